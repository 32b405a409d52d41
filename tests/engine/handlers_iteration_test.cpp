// @ITERATE@ bodies, @ITERATOR@ and @VHDL_TYPEDEC@, including the iteration's own position
// while searches and mappings run inside its body.
#include <gtest/gtest.h>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::errorAt;
using handlers_test::PortSpec;
using handlers_test::runTemplate;

const std::vector<PortSpec> kAbc = {{"a", -1, -1, 'I'}, {"b", -1, -1, 'I'}, {"c", -1, -1, 'I'}};
const std::vector<PortSpec> kMixed = {
    {"data", 7, 0, 'I'}, {"en", -1, -1, 'I'}, {"q", -1, -1, 'O'}};
const std::vector<PortSpec> kTyped = {
    {"en", -1, -1, 'I'}, {"data", 7, 0, 'I'}, {"addr", 0, 3, 'I'}};
const std::vector<PortSpec> kSmallBus = {{"d", 1, 0, 'I'}, {"q", -1, -1, 'O'}};

struct IterCase {
  const char* name;
  const char* templateText;
  std::vector<PortSpec> ports;
  const char* expected;
  int errorLine;             // 0: the run succeeds
  const char* errorText;
};

class IterationTest : public ::testing::TestWithParam<IterCase> {};

TEST_P(IterationTest, WritesWholeOutputAndResult) {
  const IterCase& c = GetParam();
  const handlers_test::Run run = runTemplate(c.templateText, c.ports);
  EXPECT_EQ(run.output, c.expected);
  if (c.errorLine == 0) {
    EXPECT_EQ(run.status, 0u) << run.message;
    EXPECT_EQ(run.message, handlers_test::kNoError);
    EXPECT_TRUE(run.completed);
  } else {
    EXPECT_EQ(run.status, 2u);
    EXPECT_EQ(run.message, errorAt(c.errorLine, c.errorText));
    EXPECT_FALSE(run.completed);
  }
}

constexpr const char* kVariablesMessage =
    "Variables: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL% are not valid within "
    "@ITERATE@";
constexpr const char* kIteratorMessage =
    "Iterator must be one of: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL%";
constexpr const char* kVhdlDecl = "@ITERATE@%IPORT%@ITERATOR@ : in @VHDL_TYPEDEC@;@ENDITERATE@";

