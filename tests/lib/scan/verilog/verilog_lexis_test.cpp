// The token level of the Verilog reader: lexing, literals, the preprocessor's expansions and
// conditionals, and constant evaluation of expressions, each checked over a table of inputs.
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/verilog/verilog_lexer.h"
#include "scan/verilog/verilog_preprocessor.h"
#include "scan/verilog/verilog_sources.h"
#include "support/scratch_dir.h"
#include "verilog_read.h"

namespace scan::verilog {
namespace {

char kindLetter(TokenKind kind) {
  switch (kind) {
    case TokenKind::Identifier:
      return 'I';
    case TokenKind::SystemName:
      return 'S';
    case TokenKind::Directive:
      return 'D';
    case TokenKind::Number:
      return 'N';
    case TokenKind::String:
      return 'Q';
    case TokenKind::Symbol:
      return 'P';
    case TokenKind::End:
      return 'E';
  }
  return '?';
}

// "K:text" per token, joined by blanks.
std::string lex(const std::string& text, bool coarse = false) {
  std::unique_ptr<SourceBuffer> source = SourceBuffer::fromText("t.v", text);
  Lexer lexer(source->begin(), source->end(), source.get(), Lexer::npos, nullptr);
  lexer.setCoarse(coarse);
  std::string out;
  Token token;
  for (lexer.next(token); token.kind != TokenKind::End; lexer.next(token)) {
    if (!out.empty()) out += ' ';
    out += kindLetter(token.kind);
    out += ':';
    out.append(token.text);
  }
  return out;
}

struct LexCase {
  const char* label;
  std::string text;
  std::string tokens;
};

class VerilogLexerTest : public testing::TestWithParam<LexCase> {};

TEST_P(VerilogLexerTest, Tokens) { EXPECT_EQ(lex(GetParam().text), GetParam().tokens); }

INSTANTIATE_TEST_SUITE_P(
    Lexis, VerilogLexerTest,
    testing::Values(
        LexCase{"EscapedIdentifierDropsItsBlank", "\\bus[0] , \\a+b\tx",
                "I:\\bus[0] P:, I:\\a+b I:x"},
        LexCase{"CommentsAndAttributesVanish", "a // c\n/* b */ (* keep *) b", "I:a I:b"},
        LexCase{"EventStarIsNoAttribute", "@(*)", "P:@ P:( P:* P:)"},
        LexCase{"BasedNumbersWithBlanksAndUnknowns", "8 'h FF 4'b1x?z 'sd5 12'o7_7",
                "N:8 'h FF N:4'b1x?z N:'sd5 N:12'o7_7"},
        LexCase{"UnbasedAndTimeLiterals", "'1 '0 'z 10ns 1.5e3 2step",
                "N:'1 N:'0 N:'z N:10ns N:1.5e3 N:2step"},
        LexCase{"AssignmentPatternAndCast", "'{a} int'(x)", "P:'{ I:a P:} I:int P:' P:( I:x P:)"},
        LexCase{"StringsKeepEscapes", "\"a \\\"b\\\" // c\" d", "Q:\"a \\\"b\\\" // c\" I:d"},
        LexCase{"OperatorsMaxMunch", "a<<<=b>>>c===d!==e**f->g::h+:i|->j",
                "I:a P:<<<= I:b P:>>> I:c P:=== I:d P:!== I:e P:** I:f P:-> I:g P::: I:h P:+: "
                "I:i P:|-> I:j"},
        LexCase{"SystemNamesAndDirectives", "$clog2(`W) $ `\"", "S:$clog2 P:( D:W P:) P:$ P:`\""},
        LexCase{"IdentifiersWithDollarAndDigits", "a$b _c9 9d", "I:a$b I:_c9 N:9d"}),
    verilog_test::Label());

TEST(VerilogLexerCoarseTest, ReturnsOnlyWhatTheIndexNeeds) {
  EXPECT_EQ(lex("NAND2 \\u[1] ( .A(n1), .Y(\\n[2] ) ); wire x; end : lbl @ \"s\" `D $f(1)", true),
            "P:; I:wire P:; I:end P:: P:@ Q:\"s\" D:D");
}

// Preprocesses `text` and returns the token texts joined by blanks.
std::string preprocess(const std::string& text, std::string* messages = nullptr) {
  pinforge_test::FilePtr sink(std::tmpfile());
  std::string joined;
  {
    Diagnostics diagnostics(sink.get());
    MacroTable macros;
    SourceStore sources("", {});
    std::unique_ptr<SourceBuffer> source = SourceBuffer::fromText("t.v", text);
    Preprocessor pre(&diagnostics, macros, sources);
    pre.start(*source, 0, 0);
    Token token;
    while (pre.next(token)) {
      if (!joined.empty()) joined += ' ';
      joined.append(token.text);
    }
  }
  if (messages)
    for (const std::string& head : pinforge_test::messageHeads(pinforge_test::readBack(sink.get())))
      *messages += head + "\n";
  return joined;
}

struct PreprocessCase {
  const char* label;
  std::string text;
  std::string tokens;
};

class VerilogPreprocessorTest : public testing::TestWithParam<PreprocessCase> {};

TEST_P(VerilogPreprocessorTest, Expands) {
  std::string messages;
  EXPECT_EQ(preprocess(GetParam().text, &messages), GetParam().tokens);
  EXPECT_EQ(messages, "");
}

INSTANTIATE_TEST_SUITE_P(
    Directives, VerilogPreprocessorTest,
    testing::Values(
        PreprocessCase{"ObjectLike", "`define W 8\n[`W-1:0]", "[ 8 - 1 : 0 ]"},
        PreprocessCase{"Continuation", "`define W 1 + \\\n 2\n`W", "1 + 2"},
        PreprocessCase{"CommentEndsBody", "`define W 3 // note\n`W", "3"},
        PreprocessCase{"ArgumentsAndDefaults", "`define R(h, l = 0) [h:l]\n`R(7) `R(3, 1) `R(5,)",
                       "[ 7 : 0 ] [ 3 : 1 ] [ 5 : 0 ]"},
        PreprocessCase{"NestedParenthesesInArguments", "`define F(a, b) a+b\n`F((1,2), {3,4})",
                       "( 1 , 2 ) + { 3 , 4 }"},
        PreprocessCase{"PasteAndStringify",
                       "`define P(a, b) a``b\n`define S(x) `\"x`\"\n`P(n, 1) `S(hi)", "n1 \"hi\""},
        PreprocessCase{"NoSubstitutionInStrings", "`define F(x) \"x\" x\n`F(7)", "\"x\" 7"},
        PreprocessCase{"MacroUsingMacro", "`define A 2\n`define B (`A * `A)\n`B", "( 2 * 2 )"},
        PreprocessCase{"ArgumentWithMacro", "`define A 5\n`define F(x) x+1\n`F(`A)", "5 + 1"},
        PreprocessCase{"NestedConditionals",
                       "`define A\n`ifdef A `ifndef B x `else y `endif `elsif C z `else w `endif",
                       "x"},
        PreprocessCase{"ElsifTakesFirstDefined",
                       "`define C\n`ifdef A a `elsif B b `elsif C c `else d `endif", "c"},
        PreprocessCase{"SkippedDefineHasNoEffect",
                       "`ifdef NO `define X 1 `endif\n`ifdef X y `endif", ""},
        PreprocessCase{"Undef", "`define X 1\n`undef X\n`ifdef X a `else b `endif", "b"},
        PreprocessCase{"UndefineAll", "`define X 1\n`undefineall\n`ifndef X gone `endif", "gone"},
        PreprocessCase{"IgnoredDirectives",
                       "`timescale 1ns/1ps\n`default_nettype none\n`celldefine\n`resetall\n"
                       "`line 3 \"x.v\" 0\n`pragma foo bar\nx",
                       "x"},
        PreprocessCase{"ProtectedEnvelopes",
                       "a\n`pragma protect begin_protected\n`junk \"\nmodule\n"
                       "`pragma protect end_protected\nb `protected\n@#$`\n`endprotected\nc",
                       "a b c"},
        PreprocessCase{"FileAndLine", "\n`__LINE__ `__FILE__", "2 \"t.v\""}),
    verilog_test::Label());

// The value of parameter X = `expression`, read with P = 5, Q = P * 2, [3:0] N = 20 and
// R = 2.5 declared before it; "error: ..." with the reason when X has no value.
std::string evaluate(const std::string& expression) {
  const verilog_test::Read result = verilog_test::read(
      {{"module m #(parameter P = 5, parameter Q = P * 2, parameter [3:0] N = 20,\n"
        "  parameter R = 2.5, parameter X = " +
        expression + ")\n(input [X:0] a); endmodule\n"}});
  if (!result.ok) return result.messages.empty() ? "not ok" : result.messages.front();
  for (const ScanGeneric& generic : result.unit.generics)
    if (generic.name == "X" && generic.value) return *generic.value;
  if (result.unit.ports.size() != 1) return "no port";
  const std::string problem = result.unit.ports[0].rangeProblem();
  return "error: " + problem.substr(problem.find("]: ") + 3);
}

const char* const kXz = "error: a literal with x or z bits has no numeric value";

struct EvalCase {
  std::string expression;
  std::string result;
};

class VerilogEvaluatorTest : public testing::TestWithParam<EvalCase> {};

TEST_P(VerilogEvaluatorTest, Evaluates) {
  EXPECT_EQ(evaluate(GetParam().expression), GetParam().result) << GetParam().expression;
}

INSTANTIATE_TEST_SUITE_P(
    Expressions, VerilogEvaluatorTest,
    testing::Values(
        EvalCase{"42", "42"}, EvalCase{"1_000", "1000"}, EvalCase{"8'hFF", "255"},
        EvalCase{"4'hFF", "15"}, EvalCase{"4'sb1111", "-1"}, EvalCase{"'d12", "12"},
        EvalCase{"12 'o17", "15"}, EvalCase{"'1", "1"}, EvalCase{"64'hFFFF_FFFF_FFFF_FFFF", "-1"},
        EvalCase{"$bits(8'hFF) + $bits(12 'o17) * 100 + $bits('1) * 10000", "11208"},
        EvalCase{"8'b1x", kXz}, EvalCase{"'z", kXz}, EvalCase{"10ns", kXz}, EvalCase{"4'b102", kXz},
        EvalCase{"1 + 2 * 3 - 4 / 2", "5"}, EvalCase{"2 ** 3 ** 2", "64"},
        EvalCase{"(1 + 2) * 3", "9"}, EvalCase{"-7 % 3", "-1"}, EvalCase{"1 << 4 | 1", "17"},
        EvalCase{"-16 >>> 2", "-4"}, EvalCase{"8'hF0 >> 4", "15"}, EvalCase{"5 & 3 ^ 1 | 8", "8"},
        EvalCase{"~0", "-1"}, EvalCase{"!3 || 0", "0"},
        EvalCase{"3 > 2 && 2 >= 2 && 1 < 2 && 1 <= 1 && 1 == 1 && 1 != 2", "1"},
        EvalCase{"P > 3 ? Q : 0", "10"}, EvalCase{"N", "4"}, EvalCase{"Q[3:1]", "5"},
        EvalCase{"Q[1]", "1"}, EvalCase{"Q[0+:3]", "2"}, EvalCase{"&4'b1111", "1"},
        EvalCase{"|Q", "1"}, EvalCase{"^3'b111", "1"}, EvalCase{"{4'h1, 4'h2}", "18"},
        EvalCase{"{2{2'b10}}", "10"},
        EvalCase{"$clog2(1) + $clog2(2) * 10 + $clog2(1025) * 100", "1110"},
        EvalCase{"$bits(N) + $bits(logic [3:0][1:0])", "12"}, EvalCase{"R * 2", "5.0"},
        EvalCase{"$rtoi(R) + $ceil(R)", "5.0"}, EvalCase{"\"ab\" == \"ab\"", "1"},
        EvalCase{"int'(P) + 4'(1)", "6"}, EvalCase{"1 / 0", "error: division by zero"},
        EvalCase{"9223372036854775807 + 1", "error: arithmetic overflow in '+'"},
        // Unsigned operands wrap at the wider operand's width, an integer counting 32 bits.
        EvalCase{"32'd0 - 1", "4294967295"}, EvalCase{"4'd3 - 4'd4", "15"},
        EvalCase{"8'hFF + 1", "256"}, EvalCase{"-8'd1", "255"}, EvalCase{"~4'b0101", "10"},
        EvalCase{"32'd0 - 1 > 5", "1"}, EvalCase{"Q[0] - 1", "4294967295"},
        EvalCase{"$signed(8'hFF)", "-1"}, EvalCase{"$unsigned(-1)", "4294967295"},
        EvalCase{"8'hFF << 1", "254"}, EvalCase{"4'sd7 + 4'sd7", "14"}, EvalCase{"80'h5 + 1", "6"},
        EvalCase{"80'h1_0000_0000_0000_0000", "error: the literal does not fit in 64 bits"},
        EvalCase{"99999999999999999999", "error: the literal does not fit in 64 bits"},
        EvalCase{"UNKNOWN + 1", "error: unknown name 'UNKNOWN'"}, EvalCase{"4'bx1 + 1", kXz},
        EvalCase{"{P, 1'b1}", "error: a concatenation needs sized operands"},
        EvalCase{"$fopen(1)", "error: unsupported system function $fopen"},
        EvalCase{"f(1)", "error: unknown function 'f'"},
        EvalCase{"(1 + ", "t.v:2:41: error: expected an expression but found ')'"}));

}  // namespace
}  // namespace scan::verilog
