// The engine's parts that whole templates cannot pin down precisely: the token reader against a
// byte-by-byte statement of the grammar, the keyword table, name patterns, trace lines and a
// failing output stream.
#include <gtest/gtest.h>

#include <cctype>
#include <string>
#include <vector>

#include "engine/handlers_fixture.h"
#include "engine/keyword_table.h"
#include "engine/token_reader.h"

namespace {

using handlers_test::runTemplate;

// Every token up to and including the one that met the end, and the final line number.
std::string splitAll(std::string_view input, std::vector<std::string>& tokens) {
  std::FILE* file = handlers_test::fileWith(input);
  TokenReader reader(file);
  do {
    tokens.emplace_back(reader.nextToken());
  } while (!reader.atEnd());
  std::fclose(file);
  return std::to_string(reader.line());
}

struct ReaderRow {
  std::string input;
  std::vector<std::string> tokens;
  const char* finalLine;
};

TEST(TokenReader, SplitsAndCounts) {
  const std::string nul("a\0b%x\0%\0", 8);
  const ReaderRow rows[] = {
      {"", {""}, "1"},
      {"one\ntwo\nthree", {"one\ntwo\nthree"}, "3"},
      {"a%b%c@d@e", {"a", "%b%", "c", "@d@", "e"}, "1"},
      {"x %module%", {"x ", "%module%", ""}, "1"},
      {"%date@rest", {"%date@", "rest"}, "1"},
      {"ab%date", {"ab", "%date"}, "1"},
      {"%%@@x", {"%%", "@@", "x"}, "1"},
      {"x %\ny\nz", {"x ", "%\ny\nz"}, "3"},
      {"a\nb\n%m%", {"a\nb\n", "%m%", ""}, "3"},
      {nul, {nul.substr(0, 3), nul.substr(3, 4), nul.substr(7)}, "1"},
      {"\xff%\x80%", {"\xff", "%\x80%", ""}, "1"},
  };
  for (const ReaderRow& row : rows) {
    std::vector<std::string> tokens;
    EXPECT_EQ(splitAll(row.input, tokens), row.finalLine) << row.input;
    EXPECT_EQ(tokens, row.tokens) << row.input;
  }
}

// The grammar stated one byte at a time, as the reference for large inputs.
std::string referenceSplit(const std::string& input, std::vector<std::string>& tokens) {
  int lines = 1;
  size_t i = 0;
  for (;;) {
    std::string token;
    if (i == input.size()) {
      tokens.push_back(token);
      return std::to_string(lines);
    }
    const bool keyword = input[i] == '%' || input[i] == '@';
    token += input[i++];
    while (i < input.size() && input[i] != '%' && input[i] != '@') token += input[i++];
    const bool closed = keyword && i < input.size();
    if (closed) token += input[i++];
    for (char c : token) lines += c == '\n' ? 1 : 0;
    tokens.push_back(token);
    if (i == input.size() && !closed) return std::to_string(lines);
  }
}

TEST(TokenReader, LargeInputMatchesByteByByteGrammar) {
  // Tokens of every length straddle the reader's block boundaries.
  std::string input;
  unsigned state = 12345;
  while (input.size() < 300000) {
    state = state * 1103515245u + 12345u;
    const char pick = static_cast<char>((state >> 16) % 16);
    input += pick == 0 ? '%' : pick == 1 ? '@' : pick == 2 ? '\n' : pick == 3 ? '\0' : 'a' + pick;
  }
  for (const std::string& text : {input, input + "%", input + "@x"}) {
    std::vector<std::string> expected;
    std::vector<std::string> actual;
    EXPECT_EQ(splitAll(text, actual), referenceSplit(text, expected));
    EXPECT_EQ(actual, expected);
  }
}

TEST(KeywordTable, SortedPrefixFreeAndFoundIgnoringCase) {
  for (int i = 0; i < kKeywordCount; ++i) {
    const std::string_view word = keywordWord(i);
    ASSERT_FALSE(word.empty()) << i;
    EXPECT_EQ(word[0], i < kVariableCount ? '%' : '@') << word;
    if (i > 0) {
      EXPECT_LT(keywordWord(i - 1), word);
    }
    for (int j = 0; j < kKeywordCount; ++j) {
      if (j != i) {
        EXPECT_NE(word.substr(0, keywordWord(j).size()), keywordWord(j)) << word;
      }
    }
    std::string upper(word);
    for (char& c : upper) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    EXPECT_EQ(lookupKeyword(upper + " trailing text@"), i) << upper;
  }
  EXPECT_TRUE(keywordWord(-1).empty());
  EXPECT_TRUE(keywordWord(kKeywordCount).empty());
  const std::pair<const char*, int> lookups[] = {
      {"@settings@", kKwSet},      {"@commentary@", kKwComment}, {"@map@", kKwMap},
      {"@mapx@", kKwNoMatch},      {"%", kKwNoMatch},            {"%\x80%", kKwNoMatch},
      {"@se", kKwNoMatch},         {"text", kKwPlainText},       {"", kKwPlainText},
      {" %module%", kKwPlainText}};
  for (const auto& [token, index] : lookups) EXPECT_EQ(lookupKeyword(token), index) << token;
}

TEST(SignalName, PatternsAndCase) {
  struct NameRow {
    const char* name;
    const char* pattern;
    bool caseSensitive;
    bool matches;
  };
  const NameRow rows[] = {
      {"data", "*", true, true},      {"", "*", true, true},         {"data", "d?t?", true, true},
      {"data", "?????", true, false}, {"data", "???", true, false},   {"data", "d*", true, false},
      {"d*", "d*", true, true},       {"data", "**", true, false},   {"Data", "data", true, false},
      {"Data", "dATA", false, true},  {"Da?a", "da?a", false, true}, {"a[b", "A{B", false, false}};
  StbDataList data(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  Forge forge(nullptr, nullptr, nullptr, &data);
  for (const NameRow& row : rows) {
    forge.m_CaseSensitiveIf = row.caseSensitive;
    EXPECT_EQ(forge.compareSignalName(row.name, row.pattern) == 0, row.matches)
        << row.name << " vs " << row.pattern;
  }
}

// Handler lines only: every token also gets a dispatcher line, which the end-to-end cases show.
std::string handlerLines(const std::string& trace) {
  std::string kept;
  size_t start = 0;
  while (start < trace.size()) {
    const size_t end = std::min(trace.find('\n', start), trace.size() - 1) + 1;
    const std::string_view line(trace.data() + start, end - start);
    if (line.substr(0, 10) != "doToken() ") kept += line;
    start = end;
  }
  return kept;
}

TEST(Trace, HandlerLines) {
  const std::vector<handlers_test::PortSpec> ports = {{"d", 1, 0, 'I'}, {"q", -1, -1, 'O'}};
  const std::pair<std::string, std::string> rows[] = {
      {"@IFNHAS PORT=q@@IFHAS PORT=*@@ENDIF@@ENDIF@@MAPSIGNAL zz TO s@@SET sigdelim=;@",
       "doIf() called: token=@IFNHAS PORT=q@|Condition=0\n"
       "addCondition() called: condition=1\n"
       "doIf() called: token=@IFHAS PORT=*@|Condition=1\n"
       "addCondition() called: condition=1\n"
       "doEndIf() called: m_ConditionalDepth=2\n"
       "doEndIf() called: m_ConditionalDepth=1\n"
       "doMapSignal() called: token=@MAPSIGNAL zz TO s@\n"
       "doSet() called: token=@SET sigdelim=;@\n"},
      {"@EXPANDBUS@@ITERATE@%IPORT%<>@ENDITERATE@",
       "eatIterate() Iterator=%IPORT%\n"
       "eatIterate() eating szToken=<>\n"
       "doIterate() Iterating for signal=d\n"
       "doIterate() Iterating for signal=d\n"},
      {"@ITERATE@%module%", "eatIterate() Iterator=%module%\n"},
  };
  for (const auto& [templateText, lines] : rows) {
    EXPECT_EQ(handlerLines(runTemplate(templateText, ports, true).trace), lines) << templateText;
  }
}

TEST(Trace, FailedConditionLinesShowTokensUpToNul) {
  const std::string templateText("@IFHAS PORT=zz@x\0y@FOO@", 23);
  EXPECT_EQ(runTemplate(templateText, {}, true).trace,
            "doToken() called: szToken=@IFHAS PORT=zz@|pTokList=0\n"
            "doIf() called: token=@IFHAS PORT=zz@|Condition=1\n"
            "addCondition() called: condition=1\n"
            "doToken() called: szToken=x|pTokList=0\n"
            "doToken() processing token=x| with condition test failed.\n"
            "doToken() called: szToken=@FOO@|pTokList=0\n"
            "doToken() processing token=@FOO@| with condition test failed.\n"
            "doToken() called: szToken=|pTokList=0\n"
            "doToken() processing token=| with condition test failed.\n");
}

TEST(Output, FailedWriteStopsWithoutMessage) {
  StbDataList data("prj", "top", "out.vhd", "vhd", "pinforge", "", "title", "date");
  std::FILE* in = handlers_test::fileWith("text%module%more");
  std::FILE* readOnly = std::fopen("/dev/null", "r");
  ASSERT_NE(readOnly, nullptr);
  {
    Forge forge(readOnly, in, nullptr, &data);
    EXPECT_FALSE(forge.processTemplate());
    std::string message;
    EXPECT_EQ(forge.getResult(message), 0u);
    EXPECT_EQ(message, handlers_test::kNoError);
  }
  std::fclose(readOnly);
  std::fclose(in);
}

}  // namespace
