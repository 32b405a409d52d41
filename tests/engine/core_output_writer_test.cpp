// Column keeping, newline suppression and line wrapping after the signal delimiter.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core_harness.h"

namespace {

using enginetest::Rig;

struct Write {
  std::string text;
  bool suppress;
};

struct WrapCase {
  const char* name;
  int32_t width;
  std::string sigDelim;
  std::string eolDelim;
  std::vector<Write> writes;
  std::string expected;
  uint32_t column;
};

// A listing of the given names the way a port list writes it: delimiter between items only.
std::vector<Write> listing(std::vector<std::string> names, const std::string& delim) {
  std::vector<Write> writes;
  for (size_t i = 0; i < names.size(); ++i) {
    if (i > 0) writes.push_back({delim, false});
    writes.push_back({names[i], false});
  }
  return writes;
}

class WriterTest : public ::testing::TestWithParam<WrapCase> {};

TEST_P(WriterTest, WritesAndWraps) {
  const WrapCase& c = GetParam();
  Rig rig("");
  rig.forge.m_OutLineWidth = c.width;
  rig.forge.m_SigDelim = c.sigDelim;
  rig.forge.m_EolDelim = c.eolDelim;
  for (const Write& w : c.writes) ASSERT_FALSE(rig.forge.writeText(w.text, w.suppress));
  EXPECT_EQ(rig.output(), c.expected);
  EXPECT_EQ(rig.forge.m_Column, c.column);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, WriterTest,
    ::testing::Values(
        WrapCase{"WidthFiveBreaksAfterDelimiter", 5, ", ", "\n",
                 listing({"a", "b", "c", "d"}, ", "), "a, b, \nc, d", 4},
        WrapCase{"ColumnEqualToWidthDoesNotBreak", 3, ", ", "\n", listing({"a", "b", "c"}, ", "),
                 "a, b, \nc", 1},
        WrapCase{"WidthZeroOnePerLine", 0, ", ", "\n", listing({"a", "b", "c"}, ", "),
                 "a, \nb, \nc", 1},
        WrapCase{"WidthZeroKeepsNewlineDelimiter", 0, ",\n", "\n",
                 listing({"a", "b", "c"}, ",\n"), "a,\nb,\nc", 1},
        WrapCase{"NegativeWidthBreaksEvenAtColumnZero", -1, ",\n", "\n",
                 listing({"a", "b"}, ",\n"), "a,\n\nb", 1},
        WrapCase{"EolWithoutNewlineKeepsGrowing", 4, ", ", "|",
                 listing({"a", "b", "c"}, ", "), "a, b, |c", 8},
        WrapCase{"IndentedEol", 5, ", ", "\n    ", listing({"a", "b", "c", "d"}, ", "),
                 "a, b, \n    c, \n    d", 5},
        WrapCase{"LongerTextContainingDelimiter", 0, ", ", "\n", {{", x", false}}, ", x", 3},
        WrapCase{"DelimiterComparedWithCase", 0, "X", "\n", {{"x", false}}, "x", 1},
        WrapCase{"SuppressDropsNewlineAndTab", 32767, ", ", "\n", {{"a\tb\nc\n", true}}, "abc",
                 3},
        WrapCase{"SuppressKeepsEolDelim", 0, ", ", "\n", {{"a", false}, {", ", true}},
                 "a, \n", 0},
        WrapCase{"CarriageReturnCountsAColumn", 32767, ", ", "\n", {{"ab\r", false}}, "ab\r", 3},
        WrapCase{"EmptyTextWritesNothing", 0, ", ", "\n", {{"", false}}, "", 0},
        WrapCase{"EmptyTextEqualToEmptyDelimiter", -1, "", "\n", {{"", false}}, "\n", 0},
        WrapCase{"NulBytesPass", 32767, ", ", "\n", {{std::string("a\0b", 3), false}},
                 std::string("a\0b", 3), 3}),
    [](const auto& info) { return std::string(info.param.name); });

TEST(Writer, FailedWriteReportsStop) {
  Rig rig("");
  enginetest::File readOnly(std::fopen("/dev/null", "r"));
  ASSERT_NE(readOnly, nullptr);
  rig.forge.m_Output = readOnly.get();
  EXPECT_TRUE(rig.forge.writeText("abc", false));
  EXPECT_TRUE(rig.forge.writeText("a\nb", true));
  rig.forge.m_SigDelim = "";
  rig.forge.m_OutLineWidth = -1;
  EXPECT_TRUE(rig.forge.writeText("", false));
}

TEST(Writer, MakeVariableTokenAndDisplayName) {
  EXPECT_EQ(Forge::makeVariableToken("IPORT"), "%IPORT%");
  EXPECT_EQ(Forge::makeVariableToken(""), "%%");
  Rig rig("");
  PortRecord plain("clk", -1, -1, 'I');
  PortRecord mapped("data", 7, 0, 'I');
  mapped.setMappedName("bus_a");
  EXPECT_EQ(rig.forge.displayName(plain), "clk");
  EXPECT_EQ(rig.forge.displayName(mapped), "data");
  rig.forge.m_Map = true;
  EXPECT_EQ(rig.forge.displayName(plain), "clk");
  EXPECT_EQ(rig.forge.displayName(mapped), "bus_a");
}

}  // namespace
