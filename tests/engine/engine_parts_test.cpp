// The engine's parts that whole templates cannot pin down precisely: the token reader against a
// byte-by-byte statement of the grammar, the keyword table, the name index against a walk over
// all ports, trace lines, the token size limit and a failing output stream.
#include <gtest/gtest.h>

#include <cctype>
#include <string>
#include <tuple>
#include <vector>

#include "engine/handlers_fixture.h"
#include "engine/keyword_table.h"
#include "engine/token_reader.h"

namespace {

using handlers_test::Design;
using handlers_test::runOn;

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

TEST(TokenReader, SplitsAndCounts) {
  const std::tuple<std::string, std::vector<std::string>, const char*> rows[] = {
      {"", {""}, "1"},
      {"a%b%c@d@e", {"a", "%b%", "c", "@d@", "e"}, "1"},
      {"x %module%", {"x ", "%module%", ""}, "1"},
      {"%date@rest", {"%date@", "rest"}, "1"},
      {"ab%date", {"ab", "%date"}, "1"},
      {"%%@@x", {"%%", "@@", "x"}, "1"},
      {"x %\ny\nz", {"x ", "%\ny\nz"}, "3"},
      {"\xff%\x80%", {"\xff", "%\x80%", ""}, "1"}};
  for (const auto& [input, expected, finalLine] : rows) {
    std::vector<std::string> tokens;
    EXPECT_EQ(splitAll(input, tokens), finalLine) << input;
    EXPECT_EQ(tokens, expected) << input;
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
      {"@settings@", kKwSet}, {"@commentary@", kKwComment},
      {"@map@", kKwMap},      {"@mapx@", kKwNoMatch},
      {"%", kKwNoMatch},      {"%\x80%", kKwNoMatch},
      {"@se", kKwNoMatch},    {"text", kKwPlainText},
      {"", kKwPlainText},     {" %module%", kKwPlainText}};
  for (const auto& [token, index] : lookups) EXPECT_EQ(lookupKeyword(token), index) << token;
}

// Lines the end-to-end trace case does not reach: a false @IFNHAS, a mapping that finds no
// port, @SET, a bad iterator, and a failed block, whose tokens show up to a NUL.
TEST(Trace, Lines) {
  const std::pair<std::string, std::string> rows[] = {
      {"@IFNHAS PORT=q@@ENDIF@@MAPSIGNAL zz TO s@@SET sigdelim=;@",
       "doToken() called: szToken=@IFNHAS PORT=q@|pTokList=0\n"
       "doIf() called: token=@IFNHAS PORT=q@|Condition=0\n"
       "addCondition() called: condition=1\n"
       "doToken() called: szToken=@ENDIF@|pTokList=0\n"
       "doToken() processing token=@ENDIF@| with condition test failed.\n"
       "doEndIf() called: m_ConditionalDepth=1\n"
       "doToken() called: szToken=@MAPSIGNAL zz TO s@|pTokList=0\n"
       "doMapSignal() called: token=@MAPSIGNAL zz TO s@\n"
       "doToken() called: szToken=@SET sigdelim=;@|pTokList=0\n"
       "doSet() called: token=@SET sigdelim=;@\n"
       "doToken() called: szToken=|pTokList=0\n"},
      {"@ITERATE@%module%",
       "doToken() called: szToken=@ITERATE@|pTokList=0\neatIterate() Iterator=%module%\n"},
      {std::string("@IFHAS PORT=zz@x\0y@IfTyped@@ENDIF@", 34),
       "doToken() called: szToken=@IFHAS PORT=zz@|pTokList=0\n"
       "doIf() called: token=@IFHAS PORT=zz@|Condition=1\n"
       "addCondition() called: condition=1\n"
       "doToken() called: szToken=x|pTokList=0\n"
       "doToken() processing token=x| with condition test failed.\n"
       "doToken() called: szToken=@IfTyped@|pTokList=0\n"
       "doToken() processing token=@IfTyped@| with condition test failed.\n"
       "doIfDeclared() called: token=@iftyped@\n"
       "addCondition() called: condition=1\n"
       "doToken() called: szToken=@ENDIF@|pTokList=0\n"
       "doToken() processing token=@ENDIF@| with condition test failed.\n"
       "doEndIf() called: m_ConditionalDepth=2\n"
       "doToken() called: szToken=|pTokList=0\n"
       "doToken() processing token=| with condition test failed.\n"}};
  const Design design{{{"d", 1, 0, 'I'}, {"q", -1, -1, 'O'}}};
  for (const auto& [templateText, trace] : rows)
    EXPECT_EQ(runOn(templateText, design, true).trace, trace) << templateText;
}

// The name index and the cached wildcard results must answer exactly as a walk over all ports
// comparing names by the @IFHAS rules would, through case switches, mappings and iterations.
TEST(NameSearch, AgreesWithAWalkOverAllPorts) {
  unsigned state = 2024;
  const auto pick = [&state](unsigned n) {
    state = state * 1103515245u + 12345u;
    return (state >> 16) % n;
  };
  const auto randomName = [&](const char* letters, unsigned count) {
    std::string name;
    for (unsigned length = 1 + pick(3); length > 0; --length) name += letters[pick(count)];
    return name;
  };
  std::vector<int> kinds;
  for (int i = 0; i < kKeywordCount; ++i)
    if (portKindFor(i) != nullptr) kinds.push_back(i);

  for (int round = 0; round < 40; ++round) {
    // '[' and '{' differ only in the bit that tells ASCII letters' case apart.
    Design design;
    for (unsigned i = 0, n = 1 + pick(12); i < n; ++i) {
      const bool bus = pick(2) == 0;
      design.ports.push_back({randomName("aA[{", 4), bus ? 1 : -1, bus ? 0 : -1, "IOBN"[pick(4)]});
    }
    const std::vector<handlers_test::Port>& ports = design.ports;
    std::vector<std::string> mapped(ports.size());
    std::string templateText;
    std::string expected;
    bool foldCase = false;
    for (int step = 0; step < 30; ++step) {
      const unsigned what = pick(8);
      if (what == 0) {
        foldCase = !foldCase;
        templateText += foldCase ? "@SET CASESENSITIVEIF=OFF@" : "@SET CASESENSITIVEIF=ON@";
      } else if (what == 1) {
        const std::string from = randomName("aA[{c", 5);
        const std::string to = "m" + std::to_string(step);
        templateText += "@MAPSIGNAL " + from + " TO " + to + "@";
        for (size_t i = 0; i < ports.size(); ++i) {
          if (ports[i].name == from) {
            mapped[i] = to;
            break;
          }
        }
      } else {
        const int kind = kinds[pick(static_cast<unsigned>(kinds.size()))];
        const std::string pattern = pick(6) == 0 ? "*" : randomName("aA[{?", 5);
        const PortKind& selection = *portKindFor(kind);
        bool found = false;
        for (size_t i = 0; i < ports.size(); ++i) {
          bool same = ports[i].name.size() == pattern.size();
          for (size_t c = 0; same && c < pattern.size(); ++c) {
            const auto fold = [foldCase](char x) {
              return foldCase ? static_cast<char>(std::tolower(static_cast<unsigned char>(x))) : x;
            };
            same = pattern[c] == '?' || fold(pattern[c]) == fold(ports[i].name[c]);
          }
          if ((pattern == "*" || same) && selection.selects(ports[i].dir, ports[i].left != -1))
            found = true;
        }
        std::string word(keywordWord(kind).substr(1));
        word.pop_back();
        templateText += "@IFHAS " + word + "=" + pattern + "@1@ENDIF@@IFNHAS " + word + "=" +
                        pattern + "@0@ENDIF@";
        expected += found ? "1" : "0";
      }
    }
    std::string list;
    for (size_t i = 0; i < ports.size(); ++i)
      list += (i > 0 ? "," : "") + (mapped[i].empty() ? ports[i].name : mapped[i]);
    const std::string whole = templateText + "@SET SIGDELIM=,@@MAP@%signal%";
    EXPECT_EQ(runOn(whole, design).output, expected + list) << whole;
    // Replayed in an iteration, every pass sees the same answers.
    const std::string body =
        "@SET SIGDELIM=|@@ITERATE@%SIGNAL%@SET CASESENSITIVEIF=ON@" + templateText + "@ENDITERATE@";
    std::string passes;
    for (size_t i = 0; i < ports.size(); ++i) passes += (i > 0 ? "|" : "") + expected;
    EXPECT_EQ(runOn(body, design).output, passes) << body;
  }
}

TEST(TokenReader, TokenLengthIsBounded) {
  const std::string limit(TokenReader::kMaxTokenSize, 'x');
  const std::string tooLong = handlers_test::errorAt(
      1,
      "Token: the token that starts on line 1 is longer than the limit of 16777216 bytes "
      "(16 MB).");
  struct BoundRow {
    std::string templateText;
    size_t outputSize;
    std::string message;
  };
  const BoundRow rows[] = {
      {limit, limit.size(), handlers_test::kNoError},
      {limit + "x", 0, tooLong},
      {"a\n%" + limit + "%", 2,
       handlers_test::errorAt(2,
                              "Token: the token that starts on line 2 is longer than the "
                              "limit of 16777216 bytes (16 MB).")},
      {"@ITERATE@%" + limit, 0, tooLong},
      {"@ITERATE@%PORT%" + limit + "x@ENDITERATE@", 0, tooLong},
  };
  for (const BoundRow& row : rows) {
    const handlers_test::Run run = runOn(row.templateText, Design{{{"a", -1, -1, 'I'}}});
    EXPECT_EQ(run.output.size(), row.outputSize) << row.templateText.substr(0, 20);
    EXPECT_EQ(run.message, row.message) << row.templateText.substr(0, 20);
  }
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
