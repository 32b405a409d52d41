// Text in, verdict out: small designs and hostile or truncated Verilog (generated here) must
// end in the right ports, the right verdict on the selected unit's header and the exact
// messages, never in a crash, a hang or unbounded memory. Covers the reporting rules for
// ports, header errors of every kind, preprocessor errors, the evaluator's width rules, and
// files that cannot be read.
#include <gtest/gtest.h>

#include <sys/stat.h>

#include <string>
#include <vector>

#include "support/scratch_dir.h"
#include "verilog_read.h"

namespace {

using verilog_test::read;

// "ok" or "bad" (readUnit's verdict), each port after "; ", then each message on a line.
std::string outcome(const verilog_test::Read& result) {
  std::string out = result.ok ? "ok" : "bad";
  for (const ScanPort& port : result.unit.ports) out += "; " + verilog_test::portText(port);
  for (const std::string& message : result.messages) out += "\n" + message;
  return out;
}

std::string repeat(const std::string& piece, size_t count, const std::string& separator = "") {
  std::string out;
  for (size_t i = 0; i < count; ++i) out += (i ? separator : "") + piece;
  return out;
}

std::string parameterChain(size_t count) {
  std::string text = "module m(output [P" + std::to_string(count - 1) + ":0] a);\n";
  text += "localparam P0 = 0;\n";
  for (size_t i = 1; i < count; ++i)
    text += "localparam P" + std::to_string(i) + " = P" + std::to_string(i - 1) + " + 1;\n";
  return text + "endmodule\n";
}

std::string longMacroChain() {
  std::string text = "`define A0 x x\n";
  for (int i = 1; i <= 40; ++i)
    text += "`define A" + std::to_string(i) + " `A" + std::to_string(i - 1) + " `A" +
            std::to_string(i - 1) + "\n";
  return text + "`A40\n";
}

struct Case {
  const char* label;
  std::vector<std::string> texts;
  std::string outcome;
  ScanSettings settings = {};
};

ScanSettings overrides(std::vector<std::pair<std::string, std::string>> values) {
  ScanSettings settings;
  settings.genericOverrides = std::move(values);
  return settings;
}

ScanSettings macros(std::vector<std::pair<std::string, std::optional<std::string>>> values) {
  ScanSettings settings;
  settings.macros = std::move(values);
  return settings;
}

class VerilogReadTest : public testing::TestWithParam<Case> {};

TEST_P(VerilogReadTest, ReadsAsExpected) {
  EXPECT_EQ(outcome(read({GetParam().texts, "m", GetParam().settings})), GetParam().outcome);
}

INSTANTIATE_TEST_SUITE_P(
    PortRules, VerilogReadTest,
    testing::Values(
        Case{"EqualBoundsAreDescending",
             {"module m(input [0:0] a, input [3:3] b, input [0:1] c); endmodule"},
             "ok; in a[0:0]; in b[3:3]; in c[0:1] asc"},
        Case{"AtomTypes",
             {"module m(input byte a, input shortint b, input longint c, input integer d,\n"
              " input time e, input real f, input string g, input bit h); endmodule"},
             "ok; in byte a[7:0]; in shortint b[15:0]; in longint c[63:0]; in integer d; in time "
             "e[63:0]; in real f; in string g; in bit h"},
        Case{"TypedefKeepsOneDimensionAsWritten",
             {"typedef logic [0:3] up_t;\ntypedef up_t [1:0] two_t;\n"
              "module m(input up_t a, input two_t b, input up_t [2:0] c); endmodule"},
             "ok; in up_t a[0:3] asc; in two_t b[7:0]; in up_t c[11:0]"},
        Case{"UnpackedDimensionsAreIgnored",
             {"module m(input logic [7:0] a [0:3], output b [8], input [1:0][2:0] c [2]);\n"
              "endmodule"},
             "ok; in logic a[7:0]; out b; in c[5:0]"},
        Case{"StructAndUnionWidths",
             {"typedef struct packed { logic [3:0] a; logic b; } s_t;\n"
              "typedef union packed { logic [7:0] x; s_t [1:0] y; } u_t;\n"
              "module m(input s_t s, output u_t u); endmodule"},
             "ok; in s_t s[4:0]; out u_t u[9:0]"},
        Case{"FirstPortWithoutDirectionIsInout",
             {"module m(logic [1:0] a, b, output c, d, var e); endmodule"},
             "ok; inout logic a[1:0]; inout logic b[1:0]; out c; out d; out var e"},
        Case{"DirectionAloneResetsTheType",
             {"module m(input [3:0] a, output b, input signed [1:0] c, d); endmodule"},
             "ok; in a[3:0]; out b; in c[1:0]; in d[1:0]"},
        Case{"NonAnsiMergesPortAndNetDeclarations",
             {"module m(a, b, c, d);\n output [7:0] a; reg [7:0] a;\n output b; integer b;\n"
              " input c; wire [2:0] c;\n output reg signed [0:1] d;\nendmodule"},
             "ok; out reg a[7:0]; out integer b; in wire c[2:0]; out reg d[0:1] asc"},
        Case{"NonAnsiIgnoresTaskAndFunctionArguments",
             {"module m(a);\n task t; input x; endtask\n"
              " function f; input a; f = a; endfunction\n output [1:0] a;\nendmodule"},
             "ok; out a[1:0]"},
        Case{"MacroWritesDeclarations",
             {"`define PORTS input [3:0] a; output b;\nmodule m(a, b);\n `PORTS\nendmodule"},
             "ok; in a[3:0]; out b"},
        Case{"CompilationUnitScope",
             {"localparam int UW = 6;\nfunction int twice(int v); return v * 2; endfunction\n"
              "module m(input [UW-1:0] a, input [twice(UW):0] b); endmodule"},
             "ok; in a[5:0]; in b[12:0]"},
        Case{"BodyLocalparamsForNonAnsi",
             {"module m(a);\n localparam A = B + 1;\n localparam B = 2;\n input [A:0] a;\n"
              "endmodule"},
             "ok; in a[3:0]"},
        Case{"HeaderParametersWithTypes",
             {"module m #(parameter logic [3:0] P = 4'hA, int Q = P + 1, type T = bit [Q:0])\n"
              " (input T a, input [P:0] b); endmodule"},
             "ok; in T a[11:0]; in b[10:0]"},
        Case{"UnitInElseBranch",
             {"`ifdef NEVER\n`else\nmodule m(input a);\nendmodule\n`endif"},
             "ok; in a"},
        Case{
            "DefineInBodyReachesLaterFiles",
            {"module first; `define LATER 9\nendmodule", "module m(input [`LATER:0] a); endmodule"},
            "ok; in a[9:0]"},
        Case{"DuplicateInLaterFileIgnored",
             {"module m(input a); endmodule", "module m(output [1:0] z); endmodule"},
             "ok; in a\n"
             "t1.v:1:8: warning: module 'm' is already declared at t.v:1; the first declaration is "
             "used"},
        Case{"InterfaceWithoutModport",
             {"interface bus_if; logic x; endinterface\n"
              "typedef logic [2:0] t3;\n"
              "module m(bus_if port_a, t3 b, input t3 c); endmodule"},
             "ok; interface bus_if port_a; inout t3 b[2:0]; in t3 c[2:0]"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    DeepInput, VerilogReadTest,
    testing::Values(
        Case{"FlatSumOf500IsNotNesting",
             {"module m(input [" + repeat("1", 500, "+") + ":0] a); endmodule\n"},
             "ok; in a[500:0]"},
        Case{"FlatSumOf200000",
             {"module m(input [" + repeat("1", 200000, " + ") + ":0] a);\n" +
              "localparam U = " + repeat("2", 200000, "*") + ";\nendmodule\n"},
             "ok; in a[200000:0]"},
        Case{"ShortParameterChain", {parameterChain(100)}, "ok; out a[99:0]"},
        Case{"ParameterChainOf20000",
             {parameterChain(20000)},
             "ok; out a ? port 'a': cannot evaluate [P19999:0]: evaluation is nested too deeply\n"
             "t.v:1:28: warning: cannot evaluate the range of port 'a': evaluation is nested too "
             "deeply"},
        Case{"NestedStructs",
             {"module m(input " + repeat("struct packed { ", 100000) + "logic a; " +
              repeat("} b; ", 99999) + "} x); endmodule\n"},
             "bad\n"
             "t.v:1:6416: error: data type nested too deeply"},
        Case{"SelectChain",
             {"module m(input [P" + repeat("[0]", 100000) + ":0] a); endmodule\n"},
             "bad\n"
             "t.v:1:1221: error: expression nested too deeply"},
        Case{"DeepParentheses",
             {"module m(input [" + repeat("(", 100000) + "1" + repeat(")", 100000) +
              ":0] a);\nendmodule\n"},
             "bad\n"
             "t.v:1:216: error: expression nested too deeply"},
        Case{
            "DeepConcatenations",
            {"module m(.a(" + repeat("{", 100000) + "x" + repeat("}", 100000) + "));\nendmodule\n"},
            "bad\n"
            "t.v:1:14: error: expected a port name"},
        Case{"DeepConditionals",
             {repeat("`ifdef X\n", 100000) + repeat("`endif\n", 100000) +
              "module m(input a); endmodule\n"},
             "ok; in a"},
        Case{"DeepBlocksInBody",
             {"module m(input a);\n" + repeat("begin ", 100000) + repeat("end ", 100000) +
              "\nendmodule\n"},
             "ok; in a"},
        Case{"DeepStatementsInFunction",
             {"module m(input [f(0):0] a);\nfunction integer f(input integer n);\n" +
              repeat("begin ", 100000) + "f = 1;" + repeat("end ", 100000) +
              "\nendfunction\nendmodule\n"},
             "ok; in a ? port 'a': cannot evaluate [f(0):0]: function 'f' uses statements that "
             "cannot be evaluated\n"
             "t.v:1:25: warning: cannot evaluate the range of port 'a': function 'f' uses "
             "statements that cannot be evaluated"},
        Case{"HugeLine",
             {"module m(input a, output b);\n" +
              repeat("AND2 \\u[1] (.A(\\n[2] ), .Y(n3)); ", 400000) + "\nendmodule\n"},
             "ok; in a; out b"},
        Case{"MutualMacroRecursion",
             {"`define A `B\n`define B `A\nmodule m(input a); `A endmodule\n"},
             "ok; in a\n"
             "t.v:3:20: error: macro `B expands too deeply (recursive definition?)"},
        Case{"SelfReferentialTypedef",
             {"typedef t_t t_t;\nmodule m(input t_t a); endmodule\n"},
             "ok; in t_t a ? port 'a': cannot evaluate t_t: type definitions nested too deeply\n"
             "t.v:2:20: warning: cannot evaluate the range of port 'a': type definitions nested "
             "too deeply"},
        Case{"BinaryGarbage",
             {std::string("module m(input a);\0\xff\x01`\\\"(*", 23) + "\nendmodule\n"},
             "ok; in a"},
        Case{"UnterminatedEverything",
             {"module m(input a); `define X(a \"str\n(* attr"},
             "ok; in a\n"
             "t.v:1:20: error: malformed argument list of macro `X\n"
             "t.v:2:1: error: unterminated attribute\n"
             "t.v:1:1: error: missing endmodule for module 'm'"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    HeaderErrors, VerilogReadTest,
    testing::Values(
        Case{"Clean", {"module m(input a, output [3:0] b); endmodule\n"}, "ok; in a; out b[3:0]"},
        Case{"SyntaxErrorInParameters",
             {"module m #(parameter W = ) (input a); endmodule\n"},
             "bad\n"
             "t.v:1:26: error: expected an expression but found ')'"},
        Case{"SyntaxErrorInPorts",
             {"module m(input a, output [3:0 b); endmodule\n"},
             "bad; in a\n"
             "t.v:1:31: error: expected ']' but found 'b'"},
        Case{"MissingPortName",
             {"module m(input a, output);\nendmodule\n"},
             "bad; in a\n"
             "t.v:1:25: error: expected a port name"},
        Case{"UnterminatedStringInPorts",
             {"module m(input a, output \"b);\nendmodule\n"},
             "bad; in a\n"
             "t.v:1:26: error: unterminated string\n"
             "t.v:1:26: error: expected a port name"},
        Case{"UnterminatedCommentSwallowsPorts",
             {"module m(input a, /* output b);\nendmodule\n"},
             "bad; in a\n"
             "t.v:1:19: error: unterminated comment\n"
             "t.v:1:1: error: missing endmodule for module 'm'"},
        Case{"NulByteInPorts",
             {std::string("module m(input a,\0 output b); endmodule\n", 41)},
             "bad; in a\n"
             "t.v:1:18: error: expected a port name"},
        Case{"DeepNestingInPorts",
             {"module m(input [" + repeat("(", 1000) + "1" + repeat(")", 1000) +
              ":0] a); endmodule\n"},
             "bad\n"
             "t.v:1:216: error: expression nested too deeply"},
        Case{"RecursiveMacroInPorts",
             {"`define A `A\nmodule m(input [`A:0] a); endmodule\n"},
             "bad\n"
             "t.v:2:17: error: macro `A expands too deeply (recursive definition?)\n"
             "t.v:2:19: error: expected an expression but found ':'"},
        Case{"TruncatedAfterAPort",
             {"module m(input wire a, outpu"},
             "bad; in wire a\n"
             "t.v:1:1: error: missing endmodule for module 'm'"},
        Case{"TruncatedInAType",
             {"module m(input wi"},
             "bad\n"
             "t.v:1:1: error: missing endmodule for module 'm'"},
        Case{"TruncatedNonAnsiList",
             {"module m(a, b"},
             "bad\n"
             "t.v:1:1: error: missing endmodule for module 'm'\n"
             "t.v:1:10: error: port 'a' has no input, output or inout declaration"},
        Case{"NonAnsiDeclarationError",
             {"module m(a, b);\ninput a;\noutput [3:0 b;\nendmodule\n"},
             "bad; in a; out b\n"
             "t.v:3:13: error: expected ']' but found 'b'"},
        Case{"NonAnsiDeclarationJunk",
             {"module m(a);\ninput a b;\nendmodule\n"},
             "bad\n"
             "t.v:1:10: error: port 'a' has no input, output or inout declaration"},
        Case{"UndeclaredNonAnsiPort",
             {"module m(a, b);\ninput b;\nendmodule\n"},
             "bad; in b\n"
             "t.v:1:10: error: port 'a' has no input, output or inout declaration"},
        Case{"ErrorInAnotherUnit",
             {"module other(input [ a); endmodule\nmodule m(input a); endmodule\n"},
             "ok; in a"},
        Case{"RecursiveMacroInAnotherUnit",
             {"`define A `A\nmodule other(input [`A:0] a); endmodule\n"
              "module m(input a); endmodule\n"},
             "ok; in a\n"
             "t.v:2:21: error: macro `A expands too deeply (recursive definition?)"},
        Case{"MissingEndmoduleResyncs",
             {"module a(input x);\nmodule m(input [3:0] y);\nendmodule\n"},
             "ok; in y[3:0]\n"
             "t.v:1:1: error: missing endmodule for module 'a'"},
        Case{"DuplicateModuleKeepsFirst",
             {"module m(input a); endmodule\nmodule m(input b, c); endmodule\n"},
             "ok; in a\n"
             "t.v:2:8: warning: module 'm' is already declared at t.v:1; the first declaration is "
             "used"},
        Case{"ErrorInTheBodyOnly", {"module m(input a);\nassign x = (;\nendmodule\n"}, "ok; in a"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    Preprocessor, VerilogReadTest,
    testing::Values(
        Case{"UndefinedMacro",
             {"module m(input `FOO a);\nendmodule\n"},
             "bad; in a\n"
             "t.v:1:16: error: undefined macro `FOO"},
        Case{"UnterminatedIfdef",
             {"`ifdef X\nmodule m; endmodule\n"},
             "bad\n"
             "t.v:1:1: error: unterminated `ifdef: no `endif before the end of the file"},
        Case{"ElseWithoutIfdef",
             {"`else\n"},
             "bad\n"
             "t.v:1:1: error: `else without a matching `ifdef"},
        Case{"ElsifAfterElse",
             {"`ifdef A\n`else\n`elsif B\n`endif\n"},
             "bad\n"
             "t.v:3:1: error: `elsif after `else"},
        Case{"MissingInclude",
             {"`include \"nope.vh\"\n"},
             "bad\n"
             "t.v:1:1: error: cannot find include file \"nope.vh\""},
        Case{"IncludeDevice",
             {"`include \"/dev/zero\"\n"},
             "bad\n"
             "t.v:1:1: error: cannot read include file \"/dev/zero\": not a regular file"},
        Case{"ExponentialMacro",
             {longMacroChain()},
             "bad\n"
             "t.v:42:1: error: expansion of macro `A40 is too large"},
        Case{"TooManyMacroArguments",
             {"`define F(a, b) a\n`F(1, 2, 3)\n"},
             "bad\n"
             "t.v:2:1: error: too many arguments for macro `F"},
        Case{"MissingMacroArguments",
             {"`define F(a) a\n`F;\n"},
             "bad\n"
             "t.v:2:1: error: macro `F needs an argument list"},
        Case{"UnterminatedComment",
             {"module m; endmodule /* open"},
             "ok\n"
             "t.v:1:21: error: unterminated comment"},
        Case{"UnnamedModule",
             {"module (input x);\nendmodule\n"},
             "bad\n"
             "t.v:1:1: error: expected a name after 'module'"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    Evaluation, VerilogReadTest,
    testing::Values(
        Case{"UnknownParameter",
             {"module m(input [W-1:0] a); endmodule\n"},
             "ok; in a ? port 'a': cannot evaluate [W-1:0]: unknown name 'W'\n"
             "t.v:1:24: warning: cannot evaluate the range of port 'a': unknown name 'W'"},
        Case{"CircularParameters",
             {"module m #(parameter A = B, B = A) (input [A:0] x); endmodule\n"},
             "ok; in x ? port 'x': cannot evaluate [A:0]: parameter 'A' depends on itself\n"
             "t.v:1:49: warning: cannot evaluate the range of port 'x': parameter 'A' depends on "
             "itself"},
        Case{"DivisionByZero",
             {"module m(input [1/0:0] a); endmodule\n"},
             "ok; in a ? port 'a': cannot evaluate [1/0:0]: division by zero\n"
             "t.v:1:24: warning: cannot evaluate the range of port 'a': division by zero"},
        Case{"EndlessFunction",
             {"module m(input [f(1):0] a);\n"
              "function integer f(input integer n); while (1) n = n + 1; endfunction\n"
              "endmodule\n"},
             "ok; in a ? port 'a': cannot evaluate [f(1):0]: constant function did not finish "
             "within 1000000 steps\n"
             "t.v:1:25: warning: cannot evaluate the range of port 'a': constant function did not "
             "finish within 1000000 steps"},
        Case{"IntUnsignedWraps",
             {"module m #(parameter int unsigned NoRules = 32'd0)\n"
              "  (input [NoRules-1:0] a, input [NoRules:0] b, input [NoRules-1:NoRules-4] c);\n"
              "endmodule\n"},
             "ok; in a ? port 'a': [4294967295:0] does not fit 32-bit bounds; in b[0:0]; in c ? "
             "port 'c': [4294967295:4294967292] does not fit 32-bit bounds\n"
             "t.v:2:24: warning: port 'a': its bounds do not fit in 32 bits; no range reported\n"
             "t.v:2:76: warning: port 'c': its bounds do not fit in 32 bits; no range reported"},
        Case{"SizedLiteralParameterWraps",
             {"module m(input [N-1:0] a, input [S-1:0] b);\nlocalparam N = 8'd0, S = 8'sd0;\n"
              "endmodule\n"},
             "ok; in a ? port 'a': [4294967295:0] does not fit 32-bit bounds; in b[-1:0] asc\n"
             "t.v:1:24: warning: port 'a': its bounds do not fit in 32 bits; no range reported"},
        Case{"TypedParameterTruncates",
             {"module m #(parameter [3:0] U = 20, parameter signed [3:0] S = 15,\n"
              "           parameter int I = 32'hFFFF_FFFF)"
              "\n  (input [U:0] a, input [S:-2] b, input [I:-2] c); endmodule\n"},
             "ok; in a[4:0]; in b[-1:-2]; in c[-1:-2]"},
        Case{"ParameterArrays",
             {"module m #(parameter int W[2] = '{8, 16})\n"
              "  (input [W[1]-1:0] a, input [W[0]-1:0] b, output [T[2]:T[3]] c,\n"
              "   output [K[1]:K[2]] d, output [R[3]:0] e);\n"
              "localparam [7:0] T [0:3] = '{1, 2, 300, 8};\n"
              "localparam int K [4] = '{default: 3, 1: 5};\n"
              "localparam int R [3:0] = '{4{6}};\n"
              "endmodule\n"},
             "ok; in a[15:0]; in b[7:0]; out c[44:8]; out d[5:3]; out e[6:0]"},
        Case{"ParameterArrayOutOfRange",
             {"module m(input [T[4]:0] a);\nlocalparam int T [0:3] = '{1, 2, 3, 4};\nendmodule\n"},
             "ok; in a ? port 'a': cannot evaluate [T[4]:0]: index 4 is outside parameter array "
             "'T'\n"
             "t.v:1:25: warning: cannot evaluate the range of port 'a': index 4 is outside "
             "parameter array 'T'"},
        Case{"BitSelectsInConstantFunctions",
             {"module m(input [f(2):0] a, input [f(0)-1:0] b);\n"
              "function automatic integer f(input integer n);\n"
              "  reg [7:0] x;\n"
              "  begin x = 0; x[n] = 1'b1; x[7:6] = 2'b11; x[1 +: 1] = x[n]; f = x; end\n"
              "endfunction\nendmodule\n"},
             "ok; in a[198:0]; in b[194:0]"},
        Case{"BoundBeyond64Bits",
             {"module m(input [64'h1_0000_0000:0] a, input [80'h1_0000_0000_0000_0000:0] b);\n"
              "endmodule\n"},
             "ok; in a ? port 'a': [4294967296:0] does not fit 32-bit bounds; in b ? port 'b': "
             "cannot evaluate [80'h1_0000_0000_0000_0000:0]: the literal does not fit in 64 bits\n"
             "t.v:1:36: warning: port 'a': its bounds do not fit in 32 bits; no range reported\n"
             "t.v:1:75: warning: cannot evaluate the range of port 'b': the literal does not fit "
             "in 64 bits"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    RangeProblems, VerilogReadTest,
    testing::Values(
        Case{"ParameterWithoutDefault",
             {"module m #(parameter W) (input logic [W-1:0] data);\nendmodule\n"},
             "ok; in logic data ? port 'data': cannot evaluate [W-1:0]: parameter 'W' has no "
             "value; give one with -g W=VALUE\n"
             "t.v:1:46: warning: cannot evaluate the range of port 'data': parameter 'W' has no "
             "value"},
        Case{"OverrideGivesTheMissingValue",
             {"module m #(parameter W) (input logic [W-1:0] data);\nendmodule\n"},
             "ok; in logic data[2:0]",
             overrides({{"W", "3"}})},
        Case{"ScopedTypeOfAMissingPackage",
             {"module m (input axi_pkg::req_t req);\nendmodule\n"},
             "ok; in req_t req ? port 'req': cannot evaluate axi_pkg::req_t: package 'axi_pkg' is "
             "not in any design file; add the file that declares it\n"
             "t.v:1:32: warning: cannot evaluate the range of port 'req': unknown type 'req_t'"},
        Case{"ScopedNameOfAMissingPackage",
             {"module m (input logic [axi_pkg::W-1:0] d);\nendmodule\n"},
             "ok; in logic d ? port 'd': cannot evaluate [axi_pkg::W-1:0]: package 'axi_pkg' is "
             "not in any design file; add the file that declares it\n"
             "t.v:1:40: warning: cannot evaluate the range of port 'd': unknown package 'axi_pkg'"},
        Case{"NameFromAMissingImportedPackage",
             {"import axi_pkg::*;\nmodule m (input logic [AW-1:0] a);\nendmodule\n"},
             "ok; in logic a ? port 'a': cannot evaluate [AW-1:0]: unknown name 'AW'; package "
             "'axi_pkg' is not in any design file; add the file that declares it\n"
             "t.v:2:32: warning: cannot evaluate the range of port 'a': unknown name 'AW'"},
        Case{"TypeFromMissingImportedPackages",
             {"module m import a_pkg::*, b_pkg::*; (input req_t r);\nendmodule\n"},
             "ok; in req_t r ? port 'r': cannot evaluate req_t: unknown type 'req_t'; packages "
             "'a_pkg' and 'b_pkg' are not in any design file; add the files that declare them\n"
             "t.v:1:50: warning: cannot evaluate the range of port 'r': unknown type 'req_t'"},
        Case{
            "LocalparamWithoutValueHasNoOverrideHint",
            {"module m (a);\n  localparam W;\n  input [W:0] a;\nendmodule\n"},
            "ok; in a ? port 'a': cannot evaluate [W:0]: parameter 'W' has no value\n"
            "t.v:3:15: warning: cannot evaluate the range of port 'a': parameter 'W' has no value"},
        Case{"UnsupportedConstruct",
             {"module m (input logic [$random:0] x);\nendmodule\n"},
             "ok; in logic x ? port 'x': cannot evaluate [$random:0]: unsupported system function "
             "$random\n"
             "t.v:1:35: warning: cannot evaluate the range of port 'x': unsupported system "
             "function $random"},
        Case{
            "FailureInsideATypedef",
            {"module m #(parameter W) (x);\n  typedef logic [W:0] w_t;\n  input w_t "
             "x;\nendmodule\n"},
            "ok; in w_t x ? port 'x': cannot evaluate w_t: parameter 'W' has no value; give one "
            "with -g W=VALUE\n"
            "t.v:3:13: warning: cannot evaluate the range of port 'x': parameter 'W' has no value"},
        Case{"NonAnsiSelect",
             {"module m (.p(x[W-1:0]));\n  parameter W;\n  input [7:0] x;\nendmodule\n"},
             "ok; in p ? port 'p': cannot evaluate .p(x[W-1:0]): parameter 'W' has no value; give "
             "one with -g W=VALUE\n"
             "t.v:3:15: warning: cannot evaluate the range of port 'p': parameter 'W' has no "
             "value"}),
    verilog_test::Label());

INSTANTIATE_TEST_SUITE_P(
    CommandLine, VerilogReadTest,
    testing::Values(
        Case{"MacrosComeBeforeTheFirstFile",
             {"`ifdef FLAG\n"
              "module m (input [`ADD(2, 3):0] a);\n"
              "`else\n"
              "module m (input b);\n"
              "`endif\n"
              "endmodule\n"},
             "ok; in a[5:0]",
             macros({{"ADD(x, y)", "x + y"}, {"FLAG", ""}, {"LATE", "1"}})},
        Case{"BadValuesAreErrorsNamingTheSwitch",
             {"module m #(parameter W = 1, V = 1, type T = int) (input [W:0] a);\n"
              "endmodule\n"},
             "bad; in a[1:0]\n"
             "-D 1BAD: error: '1BAD' is not a macro name\n"
             "-g W: error: expected an expression but found the end of the file\n"
             "-g V:1:3: error: unexpected '3' after the value\n"
             "-g T: error: expected ']' but found the end of the file",
             [] {
               ScanSettings settings = overrides({{"W", "3 +"}, {"V", "2 3"}, {"T", "[3:0"}});
               settings.macros = {{"1BAD", "2"}};
               return settings;
             }()}),
    verilog_test::Label());

struct FileCase {
  const char* label;
  std::vector<std::pair<std::string, std::string>> written;  ///< name, text; "" for a FIFO
  std::vector<std::string> files;                            ///< design files in the folder
  const char* unit;
  std::string outcome;  ///< "@" stands for the folder
};

// Unreadable design and include files: an include cycle, a missing file, and FIFOs, which
// would block the open until a writer came.
TEST(VerilogFileTest, UnreadableFilesAreReported) {
  const std::vector<FileCase> cases = {
      {"IncludeCycle",
       {{"a.vh", "`include \"b.vh\"\n"},
        {"b.vh", "`include \"a.vh\"\n"},
        {"top.v", "`include \"a.vh\"\nmodule m(input a); endmodule\n"}},
       {"top.v"},
       "m",
       "ok; in a\n@/b.vh:1:1: error: include cycle: \"a.vh\" is already being read"},
      {"MissingDesignFile",
       {},
       {"x.v"},
       "x",
       "bad\n@/x.v: error: cannot read the file: No such file or directory"},
      {"FifoDesignFileAndInclude",
       {{"f.vh", ""}, {"top.v", "`include \"f.vh\"\nmodule m(input a); endmodule\n"}},
       {"f.vh", "top.v"},
       "m",
       "ok; in a\n@/f.vh: error: cannot read the file: not a regular file\n"
       "@/top.v:1:1: error: cannot read include file \"f.vh\": not a regular file"},
  };
  for (const FileCase& c : cases) {
    SCOPED_TRACE(c.label);
    pinforge_test::ScratchDir dir;
    for (const auto& [name, text] : c.written)
      ASSERT_TRUE(text.empty() ? ::mkfifo(dir.file(name).c_str(), 0600) == 0
                               : dir.write(name, text));
    verilog_test::Input input{{}, c.unit};
    for (const std::string& name : c.files) input.files.push_back(dir.file(name));
    std::string expected;
    for (const char ch : c.outcome) expected += ch == '@' ? dir.path() : std::string(1, ch);
    EXPECT_EQ(outcome(read(input)), expected);
  }
}

}  // namespace
