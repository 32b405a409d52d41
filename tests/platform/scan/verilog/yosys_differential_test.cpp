// Holds the Verilog reader against Yosys. Every module of every fixture file Yosys reads is
// elaborated as top with its parameter defaults (hierarchy -top) and written as JSON; the
// port names, directions, lines and bounds found there must equal what the extractor reports.
#include <gtest/gtest.h>

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
#include "support/mini_json.h"

namespace {

using namespace difftest;

// Types whose width is implied by the type itself; a port of such a type may be reported
// without a range as long as Yosys gives it exactly that width from bit 0.
const std::map<std::string, size_t> kImpliedWidths = {
    {"integer", 32}, {"int", 32}, {"shortint", 16}, {"longint", 64}, {"byte", 8}, {"time", 64}};

// Type names that are Verilog keywords rather than user types.
const std::set<std::string> kBuiltinTypes = {
    "",       "wire",    "reg",     "logic",   "bit",      "tri",     "tri0",    "tri1",
    "triand", "trior",   "wand",    "wor",     "uwire",    "var",     "integer", "int",
    "shortint", "longint", "byte",  "time",    "signed",   "unsigned", "supply0", "supply1"};

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
      if (part < 3 && (at == src.size() || src[at++] != (part % 2 == 0 ? '.' : '-')))
        return false;
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

  bool readJson(const std::string& path, JsonValue& json) {
    std::string text;
    return readFile(path, text) && JsonReader(text).parse(json);
  }

  // The modules Yosys reads from `file` itself, in the order it lists them.
  std::vector<std::string> modulesOf(const JsonValue& design, const std::string& file) {
    std::vector<std::string> names;
    const JsonValue* modules = design.member("modules");
    if (modules == nullptr) return names;
    for (const auto& [name, module] : modules->members) {
      const JsonValue* attributes = module.member("attributes");
      const JsonValue* src = attributes != nullptr ? attributes->member("src") : nullptr;
      if (src != nullptr && src->text.rfind(file + ":", 0) == 0 &&
          attributes->member("is_interface") == nullptr)
        names.push_back(name);
    }
    return names;
  }

  // Elaborates each module as top in one Yosys run; when that run fails, module by module,
  // leaving out (with a note) the ones Yosys cannot elaborate. Fills `elaborated` with each
  // module's JSON description.
  void elaborate(const std::vector<std::string>& files, const std::vector<std::string>& modules,
                 std::map<std::string, JsonValue>& elaborated) {
    std::string all = "design -save pinforge_read\n";
    for (size_t i = 0; i < modules.size(); ++i)
      all += "design -load pinforge_read\nhierarchy -top " + modules[i] + "\nwrite_json " +
             m_Workdir + "/top" + std::to_string(i) + ".json\n";
    const bool together = yosys(files, all, "tops").status == 0;
    for (size_t i = 0; i < modules.size(); ++i) {
      const std::string json = m_Workdir + "/top" + std::to_string(i) + ".json";
      if (!together) {
        const ToolRun run = yosys(
            files, "hierarchy -top " + modules[i] + "\nwrite_json " + json + "\n", "top");
        if (run.status != 0) {
          std::cout << "  note: module " << modules[i]
                    << " left out, Yosys cannot elaborate it: " << firstErrorLine(run.output)
                    << "\n";
          continue;
        }
      }
      JsonValue design;
      const JsonValue* module = nullptr;
      if (readJson(json, design) && design.member("modules") != nullptr)
        module = design.member("modules")->member(modules[i]);
      if (module == nullptr) {
        ADD_FAILURE() << "no JSON description of module " << modules[i] << " in " << json;
        continue;
      }
      elaborated[modules[i]] = *module;
    }
  }

