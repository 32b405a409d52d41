// Whole templates through the processor, one row per template: the complete output, and either
// a clean finish or the exact message with its line. Rows are grouped by the part of the
// language they exercise.
#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::Design;
using handlers_test::errorAt;
using handlers_test::kDepth;
using handlers_test::nested;
using handlers_test::Row;
using handlers_test::rowName;
using handlers_test::TemplateTest;

TEST_P(TemplateTest, WritesWholeOutputAndResult) {
  const Row& row = GetParam();
  const handlers_test::Run run = handlers_test::runOn(row.templateText, row.design);
  EXPECT_EQ(run.output, row.output);
  const bool ok = row.message.empty();
  EXPECT_EQ(run.completed, ok);
  EXPECT_EQ(run.status, ok ? 0u : 2u);
  EXPECT_EQ(run.message, ok ? handlers_test::kNoError : row.message);
  EXPECT_EQ(run.warnings, row.warning.empty() ? std::vector<std::string>{}
                                              : std::vector<std::string>{row.warning});
}

const Design kNone;
const Design kAbc{{{"a", -1, -1, 'I'}, {"b", -1, -1, 'I'}, {"c", -1, -1, 'I'}}};
const Design kAbcd{
    {{"a", -1, -1, 'I'}, {"b", -1, -1, 'I'}, {"c", -1, -1, 'I'}, {"d", -1, -1, 'I'}}};
const Design kDesign{{{"clk", -1, -1, 'I'}, {"data", 7, 0, 'I'}, {"q", -1, -1, 'O'}}};
const Design kSmallBus{{{"d", 1, 0, 'I'}, {"q", -1, -1, 'O'}}};

std::string unknown(const std::string& token) {
  return errorAt(1, "Keyword: " + token + " is not a valid Variable or Directive name.");
}

INSTANTIATE_TEST_SUITE_P(
    Tokens, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"CommentsVanish", kNone, "a@comment x = y@b@COMMENTARY@c@comment open", "abc"},
        {"UnknownVariable", kNone, "ok %foo% never", "ok ", unknown("%foo%")},
        {"ClosedByOtherMark", kNone, "%date@x", "", unknown("%date@")},
        {"DoublePercent", kNone, "50%% off", "50", unknown("%%")},
        {"CommentCutByPercent", kNone, "a@comment 50% done@b", "a done", unknown("@b")},
        {"SettingsIsSet", kNone, "@settings@", "",
         errorAt(1,
                 "Invalid syntax for @SET directive, must be of the form: "
                 "@SET STATE_VARIABLE=VALUE@")},
        {"StrayEndIterate", kNone, "a\n@ENDITERATE@b", "a\n",
         errorAt(2, "@ENDITERATE@ keyword encountered without a matching @ITERATE@.")},
        {"TypeDecOutsideIterate", kNone, "a@vhdl_typedec@", "a",
         errorAt(1, "@VHDL_TYPEDEC@ may not occur outside of an @ITERATE@.")},
        // The message keeps 255 bytes and its newline, never splitting a character.
        {"CutDropsCharacterAcrossLimit", kNone, "%" + std::string(198, 'x') + "\xc3\xa9%", "",
         unknown("%" + std::string(198, 'x') + "\xc3\xa9%").substr(0, 253) + "\n"},
        {"CutKeepsCharacterEndingAtLimit", kNone, "%" + std::string(197, 'x') + "\xc3\xa9\xc3\xa9%",
         "", unknown("%" + std::string(197, 'x') + "\xc3\xa9\xc3\xa9%").substr(0, 254) + "\n"}}),
    rowName);

const std::string kSet = "Invalid syntax for @SET directive, ";
const std::string kSetForm = kSet + "must be of the form: @SET STATE_VARIABLE=VALUE@";
std::string badKey(const std::string& key) {
  return errorAt(1, kSet + key + "is not a valid choice for STATE_VARIABLE.");
}
std::string onOff(int line, const char* key) {
  return errorAt(line, kSet + key + " must be assigned the value ON or OFF");
}
const std::string kWidth = errorAt(1, kSet + "OUTLINEWIDTH must be assigned an integer value");

