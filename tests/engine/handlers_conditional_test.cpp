// @IFHAS / @IFNHAS / @ENDIF@ and @MAPSIGNAL: which blocks take effect, how names are compared
// and mapped, and every message these directives report.
#include <gtest/gtest.h>

#include <string>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::errorAt;
using handlers_test::PortSpec;
using handlers_test::runTemplate;

const std::vector<PortSpec> kDesign = {
    {"clk", -1, -1, 'I'}, {"data", 7, 0, 'I'}, {"q", -1, -1, 'O'}};

struct DirectiveCase {
  const char* name;
  std::string templateText;
  const char* expected;
  int errorLine;  // 0: the run succeeds
  const char* errorText;
};

class DirectiveTest : public ::testing::TestWithParam<DirectiveCase> {};

TEST_P(DirectiveTest, WritesWholeOutputAndResult) {
  const DirectiveCase& c = GetParam();
  const handlers_test::Run run = runTemplate(c.templateText, kDesign);
  EXPECT_EQ(run.output, c.expected);
  if (c.errorLine == 0) {
    EXPECT_EQ(run.status, 0u) << run.message;
    EXPECT_TRUE(run.completed);
  } else {
    EXPECT_EQ(run.status, 2u);
    EXPECT_EQ(run.message, errorAt(c.errorLine, c.errorText));
    EXPECT_FALSE(run.completed);
  }
}

std::string nested(const char* outer, int depth) {
  std::string text = outer;
  for (int i = 1; i < depth; ++i) text += "@IFHAS PORT=*@";
  return text + "x";
}

constexpr const char* kFormMessage =
    "Invalid syntax for @IFHAS or @IFNHAS directive, must be of the form:\n"
    "@IFHAS SIGNALTYPE=SIGNALNAME@";
constexpr const char* kTypeMessage =
    "Invalid syntax for @IFHAS or @IFNHAS directive, SIGNALTYPE must be one of:\n"
    "IPORT, OBPORT, OPORT, BPORT, PORT, NODE, SIGNAL.";
constexpr const char* kDepthMessage =
    "Maximum number of nested @IFHAS or @IFNHAS directives exceeded.";
constexpr const char* kEndIfMessage =
    "@ENDIF@ directive encountered without a matching @IFHAS or @IFNHAS.";
constexpr const char* kMapMessage =
    "Invalid syntax for @MAPSIGNAL directive, must be of the form: @MAPSIGNAL OLDNAME TO NEWNAME@";

