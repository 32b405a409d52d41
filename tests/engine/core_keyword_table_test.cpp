// The keyword table's order and prefix lookup, and the port-list kinds.
#include <gtest/gtest.h>

#include <cctype>
#include <string>

#include "engine/keyword_table.h"

namespace {

TEST(KeywordTable, SortedWithoutPrefixesAndEachWordFindsItself) {
  for (int i = 0; i < kKeywordCount; ++i) {
    const std::string_view word = keywordWord(i);
    ASSERT_FALSE(word.empty()) << i;
    EXPECT_EQ(word[0], i < 26 ? '%' : '@') << word;
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
    EXPECT_EQ(lookupKeyword(word), i);
    EXPECT_EQ(lookupKeyword(upper + " trailing text@"), i) << upper;
  }
  EXPECT_TRUE(keywordWord(-1).empty());
  EXPECT_TRUE(keywordWord(kKeywordCount).empty());
}

struct LookupCase {
  const char* token;
  int index;
};

class LookupTest : public ::testing::TestWithParam<LookupCase> {};

TEST_P(LookupTest, FindsWordByPrefix) {
  EXPECT_EQ(lookupKeyword(GetParam().token), GetParam().index) << GetParam().token;
}

INSTANTIATE_TEST_SUITE_P(
    Tokens, LookupTest,
    ::testing::Values(LookupCase{"%MODULE%", kKwModule}, LookupCase{"%Module%", kKwModule},
                      LookupCase{"@settings@", kKwSet}, LookupCase{"@SET x=1@", kKwSet},
                      LookupCase{"@commentary@", kKwComment}, LookupCase{"@Tab@", kKwTab},
                      LookupCase{"@mapsignal a TO b@", kKwMapSignal},
                      LookupCase{"@map@", kKwMap}, LookupCase{"@mapx@", kKwNoMatch},
                      LookupCase{"@ifnhas PORT=*@", kKwIfNHas},
                      LookupCase{"@iterator@", kKwIterator}, LookupCase{"@ITERATE@", kKwIterate},
                      LookupCase{"%date", kKwNoMatch}, LookupCase{"%date@", kKwNoMatch},
                      LookupCase{"%%", kKwNoMatch}, LookupCase{"@", kKwNoMatch},
                      LookupCase{"%", kKwNoMatch}, LookupCase{"%zzz%", kKwNoMatch},
                      LookupCase{"%\x80%", kKwNoMatch}, LookupCase{"@se", kKwNoMatch},
                      LookupCase{"text", kKwPlainText}, LookupCase{"", kKwPlainText},
                      LookupCase{" %module%", kKwPlainText}));

struct KindCase {
  int index;
  const char* letters;
  WidthFilter filter;
};

TEST(PortKinds, SeventeenKindsWithTheirSelection) {
  const KindCase kinds[] = {
      {kKwIPort, "I", WidthFilter::Any},          {kKwIBusPort, "I", WidthFilter::BusOnly},
      {kKwIScalarPort, "I", WidthFilter::ScalarOnly}, {kKwOPort, "O", WidthFilter::Any},
      {kKwOBusPort, "O", WidthFilter::BusOnly},   {kKwOScalarPort, "O", WidthFilter::ScalarOnly},
      {kKwBPort, "B", WidthFilter::Any},          {kKwBBusPort, "B", WidthFilter::BusOnly},
      {kKwBScalarPort, "B", WidthFilter::ScalarOnly}, {kKwOBPort, "OB", WidthFilter::Any},
      {kKwOBBusPort, "OB", WidthFilter::BusOnly}, {kKwOBScalarPort, "OB", WidthFilter::ScalarOnly},
      {kKwPort, "IOB", WidthFilter::Any},         {kKwBusPort, "IOB", WidthFilter::BusOnly},
      {kKwScalarPort, "IOB", WidthFilter::ScalarOnly}, {kKwNode, "N", WidthFilter::Any},
      {kKwSignal, "IOBN", WidthFilter::Any},
  };
  int found = 0;
  for (int i = -1; i <= kKeywordCount; ++i) {
    if (portKindFor(i) != nullptr) ++found;
  }
  EXPECT_EQ(found, 17);
  for (const KindCase& k : kinds) {
    const PortKind* kind = portKindFor(k.index);
    ASSERT_NE(kind, nullptr) << keywordWord(k.index);
    EXPECT_EQ(kind->letters, k.letters) << keywordWord(k.index);
    EXPECT_EQ(kind->filter, k.filter) << keywordWord(k.index);
    EXPECT_FALSE(isScalarVariable(k.index));
  }
}

TEST(PortKinds, SelectsByLetterAndWidth) {
  EXPECT_TRUE(portKindFor(kKwOBPort)->selects('B', true));
  EXPECT_FALSE(portKindFor(kKwOBPort)->selects('I', false));
  EXPECT_TRUE(portKindFor(kKwOBBusPort)->selects('O', true));
  EXPECT_FALSE(portKindFor(kKwOBBusPort)->selects('O', false));
  EXPECT_TRUE(portKindFor(kKwScalarPort)->selects('I', false));
  EXPECT_FALSE(portKindFor(kKwScalarPort)->selects('I', true));
  EXPECT_FALSE(portKindFor(kKwPort)->selects('N', false));
  EXPECT_TRUE(portKindFor(kKwSignal)->selects('N', true));
  EXPECT_FALSE(portKindFor(kKwSignal)->selects('\0', false));
}

TEST(PortKinds, NineScalarVariables) {
  int scalars = 0;
  for (int i = -1; i <= kKeywordCount; ++i) scalars += isScalarVariable(i) ? 1 : 0;
  EXPECT_EQ(scalars, 9);
  for (int i : {kKwDate, kKwDesign, kKwExt, kKwFileName, kKwModule, kKwProject, kKwTitle,
                kKwTool, kKwVer}) {
    EXPECT_TRUE(isScalarVariable(i)) << keywordWord(i);
  }
}

}  // namespace