INSTANTIATE_TEST_SUITE_P(
    Set, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"DelimiterKeepsBlanks", kAbc, "@SET sigdelim=; @%iport%", "a; b; c"},
        {"EmptyValue", kAbc, "@SET sigdelim=@%iport%", "abc"},
        {"TabAfterWord", kAbc, "@SET\tsigdelim=;@%iport%", "a;b;c"},
        {"NewlineThenBlank", kAbc, "@SET\n sigdelim=;@%iport%", "a;b;c"},
        {"NulInValue", kAbc, std::string("@SET sigdelim=\0;\0@%iport%", 25),
         std::string("a\0;\0b\0;\0c", 9)},
        {"WidthSkipsBlanksAndSign", kAbc, "@SET outlinewidth=\n +3 @%iport%", "a, b, \nc"},
        {"WidthClampsHigh", kAbc, "@SET outlinewidth=2147483648@%iport%", "a, b, c"},
        {"WidthClampsLow", kAbc, "@SET outlinewidth=-4294967295@@SET sigdelim=,\n@%iport%",
         "a,\n\nb,\n\nc"},
        {"ExpandBusSwitch", kSmallBus, "@SET expandbus=ON@%ibusport%|@SET EXPANDBUS=off@%ibusport%",
         "d_1_, d_0_|d"},
        {"ShowRangeValues", kSmallBus,
         "@SET showrange=on@%ibusport%|@SET showrange=aspostfix@@SET showrange=off@%ibusport%|"
         "@SET showrange=on@%ibusport%|@SET showrange=ASPREFIX@%ibusport%",
         "[1:0] d|d|d[1:0]|[1:0] d"},
        {"MapSwitch", kSmallBus, "@MAPSIGNAL q TO r@@SET map=on@%oport%@SET Map=OFF@%oport%", "rq"},
        {"CaseValues",
         {{{"Data", -1, -1, 'I'}}},
         "@SET case=invcase@%port%|@SET CASE=LOWCASE@%port%|@UPCASE@@SET case=samecase@%port%",
         "dATA|data|Data"},
        {"NoBlankAfterWord", kNone, "x@SETsigdelim=;@", "x", errorAt(1, kSetForm)},
        {"NewlineAfterWord", kNone, "@SET\nsigdelim=;@", "", errorAt(2, kSetForm)},
        {"BlankThenEnd", kNone, "@SET ", "", errorAt(1, kSetForm)},
        {"OnlyBlanks", kNone, "@SET \t @", "", badKey("\t @")},
        {"BlankBeforeKey", kNone, "@SET  sigdelim=x@", "", badKey(" sigdelim")},
        {"NoEquals", kNone, "@SET busleft@", "", badKey("busleft@")},
        {"NoKey", kNone, "@SET =x@", "", badKey("x@")},
        {"WidthEmpty", kNone, "@SET outlinewidth=@", "", kWidth},
        {"WidthNotNumber", kNone, "@SET outlinewidth=abc@", "", kWidth},
        {"SwitchNotOnOff", kNone, "@SET casesensitiveif=1@", "", onOff(1, "CASESENSITIVEIF")},
        {"SwitchTrailingBlank", kNone, "@SET suppresnewline=on @", "", onOff(1, "SUPPRESNEWLINE")},
        {"RangeNotPosition", kNone, "@SET showrange=AsSuffix@", "", onOff(1, "SHOWRANGE")},
        {"ValueIsNewline", kNone, "@SET map=\n@", "", onOff(2, "MAP")}}),
    rowName);

// A line breaks only after a write equal to the signal delimiter, once the column passed the
// width.
INSTANTIATE_TEST_SUITE_P(
    Wrapping, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"HeaderValueEqualToDelimiter", kNone, "@SET sigdelim=vhd@@SET outlinewidth=3@ab%ext%c",
         "abvhd\nc"},
        {"OnlyWholeDelimiterCounts", kNone, "@SET outlinewidth=0@, x@SET sigdelim=VHD@%ext%",
         ", xvhd"},
        {"SuppressedDelimiterStillBreaks", kNone,
         "@SUPPRESNEWLINE@@SET outlinewidth=0@@SET sigdelim=\n@%ext%\n%ext%\tx\n", "vhd\nvhdx"},
        {"EmptyDelimiterMatchesEmptyWrites", kAbc, "@SET outlinewidth=-1@@SET sigdelim=@%iport%",
         "a\nb\nc\n"}}),
    rowName);

