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
  const bool ok = c.message == kNoErrors;
  EXPECT_EQ(rig.forge.processTemplate(), ok);
  EXPECT_EQ(rig.output(), c.output);
  std::string message;
  EXPECT_EQ(rig.forge.getResult(message), ok ? 0u : 2u);
  EXPECT_EQ(message, c.message);
}

std::string bytes(const char* text, size_t size) { return std::string(text, size); }

const std::string kUnknown = " is not a valid Variable or Directive name.";

INSTANTIATE_TEST_SUITE_P(
    Cases, TemplateTest,
    ::testing::Values(
        TemplateCase{"Empty", "", "", kNoErrors},
        TemplateCase{"NulBytesPassThrough", bytes("a\0b%module%\0\xff", 13),
                     bytes("a\0bTop_Level2\0\xff", 15), kNoErrors},
        TemplateCase{"HeaderVariables", "%design%|%ext%|%filename%|%project%|%title%|%ver%|",
                     "proj|txt|top_pins|proj|top||", kNoErrors},
        TemplateCase{"VariablesIgnoreCase", "%Module% %MODULE%", "Top_Level2 Top_Level2",
                     kNoErrors},
        TemplateCase{"FixedCharacters", "@AT@@PERCENT@@CR@@TAB@@Tab@x", "@%\n\t\tx", kNoErrors},
        TemplateCase{"Comments", "a@comment any = thing@b@COMMENTARY@c@comment open", "abc",
                     kNoErrors},
        TemplateCase{"CaseLeavesFixedTextAlone", "@UPCASE@%ext%@CR@x@AT@", "TXT\nx@", kNoErrors},
        TemplateCase{"HeaderValueEqualToDelimiterWraps",
                     "@SET sigdelim=txt@@SET outlinewidth=3@ab%ext%c", "abtxt\nc", kNoErrors},
        TemplateCase{"UnknownVariable", "ok %foo% never", "ok ",
                     errorAt(1, "Keyword: %foo%" + kUnknown)},
        TemplateCase{"UnterminatedAtEnd", "x%date", "x", errorAt(1, "Keyword: %date" + kUnknown)},
        TemplateCase{"ClosedByOtherMark", "%date@x", "", errorAt(1, "Keyword: %date@" + kUnknown)},
        TemplateCase{"DoublePercent", "50%% off", "50", errorAt(1, "Keyword: %%" + kUnknown)},
        TemplateCase{"LineAfterThreeNewlines", "a\nb\nc\n%foo%", "a\nb\nc\n",
                     errorAt(4, "Keyword: %foo%" + kUnknown)},
        TemplateCase{"TokenSpanningLinesGivesLastLine", "x %\ny\nz", "x ",
                     errorAt(3, "Keyword: %\ny\nz" + kUnknown)},
        TemplateCase{"CommentCutByPercent", "a@comment 50% done@b", "a done",
                     errorAt(1, "Keyword: @b" + kUnknown)},
        TemplateCase{"SettingsGoesToSet", "@settings@", "",
                     errorAt(1, "Invalid syntax for @SET directive, must be of the form: "
                                "@SET STATE_VARIABLE=VALUE@")},
        TemplateCase{"StrayEndIterate", "a\n@ENDITERATE@b", "a\n",
                     errorAt(2, "@ENDITERATE@ keyword encountered without a matching @ITERATE@.")},
        TemplateCase{"IteratorOutsideIterate", "before@ITERATOR@after", "before",
                     errorAt(1, "@ITERATOR@ may not occur outside of an @ITERATE@.")},
        TemplateCase{"TypeDecOutsideIterate", "@vhdl_typedec@", "",
                     errorAt(1, "@VHDL_TYPEDEC@ may not occur outside of an @ITERATE@.")}),
    [](const auto& info) { return std::string(info.param.name); });

TEST(Dispatch, FlagDirectivesSetState) {
  Rig on("@EXPANDBUS@@MAP@@SUPPRESNEWLINE@@SET showrange=AsPostfix@@NOSHOWRANGE@@SHOWRANGE@"
         "@lowcase@");
  ASSERT_TRUE(on.forge.processTemplate());
  EXPECT_TRUE(on.forge.m_ExpandBus && on.forge.m_Map && on.forge.m_SuppresNewLine);
  EXPECT_TRUE(on.forge.m_ShowRange);
  EXPECT_EQ(on.forge.m_RangePosition, Forge::AsPostfix);
  EXPECT_EQ(on.forge.m_Case, Forge::LOWCASE);

  Rig off("@EXPANDBUS@@NOEXPANDBUS@@MAP@@NOMAP@@SUPPRESNEWLINE@@NOSUPPRESNEWLINE@@INVCASE@");
  ASSERT_TRUE(off.forge.processTemplate());
  EXPECT_FALSE(off.forge.m_ExpandBus || off.forge.m_Map || off.forge.m_SuppresNewLine);
  EXPECT_EQ(off.forge.m_Case, Forge::INVCASE);
}

TEST(Dispatch, FailedConditionDropsAllButConditionalsAndTraces) {
  const char kTemplate[] = "x\0y%module%@SET x=1@@FOO@@ITERATOR@@ENDITERATE@@SET@%open";
  Rig rig(std::string(kTemplate, sizeof kTemplate - 1), {}, true);
  rig.forge.m_ConditionalDepth = 1;
  rig.forge.m_Conditions[1] = 1;
  EXPECT_TRUE(rig.forge.processTemplate());
  EXPECT_EQ(rig.output(), "");
  EXPECT_EQ(rig.message(), kNoErrors);
  // Trace lines are text: a token is shown up to its first NUL byte.
  const std::string head =
      "doToken() called: szToken=x|pTokList=0\n"
      "doToken() processing token=x| with condition test failed.\n"
      "doToken() called: szToken=%module%|pTokList=0\n";
  EXPECT_EQ(rig.trace().substr(0, head.size()), head);
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

TEST(Dispatch, ReplayedTokensSeeTheCurrentPort) {
  Rig rig("", {}, true);
  TokList body;
  PortRecord port("clk", -1, -1, 'I');
  for (const char* token : {"<", "@ITERATOR@", ">"}) {
    EXPECT_FALSE(rig.forge.doToken(token, &body, &port));
  }
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
  EXPECT_EQ(rig.forge.m_Status, 0u);
  EXPECT_EQ(rig.message(), kNoErrors);
}

}  // namespace
