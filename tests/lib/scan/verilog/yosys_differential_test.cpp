// Holds the Verilog reader against Yosys. Every module of every fixture file Yosys reads is
// elaborated as top with its parameter defaults (hierarchy -top) and written as JSON; the
// port names, directions, lines and bounds found there must equal what the extractor reports.
#include <gtest/gtest.h>

#include <filesystem>
#include <iostream>
#include <regex>
#include <set>
#include <string>
#include <vector>

#include "support/diff_tools.h"
#include "yosys_harness.h"

namespace {

using namespace yosys_test;

// Whether `line` lies inside one of the "file:l1.c1-l2.c2" spans of a Yosys src attribute.
bool lineInSource(const std::string& src, int line) {
  static const std::regex span(R"(:(\d+)\.\d+-(\d+)\.\d+)");
  for (std::sregex_iterator it(src.begin(), src.end(), span), end; it != end; ++it)
    if (line >= std::stoi((*it)[1]) && line <= std::stoi((*it)[2])) return true;
  return false;
}

// Files other fixtures may need first: a line that starts a package or defines a macro.
bool isSharedFile(const std::string& text) {
  static const std::regex shared(R"((^|\n)[ \t\r\f\v]*(`define[ \t]|package[ \t\r\n]+\w+\s*;))");
  return std::regex_search(text, shared);
}

// Type names that are Verilog keywords rather than user types.
const std::set<std::string> kBuiltinTypes = {
    "",         "wire",    "reg",  "logic", "bit",    "tri",      "tri0",    "tri1",
    "triand",   "trior",   "wand", "wor",   "uwire",  "var",      "integer", "int",
    "shortint", "longint", "byte", "time",  "signed", "unsigned", "supply0", "supply1"};

class YosysDifferential : public ::testing::TestWithParam<std::string> {
 public:
  static void SetUpTestSuite() {
    s_Yosys = findTool("yosys");
    if (s_Yosys.empty()) return;
    s_Root = std::make_unique<ScratchDir>();
    // Only shared files Yosys reads on their own can help another file along.
    for (const std::string& file : fixtureFiles("verilog", {".v", ".sv"})) {
      std::string text;
      if (readFile(file, text) && isSharedFile(text) &&
          runTool({s_Yosys, "-q", "-p", "read_verilog -sv -I" + fixtureDir() + " " + file},
                  s_Root->path())
                  .status == 0)
        s_SharedFiles.push_back(file);
    }
  }

  static void TearDownTestSuite() {
    s_Root.reset();
    s_SharedFiles.clear();
  }

 protected:
  // Runs a Yosys script over `files`; the script's own commands follow the read.
  ToolRun yosys(const std::vector<std::string>& files, const std::string& commands,
                const std::string& name) {
    std::string script = "read_verilog -sv -I" + fixtureDir();
    for (const std::string& file : files) script += " " + file;
    // JSON cannot hold processes; proc turns them into cells.
    return runYosys(s_Yosys, m_Workdir, name, script + "\nproc\n" + commands);
  }

  // Elaborates each module as top in one Yosys run; when that run fails, module by module,
  // leaving out (with a note) the ones Yosys cannot elaborate. Fills `elaborated` with each
  // module's JSON description.
  void elaborate(const std::vector<std::string>& files, const std::vector<std::string>& modules,
                 std::map<std::string, Json>& elaborated) {
    std::string all = "design -save pinforge_read\n";
    for (size_t i = 0; i < modules.size(); ++i)
      all += "design -load pinforge_read\nhierarchy -top " + modules[i] + "\nwrite_json " +
             m_Workdir + "/top" + std::to_string(i) + ".json\n";
    const bool together = yosys(files, all, "tops").status == 0;
    for (size_t i = 0; i < modules.size(); ++i) {
      const std::string json = m_Workdir + "/top" + std::to_string(i) + ".json";
      if (!together) {
        const ToolRun run =
            yosys(files, "hierarchy -top " + modules[i] + "\nwrite_json " + json + "\n", "top");
        if (run.status != 0) {
          std::cout << "  note: module " << modules[i]
                    << " left out, Yosys cannot elaborate it: " << firstErrorLine(run.output)
                    << "\n";
          continue;
        }
      }
      const Json design = readJson(json);
      const Json::json_pointer module = Json::json_pointer("/modules") / modules[i];
      if (design.is_discarded() || !design.contains(module)) {
        ADD_FAILURE() << "no JSON description of module " << modules[i] << " in " << json;
        continue;
      }
      elaborated[modules[i]] = design[module];
    }
  }

  // Names, directions and ranges must agree; then lines and, without user types, the order.
  static void comparePorts(const std::string& where, const Json& module, const ScanPortList& ours) {
    const std::map<std::string, std::string> ourMap = ourPorts(ours);
    EXPECT_EQ(ourMap, theirPorts(module)) << where;
    std::string ourOrder;
    bool userTypes = false;
    for (const ScanPort* port = ours.firstPort(); port != nullptr; port = ours.nextPort(port)) {
      ourOrder += plainName(port->name()) + " ";
      userTypes = userTypes || kBuiltinTypes.count(port->typeName()) == 0;
      const std::string src = module.value(
          Json::json_pointer("/netnames") / plainName(port->name()) / "attributes" / "src",
          std::string());
      if (!src.empty() && !lineInSource(src, port->sourceLine()))
        ADD_FAILURE() << where << ": port " << port->name() << ": line: ours " << port->sourceLine()
                      << ", Yosys " << src;
    }
    std::string theirOrder;
    const Json ports = module.value("ports", Json::object());
    for (const auto& [name, port] : ports.items()) theirOrder += name + " ";
    // Yosys numbers ports of struct and enum types after all others, so with user types
    // its order says nothing.
    if (!userTypes) {
      EXPECT_EQ(ourOrder, theirOrder) << where << ": port order";
    }
  }

