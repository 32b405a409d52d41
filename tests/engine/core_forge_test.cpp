// Processor lifecycle: initial state, the first-error rule, message length, and independence
// of successive processors.
#include <gtest/gtest.h>

#include <string>

#include "core_harness.h"

namespace {

using enginetest::errorAt;
using enginetest::kNoErrors;
using enginetest::Rig;

TEST(Forge, FreshProcessorHasDefaults) {
  Rig rig("%module%");
  std::string message = "stale";
  EXPECT_EQ(rig.forge.getResult(message), 0u);
  EXPECT_EQ(message, kNoErrors);
  EXPECT_EQ(rig.forge.m_SigDelim, ", ");
  EXPECT_EQ(rig.forge.m_EolDelim, "\n");
  EXPECT_EQ(rig.forge.m_BusLeft, "_");
  EXPECT_EQ(rig.forge.m_BusRight, "_");
  EXPECT_EQ(rig.forge.m_VhdlBusType, "std_logic_vector");
  EXPECT_EQ(rig.forge.m_VhdlNetType, "std_logic");
  EXPECT_EQ(rig.forge.m_OutLineWidth, 32767);
  EXPECT_TRUE(rig.forge.m_CaseSensitiveIf);
  EXPECT_EQ(rig.output(), "");
}

TEST(Forge, StateDoesNotLeakIntoNextProcessor) {
  {
    Rig first("@SET sigdelim=;@@SET outlinewidth=3@@UPCASE@@MAP@");
    ASSERT_TRUE(first.forge.processTemplate());
    EXPECT_EQ(first.forge.m_SigDelim, ";");
  }
  Rig second("");
  EXPECT_EQ(second.forge.m_SigDelim, ", ");
  EXPECT_EQ(second.forge.m_OutLineWidth, 32767);
  EXPECT_EQ(second.forge.m_Case, Forge::SAMECASE);
  EXPECT_FALSE(second.forge.m_Map);
}

TEST(Forge, OnlyTheFirstErrorIsRecorded) {
  Rig rig("one\ntwo");
  rig.forge.reportError("first");
  rig.forge.reportError("second");
  std::string message;
  EXPECT_EQ(rig.forge.getResult(message), 2u);
  EXPECT_EQ(message, errorAt(1, "first"));
}

TEST(Forge, ErrorCarriesReaderLine) {
  Rig rig("a\nb\nc");
  rig.forge.m_Reader.nextToken();
  rig.forge.reportError("late");
  EXPECT_EQ(rig.message(), errorAt(3, "late"));
}

TEST(Forge, LongMessageIsCutToCapacity) {
  const std::string token = "%" + std::string(300, 'x') + "%";
  Rig rig(token);
  EXPECT_FALSE(rig.forge.processTemplate());
  const std::string message = rig.message();
  const std::string full = errorAt(1, "Keyword: " + token +
                                          " is not a valid Variable or Directive name.");
  ASSERT_EQ(message.size(), Forge::kMessageCapacity);
  EXPECT_EQ(message.substr(0, message.size() - 1), full.substr(0, message.size() - 1));
  EXPECT_EQ(message.back(), '\n');
}

TEST(Forge, CutNeverSplitsACharacter) {
  struct CutCase {
    size_t asciiBefore;  // bytes of the message before the first multi-byte character
    size_t expectedSize;
  };
  const std::string prefix = errorAt(1, "");  // "Error - ... line 1\n\n"
  const size_t head = prefix.size() - 1;      // the text starts here
  // Each "\xc3\xa9" is two bytes; place one across the cut (at 253/254) or right before it.
  const CutCase cases[] = {{253 - head, 254}, {252 - head, 255}, {254 - head, 255}};
  for (const CutCase& c : cases) {
    std::string text(c.asciiBefore, 'a');
    for (int i = 0; i < 40; ++i) text += "\xc3\xa9";
    Rig rig("");
    rig.forge.reportError(text);
    const std::string message = rig.message();
    EXPECT_EQ(message.size(), c.expectedSize) << c.asciiBefore;
    EXPECT_EQ(message.back(), '\n');
    const unsigned char last = static_cast<unsigned char>(message[message.size() - 2]);
    EXPECT_TRUE(last == 'a' || last == 0xa9) << c.asciiBefore;
  }
}

TEST(Forge, MessageAtCapacityIsKeptWhole) {
  const std::string prefix = errorAt(1, "");
  const std::string text(Forge::kMessageCapacity - prefix.size(), 'm');
  Rig rig("");
  rig.forge.reportError(text);
  EXPECT_EQ(rig.message(), errorAt(1, text));
}

}  // namespace