const std::string kIfForm =
    errorAt(1,
            "Invalid syntax for @IFHAS or @IFNHAS directive, must be of the form:\n"
            "@IFHAS SIGNALTYPE=SIGNALNAME@");
const std::string kIfType =
    errorAt(1,
            "Invalid syntax for @IFHAS or @IFNHAS directive, SIGNALTYPE must be one of:\n"
            "IPORT, OBPORT, OPORT, BPORT, PORT, NODE, SIGNAL.");
const std::string kEndIf = "@ENDIF@ directive encountered without a matching @IFHAS or @IFNHAS.";
const std::string kMapForm =
    "Invalid syntax for @MAPSIGNAL directive, must be of the form: @MAPSIGNAL OLDNAME TO NEWNAME@";

INSTANTIATE_TEST_SUITE_P(
    Conditionals, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"Kinds", kDesign,
         "@IFHAS PORT=*@1@ENDIF@@IFHAS NODE=*@2@ENDIF@@IFHAS BUSPORT=*@3@ENDIF@"
         "@IFHAS OBUSPORT=*@4@ENDIF@@IFHAS\tiport=clk@5@ENDIF@@ifnhas SignaL=zz@6@endif@",
         "1356"},
        {"Wildcards", kDesign,
         "@IFHAS IPORT=d?ta@1@ENDIF@@IFHAS IPORT=????@2@ENDIF@@IFHAS IPORT=dat??@3@ENDIF@"
         "@IFHAS IPORT=d*@4@ENDIF@@IFHAS OPORT=q?@5@ENDIF@",
         "12"},
        {"BlankBeforeClosingIsPartOfName", kDesign, "@IFHAS IPORT=clk @y@ENDIF@", ""},
        {"Nesting", kDesign,
         "A@IFHAS IPORT=x@B@IFHAS IPORT=clk@C@ENDIF@D@ENDIF@E"
         "@IFHAS IPORT=clk@F@IFHAS IPORT=y@G@ENDIF@H@ENDIF@",
         "AEFH"},
        {"MalformedIfInFailedBlockStillNests", kDesign,
         "<@IFHAS IPORT=zz@@IFHAS@@IFNHAS FOO@@ENDIF@@ENDIF@x@ENDIF@>", "<>"},
        {"BusFoundByNameWhenExpanding", kDesign,
         "@IFHAS IPORT=data@a@ENDIF@@EXPANDBUS@@IFHAS IPORT=data@b@ENDIF@"
         "@IFHAS IPORT=data_7_@c@ENDIF@",
         "ab"},
        {"NineLevels", kDesign, nested(9), "x"},
        {"TenthLevel", kDesign, nested(10), "", kDepth},
        {"TenthLevelInFailedBlock", kDesign, nested(10, "@IFHAS PORT=*@", "@IFHAS PORT=zz@"), "",
         kDepth},
        {"EndIfOutside", kDesign, "a\n@ENDIF@b", "a\n", errorAt(2, kEndIf)},
        {"EndIfInBodyClosesOuterBlock", kDesign,
         "@IFHAS PORT=*@@ITERATE@%PORT%@ITERATOR@@ENDIF@@ENDITERATE@", "clk, data, ",
         errorAt(1, kEndIf)},
        {"EmptyName", kDesign, "@IFHAS IPORT=@", "", kIfForm},
        {"NoArgument", kDesign, "x@IFNHAS @", "x", kIfForm},
        {"HeaderVariableKind", kDesign, "@IFHAS MODULE=x@", "", kIfType},
        {"TwoBlanks", kDesign, "@IFHAS  IPORT=clk@", "", kIfType},
        {"BlankBeforeEquals", kDesign, "@IFHAS IPORT =clk@", "", kIfType}}),
    rowName);

