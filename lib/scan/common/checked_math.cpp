// Checked 64-bit integer arithmetic on the compiler's overflow builtins.
#include "scan/common/checked_math.h"

#include <limits>

namespace scan {

// The builtins store the wrapped value even on overflow; the result is written only on success.
bool checkedAdd(int64_t a, int64_t b, int64_t& result) {
  int64_t r = 0;
  if (__builtin_add_overflow(a, b, &r)) return false;
  result = r;
  return true;
}

bool checkedSub(int64_t a, int64_t b, int64_t& result) {
  int64_t r = 0;
  if (__builtin_sub_overflow(a, b, &r)) return false;
  result = r;
  return true;
}

bool checkedMul(int64_t a, int64_t b, int64_t& result) {
  int64_t r = 0;
  if (__builtin_mul_overflow(a, b, &r)) return false;
  result = r;
  return true;
}

bool checkedDiv(int64_t a, int64_t b, int64_t& result) {
  if (b == 0 || (a == std::numeric_limits<int64_t>::min() && b == -1)) return false;
  result = a / b;
  return true;
}

bool checkedPow(int64_t base, int64_t exponent, int64_t& result) {
  if (exponent < 0) return false;
  int64_t acc = 1;
  while (exponent > 0) {
    if ((exponent & 1) && !checkedMul(acc, base, acc)) return false;
    exponent >>= 1;
    if (exponent > 0 && !checkedMul(base, base, base)) return false;
  }
  result = acc;
  return true;
}

bool fitsBound(int64_t v) {
  return v >= std::numeric_limits<int32_t>::min() && v <= std::numeric_limits<int32_t>::max();
}

}  // namespace scan
