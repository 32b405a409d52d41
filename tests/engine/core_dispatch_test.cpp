// Whole templates through the main loop: text, header variables, fixed characters, flag
// directives, comments, the failed-condition filter, errors with their lines, and tracing.
#include <gtest/gtest.h>

#include <string>

#include "core_harness.h"

namespace {

using enginetest::errorAt;
using enginetest::kNoErrors;
using enginetest::Rig;

struct TemplateCase {
  const char* name;
  std::string templateText;
  std::string output;
  std::string message;  // kNoErrors when the template runs to its end
};

class TemplateTest : public ::testing::TestWithParam<TemplateCase> {};

TEST_P(TemplateTest, ExpandsWhole) {
  const TemplateCase& c = GetParam();
  Rig rig(c.templateText);
  const bool completed = rig.forge.processTemplate();
  const bool ok = c.message == kNoErrors;
  EXPECT_EQ(completed, ok);
  EXPECT_EQ(rig.output(), c.output);
  std::string message;
  EXPECT_EQ(rig.forge.getResult(message), ok ? 0u : 2u);
  EXPECT_EQ(message, c.message);
}

std::string bytes(const char* text, size_t size) { return std::string(text, size); }

const std::string kUnknown = " is not a valid Variable or Directive name.";

INSTANTIATE_TEST_SUITE_P(
    Plain, TemplateTest,
    ::testing::Values(
        TemplateCase{"Empty", "", "", kNoErrors},
        TemplateCase{"TextOnly", "line one\n\tline two\n", "line one\n\tline two\n", kNoErrors},
        TemplateCase{"EndsWithVariable", "name: %module%", "name: Top_Level2", kNoErrors},
        TemplateCase{"NulBytesPassThrough", bytes("a\0b%module%\0\xff", 13),
                     bytes("a\0bTop_Level2\0\xff", 15), kNoErrors},
        TemplateCase{"HeaderVariables",
                     "%date%|%design%|%ext%|%filename%|%module%|%project%|%title%|%tool%|%ver%|",
                     "Sun Dec 06 10:00:00 2026|proj|txt|top_pins|Top_Level2|proj|top|pinforge||",
                     kNoErrors},
        TemplateCase{"VariablesIgnoreCase", "%Module% %MODULE% %module%",
                     "Top_Level2 Top_Level2 Top_Level2", kNoErrors},
        TemplateCase{"FixedCharacters", "@AT@@PERCENT@@CR@@TAB@@Tab@x", "@%\n\t\tx", kNoErrors},
        TemplateCase{"Comments", "a@comment anything = here@b@COMMENTARY@c", "abc", kNoErrors},
        TemplateCase{"UnclosedCommentAtEnd", "a@comment runs to the end", "a", kNoErrors},
        TemplateCase{"FlagDirectivesWriteNothing",
                     "<@EXPANDBUS@@NOEXPANDBUS@@MAP@@NOMAP@@SHOWRANGE@@NOSHOWRANGE@>", "<>",
                     kNoErrors},
        TemplateCase{"CaseModes",
                     "@UPCASE@module %module% @LOWCASE@%module% @INVCASE@%module% "
                     "@SAMECASE@%module%",
                     "module TOP_LEVEL2 top_level2 tOP_lEVEL2 Top_Level2", kNoErrors},
        TemplateCase{"CaseLeavesFixedTextAlone", "@UPCASE@%ext%@CR@x@AT@", "TXT\nx@",
                     kNoErrors},
        TemplateCase{"SuppressNewLine",
                     "a\n\tb@SUPPRESNEWLINE@c\n\td@CR@@TAB@e@NOSUPPRESNEWLINE@f\ng",
                     "a\n\tbcd\n\tef\ng", kNoErrors},
        TemplateCase{"TemplateDelimiterWraps",
                     "@SET outlinewidth=0@%ext%, %ext%, %ext%", "txt, \ntxt, \ntxt", kNoErrors},
        TemplateCase{"HeaderValueEqualToDelimiterWraps",
                     "@SET sigdelim=txt@@SET outlinewidth=3@ab%ext%c", "abtxt\nc", kNoErrors}),
    [](const auto& info) { return std::string(info.param.name); });

INSTANTIATE_TEST_SUITE_P(
    Errors, TemplateTest,
    ::testing::Values(
        TemplateCase{"UnknownVariable", "ok %foo% never", "ok ",
                     errorAt(1, "Keyword: %foo%" + kUnknown)},
        TemplateCase{"UnterminatedAtEnd", "x%date", "x", errorAt(1, "Keyword: %date" + kUnknown)},
        TemplateCase{"ClosedByOtherMark", "%date@x", "", errorAt(1, "Keyword: %date@" + kUnknown)},
        TemplateCase{"DoublePercent", "50%% off", "50", errorAt(1, "Keyword: %%" + kUnknown)},
        TemplateCase{"DoubleAt", "@@", "", errorAt(1, "Keyword: @@" + kUnknown)},
        TemplateCase{"LineAfterThreeNewlines", "a\nb\nc\n%foo%", "a\nb\nc\n",
                     errorAt(4, "Keyword: %foo%" + kUnknown)},
        TemplateCase{"TokenSpanningLinesGivesLastLine", "x %\ny\nz", "x ",
                     errorAt(3, "Keyword: %\ny\nz" + kUnknown)},
        TemplateCase{"CommentCutByPercent", "a@comment 50% done@b", "a done",
                     errorAt(1, "Keyword: @b" + kUnknown)},
        TemplateCase{"SettingsGoesToSet", "@settings@",
                     "", errorAt(1, "Invalid syntax for @SET directive, must be of the form: "
                                    "@SET STATE_VARIABLE=VALUE@")},
        TemplateCase{"StrayEndIterate", "a\n@ENDITERATE@b", "a\n",
                     errorAt(2, "@ENDITERATE@ keyword encountered without a matching @ITERATE@.")},
        TemplateCase{"IteratorOutsideIterate", "before@ITERATOR@after", "before",
                     errorAt(1, "@ITERATOR@ may not occur outside of an @ITERATE@.")},
        TemplateCase{"TypeDecOutsideIterate", "@vhdl_typedec@", "",
                     errorAt(1, "@VHDL_TYPEDEC@ may not occur outside of an @ITERATE@.")}),
    [](const auto& info) { return std::string(info.param.name); });

TEST(Dispatch, FlagDirectivesSetState) {
  Rig rig("@EXPANDBUS@@MAP@@SUPPRESNEWLINE@@SET showrange=AsPostfix@@NOSHOWRANGE@@SHOWRANGE@"
          "@lowcase@");
  ASSERT_TRUE(rig.forge.processTemplate());
  EXPECT_TRUE(rig.forge.m_ExpandBus);
  EXPECT_TRUE(rig.forge.m_Map);
  EXPECT_TRUE(rig.forge.m_SuppresNewLine);
  EXPECT_TRUE(rig.forge.m_ShowRange);
  EXPECT_EQ(rig.forge.m_RangePosition, Forge::AsPostfix);
  EXPECT_EQ(rig.forge.m_Case, Forge::LOWCASE);

  Rig off("@EXPANDBUS@@NOEXPANDBUS@@MAP@@NOMAP@@SUPPRESNEWLINE@@NOSUPPRESNEWLINE@@INVCASE@");
  ASSERT_TRUE(off.forge.processTemplate());
  EXPECT_FALSE(off.forge.m_ExpandBus);
  EXPECT_FALSE(off.forge.m_Map);
  EXPECT_FALSE(off.forge.m_SuppresNewLine);
  EXPECT_EQ(off.forge.m_Case, Forge::INVCASE);
}

TEST(Dispatch, FailedConditionDropsEverythingButConditionals) {
  Rig rig("text %module% @SET x=1@ @FOO@ %bad% @ITERATOR@ @ENDITERATE@ @SET@ %unterminated");
  rig.forge.m_ConditionalDepth = 1;
  rig.forge.m_Conditions[1] = 1;
  EXPECT_TRUE(rig.forge.processTemplate());
  EXPECT_EQ(rig.output(), "");
  EXPECT_EQ(rig.message(), kNoErrors);
}

TEST(Dispatch, TraceLines) {
  Rig rig("ab%module%@SET sigdelim=;@", {}, true);
  ASSERT_TRUE(rig.forge.processTemplate());
  EXPECT_EQ(rig.trace(),
            "doToken() called: szToken=ab|pTokList=0\n"
            "doToken() called: szToken=%module%|pTokList=0\n"
            "doToken() called: szToken=@SET sigdelim=;@|pTokList=0\n"
            "doSet() called: token=@SET sigdelim=;@\n"
            "doToken() called: szToken=|pTokList=0\n");
}

TEST(Dispatch, TraceInFailedConditionAndNulBytes) {
  Rig rig(std::string("x\0y", 3), {}, true);
  rig.forge.m_ConditionalDepth = 1;
  rig.forge.m_Conditions[1] = 1;
  ASSERT_TRUE(rig.forge.processTemplate());
  // Trace lines are text: a token is shown up to its first NUL byte.
  EXPECT_EQ(rig.trace(),
            "doToken() called: szToken=x|pTokList=0\n"
            "doToken() processing token=x| with condition test failed.\n");
}

TEST(Dispatch, ReplayedTokensSeeTheCurrentPort) {
  Rig rig("", {}, true);
  TokList body;
  PortRecord port("clk", -1, -1, 'I');
  EXPECT_FALSE(rig.forge.doToken("<", &body, &port));
  EXPECT_FALSE(rig.forge.doToken("@ITERATOR@", &body, &port));
  EXPECT_FALSE(rig.forge.doToken(">", &body, &port));
  EXPECT_EQ(rig.output(), "<clk>");
  EXPECT_EQ(rig.trace(),
            "doToken() called: szToken=<|pTokList=1\n"
            "doToken() called: szToken=@ITERATOR@|pTokList=1\n"
            "doToken() called: szToken=>|pTokList=1\n");
}

TEST(Dispatch, FailedWriteStopsWithoutMessage) {
  Rig rig("text%module%more");
  enginetest::File readOnly(std::fopen("/dev/null", "r"));
  ASSERT_NE(readOnly, nullptr);
  rig.forge.m_Output = readOnly.get();
  EXPECT_FALSE(rig.forge.processTemplate());
  std::string message;
  EXPECT_EQ(rig.forge.getResult(message), 0u);
  EXPECT_EQ(message, kNoErrors);
}

}  // namespace
