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

TEST(PortKinds, SeventeenKindsSelectByLetterAndWidth) {
  int kinds = 0;
  int scalars = 0;
  for (int i = -1; i <= kKeywordCount; ++i) {
    kinds += portKindFor(i) != nullptr ? 1 : 0;
    scalars += isScalarVariable(i) ? 1 : 0;
    EXPECT_FALSE(portKindFor(i) != nullptr && isScalarVariable(i)) << i;
  }
  EXPECT_EQ(kinds, 17);
  EXPECT_EQ(scalars, 9);
  EXPECT_TRUE(portKindFor(kKwOBPort)->selects('B', true));
  EXPECT_FALSE(portKindFor(kKwOBPort)->selects('I', false));
  EXPECT_FALSE(portKindFor(kKwOBBusPort)->selects('O', false));
  EXPECT_FALSE(portKindFor(kKwScalarPort)->selects('I', true));
  EXPECT_FALSE(portKindFor(kKwPort)->selects('N', false));
  EXPECT_TRUE(portKindFor(kKwSignal)->selects('N', true));
  EXPECT_TRUE(portKindFor(kKwNode)->selects('N', false));
  EXPECT_FALSE(portKindFor(kKwIBusPort)->selects('O', true));
}

}  // namespace
