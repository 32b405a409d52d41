// Time on Windows: the C library's clock and formatting, with the reentrant local-time
// conversion Windows names differently.
#include <ctime>

#include "platform/hostkit.h"

std::time_t UT_TIME::Time() { return std::time(nullptr); }

std::tm UT_TIME::LocalTime(std::time_t when) {
  std::tm local{};
  localtime_s(&local, &when);
  return local;
}

size_t UT_TIME::StrFTime(char* buffer, size_t size, const char* format, const std::tm& when) {
  if (buffer == nullptr || size == 0 || format == nullptr) return 0;
  return std::strftime(buffer, size, format, &when);
}
