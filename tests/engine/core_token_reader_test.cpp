// Token grammar and line counting of the template reader.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core_harness.h"
#include "engine/token_reader.h"

namespace {

using enginetest::fileWith;

struct ReaderCase {
  const char* name;
  std::string input;
  std::vector<std::string> tokens;  // every token up to and including the one that met the end
  int finalLine;
};

std::vector<std::string> readAll(TokenReader& reader) {
  std::vector<std::string> tokens;
  do {
    tokens.emplace_back(reader.nextToken());
  } while (!reader.atEnd());
  return tokens;
}

std::string withNul(const char* text, size_t size) { return std::string(text, size); }

class TokenReaderTest : public ::testing::TestWithParam<ReaderCase> {};

TEST_P(TokenReaderTest, SplitsAndCounts) {
  const ReaderCase& c = GetParam();
  auto file = fileWith(c.input);
  TokenReader reader(file.get());
  EXPECT_EQ(readAll(reader), c.tokens);
  EXPECT_EQ(reader.line(), c.finalLine);
}

const std::string kLongValue(450, 'v');

INSTANTIATE_TEST_SUITE_P(
    Grammar, TokenReaderTest,
    ::testing::Values(
        ReaderCase{"Empty", "", {""}, 1},
        ReaderCase{"PlainTextOnly", "one\ntwo\nthree", {"one\ntwo\nthree"}, 3},
        ReaderCase{"EndsAfterClosingMark", "x %module%", {"x ", "%module%", ""}, 1},
        ReaderCase{"TextBetweenKeywords", "a%b%c@d@e", {"a", "%b%", "c", "@d@", "e"}, 1},
        ReaderCase{"EitherMarkClosesEitherKind", "%date@rest", {"%date@", "rest"}, 1},
        ReaderCase{"UnterminatedAtEnd", "ab%date", {"ab", "%date"}, 1},
        ReaderCase{"DoublePercent", "%%", {"%%", ""}, 1},
        ReaderCase{"DoubleAt", "@@x", {"@@", "x"}, 1},
        ReaderCase{"AdjacentKeywords", "%a%%b%", {"%a%", "%b%", ""}, 1},
        ReaderCase{"LoneMarkSpansLines", "x %\ny\nz", {"x ", "%\ny\nz"}, 3},
        ReaderCase{"LinesBeforeKeyword", "a\nb\nc\n%m%", {"a\nb\nc\n", "%m%", ""}, 4},
        ReaderCase{"NewlineOnlyText", "\n", {"\n"}, 2},
        ReaderCase{"SetValueIsNewline", "@SET eoldelim=\n@", {"@SET eoldelim=\n@", ""}, 2},
        ReaderCase{"NulIsOrdinary", withNul("a\0b%x\0%\0", 8), {withNul("a\0b", 3),
                                                               withNul("%x\0%", 4),
                                                               withNul("\0", 1)}, 1},
        ReaderCase{"HighBytes", "\xff\xfe%\x80%", {"\xff\xfe", "%\x80%", ""}, 1},
        ReaderCase{"LongToken", "@SET sigdelim=" + kLongValue + "@",
                   {"@SET sigdelim=" + kLongValue + "@", ""}, 1}),
    [](const auto& info) { return std::string(info.param.name); });

TEST(TokenReader, LineCountsNewlinesConsumedSoFar) {
  auto file = fileWith("a\nb%x\ny%\nc");
  TokenReader reader(file.get());
  EXPECT_EQ(reader.nextToken(), "a\nb");
  EXPECT_EQ(reader.line(), 2);
  EXPECT_EQ(reader.nextToken(), "%x\ny%");
  EXPECT_EQ(reader.line(), 3);
  EXPECT_EQ(reader.nextToken(), "\nc");
  EXPECT_EQ(reader.line(), 4);
  EXPECT_TRUE(reader.atEnd());
  EXPECT_EQ(reader.current(), "\nc");
}

// The grammar stated one byte at a time, as the reference for large inputs.
std::vector<std::string> referenceTokens(const std::string& input, int& lines) {
  std::vector<std::string> tokens;
  lines = 1;
  size_t i = 0;
  for (;;) {
    std::string token;
    if (i == input.size()) {
      tokens.push_back(token);
      return tokens;
    }
    const bool keyword = input[i] == '%' || input[i] == '@';
    token += input[i++];
    while (i < input.size() && input[i] != '%' && input[i] != '@') token += input[i++];
    const bool closed = keyword && i < input.size();
    if (closed) token += input[i++];
    for (char c : token) lines += c == '\n' ? 1 : 0;
    tokens.push_back(token);
    // A text token or an open keyword token that reached the end has met the end of input.
    if (i == input.size() && !closed) return tokens;
  }
}

TEST(TokenReader, LargeInputMatchesByteByByteGrammar) {
  // Tokens of every length straddle the reader's block boundaries.
  std::string input;
  unsigned state = 12345;
  while (input.size() < 300000) {
    state = state * 1103515245u + 12345u;
    const unsigned pick = (state >> 16) % 16;
    if (pick == 0) input += '%';
    else if (pick == 1) input += '@';
    else if (pick == 2) input += '\n';
    else if (pick == 3) input += '\0';
    else input += static_cast<char>('a' + pick);
  }
  for (const std::string& text : {input, input + "%", input + "@x"}) {
    auto file = fileWith(text);
    TokenReader reader(file.get());
    int lines = 0;
    const std::vector<std::string> expected = referenceTokens(text, lines);
    EXPECT_EQ(readAll(reader), expected);
    EXPECT_EQ(reader.line(), lines);
  }
}

}  // namespace
