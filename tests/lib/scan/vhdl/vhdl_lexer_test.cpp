// Token boundaries of the lexer where VHDL is ambiguous or unusual.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "scan/vhdl/vhdl_lexer.h"
#include "scan/vhdl/vhdl_literal.h"

namespace {

using scan::vhdl::Lexer;
using scan::vhdl::Token;
using scan::vhdl::TokenKind;

// "kind:text" per token; with `fastPath` only the tokens the index pass stops at, which
// are the ones that start a statement.
std::string describe(const std::string& text, bool fastPath) {
  Lexer lexer(text);  // std::string keeps a NUL after its last byte
  auto next = [&] { return fastPath ? lexer.nextAtStatementStart() : lexer.next(); };
  std::string out;
  for (Token t = next(); t.kind != TokenKind::End; t = next()) {
    static const char* kNames[] = {"end", "id", "ext", "num", "chr", "str", "bits", "sym", "bad"};
    if (!out.empty()) out += ' ';
    out += std::string(kNames[static_cast<int>(t.kind)]) + ":" + std::string(t.text);
  }
  return out;
}

struct LexCase {
  const char* text;
  const char* tokens;
  bool fastPath = false;
};

const LexCase kLexCases[] = {
    {"a'range", "id:a sym:' id:range"},
    {"x = '1'", "id:x sym:= chr:'1'"},
    {"when '0' =>", "id:when chr:'0' sym:=>"},
    {"t'('0')", "id:t sym:' sym:( chr:'0' sym:)"},
    {"f(x)'length", "id:f sym:( id:x sym:) sym:' id:length"},
    {"'''", "chr:'''"},
    {"\\a b\\ \\x\\\\y\\", "ext:\\a b\\ ext:\\x\\\\y\\"},
    {"X\"FF\" b\"1_0\" 8UX\"0F\" sx\"F\"",
     "bits:X\"FF\" bits:b\"1_0\" bits:8UX\"0F\" bits:sx\"F\""},
    {"16#FF# 2#1010_1010#E2 1_000 1.5e-3 3E6",
     "num:16#FF# num:2#1010_1010#E2 num:1_000 num:1.5e-3 num:3E6"},
    {"a -- comment ; entity\nb", "id:a id:b"},
    {"a /* block \n */ b /* unterminated", "id:a id:b bad:/* unterminated"},
    {"\"a \"\"q\"\" -- x\" c", "str:\"a \"\"q\"\" -- x\" id:c"},
    {"\"open\nx", "bad:\"open id:x"},
    {"a<=b:=c/=d>=e<>f=>g**h??i?/=j",
     "id:a sym:<= id:b sym::= id:c sym:/= id:d sym:>= id:e sym:<> id:f sym:=> id:g sym:** id:h "
     "sym:?? id:i sym:?/= id:j"},
    {"x\r\ny\x01z", "id:x id:y bad:\x01 id:z"},
    {"b0 bx X\"\"", "id:b0 id:bx bits:X\"\""},
    {"entity e is port (a : in bit); end;", "id:entity id:end", true},
    {"a; -- b;\n c; /* d; */ e", "id:a id:c id:e", true},
    {"x <= \"; y\"; z", "id:x id:z", true},
    {"x := '; '; y", "id:x id:y", true},
    {"f(a)';' b; c", "id:f id:c", true},
    {"when ';' => q; r", "id:when id:r", true},
    {"x := 8UX\";\"; y", "id:x id:y", true},
    {"\\ext\\; \\two words\\ is", "ext:\\ext\\ ext:\\two words\\", true},
    {"ENDING; End; a.end", "id:ENDING id:End id:a id:end", true},
};

class Lexing : public testing::TestWithParam<LexCase> {};

TEST_P(Lexing, SplitsTokens) {
  EXPECT_EQ(describe(GetParam().text, GetParam().fastPath), GetParam().tokens);
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Lexing, testing::ValuesIn(kLexCases));

struct LiteralCase {
  const char* text;
  const char* expected;  ///< "i:N", "r:N", "s:text" or "none"
};

const LiteralCase kLiteralCases[] = {
    {"16#FF#", "i:255"},
    {"2#1010_1010#", "i:170"},
    {"1_000", "i:1000"},
    {"1E3", "i:1000"},
    {"16#F#E1", "i:240"},
    {"2.5", "r:2.5"},
    {"9223372036854775808", "none"},
    {"X\"A\"", "s:1010"},
    {"O\"7\"", "s:111"},
    {"6X\"F\"", "s:001111"},
    {"3B\"1010\"", "s:010"},
    {"SX\"8\"", "s:1000"},
    {"6SX\"8\"", "s:111000"},
    {"D\"5\"", "s:101"},
    {"X\"Z\"", "s:ZZZZ"},
    {"\"a\"\"b\"", "s:a\"b"},
    {"'x'", "s:x"},
};

class Literals : public testing::TestWithParam<LiteralCase> {};

TEST_P(Literals, HaveValues) {
  std::string text = GetParam().text;
  Lexer lexer(text);
  scan::Value v = scan::vhdl::literalValue(lexer.next());
  std::string got = v.isInteger()  ? "i:" + std::to_string(v.asInteger())
                    : v.isReal()   ? "r:" + std::to_string(v.asReal()).substr(0, 3)
                    : v.isString() ? "s:" + v.asString()
                                   : "none";
  EXPECT_EQ(got, GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Literals, testing::ValuesIn(kLiteralCases));

}  // namespace
