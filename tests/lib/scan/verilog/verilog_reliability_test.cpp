// Hostile and truncated Verilog that must end in the right ports, the right verdict on the
// selected unit's header and the exact messages: huge flat expressions and parameter chains
// (generated here), header errors of every kind, and the evaluator's width rules.
#include <gtest/gtest.h>

#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_reader.h"
#include "support/scratch_dir.h"

namespace {

struct Outcome {
  std::vector<std::string> messages;  ///< first line of every message
  std::vector<std::string> ports;     ///< "name" or "name[left:right]"
  bool headerOk = false;              ///< readUnit's verdict
};

Outcome read(const std::string& text) {
  Outcome outcome;
  pinforge_test::FilePtr sink(std::tmpfile());
  {
    scan::Diagnostics diagnostics(sink.get(), 1000);
    scan::verilog::VerilogReader reader(diagnostics);
    reader.indexText("t.v", text, "work");
    if (reader.selectUnit("work", "m")) {
      scan::UnitDescription unit;
      outcome.headerOk = reader.readUnit(unit);
      for (const ScanPort& port : unit.ports) {
        std::string shown = port.name();
        if (port.hasRange()) {
          int32_t left = 0, right = 0;
          port.getBounds(left, right);
          shown += "[" + std::to_string(left) + ":" + std::to_string(right) + "]";
        }
        outcome.ports.push_back(shown);
      }
    }
  }
  outcome.messages = pinforge_test::messageHeads(pinforge_test::readBack(sink.get()));
  return outcome;
}

std::string joined(const std::string& piece, const std::string& separator, size_t count) {
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

struct Case {
  const char* label;
  std::string text;
  std::vector<std::string> ports;
  bool headerOk;
  std::vector<std::string> messages;
};

class VerilogReliabilityTest : public testing::TestWithParam<Case> {};

TEST_P(VerilogReliabilityTest, ReadsAsExpected) {
  Outcome outcome = read(GetParam().text);
  EXPECT_EQ(outcome.ports, GetParam().ports);
  EXPECT_EQ(outcome.headerOk, GetParam().headerOk);
  EXPECT_EQ(outcome.messages, GetParam().messages);
}

std::string label(const testing::TestParamInfo<Case>& info) { return info.param.label; }

INSTANTIATE_TEST_SUITE_P(
    DeepInput, VerilogReliabilityTest,
    testing::Values(
        Case{"FlatSumOf500IsNotNesting",
             "module m(input [" + joined("1", "+", 500) + ":0] a); endmodule\n",
             {"a[500:0]"},
             true,
             {}},
        Case{"FlatSumOf200000",
             "module m(input [" + joined("1", " + ", 200000) + ":0] a);\n" +
                 "localparam U = " + joined("2", "*", 200000) + ";\nendmodule\n",
             {"a[200000:0]"},
             true,
             {}},
        Case{"ShortParameterChain", parameterChain(100), {"a[99:0]"}, true, {}},
        Case{"ParameterChainOf20000",
             parameterChain(20000),
             {"a"},
             true,
             {"t.v:1:28: warning: cannot evaluate the range of port 'a': evaluation is nested "
              "too deeply"}},
        Case{"NestedStructs",
             "module m(input " + joined("struct packed { ", "", 100000) + "logic a; " +
                 joined("} b; ", "", 99999) + "} x); endmodule\n",
             {},
             false,
             {"t.v:1:6416: error: data type nested too deeply"}},
        Case{"SelectChain",
             "module m(input [P" + joined("[0]", "", 100000) + ":0] a); endmodule\n",
             {},
             false,
             {"t.v:1:1221: error: expression nested too deeply"}}),
    label);

INSTANTIATE_TEST_SUITE_P(
    HeaderErrors, VerilogReliabilityTest,
    testing::Values(
        Case{"Clean", "module m(input a, output [3:0] b); endmodule\n", {"a", "b[3:0]"}, true, {}},
        Case{"SyntaxErrorInParameters",
             "module m #(parameter W = ) (input a); endmodule\n",
             {},
             false,
             {"t.v:1:26: error: expected an expression but found ')'"}},
        Case{"SyntaxErrorInPorts",
             "module m(input a, output [3:0 b); endmodule\n",
             {"a"},
             false,
             {"t.v:1:31: error: expected ']' but found 'b'"}},
        Case{"UnterminatedStringInPorts",
             "module m(input a, output \"b);\nendmodule\n",
             {"a"},
             false,
             {"t.v:1:26: error: unterminated string", "t.v:1:26: error: expected a port name"}},
        Case{"UnterminatedCommentSwallowsPorts",
             "module m(input a, /* output b);\nendmodule\n",
             {"a"},
             false,
             {"t.v:1:19: error: unterminated comment",
              "t.v:1:1: error: missing endmodule for module 'm'"}},
        Case{"NulByteInPorts",
             std::string("module m(input a,\0 output b); endmodule\n", 41),
             {"a"},
             false,
             {"t.v:1:18: error: expected a port name"}},
        Case{"DeepNestingInPorts",
             "module m(input [" + joined("(", "", 1000) + "1" + joined(")", "", 1000) +
                 ":0] a); endmodule\n",
             {},
             false,
             {"t.v:1:216: error: expression nested too deeply"}},
        Case{"RecursiveMacroInPorts",
             "`define A `A\nmodule m(input [`A:0] a); endmodule\n",
             {},
             false,
             {"t.v:2:17: error: macro `A expands too deeply (recursive definition?)",
              "t.v:2:19: error: expected an expression but found ':'"}},
        Case{"TruncatedAfterAPort",
             "module m(input wire a, outpu",
             {"a"},
             false,
             {"t.v:1:1: error: missing endmodule for module 'm'"}},
        Case{"TruncatedInAType",
             "module m(input wi",
             {},
             false,
             {"t.v:1:1: error: missing endmodule for module 'm'"}},
        Case{"TruncatedNonAnsiList",
             "module m(a, b",
             {},
             false,
             {"t.v:1:1: error: missing endmodule for module 'm'",
              "t.v:1:10: error: port 'a' has no input, output or inout declaration"}},
        Case{"NonAnsiDeclarationError",
             "module m(a, b);\ninput a;\noutput [3:0 b;\nendmodule\n",
             {"a", "b"},
             false,
             {"t.v:3:13: error: expected ']' but found 'b'"}},
        Case{"NonAnsiDeclarationJunk",
             "module m(a);\ninput a b;\nendmodule\n",
             {},
             false,
             {"t.v:1:10: error: port 'a' has no input, output or inout declaration"}},
        Case{"ErrorInAnotherUnit",
             "module other(input [ a); endmodule\nmodule m(input a); endmodule\n",
             {"a"},
             true,
             {}},
        Case{"RecursiveMacroInAnotherUnit",
             "`define A `A\nmodule other(input [`A:0] a); endmodule\n"
             "module m(input a); endmodule\n",
             {"a"},
             true,
             {"t.v:2:21: error: macro `A expands too deeply (recursive definition?)"}},
        Case{"MissingEndmoduleResyncs",
             "module a(input x);\nmodule m(input [3:0] y);\nendmodule\n",
             {"y[3:0]"},
             true,
             {"t.v:1:1: error: missing endmodule for module 'a'"}},
        Case{"DuplicateModuleKeepsFirst",
             "module m(input a); endmodule\nmodule m(input b, c); endmodule\n",
             {"a"},
             true,
             {"t.v:2:8: warning: module 'm' is already declared at t.v:1; the first "
              "declaration is used"}},
        Case{"ErrorInTheBodyOnly",
             "module m(input a);\nassign x = (;\nendmodule\n",
             {"a"},
             true,
             {}}),
    label);

INSTANTIATE_TEST_SUITE_P(
    Fidelity, VerilogReliabilityTest,
    testing::Values(
        Case{"IntUnsignedWraps",
             "module m #(parameter int unsigned NoRules = 32'd0)\n"
             "  (input [NoRules-1:0] a, input [NoRules:0] b, input [NoRules-1:NoRules-4] c);\n"
             "endmodule\n",
             {"a", "b[0:0]", "c"},
             true,
             {"t.v:2:24: warning: port 'a': its bounds do not fit in 32 bits; no range reported",
              "t.v:2:76: warning: port 'c': its bounds do not fit in 32 bits; no range reported"}},
        Case{"SizedLiteralParameterWraps",
             "module m(input [N-1:0] a, input [S-1:0] b);\nlocalparam N = 8'd0, S = 8'sd0;\n"
             "endmodule\n",
             {"a", "b[-1:0]"},
             true,
             {"t.v:1:24: warning: port 'a': its bounds do not fit in 32 bits; no range reported"}},
        Case{"TypedParameterTruncates",
             "module m #(parameter [3:0] U = 20, parameter signed [3:0] S = 15,\n"
             "           parameter int I = 32'hFFFF_FFFF)"
             "\n  (input [U:0] a, input [S:-2] b, input [I:-2] c); endmodule\n",
             {"a[4:0]", "b[-1:-2]", "c[-1:-2]"},
             true,
             {}},
        Case{"ParameterArrays",
             "module m #(parameter int W[2] = '{8, 16})\n"
             "  (input [W[1]-1:0] a, input [W[0]-1:0] b, output [T[2]:T[3]] c,\n"
             "   output [K[1]:K[2]] d, output [R[3]:0] e);\n"
             "localparam [7:0] T [0:3] = '{1, 2, 300, 8};\n"
             "localparam int K [4] = '{default: 3, 1: 5};\n"
             "localparam int R [3:0] = '{4{6}};\n"
             "endmodule\n",
             {"a[15:0]", "b[7:0]", "c[44:8]", "d[5:3]", "e[6:0]"},
             true,
             {}},
        Case{"ParameterArrayOutOfRange",
             "module m(input [T[4]:0] a);\nlocalparam int T [0:3] = '{1, 2, 3, 4};\nendmodule\n",
             {"a"},
             true,
             {"t.v:1:25: warning: cannot evaluate the range of port 'a': index 4 is outside "
              "parameter array 'T'"}},
        Case{"BitSelectsInConstantFunctions",
             "module m(input [f(2):0] a, input [f(0)-1:0] b);\n"
             "function automatic integer f(input integer n);\n"
             "  reg [7:0] x;\n"
             "  begin x = 0; x[n] = 1'b1; x[7:6] = 2'b11; x[1 +: 1] = x[n]; f = x; end\n"
             "endfunction\nendmodule\n",
             {"a[198:0]", "b[194:0]"},
             true,
             {}},
        Case{"BoundBeyond64Bits",
             "module m(input [64'h1_0000_0000:0] a, input [80'h1_0000_0000_0000_0000:0] b);\n"
             "endmodule\n",
             {"a", "b"},
             true,
             {"t.v:1:36: warning: port 'a': its bounds do not fit in 32 bits; no range reported",
              "t.v:1:75: warning: cannot evaluate the range of port 'b': the literal does not "
              "fit in 64 bits"}}),
    label);

// A FIFO would block the open until a writer came; it is refused as a design file and as an
// include target alike.
TEST(VerilogFifoTest, FifoDesignFileAndIncludeAreRefused) {
  std::string dir = testing::TempDir() + "/vfifo_" + std::to_string(::getpid());
  ASSERT_EQ(::mkdir(dir.c_str(), 0700), 0);
  std::string fifo = dir + "/f.vh";
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  std::ofstream(dir + "/top.v") << "`include \"f.vh\"\nmodule m(input a); endmodule\n";
  std::FILE* sink = std::tmpfile();
  bool found = false;
  {
    scan::Diagnostics diagnostics(sink, 1000);
    scan::verilog::VerilogReader reader(diagnostics);
    reader.indexFiles({{"work", fifo}, {"work", dir + "/top.v"}});
    found = reader.selectUnit("work", "m");
  }
  std::rewind(sink);
  std::string printed;
  char line[4096];
  while (std::fgets(line, sizeof line, sink))
    if (std::string(line).rfind("  ", 0) != 0) printed += line;
  std::fclose(sink);
  EXPECT_TRUE(found);
  EXPECT_EQ(printed, fifo + ": error: cannot read the file: not a regular file\n" + dir +
                         "/top.v:1:1: error: cannot read include file \"f.vh\": not a regular "
                         "file\n");
  for (const char* name : {"/f.vh", "/top.v", ""}) std::remove((dir + name).c_str());
}

}  // namespace
