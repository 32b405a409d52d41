// Text in, verdict out: small designs and hostile or truncated Verilog must end in the right
// ports, the right verdict on the selected unit's header and the exact messages, never in a
// crash, a hang or unbounded memory. The cases of reader_cases.txt cover the reporting rules
// for ports, header, preprocessor and -g/-D errors of every kind and the evaluator's width
// rules; the inputs too large or too odd for a text file are generated here.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "verilog_read.h"

namespace {

using verilog_test::Case;
using verilog_test::outcome;
using verilog_test::read;

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

class VerilogReadTest : public testing::TestWithParam<verilog_test::Case> {};

TEST_P(VerilogReadTest, ReadsAsExpected) {
  EXPECT_EQ(outcome(read(GetParam().input())), GetParam().outcome);
}

INSTANTIATE_TEST_SUITE_P(Cases, VerilogReadTest,
                         testing::ValuesIn(verilog_test::casesFromFile("reader_cases.txt")),
                         verilog_test::Label());

// Inputs too large or too odd for the case file.
INSTANTIATE_TEST_SUITE_P(
    Generated, VerilogReadTest,
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
        Case{"BinaryGarbage",
             {std::string("module m(input a);\0\xff\x01`\\\"(*", 23) + "\nendmodule\n"},
             "ok; in a"},
        Case{"NulByteInPorts",
             {std::string("module m(input a,\0 output b); endmodule\n", 41)},
             "bad; in a\n"
             "t.v:1:18: error: expected a port name"},
        Case{"DeepNestingInPorts",
             {"module m(input [" + repeat("(", 1000) + "1" + repeat(")", 1000) +
              ":0] a); endmodule\n"},
             "bad\n"
             "t.v:1:216: error: expression nested too deeply"},
        Case{"ExponentialMacro",
             {longMacroChain()},
             "bad\n"
             "t.v:42:1: error: expansion of macro `A40 is too large"}),
    verilog_test::Label());

}  // namespace