INSTANTIATE_TEST_SUITE_P(
    Mapping, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"MapSwitches", kDesign,
         "@MAPSIGNAL clk TO s@%iscalarport%@MAP@%iscalarport%@NOMAP@%iscalarport%", "clksclk"},
        {"MapBeforeMapping", kDesign, "@MAP@@MAPSIGNAL clk TO s@%iscalarport%", "s"},
        {"AnyWordAndSeparators", kDesign,
         "@MAPSIGNAL   clk   AS a@@MAPSIGNAL\tq\tTO\tb@@MAP@%iscalarport%%oport%", "ab"},
        {"NewNameKeepsBlank", kDesign, "@MAPSIGNAL clk TO  s@@MAP@[%iscalarport%]", "[ s]"},
        {"NameComparedWithCase", kDesign,
         "@SET CASESENSITIVEIF=OFF@@MAPSIGNAL CLK TO s@@MAP@%iscalarport%", "clk"},
        {"LastWinsOnlyDeclaredNamesSearched", kDesign,
         "@MAPSIGNAL clk TO a@@MAPSIGNAL clk TO b@@MAPSIGNAL b TO c@@MAPSIGNAL zz TO d@"
         "@MAP@%signal%",
         "b, data, q"},
        {"ConditionalUsesDeclaredName", kDesign,
         "@MAPSIGNAL clk TO s@@MAP@@IFHAS IPORT=clk@1@ENDIF@@IFHAS IPORT=s@2@ENDIF@", "1"},
        {"BusMappingReachesBits", kDesign,
         "@MAPSIGNAL data TO b@@MAP@%ibusport%|@EXPANDBUS@@UPCASE@%ibusport%",
         "b|B_7_, B_6_, B_5_, B_4_, B_3_, B_2_, B_1_, B_0_"},
        {"MappedWhileExpanding", kDesign,
         "@EXPANDBUS@@MAPSIGNAL data TO b@@MAP@%ibusport%|@NOEXPANDBUS@%ibusport%",
         "b_7_, b_6_, b_5_, b_4_, b_3_, b_2_, b_1_, b_0_|b"},
        {"MappingInFailedBlockDropped", kDesign,
         "@IFHAS PORT=zz@@MAPSIGNAL clk@@MAPSIGNAL clk TO a@@ENDIF@@MAP@%iscalarport%", "clk"},
        {"NoConnectingWord", kDesign, "@MAPSIGNAL clk s@", "", errorAt(1, kMapForm)},
        {"NoArguments", kDesign, "a\n\n@MAPSIGNAL@", "a\n\n", errorAt(3, kMapForm)},
        {"EmptyNewName", kDesign, "@MAPSIGNAL clk TO @", "", errorAt(1, kMapForm)}}),
    rowName);

INSTANTIATE_TEST_SUITE_P(
    PortLists, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"NodesOnlyInNodeAndSignal",
         {{{"a", -1, -1, 'I'}, {"nb", 1, 0, 'N'}}},
         "%node%;%signal%;%port%;%busport%",
         "nb;a, nb;a;"},
        {"KeepsListOrder",
         {{{"x", -1, -1, 'O'}, {"y", -1, -1, 'B'}, {"z", -1, -1, 'O'}}},
         "%obport%",
         "x, y, z"},
        {"RangesAndBits",
         {{{"d", 1, 0, 'I'}, {"a", 0, 1, 'I'}, {"en", -1, -1, 'I'}, {"x", 0, 0, 'I'}}},
         "@SHOWRANGE@%port%|@SET SHOWRANGE=AsPostfix@%port%|@EXPANDBUS@%port%",
         "[1:0] d, [0:1] a, en, [0:0] x|d[1:0], a[0:1], en, x[0:0]|"
         "d_1_, d_0_, a_0_, a_1_, en, x_0_"},
        {"EmptyBrackets",
         {{{"d", 7, 6, 'I'}}},
         "@SET BUSLEFT=@@SET BUSRIGHT=@@EXPANDBUS@%port%",
         "d7, d6"},
        {"NegativeIndices",
         {{{"n", 3, -2, 'I'}}},
         "@EXPANDBUS@%port%|@NOEXPANDBUS@@SHOWRANGE@%port%",
         "n_3_, n_2_, n_1_, n_0_, n, n_-2_|[3:-2] n"},
        {"RangeEnds",
         {{{"h", INT_MAX - 1, INT_MAX, 'I'}, {"l", INT_MIN + 1, INT_MIN, 'I'}}},
         "@EXPANDBUS@%port%",
         "h_2147483646_, h_2147483647_, l_-2147483647_, l_-2147483648_"},
        {"CaseSparesDelimiter",
         {{{"Data", -1, -1, 'I'}, {"x", -1, -1, 'I'}}},
         "@INVCASE@@SET SIGDELIM=aB@%port%",
         "dATAaBX"}}),
    rowName);

