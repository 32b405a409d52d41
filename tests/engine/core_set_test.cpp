// @SET: every key, the value rules, and every rejection with its message.
#include <gtest/gtest.h>

#include <string>

#include "core_harness.h"

namespace {

using enginetest::errorAt;
using enginetest::kNoErrors;
using enginetest::Rig;

struct TextCase {
  std::string token;
  std::string Forge::*field;
  std::string value;
};

class SetTextTest : public ::testing::TestWithParam<TextCase> {};

TEST_P(SetTextTest, TakesValueVerbatim) {
  Rig rig(GetParam().token);
  EXPECT_TRUE(rig.forge.processTemplate()) << rig.message();
  EXPECT_EQ(rig.forge.*GetParam().field, GetParam().value) << GetParam().token;
  EXPECT_EQ(rig.output(), "");
}

INSTANTIATE_TEST_SUITE_P(
    Keys, SetTextTest,
    ::testing::Values(
        TextCase{"@SET sigdelim=; @", &Forge::m_SigDelim, "; "},
        TextCase{"@set SIGDELIM=;@", &Forge::m_SigDelim, ";"},
        TextCase{"@SET sigdelim==@", &Forge::m_SigDelim, "="},
        TextCase{"@SET sigdelim=a=b@", &Forge::m_SigDelim, "a=b"},
        TextCase{"@SET sigdelim=@", &Forge::m_SigDelim, ""},
        TextCase{"@SET sigdelim=tail at end", &Forge::m_SigDelim, "tail at end"},
        TextCase{"@SET\tsigdelim=tab@", &Forge::m_SigDelim, "tab"},
        TextCase{"@SET\n sigdelim=x@", &Forge::m_SigDelim, "x"},
        TextCase{"@SET busleft=@", &Forge::m_BusLeft, ""},
        TextCase{"@SET BusLeft=(@", &Forge::m_BusLeft, "("},
        TextCase{"@SET busright=)@", &Forge::m_BusRight, ")"},
        TextCase{"@SET eoldelim=\n    @", &Forge::m_EolDelim, "\n    "},
        TextCase{"@SET EOLDELIM=\t@", &Forge::m_EolDelim, "\t"},
        TextCase{"@SET vhdl_bustype=bit_vector@", &Forge::m_VhdlBusType, "bit_vector"},
        TextCase{"@SET VHDL_NETTYPE=bit@", &Forge::m_VhdlNetType, "bit"},
        TextCase{std::string("@SET sigdelim=\0;\0@", 18), &Forge::m_SigDelim,
                 std::string("\0;\0", 3)}));

// The non-text state as one line, so each case states all of it at once.
std::string stateOf(const Forge& f) {
  return "w=" + std::to_string(f.m_OutLineWidth) + " bus=" + std::to_string(f.m_ExpandBus) +
         " range=" + std::to_string(f.m_ShowRange) + "/" + std::to_string(f.m_RangePosition) +
         " nl=" + std::to_string(f.m_SuppresNewLine) + " map=" + std::to_string(f.m_Map) +
         " if=" + std::to_string(f.m_CaseSensitiveIf) + " case=" + std::to_string(f.m_Case);
}

struct StateCase {
  const char* token;
  const char* state;
};

class SetStateTest : public ::testing::TestWithParam<StateCase> {};

TEST_P(SetStateTest, SetsState) {
  Rig rig(GetParam().token);
  EXPECT_TRUE(rig.forge.processTemplate()) << rig.message();
  EXPECT_EQ(stateOf(rig.forge), GetParam().state) << GetParam().token;
}

INSTANTIATE_TEST_SUITE_P(
    Values, SetStateTest,
    ::testing::Values(
        StateCase{"", "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=72@", "w=72 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET OutLineWidth=72abc@", "w=72 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=-1@", "w=-1 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=\n +5 @", "w=5 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=99999999999@",
                  "w=2147483647 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=-2147483648@",
                  "w=-2147483648 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET outlinewidth=-99999999999@",
                  "w=-2147483648 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET expandbus=ON@", "w=32767 bus=1 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET EXPANDBUS=On@@SET expandbus=off@",
                  "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET showrange=on@", "w=32767 bus=0 range=1/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET showrange=aspostfix@@SET showrange=off@@SET showrange=on@",
                  "w=32767 bus=0 range=1/1 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET showrange=AsPostfix@@NOSHOWRANGE@",
                  "w=32767 bus=0 range=0/1 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET showrange=AsPostfix@@SET showrange=ASPREFIX@",
                  "w=32767 bus=0 range=1/0 nl=0 map=0 if=1 case=0"},
        StateCase{"@SET suppresnewline=on@", "w=32767 bus=0 range=0/0 nl=1 map=0 if=1 case=0"},
        StateCase{"@SET map=on@", "w=32767 bus=0 range=0/0 nl=0 map=1 if=1 case=0"},
        StateCase{"@SET casesensitiveif=OFF@", "w=32767 bus=0 range=0/0 nl=0 map=0 if=0 case=0"},
        StateCase{"@SET case=UpCase@", "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=3"},
        StateCase{"@SET case=lowcase@", "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=2"},
        StateCase{"@SET CASE=INVCASE@", "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=1"},
        StateCase{"@UPCASE@@SET case=samecase@",
                  "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=0"}));

struct RejectCase {
  std::string templateText;
  std::string text;
  int line;
};

class SetRejectTest : public ::testing::TestWithParam<RejectCase> {};

TEST_P(SetRejectTest, StopsWithMessageAndKeepsState) {
  const RejectCase& c = GetParam();
  Rig rig("before" + c.templateText + "after");
  EXPECT_FALSE(rig.forge.processTemplate());
  EXPECT_EQ(rig.message(), errorAt(c.line, c.text));
  EXPECT_EQ(rig.output(), "before");
  EXPECT_EQ(stateOf(rig.forge), "w=32767 bus=0 range=0/0 nl=0 map=0 if=1 case=0");
  EXPECT_EQ(rig.forge.m_SigDelim, ", ");
}

const std::string kP = "Invalid syntax for @SET directive, ";
const std::string kForm = kP + "must be of the form: @SET STATE_VARIABLE=VALUE@";
std::string onOff(const char* key) { return kP + key + " must be assigned the value ON or OFF"; }
std::string invalid(const std::string& key) {
  return kP + key + "is not a valid choice for STATE_VARIABLE.";
}

INSTANTIATE_TEST_SUITE_P(
    Messages, SetRejectTest,
    ::testing::Values(
        RejectCase{"@SET@", kForm, 1},
        RejectCase{"@SETsigdelim=x@", kForm, 1},
        RejectCase{"@SET\nsigdelim=x@", kForm, 2},
        RejectCase{"@SET \t @", invalid("\t @"), 1},
        RejectCase{"@SET x=1@", invalid("x"), 1},
        RejectCase{"@SET  sigdelim=x@", invalid(" sigdelim"), 1},
        RejectCase{"@SET sigdelim =x@", invalid("sigdelim "), 1},
        RejectCase{"@SET busleft@", invalid("busleft@"), 1},
        RejectCase{"@SET @", invalid("@"), 1},
        RejectCase{"@SET =x@", invalid("x@"), 1},
        RejectCase{"@SET outlinewidth=@", kP + "OUTLINEWIDTH must be assigned an integer value", 1},
        RejectCase{"@SET outlinewidth=abc@", kP + "OUTLINEWIDTH must be assigned an integer value",
                   1},
        RejectCase{"@SET casesensitiveif=1@", onOff("CASESENSITIVEIF"), 1},
        RejectCase{"@SET expandbus=yes@", onOff("EXPANDBUS"), 1},
        RejectCase{"@SET expandbus=@", onOff("EXPANDBUS"), 1},
        RejectCase{"@SET expandbus=on @", onOff("EXPANDBUS"), 1},
        RejectCase{"@SET showrange=AsSuffix@", onOff("SHOWRANGE"), 1},
        RejectCase{"@SET suppresnewline=true@", onOff("SUPPRESNEWLINE"), 1},
        RejectCase{"@SET map=\n@", onOff("MAP"), 2},
        RejectCase{"@SET case=upper@", kP + "CASE must be assigned the value\nUPCASE, LOWCASE, "
                                            "INVCASE, or SAMECASE.", 1},
        RejectCase{"@SET case=@", kP + "CASE must be assigned the value\nUPCASE, LOWCASE, "
                                       "INVCASE, or SAMECASE.", 1}));

TEST(SetReject, BlankThenEndOfTemplateHasNoKey) {
  Rig rig("@SET ");
  EXPECT_FALSE(rig.forge.processTemplate());
  EXPECT_EQ(rig.message(), errorAt(1, kForm));
}

}  // namespace