  std::string m_Workdir;

  static std::string s_Yosys;
  static std::unique_ptr<ScratchDir> s_Root;
  static std::vector<std::string> s_SharedFiles;
};

std::string YosysDifferential::s_Yosys;
std::unique_ptr<ScratchDir> YosysDifferential::s_Root;
std::vector<std::string> YosysDifferential::s_SharedFiles;

TEST_P(YosysDifferential, PortsMatchYosys) {
  DIFFTEST_REQUIRE_TOOL(s_Yosys, "yosys");
  ASSERT_TRUE(s_Root && !s_Root->path().empty()) << "no scratch directory";
  const std::string& file = GetParam();
  if (file.find_first_of(" \t\n;") != std::string::npos)
    GTEST_SKIP() << "a Yosys script cannot name " << file;
  m_Workdir = s_Root->path() + "/" + fixtureTestName(file);
  std::error_code error;
  std::filesystem::create_directories(m_Workdir, error);

  // The file on its own first; a file that needs packages or macros from others gets every
  // file that declares them ahead of it, as one compilation unit for both readers.
  std::vector<std::string> files{file};
  ToolRun read = yosys(files, "write_json " + m_Workdir + "/read.json\n", "read");
  if (read.status != 0 && !s_SharedFiles.empty()) {
    std::vector<std::string> withShared;
    for (const std::string& shared : s_SharedFiles)
      if (shared != file) withShared.push_back(shared);
    withShared.push_back(file);
    const ToolRun retry = yosys(withShared, "write_json " + m_Workdir + "/read.json\n", "read");
    if (retry.status == 0) {
      files = withShared;
      read = retry;
    }
  }
  if (read.status != 0)
    GTEST_SKIP() << "Yosys rejects " << file << ": " << firstErrorLine(read.output);
  const Json design = readJson(m_Workdir + "/read.json");
  ASSERT_FALSE(design.is_discarded()) << "unreadable Yosys JSON";
  // The modules Yosys reads from `file` itself, in the order it lists them.
  std::vector<std::string> modules;
  const Json all = design.value("modules", Json::object());
  for (const auto& [name, module] : all.items())
    if (module.value(Json::json_pointer("/attributes/src"), "").rfind(file + ":", 0) == 0 &&
        !module.contains(Json::json_pointer("/attributes/is_interface")))
      modules.push_back(name);
  if (modules.empty()) GTEST_SKIP() << file << " declares no module Yosys keeps";

  std::map<std::string, Json> elaborated;
  elaborate(files, modules, elaborated);

  const std::unique_ptr<ScanExtractor> extractor = parsed(files);
  for (const auto& [name, module] : elaborated) {
    const std::string where = file + ": module " + name;
    if (!extractor->selectDesignUnit("work", name.c_str(), ScanExtractor::SearchAllLibraries)) {
      ADD_FAILURE() << where << ": not found by ours";
      continue;
    }
    const ScanPortList& ours = *extractor->getPorts();
    bool hasInterfacePort = false;
    for (const ScanPort* port = ours.firstPort(); port != nullptr; port = ours.nextPort(port))
      hasInterfacePort = hasInterfacePort || port->direction() == ScanPort::InterfacePort;
    if (hasInterfacePort) {
      std::cout << "  note: " << where << " left out: Yosys flattens interface ports\n";
      continue;
    }
    comparePorts(where, module, ours);
  }
}

// The harness itself: a wrong reading of Yosys' answers would hide real mismatches.
TEST(YosysHarness, ReadsSourceSpansAndSharedFiles) {
  EXPECT_TRUE(lineInSource("m.v:13.15-13.16", 13));
  EXPECT_FALSE(lineInSource("m.v:13.15-13.16", 12));
  EXPECT_TRUE(lineInSource("m.v:3.1-5.2", 4));
  EXPECT_TRUE(lineInSource("m.v:3.1-3.9|m.v:8.2-8.9", 8));
  EXPECT_FALSE(lineInSource("m.v:3.1-3.9|m.v:8.2-8.9", 5));
  EXPECT_TRUE(isSharedFile("// x\n  package p ;\nendpackage\n"));
  EXPECT_TRUE(isSharedFile("`define W 8\n"));
  EXPECT_FALSE(isSharedFile("module m; endmodule // package p;\n`defineX\n"));
}

INSTANTIATE_TEST_SUITE_P(Fixtures, YosysDifferential,
                         ::testing::ValuesIn(fixtureFiles("verilog", {".v", ".sv"})),
                         [](const auto& test) { return fixtureTestName(test.param); });
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(YosysDifferential);

}  // namespace
