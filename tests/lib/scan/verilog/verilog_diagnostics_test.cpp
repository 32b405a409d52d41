// Error paths of the Verilog reader: exact message texts, and hostile input (runaway macros,
// include cycles, deep nesting, huge lines) that must end in a message instead of a crash, a
// hang or unbounded memory.
#include <gtest/gtest.h>

#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_reader.h"
#include "support/scratch_dir.h"

namespace {

using pinforge_test::FilePtr;
using pinforge_test::messageHeads;
using pinforge_test::readBack;

struct ReadResult {
  std::vector<std::string> messages;  ///< first line of every message
  std::vector<ScanPort> ports;
  bool found = false;
};

ReadResult readText(const std::string& text, const char* unit = "m") {
  ReadResult result;
  FilePtr sink(std::tmpfile());
  {
    scan::Diagnostics diagnostics(sink.get(), 1000);
    scan::verilog::VerilogReader reader(diagnostics);
    reader.indexText("t.v", text, "work");
    result.found = reader.selectUnit("work", unit);
    scan::UnitDescription description;
    if (result.found) reader.readUnit(description);
    result.ports = std::move(description.ports);
  }
  result.messages = messageHeads(readBack(sink.get()));
  return result;
}

struct MessageCase {
  const char* label;
  std::string text;
  std::vector<std::string> messages;
};

class VerilogMessageTest : public testing::TestWithParam<MessageCase> {};

TEST_P(VerilogMessageTest, PrintsExactly) {
  EXPECT_EQ(readText(GetParam().text).messages, GetParam().messages);
}

std::string longMacroChain() {
  std::string text = "`define A0 x x\n";
  for (int i = 1; i <= 40; ++i)
    text += "`define A" + std::to_string(i) + " `A" + std::to_string(i - 1) + " `A" +
            std::to_string(i - 1) + "\n";
  return text + "`A40\n";
}

INSTANTIATE_TEST_SUITE_P(
    Messages, VerilogMessageTest,
    testing::Values(
        MessageCase{"UndefinedMacro",
                    "module m(input `FOO a);\nendmodule\n",
                    {"t.v:1:16: error: undefined macro `FOO"}},
        MessageCase{"UnterminatedIfdef",
                    "`ifdef X\nmodule m; endmodule\n",
                    {"t.v:1:1: error: unterminated `ifdef: no `endif before the end of the file"}},
        MessageCase{
            "ElseWithoutIfdef", "`else\n", {"t.v:1:1: error: `else without a matching `ifdef"}},
        MessageCase{"ElsifAfterElse",
                    "`ifdef A\n`else\n`elsif B\n`endif\n",
                    {"t.v:3:1: error: `elsif after `else"}},
        MessageCase{"MissingInclude",
                    "`include \"nope.vh\"\n",
                    {"t.v:1:1: error: cannot find include file \"nope.vh\""}},
        MessageCase{"IncludeDevice",
                    "`include \"/dev/zero\"\n",
                    {"t.v:1:1: error: cannot read include file \"/dev/zero\": not a regular "
                     "file"}},
        MessageCase{"ExponentialMacro",
                    longMacroChain(),
                    {"t.v:42:1: error: expansion of macro `A40 is too large"}},
        MessageCase{"TooManyMacroArguments",
                    "`define F(a, b) a\n`F(1, 2, 3)\n",
                    {"t.v:2:1: error: too many arguments for macro `F"}},
        MessageCase{"MissingMacroArguments",
                    "`define F(a) a\n`F;\n",
                    {"t.v:2:1: error: macro `F needs an argument list"}},
        MessageCase{"UnterminatedComment",
                    "module m; endmodule /* open",
                    {"t.v:1:21: error: unterminated comment"}},
        MessageCase{"UnnamedModule",
                    "module (input x);\nendmodule\n",
                    {"t.v:1:1: error: expected a name after 'module'"}},
        MessageCase{"UnknownParameter",
                    "module m(input [W-1:0] a); endmodule\n",
                    {"t.v:1:24: warning: cannot evaluate the range of port 'a': unknown name 'W'"}},
        MessageCase{"CircularParameters",
                    "module m #(parameter A = B, B = A) (input [A:0] x); endmodule\n",
                    {"t.v:1:49: warning: cannot evaluate the range of port 'x': parameter 'A' "
                     "depends on itself"}},
        MessageCase{"DivisionByZero",
                    "module m(input [1/0:0] a); endmodule\n",
                    {"t.v:1:24: warning: cannot evaluate the range of port 'a': division by zero"}},
        MessageCase{"EndlessFunction",
                    "module m(input [f(1):0] a);\n"
                    "function integer f(input integer n); while (1) n = n + 1; endfunction\n"
                    "endmodule\n",
                    {"t.v:1:25: warning: cannot evaluate the range of port 'a': constant function "
                     "did not finish within 1000000 steps"}},
        MessageCase{"UndeclaredNonAnsiPort",
                    "module m(a, b);\ninput b;\nendmodule\n",
                    {"t.v:1:10: error: port 'a' has no input, output or inout declaration"}},
        MessageCase{"HeaderSyntaxError",
                    "module m(input a, output);\nendmodule\n",
                    {"t.v:1:25: error: expected a port name"}}),
    [](const testing::TestParamInfo<MessageCase>& info) { return std::string(info.param.label); });

struct HostileCase {
  const char* label;
  std::string text;
  size_t ports;  ///< ports of module m that must still be reported
};

std::string repeat(const std::string& piece, size_t count) {
  std::string out;
  out.reserve(piece.size() * count);
  for (size_t i = 0; i < count; ++i) out += piece;
  return out;
}

class VerilogHostileInputTest : public testing::TestWithParam<HostileCase> {};

TEST_P(VerilogHostileInputTest, EndsWithoutCrashing) {
  ReadResult result = readText(GetParam().text);
  EXPECT_EQ(result.ports.size(), GetParam().ports);
}

INSTANTIATE_TEST_SUITE_P(
    Hostile, VerilogHostileInputTest,
    testing::Values(
        HostileCase{"DeepParentheses",
                    "module m(input [" + repeat("(", 100000) + "1" + repeat(")", 100000) +
                        ":0] a);\nendmodule\n",
                    0},
        HostileCase{
            "DeepConcatenations",
            "module m(.a(" + repeat("{", 100000) + "x" + repeat("}", 100000) + "));\nendmodule\n",
            0},
        HostileCase{"DeepConditionals",
                    repeat("`ifdef X\n", 100000) + repeat("`endif\n", 100000) +
                        "module m(input a); endmodule\n",
                    1},
        HostileCase{"DeepBlocksInBody",
                    "module m(input a);\n" + repeat("begin ", 100000) + repeat("end ", 100000) +
                        "\nendmodule\n",
                    1},
        HostileCase{"DeepStatementsInFunction",
                    "module m(input [f(0):0] a);\nfunction integer f(input integer n);\n" +
                        repeat("begin ", 100000) + "f = 1;" + repeat("end ", 100000) +
                        "\nendfunction\nendmodule\n",
                    1},
        HostileCase{"HugeLine",
                    "module m(input a, output b);\n" +
                        repeat("AND2 \\u[1] (.A(\\n[2] ), .Y(n3)); ", 400000) + "\nendmodule\n",
                    2},
        HostileCase{"MutualMacroRecursion",
                    "`define A `B\n`define B `A\nmodule m(input a); `A endmodule\n", 1},
        HostileCase{"SelfReferentialTypedef",
                    "typedef t_t t_t;\nmodule m(input t_t a); endmodule\n", 1},
        HostileCase{"BinaryGarbage",
                    std::string("module m(input a);\0\xff\x01`\\\"(*", 23) + "\nendmodule\n", 1},
        HostileCase{"UnterminatedEverything", "module m(input a); `define X(a \"str\n(* attr", 1}),
    [](const testing::TestParamInfo<HostileCase>& info) { return std::string(info.param.label); });

TEST(VerilogIncludeTest, IncludeCycleIsAnError) {
  char pattern[] = "/tmp/pinforge_vinc_XXXXXX";
  ASSERT_NE(mkdtemp(pattern), nullptr);
  std::string dir = pattern;
  std::ofstream(dir + "/a.vh") << "`include \"b.vh\"\n";
  std::ofstream(dir + "/b.vh") << "`include \"a.vh\"\n";
  std::ofstream(dir + "/top.v") << "`include \"a.vh\"\nmodule m(input a); endmodule\n";
  FilePtr sink(std::tmpfile());
  size_t ports = 0;
  {
    scan::Diagnostics diagnostics(sink.get(), 1000);
    scan::verilog::VerilogReader reader(diagnostics);
    reader.indexFiles({{"work", dir + "/top.v"}});
    scan::UnitDescription description;
    if (reader.selectUnit("work", "m") && (reader.readUnit(description), true))
      ports = description.ports.size();
  }
  std::vector<std::string> messages = messageHeads(readBack(sink.get()));
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_EQ(messages[0], dir + "/b.vh:1:1: error: include cycle: \"a.vh\" is already being read");
  EXPECT_EQ(ports, 1u);
  for (const char* name : {"a.vh", "b.vh", "top.v"}) unlink((dir + "/" + name).c_str());
  rmdir(dir.c_str());
}

TEST(VerilogIncludeTest, UnreadableDesignFileIsReported) {
  FilePtr sink(std::tmpfile());
  {
    scan::Diagnostics diagnostics(sink.get(), 1000);
    scan::verilog::VerilogReader reader(diagnostics);
    reader.indexFiles({{"work", "/nonexistent/x.v"}});
    EXPECT_FALSE(reader.selectUnit("work", "x"));
  }
  std::vector<std::string> messages = messageHeads(readBack(sink.get()));
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_EQ(messages[0],
            "/nonexistent/x.v: error: cannot read the file: No such file or directory");
}

}  // namespace
