// Holds the Verilog reader against Yosys. Every module of every fixture file Yosys reads is
// elaborated as top with its parameter defaults (hierarchy -top) and written as JSON; the
// port names, directions, lines and bounds found there must equal what the extractor reports.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"

namespace {

using namespace difftest;
// Yosys lists ports in declaration order; only an ordered object keeps it.
using Json = nlohmann::ordered_json;

// Types whose width is implied by the type itself; a port of such a type may be reported
// without a range as long as Yosys gives it exactly that width from bit 0.
const std::map<std::string, size_t> kImpliedWidths = {
    {"integer", 32}, {"int", 32}, {"shortint", 16}, {"longint", 64}, {"byte", 8}, {"time", 64}};

// Type names that are Verilog keywords rather than user types.
const std::set<std::string> kBuiltinTypes = {
    "",         "wire",    "reg",  "logic", "bit",    "tri",      "tri0",    "tri1",
    "triand",   "trior",   "wand", "wor",   "uwire",  "var",      "integer", "int",
    "shortint", "longint", "byte", "time",  "signed", "unsigned", "supply0", "supply1"};

int directionCode(const std::string& direction) {
  if (direction == "input") return ScanPort::Input;
  if (direction == "output") return ScanPort::Output;
  if (direction == "inout") return ScanPort::Inout;
  return 0;
}

// Yosys writes escaped identifiers without the backslash and the terminating blank.
std::string plainName(std::string name) {
  if (!name.empty() && name[0] == '\\') name.erase(0, 1);
  while (!name.empty() && (name.back() == ' ' || name.back() == '\t')) name.pop_back();
  return name;
}

// Whether `line` lies inside one of the "file:l1.c1-l2.c2" spans of a Yosys src attribute.
bool lineInSource(const std::string& src, int line) {
  // Reads "D+.D+-D+.D+" at `at`: the first and last line of a span.
  auto span = [&src](size_t at, int& first, int& last) {
    int* bounds[2] = {&first, &last};
    for (int part = 0; part < 4; ++part) {
      const size_t digits = at;
      while (at < src.size() && std::isdigit(static_cast<unsigned char>(src[at]))) ++at;
      if (at == digits) return false;
      if (part % 2 == 0) *bounds[part / 2] = std::atoi(src.c_str() + digits);
      if (part < 3 && (at == src.size() || src[at++] != (part % 2 == 0 ? '.' : '-'))) return false;
    }
    return true;
  };
  for (size_t colon = src.find(':'); colon != std::string::npos; colon = src.find(':', colon + 1)) {
    int first = 0;
    int last = 0;
    if (span(colon + 1, first, last) && line >= first && line <= last) return true;
  }
  return false;
}

// Files other fixtures may need first: packages and macro definitions. Either starts a line
// (after white space): "package NAME ;" or "`define ".
bool isSharedFile(const std::string& text) {
  auto isBlank = [](char c) { return std::isspace(static_cast<unsigned char>(c)) != 0; };
  auto isWord = [](char c) { return std::isalnum(static_cast<unsigned char>(c)) || c == '_'; };
  auto skip = [&text](size_t at, auto&& matches) {
    while (at < text.size() && matches(text[at])) ++at;
    return at;
  };
  for (size_t line = 0;; ++line) {
    const size_t at = skip(line, isBlank);
    if (text.compare(at, 7, "`define") == 0 && at + 7 < text.size() && isBlank(text[at + 7]))
      return true;
    if (text.compare(at, 7, "package") == 0) {
      const size_t name = skip(at + 7, isBlank);
      const size_t nameEnd = skip(name, isWord);
      const size_t semicolon = skip(nameEnd, isBlank);
      if (name > at + 7 && nameEnd > name && semicolon < text.size() && text[semicolon] == ';')
        return true;
    }
    line = text.find('\n', line);
    if (line == std::string::npos) break;
  }
  return false;
}

std::string describeRange(const ScanPort& port) {
  if (!port.hasRange()) return "no range";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  return "[" + std::to_string(left) + ":" + std::to_string(right) + "]";
}

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