INSTANTIATE_TEST_SUITE_P(
    Conditionals, DirectiveTest,
    ::testing::Values(
        DirectiveCase{"ifhas_holds", "@IFHAS IPORT=clk@yes@ENDIF@", "yes", 0, ""},
        DirectiveCase{"ifnhas_fails", "@IFNHAS IPORT=clk@yes@ENDIF@", "", 0, ""},
        DirectiveCase{"wrong_direction", "@IFHAS OPORT=clk@yes@ENDIF@", "", 0, ""},
        DirectiveCase{"ifnhas_holds", "@IFNHAS OPORT=clk@yes@ENDIF@", "yes", 0, ""},
        DirectiveCase{"star_any_port", "@IFHAS PORT=*@y@ENDIF@", "y", 0, ""},
        DirectiveCase{"no_node", "@IFHAS NODE=*@y@ENDIF@", "", 0, ""},
        DirectiveCase{"busport", "@IFHAS BUSPORT=*@y@ENDIF@@IFHAS OBUSPORT=*@n@ENDIF@", "y", 0,
                      ""},
        DirectiveCase{"question_marks",
                      "@IFHAS IPORT=d?ta@1@ENDIF@@IFHAS IPORT=????@2@ENDIF@"
                      "@IFHAS IPORT=dat??@3@ENDIF@@IFHAS IPORT=d*@4@ENDIF@",
                      "12", 0, ""},
        DirectiveCase{"question_mark_needs_character", "@IFHAS OPORT=q?@y@ENDIF@", "", 0, ""},
        DirectiveCase{"case_sensitive_by_default", "@IFHAS IPORT=CLK@y@ENDIF@", "", 0, ""},
        DirectiveCase{"case_insensitive_when_off",
                      "@SET CASESENSITIVEIF=OFF@@IFHAS IPORT=CLK@y@ENDIF@", "y", 0, ""},
        DirectiveCase{"kind_any_case", "@IFHAS iport=clk@y@ENDIF@@ifnhas SignaL=zz@z@endif@",
                      "yz", 0, ""},
        DirectiveCase{"tab_after_word", "@IFHAS\tIPORT=clk@y@ENDIF@", "y", 0, ""},
        DirectiveCase{"nested_outer_fails",
                      "A@IFHAS IPORT=x@B@IFHAS IPORT=clk@C@ENDIF@D@ENDIF@E", "AE", 0, ""},
        DirectiveCase{"nested_both_hold",
                      "A@IFHAS IPORT=clk@B@IFHAS IPORT=clk@C@ENDIF@D@ENDIF@E", "ABCDE", 0, ""},
        DirectiveCase{"nested_inner_fails",
                      "A@IFHAS IPORT=clk@B@IFHAS IPORT=y@C@ENDIF@D@ENDIF@E", "ABDE", 0, ""},
        DirectiveCase{"failed_block_drops_everything",
                      "<@IFHAS IPORT=zz@%module%text@FOO@@SET@@ENDITERATE@@ENDIF@>", "<>",
                      0, ""},
        DirectiveCase{"malformed_if_in_failed_block_still_counts",
                      "<@IFHAS IPORT=zz@@IFHAS@@IFNHAS FOO@@ENDIF@@ENDIF@x@ENDIF@>", "<>", 0, ""},
        DirectiveCase{"blank_before_closing", "@IFHAS IPORT=clk @y@ENDIF@", "", 0, ""},
        DirectiveCase{"same_with_expandbus",
                      "@IFHAS IPORT=data@a@ENDIF@@EXPANDBUS@@IFHAS IPORT=data@b@ENDIF@"
                      "@IFHAS IPORT=data_7_@c@ENDIF@",
                      "ab", 0, ""},
        DirectiveCase{"unclosed_block_ends_quietly", "a@IFHAS IPORT=zz@b", "a", 0, ""},
        DirectiveCase{"nine_levels", nested("@IFHAS PORT=*@", 9), "x", 0, ""},
        DirectiveCase{"tenth_level", nested("@IFHAS PORT=*@", 10), "", 1, kDepthMessage},
        DirectiveCase{"tenth_level_in_failed_block", nested("@IFHAS PORT=zz@", 10), "", 1,
                      kDepthMessage},
        DirectiveCase{"endif_outside", "a\n@ENDIF@b", "a\n", 2, kEndIfMessage},
        DirectiveCase{"endif_in_body_closes_outer_block",
                      "@IFHAS PORT=*@@ITERATE@%PORT%@ITERATOR@@ENDIF@@ENDITERATE@", "clk, data, ",
                      1, kEndIfMessage},
        DirectiveCase{"no_name", "@IFHAS IPORT@", "", 1, kFormMessage},
        DirectiveCase{"empty_name", "@IFHAS IPORT=@", "", 1, kFormMessage},
        DirectiveCase{"no_argument", "@IFHAS@", "", 1, kFormMessage},
        DirectiveCase{"ifnhas_no_argument", "x@IFNHAS @", "x", 1, kFormMessage},
        DirectiveCase{"scalar_variable_kind", "@IFHAS MODULE=x@", "", 1, kTypeMessage},
        DirectiveCase{"unknown_kind", "@IFHAS FOO=x@", "", 1, kTypeMessage},
        DirectiveCase{"two_blanks", "@IFHAS  IPORT=clk@", "", 1, kTypeMessage},
        DirectiveCase{"blank_before_equals", "@IFHAS IPORT =clk@", "", 1, kTypeMessage},
        DirectiveCase{"directive_kind", "@IFHAS MAP=clk@", "", 1, kTypeMessage}),
    [](const ::testing::TestParamInfo<DirectiveCase>& info) {
      return std::string(info.param.name);
    });

