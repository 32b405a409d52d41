// The message manager: which stream its texts reach, and when.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "platform/hostkit.h"

namespace {

TEST(MessageManager, ErrorsGoToStandardErrorDebugTextOnlyWhenAskedFor) {
  auto manager = Host_MsgManData::createObject("Mod", "src", 1, "rev");
  ASSERT_NE(manager, nullptr);
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  manager->issueError("ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "ERROR: something %s failed\n");
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "");

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
