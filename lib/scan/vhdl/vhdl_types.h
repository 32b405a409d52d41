// Knowledge of the predefined and IEEE types and functions the evaluator does not find in
// any parsed package.
#pragma once

#include <string_view>
#include <vector>

#include "scan/common/value.h"

namespace scan::vhdl {

struct RangeValue;

enum class BuiltinShape { NotBuiltin, Scalar, UnconstrainedArray };

/// How a predefined type (normalized name) is shaped.
BuiltinShape builtinShape(std::string_view name);
/// The range of a predefined discrete type; false when it has none or is unknown.
bool builtinRange(std::string_view name, RangeValue& out);
/// Predefined, conversion and math_real functions. `known` tells whether `name` is one;
/// false with `known` set means the arguments did not fit.
bool callBuiltinFunction(std::string_view name, const std::vector<Value>& args, Value& out,
                         bool& known);
/// Rounds to the nearest integer, halves away from zero, as VHDL conversions do; false
/// when the result does not fit.
bool roundToInteger(double v, int64_t& out);

}  // namespace scan::vhdl
