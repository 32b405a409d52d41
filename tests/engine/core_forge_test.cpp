// Processor lifecycle: the first-error rule, the message length limit, and independence of
// successive processors.
#include <gtest/gtest.h>

#include <string>

#include "core_harness.h"

namespace {

using enginetest::errorAt;
using enginetest::kNoErrors;
using enginetest::Rig;

TEST(Forge, StateDoesNotLeakIntoNextProcessor) {
  {
    Rig first("@SET sigdelim=;@@SET outlinewidth=3@@UPCASE@@MAP@");
    ASSERT_TRUE(first.forge.processTemplate());
    EXPECT_EQ(first.forge.m_SigDelim, ";");
  }
  Rig second("");
  EXPECT_EQ(second.message(), kNoErrors);
  EXPECT_EQ(second.forge.m_SigDelim, ", ");
  EXPECT_EQ(second.forge.m_OutLineWidth, 32767);
  EXPECT_EQ(second.forge.m_Case, Forge::SAMECASE);
  EXPECT_FALSE(second.forge.m_Map);
}

TEST(Forge, OnlyTheFirstErrorIsRecordedWithTheReadersLine) {
  Rig rig("a\nb\nc");
  rig.forge.m_Reader.nextToken();
  rig.forge.reportError("first");
  rig.forge.reportError("second");
  std::string message;
  EXPECT_EQ(rig.forge.getResult(message), 2u);
  EXPECT_EQ(message, errorAt(3, "first"));
}

TEST(Forge, LongMessageIsCutToCapacity) {
  const std::string token = "%" + std::string(300, 'x') + "%";
  Rig rig(token);
  EXPECT_FALSE(rig.forge.processTemplate());
  const std::string message = rig.message();
  const std::string full =
      errorAt(1, "Keyword: " + token + " is not a valid Variable or Directive name.");
  ASSERT_EQ(message.size(), Forge::kMessageCapacity);
  EXPECT_EQ(message, full.substr(0, message.size() - 1) + "\n");
}

TEST(Forge, CutKeepsWholeCharactersAndFittingMessages) {
  const size_t head = errorAt(1, "").size() - 1;  // where the text starts
  struct CutCase {
    size_t asciiBefore;   // plain bytes before a run of two-byte characters
    size_t expectedSize;  // of the recorded message
  };
  // A character across the cut is dropped whole; one that ends right at the cut stays.
  const CutCase cases[] = {{253 - head, 254}, {252 - head, 255}, {254 - head, 255}};
  for (const CutCase& c : cases) {
    std::string text(c.asciiBefore, 'a');
    for (int i = 0; i < 40; ++i) text += "\xc3\xa9";
    Rig rig("");
    rig.forge.reportError(text);
    const std::string message = rig.message();
    EXPECT_EQ(message.size(), c.expectedSize) << c.asciiBefore;
    EXPECT_EQ(message, errorAt(1, text).substr(0, c.expectedSize - 1) + "\n");
  }
  const std::string fits(Forge::kMessageCapacity - head - 1, 'm');
  Rig rig("");
  rig.forge.reportError(fits);
  EXPECT_EQ(rig.message(), errorAt(1, fits));
}

}  // namespace