INSTANTIATE_TEST_SUITE_P(
    Bodies, IterationTest,
    ::testing::Values(
        IterCase{"angle_brackets", "@ITERATE@%IPORT%<@ITERATOR@>@ENDITERATE@", kAbc,
                 "<a>, <b>, <c>", 0, ""},
        IterCase{"no_node_writes_nothing", "x@ITERATE@%NODE%<@ITERATOR@>@ENDITERATE@y", kAbc,
                 "xy", 0, ""},
        IterCase{"empty_body_only_delimiters", "@ITERATE@%PORT%@ENDITERATE@", kAbc, ", , ", 0,
                 ""},
        IterCase{"one_port_no_delimiter", "@ITERATE@%OPORT%(@ITERATOR@)@ENDITERATE@", kMixed,
                 "(q)", 0, ""},
        IterCase{"delimiter_after_own_separator", "@ITERATE@%IPORT%@ITERATOR@;\n@ENDITERATE@",
                 kAbc, "a;\n, b;\n, c;\n", 0, ""},
        IterCase{"empty_delimiter", "@SET SIGDELIM=@@ITERATE@%IPORT%@ITERATOR@;\n@ENDITERATE@",
                 kAbc, "a;\nb;\nc;\n", 0, ""},
        IterCase{"lower_case_words", "@iterate@%Port%@ITERATOR@@enditerate@", kAbc, "a, b, c",
                 0, ""},
        IterCase{"same_text_as_variable", "@ITERATE@%SIGNAL%@ITERATOR@@ENDITERATE@|%signal%",
                 kMixed, "data, en, q|data, en, q", 0, ""},
        IterCase{"expanded_passes", "@EXPANDBUS@@ITERATE@%IPORT%<@ITERATOR@>@ENDITERATE@",
                 kMixed,
                 "<data_7_>, <data_6_>, <data_5_>, <data_4_>, <data_3_>, <data_2_>, <data_1_>, "
                 "<data_0_>, <en>", 0, ""},
        IterCase{"delimiter_set_in_body",
                 "@ITERATE@%IPORT%@ITERATOR@@SET SIGDELIM=;@@ENDITERATE@|%iport%", kAbc,
                 "a;b;c|a;b;c", 0, ""},
        IterCase{"upcase_from_body_persists", "@ITERATE@%IPORT%@ITERATOR@@UPCASE@@ENDITERATE@",
                 kAbc, "a, B, C", 0, ""},
        IterCase{"body_keeps_text_blanks", "@ITERATE@%IPORT% @ITERATOR@\t@TAB@\n@ENDITERATE@",
                 {{"a", -1, -1, 'I'}}, " a\t\t\n", 0, ""},
        IterCase{"vhdl_declarations", "@SET SIGDELIM=\n@" "@ITERATE@%IPORT%@ITERATOR@ : in "
                 "@VHDL_TYPEDEC@;@ENDITERATE@", kTyped,
                 "en : in std_logic;\ndata : in std_logic_vector(7 downto 0);\n"
                 "addr : in std_logic_vector(0 to 3);", 0, ""},
        IterCase{"vhdl_custom_types",
                 "@SET VHDL_BUSTYPE=bit_vector@@SET VHDL_NETTYPE=bit@@SET SIGDELIM=\n@"
                 "@ITERATE@%IPORT%@ITERATOR@ : in @VHDL_TYPEDEC@;@ENDITERATE@", kTyped,
                 "en : in bit;\ndata : in bit_vector(7 downto 0);\naddr : in bit_vector(0 to 3);",
                 0, ""},
        IterCase{"vhdl_equal_bounds", kVhdlDecl, {{"z", 0, 0, 'I'}},
                 "z : in std_logic_vector(0 to 0);", 0, ""},
        IterCase{"vhdl_negative_bound", kVhdlDecl, {{"n", 3, -2, 'I'}},
                 "n : in std_logic_vector(3 downto -2);", 0, ""},
        IterCase{"vhdl_expanded_bits", "@EXPANDBUS@@ITERATE@%IPORT%@VHDL_TYPEDEC@@ENDITERATE@",
                 {{"d", 7, 6, 'I'}}, "std_logic_vector(7 to 7), std_logic_vector(6 to 6)", 0,
                 ""},
        IterCase{"vhdl_types_ignore_case", "@UPCASE@" "@ITERATE@%IPORT%@ITERATOR@ : "
                 "@VHDL_TYPEDEC@@ENDITERATE@", {{"data", 7, 0, 'I'}},
                 "DATA : std_logic_vector(7 downto 0)", 0, ""},
        IterCase{"vhdl_piece_equal_to_delimiter_wraps",
                 "@SET SIGDELIM=(@@SET OUTLINEWIDTH=0@@ITERATE@%IPORT%@VHDL_TYPEDEC@@ENDITERATE@",
                 {{"d", 1, 0, 'I'}}, "std_logic_vector(\n1 downto 0)", 0, ""},
        IterCase{"conditional_per_pass",
                 "@ITERATE@%PORT%@IFHAS IPORT=en@+@ENDIF@@ITERATOR@@ENDITERATE@", kMixed,
                 "+data, +en, +q", 0, ""},
        IterCase{"iteration_in_failed_block_dropped",
                 "@IFHAS PORT=zz@@ITERATE@%PORT%x@ENDITERATE@@ENDIF@y", kAbc, "y", 0, ""},
        // The iteration keeps its own position: searches in the body do not move it.
        IterCase{"search_in_body_keeps_position",
                 "@ITERATE@%PORT%@IFHAS PORT=b@@ITERATOR@@ENDIF@@ENDITERATE@", kAbc, "a, b, c",
                 0, ""},
        IterCase{"failed_search_in_body_keeps_position",
                 "@ITERATE@%PORT%@IFNHAS PORT=zz@@ITERATOR@@ENDIF@@ENDITERATE@", kAbc,
                 "a, b, c", 0, ""},
        IterCase{"search_in_body_keeps_current_bit",
                 "@EXPANDBUS@@ITERATE@%PORT%@IFHAS OPORT=q@@ITERATOR@@ENDIF@"
                 "@IFHAS IPORT=d@=@ITERATOR@@ENDIF@@ENDITERATE@",
                 kSmallBus, "d_1_=d_1_, d_0_=d_0_, q=q", 0, ""},
        IterCase{"mapping_in_body_keeps_position",
                 "@MAP@@ITERATE@%PORT%@MAPSIGNAL c TO z@@ITERATOR@@ENDITERATE@", kAbc,
                 "a, b, z", 0, ""},
        IterCase{"mapping_in_body_keeps_current_bit",
                 "@MAP@@EXPANDBUS@@ITERATE@%PORT%@MAPSIGNAL q TO r@@ITERATOR@@ENDITERATE@"
                 "|%port%", kSmallBus, "d_1_, d_0_, r|d_1_, d_0_, r", 0, ""},
        // Bits already handed out keep the mapped name their bus had when it was expanded.
        IterCase{"mapping_current_bus_reaches_next_expansion",
                 "@MAP@@EXPANDBUS@@ITERATE@%IPORT%@MAPSIGNAL d TO e@@ITERATOR@@ENDITERATE@"
                 "|%iport%", kSmallBus, "d_1_, d_0_|e_1_, e_0_", 0, ""},
        // Errors.
        IterCase{"nested_iterate", "@ITERATE@%PORT%a@ITERATE@%PORT%b@ENDITERATE@c", kAbc, "a, ",
                 1, "@ITERATE@ may not occur inside an @ITERATE@ body."},
        IterCase{"blank_before_iterator", "@ITERATE@ %PORT%x@ENDITERATE@", kAbc, "", 1,
                 kIteratorMessage},
        IterCase{"scalar_variable_iterator", "@ITERATE@%MODULE%x@ENDITERATE@", kAbc, "", 1,
                 kIteratorMessage},
        IterCase{"directive_iterator", "@ITERATE@@CR@x@ENDITERATE@", kAbc, "", 1,
                 kIteratorMessage},
        IterCase{"iterator_at_end", "z@ITERATE@", kAbc, "z", 1, kIteratorMessage},
        IterCase{"unterminated_body", "z@ITERATE@%PORT%@ITERATOR@\nx\n", kAbc, "z", 3,
                 "@ITERATE@ must be terminated by @ENDITERATE@!"},
        IterCase{"unclosed_enditerate", "@ITERATE@%PORT%x@ENDITERATE", kAbc, "", 1,
                 "@ITERATE@ must be terminated by @ENDITERATE@!"},
        IterCase{"variable_in_body", "@ITERATE@%PORT%x%port%y@ENDITERATE@z", kAbc, "x, ", 1,
                 kVariablesMessage},
        IterCase{"variable_in_body_last_port", "@ITERATE@%PORT%x%iscalarport%y@ENDITERATE@",
                 {{"a", -1, -1, 'I'}}, "x", 1, kVariablesMessage},
        IterCase{"replay_error_carries_enditerate_line",
                 "\n@ITERATE@%PORT%\n@ITERATOR@\n@FOO@\nx\n@ENDITERATE@\n", kAbc, "\n\na\n, ", 6,
                 "Keyword: @FOO@ is not a valid Variable or Directive name."},
        IterCase{"stray_enditerate", "a\n@ENDITERATE@", kAbc, "a\n", 2,
                 "@ENDITERATE@ keyword encountered without a matching @ITERATE@."},
        IterCase{"second_enditerate_is_stray", "@ITERATE@%PORT%x@ENDITERATE@@ENDITERATE@",
                 kAbc, "x, x, x", 1,
                 "@ENDITERATE@ keyword encountered without a matching @ITERATE@."},
        IterCase{"iterator_outside", "a@ITERATOR@b", kAbc, "a", 1,
                 "@ITERATOR@ may not occur outside of an @ITERATE@."},
        IterCase{"typedec_outside", "a@VHDL_TYPEDEC@b", kAbc, "a", 1,
                 "@VHDL_TYPEDEC@ may not occur outside of an @ITERATE@."}),
    [](const ::testing::TestParamInfo<IterCase>& info) { return std::string(info.param.name); });

