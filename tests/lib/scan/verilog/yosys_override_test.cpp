// Holds the Verilog reader's parameter overrides against Yosys: a fixture module whose port
// widths hang on parameters is read with overrides given as the command line's -g gives them,
// and elaborated by Yosys with chparam setting the same values; every port's bounds must agree.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include <filesystem>
#include <map>
#include <ostream>
#include <string>
#include <vector>

#include "platform/scan.h"
#include "support/diff_tools.h"

namespace {

using namespace difftest;

struct Override {
  std::string name;
  std::string ours;   ///< the value as -g takes it: an expression in the design's language
  std::string yosys;  ///< the same value as chparam takes it: a constant
};

struct OverrideCase {
  const char* label;
  const char* file;  ///< in tests/fixtures/verilog, or the name under which `text` is written
  const char* module;
  std::vector<Override> overrides;
  const char* text = nullptr;  ///< the module's source when no fixture holds one Yosys reads
};

// Parameters in the #(...) list with SV types, a localparam that follows an override there,
// and a 4-bit parameter given a wider value.
constexpr const char* kTyped =
    "module typed #(parameter int W = 8, localparam int D = W * 2,\n"
    "               parameter logic [3:0] M = 4'd3)\n"
    "  (input logic [W-1:0] a, output logic [D-1:0] b, output [M:0] c, input [0:W+M] d);\n"
    "endmodule\n";

// A body parameter reaching widths through a constant function, $clog2 and arithmetic.
constexpr const char* kClogs =
    "module clogs (addr, count, data);\n"
    "  parameter DEPTH = 1000;\n"
    "  localparam AW = clog2(DEPTH);\n"
    "  localparam CW = $clog2(DEPTH + 1);\n"
    "  output [AW-1:0] addr;\n"
    "  output [CW-1:0] count;\n"
    "  input [DEPTH % 7 + 1:0] data;\n"
    "  function integer clog2;\n"
    "    input integer value;\n"
    "    integer v;\n"
    "    begin\n"
    "      v = value - 1;\n"
    "      for (clog2 = 0; v > 0; clog2 = clog2 + 1) v = v >> 1;\n"
    "    end\n"
    "  endfunction\n"
    "endmodule\n";

// Each case changes at least one width; together they reach parameters in the #(...) list and
// in the body, typed ones that truncate the value, derived parameters and localparams that
// follow an override, constant functions and $clog2. ansi_basic.v and functions.v hold the
// same constructs but use SV that Yosys does not read, hence the two modules of their own.
const OverrideCase kCases[] = {
    {"ExpressionsTruncationAndDerivedParameters",
     "diff_params.v",
     "diff_params",
     {{"DATA_W", "4 * 2", "8"},
      {"LOW", "2", "2"},
      {"MODE", "5'b10110", "5'b10110"},
      {"DEPTH", "100", "100"}}},
    {"DerivedParameterSetItself", "diff_params.v", "diff_params", {{"HIGH", "12", "12"}}},
    {"AscendingRanges", "diff_params.v", "diff_params_ascending", {{"N", "7", "7"}}},
    {"BodyParametersOfANonAnsiModule",
     "diff_nonansi.v",
     "diff_nonansi",
     {{"WIDTH", "5", "5"}, {"OFFSET", "2", "2"}}},
    {"ConstantFunctionOfAnOverride",
     "diff_nonansi.v",
     "diff_nonansi_func",
     {{"N", "1000", "1000"}}},
    {"OperatorsOverOverrides",
     "diff_operators.v",
     "diff_operators",
     {{"A", "9", "9"}, {"B", "2", "2"}, {"MASK", "8'h3C", "8'h3C"}}},
    {"TypedParametersAndAFollowingLocalparam",
     "typed.sv",
     "typed",
     {{"W", "3", "3"}, {"M", "5'd20", "5'd20"}},
     kTyped},
    {"ClogAndFunctionsOfABodyParameter", "clogs.v", "clogs", {{"DEPTH", "17", "17"}}, kClogs},
};

void PrintTo(const OverrideCase& c, std::ostream* os) { *os << c.label; }

std::string fixtureDir() { return sourceDir() + "/tests/fixtures/verilog"; }

// Yosys writes escaped identifiers without the backslash and the terminating blank.
std::string plainName(std::string name) {
  if (!name.empty() && name[0] == '\\') name.erase(0, 1);
  while (!name.empty() && (name.back() == ' ' || name.back() == '\t')) name.pop_back();
  return name;
}

/// "[left:right]", "[left:right] ascending", or "scalar" for a single bit at 0 (with a range
/// [0:0] or none).
std::string oursRange(const ScanPort& port) {
  if (port.rangeUnknown()) return "unknown: " + port.rangeProblem();
  if (!port.hasRange()) return "scalar";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  if (left == 0 && right == 0) return "scalar";
  return "[" + std::to_string(left) + ":" + std::to_string(right) + "]" +
         (port.isAscending() != 0 && left != right ? " ascending" : "");
}

/// The same form for a port of Yosys' JSON, which cannot tell a scalar from [0:0].
std::string theirRange(const nlohmann::json& port) {
  const long long width =
      static_cast<long long>(port.value("bits", nlohmann::json::array()).size());
  const long long offset = port.value("offset", 0LL);
  const bool upto = port.value("upto", 0) != 0;
  if (width == 1 && offset == 0) return "scalar";
  const long long left = upto ? offset : offset + width - 1;
  const long long right = upto ? offset + width - 1 : offset;
  return "[" + std::to_string(left) + ":" + std::to_string(right) + "]" +
         (upto && width > 1 ? " ascending" : "");
}

// Types whose width the type itself gives; such a port has no range of its own.
const std::map<std::string, std::string> kImpliedRanges = {{"integer", "[31:0]"},
                                                           {"int", "[31:0]"}};

/// Every port's range by name, as the reader gives it with `settings`; empty when the module
/// is not found.
std::map<std::string, std::string> readOurs(const std::string& file, const char* module,
                                            ScanSettings settings,
                                            std::vector<std::string>& unknownNames) {
  std::map<std::string, std::string> ranges;
  ScanExtractor extractor;
  extractor.configure(std::move(settings));
  extractor.addDesignFile("work", file.c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  if (!extractor.selectDesignUnit("work", module, ScanExtractor::SearchAllLibraries)) return ranges;
  const ScanPortList& ports = *extractor.getPorts();
  for (const ScanPort* port = ports.firstPort(); port != nullptr; port = ports.nextPort(port)) {
    std::string range = oursRange(*port);
    const auto implied = kImpliedRanges.find(port->typeName());
    if (range == "scalar" && implied != kImpliedRanges.end()) range = implied->second;
    ranges[plainName(port->name())] = range;
  }
  unknownNames = extractor.unknownOverrides();
  return ranges;
}

class YosysOverride : public testing::TestWithParam<OverrideCase> {};

TEST_P(YosysOverride, PortRangesMatchYosysChparam) {
  const std::string yosys = findTool("yosys");
  DIFFTEST_REQUIRE_TOOL(yosys, "yosys");
  const OverrideCase& c = GetParam();
  ScratchDir dir;
  ASSERT_FALSE(dir.path().empty());
  const std::string file = c.text != nullptr ? dir.file(c.file) : fixtureDir() + "/" + c.file;
  if (c.text != nullptr) {
    ASSERT_TRUE(dir.write(c.file, c.text));
  }

  // Without -noblackbox Yosys makes a module with an empty body a black box, which chparam
  // does not select.
  std::string script = "read_verilog -sv -noblackbox -I" + fixtureDir() + " " + file + "\n";
  script += "chparam";
  for (const Override& o : c.overrides) script += " -set " + o.name + " " + o.yosys;
  script += " " + std::string(c.module) + "\n";
  script += "hierarchy -top " + std::string(c.module) + "\nproc\n";
  script += "write_json " + dir.file("out.json") + "\n";
  ASSERT_TRUE(dir.write("run.ys", script));
  const ToolRun run = runTool({yosys, "-q", "-s", dir.file("run.ys")}, dir.path());
  ASSERT_EQ(run.status, 0) << firstErrorLine(run.output);
  ASSERT_EQ(run.output.find("did not match"), std::string::npos) << run.output;
  std::string text;
  ASSERT_TRUE(readFile(dir.file("out.json"), text));
  const nlohmann::json json = nlohmann::json::parse(text, nullptr, false);
  const nlohmann::json::json_pointer ports =
      nlohmann::json::json_pointer("/modules") / c.module / "ports";
  ASSERT_TRUE(json.is_object() && json.contains(ports))
      << "no ports of " << c.module << " in Yosys' JSON";

  ScanSettings settings;
  for (const Override& o : c.overrides) settings.genericOverrides.emplace_back(o.name, o.ours);
  std::vector<std::string> unknownNames;
  const std::map<std::string, std::string> ours =
      readOurs(file, c.module, std::move(settings), unknownNames);
  ASSERT_FALSE(ours.empty()) << c.module << " not found by ours";
  EXPECT_EQ(unknownNames, std::vector<std::string>{}) << "overrides that name no parameter";

  std::map<std::string, std::string> theirs;
  for (const auto& [name, port] : json[ports].items()) theirs[name] = theirRange(port);
  EXPECT_EQ(ours, theirs);

  // A case whose overrides change no width would hold nothing against Yosys.
  std::vector<std::string> ignored;
  EXPECT_NE(readOurs(file, c.module, {}, ignored), ours) << "the overrides change no width";
}

INSTANTIATE_TEST_SUITE_P(Fixtures, YosysOverride, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<OverrideCase>& info) {
                           return std::string(info.param.label);
                         });

}  // namespace
