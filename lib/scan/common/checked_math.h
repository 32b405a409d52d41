// Integer arithmetic for both readers' constant evaluators and port widths: every operation
// reports overflow instead of wrapping, so an overflowing bound becomes an error message
// rather than a wrong width.
#pragma once

#include <cstdint>

namespace scan {

/// Checked integer arithmetic: false on overflow (or division by zero), result untouched.
bool checkedAdd(int64_t a, int64_t b, int64_t& result);
bool checkedSub(int64_t a, int64_t b, int64_t& result);
bool checkedMul(int64_t a, int64_t b, int64_t& result);
bool checkedDiv(int64_t a, int64_t b, int64_t& result);
bool checkedPow(int64_t base, int64_t exponent, int64_t& result);
/// True when `v` fits a port bound (signed 32-bit).
bool fitsBound(int64_t v);

}  // namespace scan