  static std::string fixtureDir() { return sourceDir() + "/tests/fixtures/verilog"; }

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
    script += "\nproc\n" + commands;
    const std::string path = m_Workdir + "/" + name + ".ys";
    if (!writeFile(path, script)) return {};
    return runTool({s_Yosys, "-q", "-s", path}, m_Workdir);
  }

  bool readJson(const std::string& path, Json& json) {
    std::string text;
    if (!readFile(path, text)) return false;
    json = Json::parse(text, nullptr, false);
    return json.is_object();
  }

  // The modules Yosys reads from `file` itself, in the order it lists them.
  std::vector<std::string> modulesOf(const Json& design, const std::string& file) {
    std::vector<std::string> names;
    const Json modules = design.value("modules", Json::object());
    for (const auto& [name, module] : modules.items())
      if (module.value(Json::json_pointer("/attributes/src"), "").rfind(file + ":", 0) == 0 &&
          !module.contains(Json::json_pointer("/attributes/is_interface")))
        names.push_back(name);
    return names;
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
      Json design;
      const Json::json_pointer module = Json::json_pointer("/modules") / modules[i];
      if (!readJson(json, design) || !design.contains(module)) {
        ADD_FAILURE() << "no JSON description of module " << modules[i] << " in " << json;
        continue;
      }
      elaborated[modules[i]] = design[module];
    }
  }

  void comparePorts(const std::string& where, const Json& module, const ScanPortList& ours) {
    if (!module.contains("ports")) {
      ADD_FAILURE() << where << ": Yosys lists no ports";
      return;
    }
    std::map<std::string, const ScanPort*> oursByName;
    std::string oursOrder;
    bool userTypes = false;
    for (const ScanPort* port = ours.firstPort(); port != nullptr; port = ours.nextPort(port)) {
      oursByName.emplace(plainName(port->name()), port);
      oursOrder += plainName(port->name()) + " ";
      userTypes = userTypes || kBuiltinTypes.count(port->typeName()) == 0;
    }
    std::string theirOrder;
    const Json& ports = module["ports"];
    for (const auto& [name, port] : ports.items()) {
      theirOrder += name + " ";
      const auto found = oursByName.find(name);
      if (found == oursByName.end()) {
        ADD_FAILURE() << where << ": port " << name << ": missing in ours";
        continue;
      }
      const std::string src = module.value(
          Json::json_pointer("/netnames") / name / "attributes" / "src", std::string());
      comparePort(where + ": port " + name, port, src, *found->second);
      oursByName.erase(found);
    }
    for (const auto& [name, port] : oursByName)
      ADD_FAILURE() << where << ": port " << name << ": ours only (line " << port->sourceLine()
                    << "), Yosys has no such port";
    // Yosys numbers ports of struct and enum types after all others, so with user types
    // its order says nothing.
    if (oursByName.empty() && ours.size() == ports.size() && oursOrder != theirOrder && !userTypes)
      ADD_FAILURE() << where << ": port order: ours " << oursOrder << "; Yosys " << theirOrder;
  }

  void comparePort(const std::string& where, const Json& theirs, const std::string& src,
                   const ScanPort& ours) {
    const std::string theirDirection = theirs.value("direction", "?");
    if (ours.direction() != directionCode(theirDirection))
      ADD_FAILURE() << where << ": direction: ours " << ours.direction() << ", Yosys "
                    << theirDirection << " (" << directionCode(theirDirection) << ")";
    if (!src.empty() && !lineInSource(src, ours.sourceLine()))
      ADD_FAILURE() << where << ": line: ours " << ours.sourceLine() << ", Yosys " << src;

    const long long width = static_cast<long long>(theirs.value("bits", Json::array()).size());
    const long long offset = theirs.value("offset", 0LL);
    const bool upto = theirs.value("upto", 0) != 0;
    const long long left = upto ? offset : offset + width - 1;
    const long long right = upto ? offset + width - 1 : offset;
    const std::string theirRange = "[" + std::to_string(left) + ":" + std::to_string(right) + "]";
    const std::string oursRange = describeRange(ours);
    if (oursRange == theirRange && (width == 1 || ours.isAscending() == (upto ? 1 : 0))) return;
    // Yosys cannot tell a scalar from [0:0].
    if (width == 1 && offset == 0 && !ours.hasRange()) return;
    const auto implied = kImpliedWidths.find(ours.typeName());
    if (!ours.hasRange() && implied != kImpliedWidths.end() && offset == 0 && !upto &&
        static_cast<size_t>(width) == implied->second)
      return;
    ADD_FAILURE() << where << ": range: ours " << oursRange
                  << (ours.hasRange() && ours.isAscending() ? " ascending" : "") << ", Yosys "
                  << (width == 1 && offset == 0 ? "scalar or [0:0]" : theirRange)
                  << (upto && width > 1 ? " ascending" : "") << " (" << width << " bits)";
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
  Json design;
  ASSERT_TRUE(readJson(m_Workdir + "/read.json", design)) << "unreadable Yosys JSON";
  const std::vector<std::string> modules = modulesOf(design, file);
  if (modules.empty()) GTEST_SKIP() << file << " declares no module Yosys keeps";

  std::map<std::string, Json> elaborated;
  elaborate(files, modules, elaborated);

  ScanExtractor extractor;
  for (const std::string& each : files)
    extractor.addDesignFile("work", each.c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  for (const auto& [name, module] : elaborated) {
    const std::string where = file + ": module " + name;
    if (!extractor.selectDesignUnit("work", name.c_str(), ScanExtractor::SearchAllLibraries)) {
      ADD_FAILURE() << where << ": not found by ours";
      continue;
    }
    const ScanPortList& ours = *extractor.getPorts();
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
TEST(YosysSourceSpans, AcceptLinesInsideAnySpan) {
  struct Case {
    const char* src;
    int line;
    bool inside;
  } const cases[] = {
      {"m.v:13.15-13.16", 13, true},
      {"m.v:13.15-13.16", 12, false},
      {"m.v:3.1-5.2", 4, true},
      {"m.v:3.1-3.9|m.v:8.2-8.9", 8, true},
      {"m.v:3.1-3.9|m.v:8.2-8.9", 5, false},
  };
  for (const Case& c : cases) EXPECT_EQ(lineInSource(c.src, c.line), c.inside) << c.src;
}

std::string testName(const ::testing::TestParamInfo<std::string>& info) {
  return fixtureTestName(info.param);
}

INSTANTIATE_TEST_SUITE_P(Fixtures, YosysDifferential,
                         ::testing::ValuesIn(fixtureFiles("verilog", {".v", ".sv"})), testName);
GTEST_ALLOW_UNINSTANTIATED_PARAMETERIZED_TEST(YosysDifferential);

}  // namespace
