// What the preprocessor's files share: the frame limit and blank trimming. Internal to
// verilog_preprocessor*.cpp.
#pragma once

#include <cstddef>
#include <string_view>

#include "scan/verilog/verilog_lexer.h"

namespace scan::verilog {

/// Open frames (files and macro texts) at most: include cycles through many names and
/// recursive macros end in one error instead of a hang or unbounded memory.
inline constexpr size_t kMaxFrames = 256;

inline std::string_view trim(std::string_view s) {
  while (!s.empty() && isBlank(s.front())) s.remove_prefix(1);
  while (!s.empty() && isBlank(s.back())) s.remove_suffix(1);
  return s;
}

}  // namespace scan::verilog