// Only the lines of the iteration handlers; the dispatcher traces every token as well.
std::string linesStartingWith(const std::string& trace, std::string_view prefix) {
  std::string kept;
  size_t start = 0;
  while (start < trace.size()) {
    size_t end = trace.find('\n', start);
    end = end == std::string::npos ? trace.size() : end + 1;
    const std::string_view line(trace.data() + start, end - start);
    if (line.substr(0, prefix.size()) == prefix) kept += line;
    start = end;
  }
  return kept;
}

TEST(IterationTrace, CollectionAndPassesAreTraced) {
  const handlers_test::Run run = runTemplate(
      "@EXPANDBUS@@ITERATE@%IPORT%<@ITERATOR@>@ENDITERATE@",
                  {{"d", 1, 0, 'I'}, {"e", -1, -1, 'I'}}, true);
  EXPECT_EQ(run.output, "<d_1_>, <d_0_>, <e>");
  EXPECT_EQ(linesStartingWith(run.trace, "eatIterate()"),
            "eatIterate() Iterator=%IPORT%\n"
            "eatIterate() eating szToken=<\n"
            "eatIterate() eating szToken=@ITERATOR@\n"
            "eatIterate() eating szToken=>\n");
  EXPECT_EQ(linesStartingWith(run.trace, "doIterate()"),
            "doIterate() Iterating for signal=d\n"
            "doIterate() Iterating for signal=d\n"
            "doIterate() Iterating for signal=e\n");
}

TEST(IterationTrace, RejectedIteratorIsTraced) {
  const handlers_test::Run run = runTemplate("@ITERATE@%module%", kAbc, true);
  EXPECT_EQ(linesStartingWith(run.trace, "eatIterate()"), "eatIterate() Iterator=%module%\n");
}

}  // namespace