const Design kTyped{{{"en", -1, -1, 'I'}, {"data", 7, 0, 'I'}, {"addr", 0, 3, 'I'}}};
const std::string kIterator =
    errorAt(1, "Iterator must be one of: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL%");
const std::string kUnterminated = "@ITERATE@ must be terminated by @ENDITERATE@!";

INSTANTIATE_TEST_SUITE_P(
    Iteration, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"NoPortNoPass", kAbc, "x@ITERATE@%NODE%<@ITERATOR@>@ENDITERATE@y", "xy"},
        {"EmptyBodyOnlyDelimiters", kAbc, "@ITERATE@%PORT%@ENDITERATE@", ", , "},
        {"DelimiterAfterBody", kAbc, "@ITERATE@%IPORT%@ITERATOR@;\n@ENDITERATE@",
         "a;\n, b;\n, c;\n"},
        {"DelimiterSetInBody", kAbc,
         "@ITERATE@%IPORT%@ITERATOR@@SET SIGDELIM=;@@ENDITERATE@|%iport%", "a;b;c|a;b;c"},
        {"CaseFromBodyPersists", kAbc, "@ITERATE@%IPORT%@ITERATOR@@UPCASE@@ENDITERATE@", "a, B, C"},
        {"BodyKeepsBlanks",
         {{{"a", -1, -1, 'I'}}},
         "@ITERATE@%IPORT% @ITERATOR@\t@TAB@\n@ENDITERATE@",
         " a\t\t\n"},
        {"VhdlTypes", kTyped,
         "@SET VHDL_BUSTYPE=bit_vector@@SET VHDL_NETTYPE=bit@@SET SIGDELIM=\n@"
         "@ITERATE@%IPORT%@ITERATOR@ : in @VHDL_TYPEDEC@;@ENDITERATE@",
         "en : in bit;\ndata : in bit_vector(7 downto 0);\naddr : in bit_vector(0 to 3);"},
        {"VhdlBounds",
         {{{"z", 0, 0, 'I'}, {"n", 3, -2, 'I'}}},
         "@ITERATE@%IPORT%@VHDL_TYPEDEC@@ENDITERATE@",
         "std_logic_vector(0 to 0), std_logic_vector(3 downto -2)"},
        {"VhdlExpandedBits",
         {{{"d", 7, 6, 'I'}}},
         "@EXPANDBUS@@ITERATE@%IPORT%@VHDL_TYPEDEC@@ENDITERATE@",
         "std_logic_vector(7 to 7), std_logic_vector(6 to 6)"},
        {"VhdlTypesIgnoreCase",
         {{{"data", 7, 0, 'I'}}},
         "@UPCASE@@ITERATE@%IPORT%@ITERATOR@ : @VHDL_TYPEDEC@@ENDITERATE@",
         "DATA : std_logic_vector(7 downto 0)"},
        {"VhdlPieceEqualToDelimiterWraps",
         {{{"d", 1, 0, 'I'}}},
         "@SET SIGDELIM=(@@SET OUTLINEWIDTH=0@@ITERATE@%IPORT%@VHDL_TYPEDEC@@ENDITERATE@",
         "std_logic_vector(\n1 downto 0)"},
        {"ConditionalPerPass", kDesign,
         "@ITERATE@%PORT%@IFHAS IPORT=clk@+@ENDIF@@ITERATOR@@ENDITERATE@", "+clk, +data, +q"},
        // The iteration keeps its own position while searches and mappings run in its body.
        {"FailedSearchKeepsPosition", kAbc,
         "@ITERATE@%PORT%@IFNHAS PORT=zz@@ITERATOR@@ENDIF@@ENDITERATE@", "a, b, c"},
        {"SearchKeepsCurrentBit", kSmallBus,
         "@EXPANDBUS@@ITERATE@%PORT%@IFHAS OPORT=q@@ITERATOR@@ENDIF@"
         "@IFHAS IPORT=d@=@ITERATOR@@ENDIF@@ENDITERATE@",
         "d_1_=d_1_, d_0_=d_0_, q=q"},
        {"MappingKeepsPosition", kAbc,
         "@MAP@@ITERATE@%PORT%@MAPSIGNAL c TO z@@ITERATOR@@ENDITERATE@", "a, b, z"},
        {"MappingKeepsCurrentBit", kSmallBus,
         "@MAP@@EXPANDBUS@@ITERATE@%PORT%@MAPSIGNAL q TO r@@ITERATOR@@ENDITERATE@|%port%",
         "d_1_, d_0_, r|d_1_, d_0_, r"},
        // Bits already handed out keep the mapped name their bus had when it was expanded.
        {"MappingReachesNextExpansion", kSmallBus,
         "@MAP@@EXPANDBUS@@ITERATE@%IPORT%@MAPSIGNAL d TO e@@ITERATOR@@ENDITERATE@|%iport%",
         "d_1_, d_0_|e_1_, e_0_"},
        {"HeaderVariableIterator", kAbc, "@ITERATE@%MODULE%x@ENDITERATE@", "", kIterator},
        {"IteratorMissing", kAbc, "z@ITERATE@", "z", kIterator},
        {"UnterminatedBody", kAbc, "z@ITERATE@%PORT%@ITERATOR@\nx\n", "z",
         errorAt(3, kUnterminated)},
        {"PortListInBody", kAbc, "@ITERATE@%PORT%x%port%y@ENDITERATE@z", "x, ",
         errorAt(1,
                 "Variables: %IPORT% %OBPORT% %OPORT% %BPORT% %PORT% %NODE% %SIGNAL% are "
                 "not valid within @ITERATE@")},
        {"SecondEndIterateIsStray", kAbc, "@ITERATE@%PORT%x@ENDITERATE@@ENDITERATE@", "x, x, x",
         errorAt(1, "@ENDITERATE@ keyword encountered without a matching @ITERATE@.")}}),
    rowName);

