// What the Verilog reader tells about the selected unit besides port ranges: parameters with
// their values after -g, declared types and kinds, package imports, the reason a range is
// unknown, -D and -I, and the unit listing. Each description is flattened to lines so a
// failure shows every difference at once.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "scan/verilog/verilog_text.h"
#include "verilog_read.h"

namespace {

using verilog_test::fixture;
using verilog_test::Input;

const char* kindName(ScanPort::Kind kind) {
  static const char* const names[] = {"bit",   "vector", "integer",   "record",
                                      "array", "enum",   "interface", "other"};
  return names[static_cast<int>(kind)];
}

// "data in 'logic [W-1:0]' vector [7:0]"; an unknown range is "?", none is "-".
std::string portLine(const ScanPort& port) {
  const std::string range = port.rangeUnknown() ? "?"
                            : port.hasRange()   ? verilog_test::bounds(port)
                                                : "-";
  return std::string(port.name()) + " " + verilog_test::directionName(port.direction()) + " '" +
         port.declaredType() + "' " + kindName(port.kind()) + " " + range;
}

// "W 'int' = '8' -> 8 @27"; a type parameter is marked "type", a missing value "none".
std::string genericLine(const ScanGeneric& generic) {
  return generic.name + (generic.kind == ScanGeneric::Kind::Type ? " type" : "") + " '" +
         generic.typeText + "' = '" + generic.defaultText + "' -> " +
         generic.value.value_or("none") + " @" + std::to_string(generic.sourceLine);
}

struct Read : verilog_test::Read {
  std::vector<std::string> ports;
  std::vector<std::string> generics;
};

Read describe(const Input& input) {
  Read result{verilog_test::read(input), {}, {}};
  for (const ScanPort& port : result.unit.ports) result.ports.push_back(portLine(port));
  for (const ScanGeneric& generic : result.unit.generics)
    result.generics.push_back(genericLine(generic));
  return result;
}

ScanSettings overrides(std::vector<std::pair<std::string, std::string>> values) {
  ScanSettings settings;
  settings.genericOverrides = std::move(values);
  return settings;
}

struct DescriptionCase {
  const char* label;
  Input input;
  std::vector<std::string> generics;
  std::vector<std::string> ports;
  std::string context;
};

const std::vector<DescriptionCase>& descriptionCases() {
  static const std::vector<DescriptionCase> all = {
      {"AnsiTypesKindsAndImports",
       {{}, "ansi_typed", {}, {fixture("described.sv")}},
       {"W 'int' = '8' -> 8 @27", "D '' = 'W * 2' -> 16 @28",
        "T type 'type' = 'logic [W-1:0]' -> none @29", "R 'real' = '1.5' -> 1.5 @30",
        "S 'string' = '\"a  b\"' -> \"a  b\" @31", "N 'logic [3:0]' = '4'd5' -> 5 @33",
        "M 'logic [3:0]' = 'N + 1' -> 6 @33"},
       {"data in 'logic [W-1:0]' vector [7:0]", "sdata in 'wire signed [7:0]' vector [7:0]",
        "req out 'req_t' record [11:0]", "mode out 'desc_pkg::mode_t' enum [1:0]",
        "b in 'byte_t' vector [7:0]", "mem in 'mem_t' array [7:0]",
        "arr in 'logic [7:0]' array [7:0]", "count in 'integer' integer -",
        "word in 'int' integer [31:0]", "typed in 'T' vector [7:0]",
        "reqs in 'req_t [1:0]' array [23:0]", "s interface 'bus_if.slave' interface -",
        "flag out 'logic [D-1:0]' vector [15:0]", "m interface 'bus_if' interface -"},
       "import desc_pkg::*;\nimport other_pkg::SHIFT;"},
      {"OverridesReachEveryWidthThatUsesThem",
       {{},
        "ansi_typed",
        overrides({{"W", "4"},
                   {"T", "logic [W+1:0]"},
                   {"R", "2.0"},
                   {"S", "\"x\""},
                   {"N", "4'd2 + 1"},
                   {"L", "9"},
                   {"D", "W + 1"}}),
        {fixture("described.sv")}},
       {"W 'int' = '8' -> 4 @27", "D '' = 'W * 2' -> 5 @28",
        "T type 'type' = 'logic [W-1:0]' -> none @29", "R 'real' = '1.5' -> 2.0 @30",
        "S 'string' = '\"a  b\"' -> \"x\" @31", "N 'logic [3:0]' = '4'd5' -> 3 @33",
        "M 'logic [3:0]' = 'N + 1' -> 4 @33"},
       {"data in 'logic [W-1:0]' vector [3:0]", "sdata in 'wire signed [7:0]' vector [7:0]",
        "req out 'req_t' record [11:0]", "mode out 'desc_pkg::mode_t' enum [1:0]",
        "b in 'byte_t' vector [7:0]", "mem in 'mem_t' array [7:0]",
        "arr in 'logic [7:0]' array [7:0]", "count in 'integer' integer -",
        "word in 'int' integer [31:0]", "typed in 'T' vector [5:0]",
        "reqs in 'req_t [1:0]' array [23:0]", "s interface 'bus_if.slave' interface -",
        "flag out 'logic [D-1:0]' vector [4:0]", "m interface 'bus_if' interface -"},
       "import desc_pkg::*;\nimport other_pkg::SHIFT;"},
      {"NonAnsiTypesFromTheBodyAndBodyParameters",
       {{}, "nonansi_typed", {}, {fixture("described.sv")}},
       {"WIDTH '' = '4' -> 4 @55", "INIT '[7:0]' = '8'h0f' -> 15 @57"},
       {"clk in '' bit -", "q out 'reg [WIDTH-1:0]' vector [3:0]",
        "d in 'wire [HALF-1:0]' vector [1:0]", "bus inout '[7:0]' vector [7:0]",
        "sel out 'reg' bit -"},
       "import desc_pkg::*;"},
      {"NonAnsiOverride",
       {{}, "nonansi_typed", overrides({{"WIDTH", "8"}, {"HALF", "1"}}), {fixture("described.sv")}},
       {"WIDTH '' = '4' -> 8 @55", "INIT '[7:0]' = '8'h0f' -> 15 @57"},
       {"clk in '' bit -", "q out 'reg [WIDTH-1:0]' vector [7:0]",
        "d in 'wire [HALF-1:0]' vector [3:0]", "bus inout '[7:0]' vector [7:0]",
        "sel out 'reg' bit -"},
       "import desc_pkg::*;"},
      {"AParameterListHidesBodyParameters",
       {{"module m #(parameter A = 1, localparam B = A, C = 2, parameter signed E = -1)\n"
         "  (input [A:0] x);\n"
         "  parameter F = 3;\n"
         "endmodule\n"},
        "m",
        {}},
       {"A '' = '1' -> 1 @1", "E 'signed' = '-1' -> -1 @1"},
       {"x in '[A:0]' vector [1:0]"},
       ""},
      {"ListWithoutParametersStillHidesTheBody",
       {{"module m #() (input x);\n  parameter F = 3;\nendmodule\n"}, "m", {}},
       {},
       {"x in '' bit -"},
       ""},
      {"TypeParameterWithANamedDefaultAndOverride",
       {{"typedef logic [4:0] five_t;\n"
         "typedef struct packed { logic a; } one_t;\n"
         "module m #(parameter type T = five_t, U = int) (input T t, input U u);\n"
         "endmodule\n"},
        "m",
        overrides({{"U", "one_t"}})},
       {"T type 'type' = 'five_t' -> none @3", "U type 'type' = 'int' -> none @3"},
       {"t in 'T' vector [4:0]", "u in 'U' record -"},
       ""},
      {"InterfacePortsOfAnInterfaceNoFileDeclares",
       {{"module m (input clk, output logic o, bus_if m, bus_if.slave s [2], interface i);\n"
         "endmodule\n"},
        "m",
        {}},
       {},
       {"clk in '' bit -", "o out 'logic' bit -", "m interface 'bus_if' interface -",
        "s interface 'bus_if.slave' interface -", "i interface 'interface' interface -"},
       ""},
      {"ImportsBeforeTheUnitOnlyOnceEach",
       {{"package p; localparam X = 1; endpackage\n"
         "package q; localparam Y = 1; endpackage\n"
         "import p::*;\n"
         "import p::X, q::Y;\n"
         "module m import p::*, q::*; (input [X:0] a);\n"
         "endmodule\n"
         "import q::*;\n"},
        "m",
        {}},
       {},
       {"a in '[X:0]' vector [1:0]"},
       "import p::*;\nimport p::X, q::Y;\nimport p::*, q::*;"},
      {"NonAnsiBodyImportsArePartOfTheContext",
       {{"package p; typedef logic [2:0] t; endpackage\n"
         "module m (a);\n"
         "  import p::*;\n"
         "  input t a;\n"
         "endmodule\n"},
        "m",
        {}},
       {},
       {"a in 't' vector [2:0]"},
       "import p::*;"},
      {"CommentsAndLineBreaksInWrittenText",
       {{"module m #(parameter /* kind */ int\n  W = 4 /* four */ + // more\n  1)\n"
         "  (input logic /* c */ [W-1\n    :0] a);\n"
         "endmodule\n"},
        "m",
        {}},
       {"W 'int' = '4 + 1' -> 5 @2"},
       {"a in 'logic [W-1 :0]' vector [4:0]"},
       ""},
      {"FifoHeaderAsFoundInTheWild",
       {{"module fifo #(\n"
         "  parameter int unsigned DEPTH = 8,\n"
         "  parameter bit FALL_THROUGH = 1'b0,\n"
         "  parameter type dtype = logic [7:0],\n"
         "  parameter int unsigned ADDR_DEPTH = (DEPTH > 1) ? $clog2(DEPTH) : 1\n"
         ") (\n"
         "  input  logic clk_i,\n"
         "  input  dtype data_i,\n"
         "  output logic [ADDR_DEPTH-1:0] usage_o\n"
         ");\n"
         "endmodule\n"},
        "fifo",
        overrides({{"DEPTH", "32"}})},
       {"DEPTH 'int unsigned' = '8' -> 32 @2", "FALL_THROUGH 'bit' = '1'b0' -> 0 @3",
        "dtype type 'type' = 'logic [7:0]' -> none @4",
        "ADDR_DEPTH 'int unsigned' = '(DEPTH > 1) ? $clog2(DEPTH) : 1' -> 5 @5"},
       {"clk_i in 'logic' bit -", "data_i in 'dtype' vector [7:0]",
        "usage_o out 'logic [ADDR_DEPTH-1:0]' vector [4:0]"},
       ""},
      {"SelectsAndConcatenationsHaveTheirEvaluatedRange",
       {{"module m (.p(x[5:2]), .q({x, y}), y);\n"
         "  input [7:0] x;\n"
         "  input y;\n"
         "endmodule\n"},
        "m",
        {}},
       {},
       {"p in '[5:2]' vector [5:2]", "q in '[8:0]' vector [8:0]", "y in '' bit -"},
       ""},
  };
  return all;
}

class VerilogDescriptionTest : public testing::TestWithParam<DescriptionCase> {};

TEST_P(VerilogDescriptionTest, DescribesTheUnit) {
  const DescriptionCase& c = GetParam();
  Read result = describe(c.input);
  ASSERT_TRUE(result.found);
  EXPECT_TRUE(result.ok);
  EXPECT_EQ(result.generics, c.generics);
  EXPECT_EQ(result.ports, c.ports);
  EXPECT_EQ(result.unit.context, c.context);
}

INSTANTIATE_TEST_SUITE_P(Cases, VerilogDescriptionTest, testing::ValuesIn(descriptionCases()),
                         verilog_test::Label());

struct SearchCase {
  const char* label;
  std::vector<std::string> includeDirectories;
  const char* environment;  ///< PINFORGE_INCLUDE, relative to the fixtures
  std::vector<std::pair<std::string, std::optional<std::string>>> macros;
  std::vector<std::string> ports;
};

TEST(VerilogCommandLineTest, IncludeFoldersAndMacros) {
  const std::vector<SearchCase> cases = {
      {"IncludeFolderBeforeTheEnvironment",
       {fixture("search/first")},
       "search/second",
       {{"DEFINED_WIDTH", "3"}},
       {"a in '[`DESC_WIDTH-1:0]' vector [5:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [2:0]"}},
      {"EnvironmentAlone",
       {},
       "search/second",
       {{"DEFINED_WIDTH", "2 + 2"}},
       {"a in '[`DESC_WIDTH-1:0]' vector [9:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [3:0]"}},
      {"MacroWithoutTextIsOne",
       {fixture("search/second"), fixture("search/first")},
       "",
       {{"DEFINED_WIDTH", std::nullopt}},
       {"a in '[`DESC_WIDTH-1:0]' vector [9:0]", "b in '[`DEFINED_WIDTH-1:0]' vector [0:0]"}},
  };
  for (const SearchCase& c : cases) {
    SCOPED_TRACE(c.label);
    std::string environment = *c.environment ? fixture(c.environment) : "";
    setenv("PINFORGE_INCLUDE", environment.c_str(), 1);
    ScanSettings settings;
    settings.includeDirectories = c.includeDirectories;
    settings.macros = c.macros;
    Read result = describe({{}, "include_order", settings, {fixture("search/include_order.v")}});
    ASSERT_TRUE(result.found);
    EXPECT_EQ(result.ports, c.ports);
  }
  unsetenv("PINFORGE_INCLUDE");
}

TEST(VerilogCommandLineTest, HostileValuesEndInMessages) {
  const std::vector<std::string> values = {std::string("1\0", 2), "`NO_SUCH_MACRO",
                                           std::string(100000, '('), "\"open", "1 /* open"};
  for (const std::string& value : values) {
    SCOPED_TRACE(value.substr(0, 20));
    ScanSettings settings;
    settings.genericOverrides = {{"W", value}};
    settings.macros = {{"LINES", "1 +\n 2"}, {"OTHER", value}};
    Read result = describe({{"module m #(parameter W = 1) (input [W:0] a, input [`LINES:0] b);\n"
                             "endmodule\n"},
                            "m",
                            settings});
    ASSERT_TRUE(result.found);
    EXPECT_FALSE(result.ok);
    EXPECT_FALSE(result.messages.empty());
    ASSERT_EQ(result.ports.size(), 2u);
    EXPECT_EQ(result.ports[1], "b in '[`LINES:0]' vector [3:0]");
  }
}

TEST(VerilogListingTest, EveryUnitInFileOrder) {
  Read result = describe({{"program p; endprogram\nmacromodule r (input a); endmodule\n"
                           "interface class c; endclass\nmodule described; endmodule\n"},
                          "described",
                          {},
                          {fixture("described.sv")}});
  EXPECT_EQ(result.units, (std::vector<std::string>{
                              "work package desc_pkg described.sv:2",
                              "work package other_pkg described.sv:13",
                              "work interface bus_if described.sv:19",
                              "work module ansi_typed described.sv:25",
                              "work module nonansi_typed described.sv:54",
                              "work program p t.v:1",
                              "work module r t.v:2",
                              "work module described t.v:4",
                          }));
}

TEST(VerilogWrittenTextTest, DropsCommentsAndKeepsLiteralsAndEscapedNames) {
  const std::vector<std::pair<std::string, std::string>> cases = {
      {"  logic\t[W-1:0]\r\n ", "logic [W-1:0]"},
      {"\"a // b /* c */\"  // d", "\"a // b /* c */\""},
      {"\"q\\\" //\"  +  1", "\"q\\\" //\" + 1"},
      {"\\bus[0]  [3:0]", "\\bus[0] [3:0]"},
      {"a /* one\ntwo */b", "a b"},
      {"x /* never closed", "x"},
      {"\"never closed", "\"never closed"},
      {std::string("n\0m", 3), std::string("n\0m", 3)},
      {"", ""},
  };
  for (const auto& [text, want] : cases) EXPECT_EQ(scan::verilog::normaliseWritten(text), want);
}

}  // namespace
