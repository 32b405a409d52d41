// What the evaluator's files share: bit masks, selects and the unsigned values Verilog
// operators produce. Internal to the evaluator; nothing outside verilog_eval*.cpp includes it.
#pragma once

#include <algorithm>
#include <cstdint>

#include "scan/common/reader_limits.h"
#include "scan/common/value.h"
#include "scan/verilog/verilog_expr.h"

namespace scan::verilog {

inline uint64_t lowMask(int64_t width) {
  return width >= 64 ? ~uint64_t{0} : (uint64_t{1} << width) - 1;
}

// The low bit and width of x[i], x[i:j], x[i+:j] or x[i-:j].
inline void selectBits(Op op, int64_t i, int64_t j, bool part, int64_t& low, int64_t& width) {
  low = i;
  width = 1;
  if (!part) return;
  if (op == Op::PlusSelect) {
    width = j;
  } else if (op == Op::MinusSelect) {
    width = j;
    low = i - j + 1;
  } else {
    low = std::min(i, j);
    width = (i > j ? i - j : j - i) + 1;
  }
}

inline Value unsignedValue(uint64_t bits, int64_t width) {
  int w = width >= 64 ? 64 : static_cast<int>(width);
  return Value::unsignedInteger(static_cast<int64_t>(bits & lowMask(w)), w);
}

}  // namespace scan::verilog
