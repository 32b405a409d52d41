// Time formatting and the message manager's streams.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "platform/hostkit.h"

namespace {

TEST(Time, FormatsAndReportsShortBuffers) {
  std::tm when{};
  when.tm_year = 2026 - 1900;
  when.tm_mon = 0;
  when.tm_mday = 2;
  when.tm_hour = 3;
  when.tm_min = 4;
  when.tm_sec = 5;
  char buffer[128];
  ASSERT_EQ(UT_TIME::StrFTime(buffer, sizeof buffer, "%H:%M:%S %m/%d/%Y", when), 19u);
  EXPECT_STREQ(buffer, "03:04:05 01/02/2026");
  char tiny[4];
  EXPECT_EQ(UT_TIME::StrFTime(tiny, sizeof tiny, "%Y-%m", when), 0u);
  EXPECT_EQ(UT_TIME::StrFTime(nullptr, 0, "%Y", when), 0u);
}

TEST(Time, LocalTimeOfNowIsPlausible) {
  const std::tm now = UT_TIME::LocalTime(UT_TIME::Time());
  EXPECT_GE(now.tm_year + 1900, 2024);
  EXPECT_GE(now.tm_mday, 1);
}

TEST(MessageManager, ErrorsGoToStandardError) {
  auto manager = Host_MsgManData::createObject("Mod", "src", 1, "rev");
  ASSERT_NE(manager, nullptr);
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  manager->issueError("ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");
}

TEST(MessageManager, DebugTextOnlyWhenAskedFor) {
  ::unsetenv("PINFORGE_DEBUG_STUB");
  testing::internal::CaptureStderr();
  Host_MsgManData::debugStub("quiet\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");

  ::setenv("PINFORGE_DEBUG_STUB", "1", 1);
  testing::internal::CaptureStderr();
  Host_MsgManData::debugStub("Command line is: runscr x\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "Command line is: runscr x\n");
  ::unsetenv("PINFORGE_DEBUG_STUB");
}

}  // namespace