INSTANTIATE_TEST_SUITE_P(
    Mapping, DirectiveTest,
    ::testing::Values(
        DirectiveCase{"map_on", "@MAPSIGNAL clk TO sysclk@@MAP@%iscalarport%", "sysclk", 0, ""},
        DirectiveCase{"map_off", "@MAPSIGNAL clk TO sysclk@%iscalarport%", "clk", 0, ""},
        DirectiveCase{"map_before_mapping", "@MAP@@MAPSIGNAL clk TO sysclk@%iscalarport%",
                      "sysclk", 0, ""},
        DirectiveCase{"nomap_restores",
                      "@MAPSIGNAL clk TO sysclk@@MAP@%iscalarport%@NOMAP@%iscalarport%",
                      "sysclkclk", 0, ""},
        DirectiveCase{"any_connecting_word", "@MAPSIGNAL clk AS sysclk@@MAP@%iscalarport%",
                      "sysclk", 0, ""},
        DirectiveCase{"repeated_blanks", "@MAPSIGNAL   clk   TO sysclk@@MAP@%iscalarport%",
                      "sysclk", 0, ""},
        DirectiveCase{"tabs_between_words", "@MAPSIGNAL\tclk\tTO\tsysclk@@MAP@%iscalarport%",
                      "sysclk", 0, ""},
        DirectiveCase{"new_name_keeps_blank", "@MAPSIGNAL clk TO  sysclk@@MAP@[%iscalarport%]",
                      "[ sysclk]", 0, ""},
        DirectiveCase{"case_differs", "@MAPSIGNAL CLK TO sysclk@@MAP@%iscalarport%", "clk", 0,
                      ""},
        DirectiveCase{"case_differs_insensitive_if",
                      "@SET CASESENSITIVEIF=OFF@@MAPSIGNAL CLK TO sysclk@@MAP@%iscalarport%",
                      "clk", 0, ""},
        DirectiveCase{"second_mapping_wins",
                      "@MAPSIGNAL clk TO a@@MAPSIGNAL clk TO b@@MAP@%iscalarport%", "b", 0, ""},
        DirectiveCase{"mapped_name_not_searched",
                      "@MAPSIGNAL clk TO a@@MAPSIGNAL a TO b@@MAP@%iscalarport%", "a", 0, ""},
        DirectiveCase{"unknown_name_silent", "@MAPSIGNAL zz TO a@@MAP@%iscalarport%", "clk", 0,
                      ""},
        DirectiveCase{"conditional_uses_declared_name",
                      "@MAPSIGNAL clk TO sysclk@@MAP@@IFHAS IPORT=clk@1@ENDIF@"
                      "@IFHAS IPORT=sysclk@2@ENDIF@",
                      "1", 0, ""},
        DirectiveCase{"iteration_uses_mapped_name",
                      "@MAPSIGNAL clk TO sysclk@@MAP@@ITERATE@%SCALARPORT%@ITERATOR@@ENDITERATE@",
                      "sysclk, q", 0, ""},
        DirectiveCase{"bus_mapped_reaches_bits",
                      "@MAPSIGNAL data TO bus_a@@MAP@%ibusport%|@EXPANDBUS@@UPCASE@%ibusport%",
                      "bus_a|BUS_A_7_, BUS_A_6_, BUS_A_5_, BUS_A_4_, BUS_A_3_, BUS_A_2_, "
                      "BUS_A_1_, BUS_A_0_", 0, ""},
        // A mapping given while expandbus is on reaches the bus itself and outlives expansions.
        DirectiveCase{"bus_mapped_while_expanding",
                      "@EXPANDBUS@@MAPSIGNAL data TO b@@MAP@%ibusport%|@NOEXPANDBUS@%ibusport%",
                      "b_7_, b_6_, b_5_, b_4_, b_3_, b_2_, b_1_, b_0_|b", 0, ""},
        DirectiveCase{"mapping_in_failed_block_dropped",
                      "@IFHAS PORT=zz@@MAPSIGNAL clk@@MAPSIGNAL clk TO a@@ENDIF@@MAP@%iscalarport%",
                      "clk", 0, ""},
        DirectiveCase{"missing_new_name", "@MAPSIGNAL clk sysclk@", "", 1, kMapMessage},
        DirectiveCase{"missing_connecting_word", "@MAPSIGNAL clk@", "", 1, kMapMessage},
        DirectiveCase{"missing_everything", "a\n\n@MAPSIGNAL@", "a\n\n", 3, kMapMessage},
        DirectiveCase{"empty_new_name", "@MAPSIGNAL clk TO @", "", 1, kMapMessage}),
    [](const ::testing::TestParamInfo<DirectiveCase>& info) {
      return std::string(info.param.name);
    });

