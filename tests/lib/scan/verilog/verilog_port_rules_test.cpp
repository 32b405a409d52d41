// The reporting rules for ports, one small design per case: ranges of atom types, typedefs
// and unpacked dimensions, equal bounds, direction inheritance, non-ANSI merging of port and
// net declarations, macros that write declarations, and the compilation-unit scope.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_reader.h"

namespace {

// "name type direction [left:right]" (ascending marked with "a"), or "... -" without range.
std::string describe(const ScanPort& port) {
  std::string out =
      std::string(port.name()) + " " + port.typeName() + " " + std::to_string(port.direction());
  if (!port.hasRange()) return out + " -";
  int32_t left = 0, right = 0;
  port.getBounds(left, right);
  return out + " [" + std::to_string(left) + ":" + std::to_string(right) + "]" +
         (port.isAscending() ? "a" : "");
}

std::vector<std::string> portsOf(const std::vector<std::string>& files, const char* unit) {
  scan::Diagnostics diagnostics(nullptr);
  scan::verilog::VerilogReader reader(diagnostics);
  int n = 0;
  for (const std::string& text : files)
    reader.indexText("f" + std::to_string(n++) + ".sv", text, "work");
  std::vector<std::string> out;
  if (!reader.selectUnit("work", unit)) return {"not found"};
  scan::UnitDescription description;
  reader.readUnit(description);
  for (const ScanPort& port : description.ports) out.push_back(describe(port));
  return out;
}

struct RuleCase {
  const char* label;
  std::vector<std::string> files;
  std::vector<std::string> ports;
};

class VerilogPortRuleTest : public testing::TestWithParam<RuleCase> {};

TEST_P(VerilogPortRuleTest, Reports) {
  EXPECT_EQ(portsOf(GetParam().files, "m"), GetParam().ports);
}

INSTANTIATE_TEST_SUITE_P(
    Rules, VerilogPortRuleTest,
    testing::Values(
        RuleCase{"EqualBoundsAreDescending",
                 {"module m(input [0:0] a, input [3:3] b, input [0:1] c); endmodule"},
                 {"a  1 [0:0]", "b  1 [3:3]", "c  1 [0:1]a"}},
        RuleCase{"AtomTypes",
                 {"module m(input byte a, input shortint b, input longint c, input integer d,\n"
                  " input time e, input real f, input string g, input bit h); endmodule"},
                 {"a byte 1 [7:0]", "b shortint 1 [15:0]", "c longint 1 [63:0]", "d integer 1 -",
                  "e time 1 [63:0]", "f real 1 -", "g string 1 -", "h bit 1 -"}},
        RuleCase{"TypedefKeepsOneDimensionAsWritten",
                 {"typedef logic [0:3] up_t;\ntypedef up_t [1:0] two_t;\n"
                  "module m(input up_t a, input two_t b, input up_t [2:0] c); endmodule"},
                 {"a up_t 1 [0:3]a", "b two_t 1 [7:0]", "c up_t 1 [11:0]"}},
        RuleCase{"UnpackedDimensionsAreIgnored",
                 {"module m(input logic [7:0] a [0:3], output b [8], input [1:0][2:0] c [2]);\n"
                  "endmodule"},
                 {"a logic 1 [7:0]", "b  2 -", "c  1 [5:0]"}},
        RuleCase{"StructAndUnionWidths",
                 {"typedef struct packed { logic [3:0] a; logic b; } s_t;\n"
                  "typedef union packed { logic [7:0] x; s_t [1:0] y; } u_t;\n"
                  "module m(input s_t s, output u_t u); endmodule"},
                 {"s s_t 1 [4:0]", "u u_t 2 [9:0]"}},
        RuleCase{"FirstPortWithoutDirectionIsInout",
                 {"module m(logic [1:0] a, b, output c, d, var e); endmodule"},
                 {"a logic 3 [1:0]", "b logic 3 [1:0]", "c  2 -", "d  2 -", "e var 2 -"}},
        RuleCase{"DirectionAloneResetsTheType",
                 {"module m(input [3:0] a, output b, input signed [1:0] c, d); endmodule"},
                 {"a  1 [3:0]", "b  2 -", "c  1 [1:0]", "d  1 [1:0]"}},
        RuleCase{"NonAnsiMergesPortAndNetDeclarations",
                 {"module m(a, b, c, d);\n output [7:0] a; reg [7:0] a;\n output b; integer b;\n"
                  " input c; wire [2:0] c;\n output reg signed [0:1] d;\nendmodule"},
                 {"a reg 2 [7:0]", "b integer 2 -", "c wire 1 [2:0]", "d reg 2 [0:1]a"}},
        RuleCase{"NonAnsiIgnoresTaskAndFunctionArguments",
                 {"module m(a);\n task t; input x; endtask\n"
                  " function f; input a; f = a; endfunction\n output [1:0] a;\nendmodule"},
                 {"a  2 [1:0]"}},
        RuleCase{"MacroWritesDeclarations",
                 {"`define PORTS input [3:0] a; output b;\nmodule m(a, b);\n `PORTS\nendmodule"},
                 {"a  1 [3:0]", "b  2 -"}},
        RuleCase{"CompilationUnitScope",
                 {"localparam int UW = 6;\nfunction int twice(int v); return v * 2; endfunction\n"
                  "module m(input [UW-1:0] a, input [twice(UW):0] b); endmodule"},
                 {"a  1 [5:0]", "b  1 [12:0]"}},
        RuleCase{"BodyLocalparamsForNonAnsi",
                 {"module m(a);\n localparam A = B + 1;\n localparam B = 2;\n input [A:0] a;\n"
                  "endmodule"},
                 {"a  1 [3:0]"}},
        RuleCase{"HeaderParametersWithTypes",
                 {"module m #(parameter logic [3:0] P = 4'hA, int Q = P + 1, type T = bit [Q:0])\n"
                  " (input T a, input [P:0] b); endmodule"},
                 {"a T 1 [11:0]", "b  1 [10:0]"}},
        RuleCase{"UnitInElseBranch",
                 {"`ifdef NEVER\n`else\nmodule m(input a);\nendmodule\n`endif"},
                 {"a  1 -"}},
        RuleCase{
            "DefineInBodyReachesLaterFiles",
            {"module first; `define LATER 9\nendmodule", "module m(input [`LATER:0] a); endmodule"},
            {"a  1 [9:0]"}},
        RuleCase{"DuplicateInLaterFileIgnored",
                 {"module m(input a); endmodule", "module m(output [1:0] z); endmodule"},
                 {"a  1 -"}},
        RuleCase{"InterfaceWithoutModport",
                 {"interface bus_if; logic x; endinterface\n"
                  "typedef logic [2:0] t3;\n"
                  "module m(bus_if port_a, t3 b, input t3 c); endmodule"},
                 {"port_a bus_if 7 -", "b t3 3 [2:0]", "c t3 1 [2:0]"}}),
    [](const testing::TestParamInfo<RuleCase>& info) { return std::string(info.param.label); });

}  // namespace