// A block still open at the end is allowed but almost always a forgotten @ENDIF@: the run
// succeeds with one warning naming the outermost open block, and saying whether text was lost.
std::string dropped(const std::string& block) {
  return "template t.tmpl: " + block + " is never closed; the rest of the template was dropped";
}

std::string kept(const std::string& block) {
  return "template t.tmpl: " + block + " is never closed; the rest of the template was kept";
}

INSTANTIATE_TEST_SUITE_P(
    OpenBlock, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"Kept", kDesign, "\n\n@IFHAS PORT=*@x", "\n\nx", "", kept("@IFHAS at line 3")},
        {"OuterOfTwo", kDesign, "@IFHAS PORT=*@@IFHAS PORT=*@x@ENDIF@", "x", "",
         kept("@IFHAS at line 1")},
        {"OuterKeptInnerDropped", kDesign, "@IFHAS PORT=*@a\n@IFHAS PORT=zz@b", "a\n", "",
         dropped("@IFHAS at line 1")},
        // A block opened by a replayed body is dated like an error there: the @ENDITERATE@ line.
        {"OpenedInReplayedBody", kDesign, "@ITERATE@%IPORT%@IFPORT clk@@ITERATOR@\n@ENDITERATE@",
         "clk\n, ", "", dropped("@IFPORT at line 2")},
        {"AllClosed", kDesign, "@IFHAS PORT=*@@ENDIF@@IFHAS PORT=zz@@ENDIF@x", "x"},
        {"ErrorInsideNoWarning", kDesign, "@IFHAS PORT=*@%foo%", "", unknown("%foo%")},
        {"UnterminatedBodyNoWarning", kDesign, "@IFHAS PORT=*@@ITERATE@%PORT%", "",
         errorAt(1, kUnterminated)}}),
    rowName);

}  // namespace