// Only the handler lines of interest; the dispatcher traces every token as well.
std::string linesStartingWithAny(const std::string& trace,
                                 std::initializer_list<std::string_view> prefixes) {
  std::string kept;
  size_t start = 0;
  while (start < trace.size()) {
    size_t end = trace.find('\n', start);
    end = end == std::string::npos ? trace.size() : end + 1;
    const std::string_view line(trace.data() + start, end - start);
    for (std::string_view prefix : prefixes) {
      if (line.substr(0, prefix.size()) == prefix) {
        kept += line;
        break;
      }
    }
    start = end;
  }
  return kept;
}

TEST(ConditionalTrace, BlocksAndMappingsAreTraced) {
  const handlers_test::Run run = runTemplate(
      "@IFHAS IPORT=clk@@IFNHAS PORT=q@@IFHAS PORT=*@@ENDIF@@ENDIF@@ENDIF@"
      "@MAPSIGNAL clk TO s@@MAPSIGNAL zz TO s@",
      kDesign, true);
  ASSERT_EQ(run.status, 0u) << run.message;
  EXPECT_EQ(linesStartingWithAny(run.trace, {"doIf()", "addCondition()", "doEndIf()",
                                             "doMapSignal()"}),
            "doIf() called: token=@IFHAS IPORT=clk@|Condition=1\n"
            "addCondition() called: condition=2\n"
            "doIf() called: token=@IFNHAS PORT=q@|Condition=0\n"
            "addCondition() called: condition=1\n"
            "doIf() called: token=@IFHAS PORT=*@|Condition=1\n"
            "addCondition() called: condition=1\n"
            "doEndIf() called: m_ConditionalDepth=3\n"
            "doEndIf() called: m_ConditionalDepth=2\n"
            "doEndIf() called: m_ConditionalDepth=1\n"
            "doMapSignal() called: token=@MAPSIGNAL clk TO s@\n"
            "doMapSignal() mapped: clk to s\n"
            "doMapSignal() called: token=@MAPSIGNAL zz TO s@\n");
}

struct NameCase {
  const char* name;
  const char* pattern;
  bool caseSensitive;
  bool matches;
};

class SignalNameTest : public ::testing::TestWithParam<NameCase> {};

TEST_P(SignalNameTest, ComparesLikeTheConditionals) {
  const NameCase& c = GetParam();
  StbDataList data(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr);
  Forge forge(nullptr, nullptr, nullptr, &data);
  forge.m_CaseSensitiveIf = c.caseSensitive;
  EXPECT_EQ(forge.compareSignalName(c.name, c.pattern) == 0, c.matches)
      << c.name << " vs " << c.pattern;
}

INSTANTIATE_TEST_SUITE_P(
    Patterns, SignalNameTest,
    ::testing::Values(NameCase{"data", "*", true, true}, NameCase{"", "*", true, true},
                      NameCase{"data", "d?t?", true, true}, NameCase{"data", "????", true, true},
                      NameCase{"data", "?????", true, false}, NameCase{"data", "???", true, false},
                      NameCase{"data", "d*", true, false}, NameCase{"d*", "d*", true, true},
                      NameCase{"data", "**", true, false}, NameCase{"Data", "data", true, false},
                      NameCase{"Data", "dATA", false, true}, NameCase{"Da?a", "da?a", false, true},
                      NameCase{"a_b", "A_B", false, true}, NameCase{"a[b", "A{B", false, false}));

}  // namespace