  void comparePorts(const std::string& where, const JsonValue& module, const ScanPortList& ours) {
    const JsonValue* ports = module.member("ports");
    const JsonValue* nets = module.member("netnames");
    if (ports == nullptr) {
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
    for (const auto& [name, port] : ports->members) {
      theirOrder += name + " ";
      const auto found = oursByName.find(name);
      if (found == oursByName.end()) {
        ADD_FAILURE() << where << ": port " << name << ": missing in ours";
        continue;
      }
      const JsonValue* net = nets != nullptr ? nets->member(name) : nullptr;
      const JsonValue* attributes = net != nullptr ? net->member("attributes") : nullptr;
      const JsonValue* src = attributes != nullptr ? attributes->member("src") : nullptr;
      comparePort(where + ": port " + name, port, src != nullptr ? src->text : "", *found->second);
      oursByName.erase(found);
    }
    for (const auto& [name, port] : oursByName)
      ADD_FAILURE() << where << ": port " << name << ": ours only (line " << port->sourceLine()
                    << "), Yosys has no such port";
    // Yosys numbers ports of struct and enum types after all others, so with user types
    // its order says nothing.
    if (oursByName.empty() && ours.size() == ports->members.size() && oursOrder != theirOrder &&
        !userTypes)
      ADD_FAILURE() << where << ": port order: ours " << oursOrder << "; Yosys " << theirOrder;
  }

  void comparePort(const std::string& where, const JsonValue& theirs, const std::string& src,
                   const ScanPort& ours) {
    const JsonValue* direction = theirs.member("direction");
    const std::string theirDirection = direction != nullptr ? direction->text : "?";
    if (ours.direction() != directionCode(theirDirection))
      ADD_FAILURE() << where << ": direction: ours " << ours.direction() << ", Yosys "
                    << theirDirection << " (" << directionCode(theirDirection) << ")";
    if (!src.empty() && !lineInSource(src, ours.sourceLine()))
      ADD_FAILURE() << where << ": line: ours " << ours.sourceLine() << ", Yosys " << src;

    const JsonValue* bits = theirs.member("bits");
    const long long width = bits != nullptr ? static_cast<long long>(bits->items.size()) : 0;
    const long long offset = theirs.integer("offset", 0);
    const bool upto = theirs.integer("upto", 0) != 0;
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
  if (s_Yosys.empty()) GTEST_SKIP() << "yosys is not installed";
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
  JsonValue design;
  ASSERT_TRUE(readJson(m_Workdir + "/read.json", design)) << "unreadable Yosys JSON";
  const std::vector<std::string> modules = modulesOf(design, file);
  if (modules.empty()) GTEST_SKIP() << file << " declares no module Yosys keeps";

  std::map<std::string, JsonValue> elaborated;
  elaborate(files, modules, elaborated);

  ScanExtractor extractor;
  for (const std::string& each : files)
    extractor.addDesignFile("work", each.c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  for (const auto& [name, module] : elaborated) {
    const std::string where = file + ": module " + name;
    if (extractor.findDesignUnit("work", name.c_str(), ScanExtractor::SearchAllLibraries) != 0) {
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
TEST(MiniJson, KeepsMemberOrderAndDecodesStrings) {
  JsonValue json;
  ASSERT_TRUE(JsonReader(R"( {"z": {"offset": -3, "upto": 1}, "a": [1, "x\"y\u0041\n", true, null],
                             "m": {}} )")
                  .parse(json));
  ASSERT_EQ(json.members.size(), 3u);
  EXPECT_EQ(json.members[0].name, "z");
  EXPECT_EQ(json.members[1].name, "a");
  EXPECT_EQ(json.member("z")->integer("offset", 0), -3);
  EXPECT_EQ(json.member("z")->integer("missing", 7), 7);
  const JsonValue* array = json.member("a");
  ASSERT_TRUE(array != nullptr && array->items.size() == 4u);
  EXPECT_EQ(array->items[1].text, "x\"yA\n");
  EXPECT_TRUE(array->items[2].kind == JsonValue::Bool && array->items[2].boolean);
  EXPECT_EQ(array->items[3].kind, JsonValue::Null);
  EXPECT_TRUE(json.member("m")->members.empty());
  EXPECT_EQ(json.member("nope"), nullptr);
}

TEST(MiniJson, RejectsMalformedDocuments) {
  for (const char* text : {"", "{\"a\":}", "[1, 2", "{\"a\": 1} x", "\"open", "tru", "{a: 1}",
                           "[1,]", "-"}) {
    JsonValue json;
    EXPECT_FALSE(JsonReader(text).parse(json)) << text;
  }
}

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
