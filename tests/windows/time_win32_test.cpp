// Time on Windows: the local-time conversion and the format the program writes for %date%.
#include <gtest/gtest.h>

#include <ctime>

#include "platform/hostkit.h"

namespace {

TEST(TimeWin32, FormatsTheRunDate) {
  std::tm when{};
  when.tm_year = 2024 - 1900;
  when.tm_mon = 1;
  when.tm_mday = 29;
  when.tm_hour = 7;
  when.tm_min = 5;
  when.tm_sec = 9;
  char buffer[64];
  const size_t length = UT_TIME::StrFTime(buffer, sizeof buffer, "%H:%M:%S %m/%d/%Y", when);
  EXPECT_EQ(std::string(buffer, length), "07:05:09 02/29/2024");
  EXPECT_EQ(UT_TIME::StrFTime(buffer, 4, "%H:%M:%S", when), 0u);

  const std::time_t now = UT_TIME::Time();
  const std::tm local = UT_TIME::LocalTime(now);
  EXPECT_GE(local.tm_year, 2024 - 1900);
  std::tm copy = local;
  EXPECT_EQ(std::mktime(&copy), now);
}

}  // namespace
