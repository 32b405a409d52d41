// The predefined world of a VHDL design: STD.STANDARD, IEEE.STD_LOGIC_1164, NUMERIC_STD and
// MATH_REAL, as far as bounds need them.
#include "scan/vhdl/vhdl_types.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "scan/vhdl/vhdl_eval.h"

namespace scan::vhdl {
namespace {

constexpr int64_t kIntegerLow = std::numeric_limits<int32_t>::min();
constexpr int64_t kIntegerHigh = std::numeric_limits<int32_t>::max();

bool realArgument(const std::vector<Value>& args, size_t i, double& out) {
  if (i >= args.size()) return false;
  std::optional<double> v = args[i].toReal();
  if (!v) return false;
  out = *v;
  return true;
}

}  // namespace

bool roundToInteger(double v, int64_t& out) {
  if (!std::isfinite(v) || std::fabs(v) > 9.0e18) return false;
  out = static_cast<int64_t>(std::llround(v));
  return true;
}

BuiltinShape builtinShape(std::string_view name) {
  static constexpr std::string_view kArrays[] = {"std_logic_vector",
                                                 "std_ulogic_vector",
                                                 "bit_vector",
                                                 "string",
                                                 "unsigned",
                                                 "signed",
                                                 "boolean_vector",
                                                 "integer_vector",
                                                 "real_vector",
                                                 "time_vector",
                                                 "ufixed",
                                                 "sfixed",
                                                 "float",
                                                 "unresolved_unsigned",
                                                 "unresolved_signed",
                                                 "u_unsigned",
                                                 "u_signed",
                                                 "u_ufixed",
                                                 "u_sfixed",
                                                 "float32",
                                                 "float64"};
  static constexpr std::string_view kScalars[] = {
      "std_logic",      "std_ulogic", "bit",       "boolean", "integer",      "natural",
      "positive",       "real",       "character", "time",    "delay_length", "severity_level",
      "file_open_kind", "x01",        "x01z",      "ux01",    "ux01z"};
  for (std::string_view a : kArrays)
    if (a == name) return BuiltinShape::UnconstrainedArray;
  for (std::string_view s : kScalars)
    if (s == name) return BuiltinShape::Scalar;
  return BuiltinShape::NotBuiltin;
}

bool builtinRange(std::string_view name, RangeValue& out) {
  struct Entry {
    std::string_view name;
    int64_t low;
    int64_t high;
  };
  static constexpr Entry kRanges[] = {{"integer", kIntegerLow, kIntegerHigh},
                                      {"natural", 0, kIntegerHigh},
                                      {"positive", 1, kIntegerHigh},
                                      {"boolean", 0, 1},
                                      {"bit", 0, 1},
                                      {"character", 0, 255},
                                      {"std_ulogic", 0, 8},
                                      {"std_logic", 0, 8},
                                      {"severity_level", 0, 3}};
  for (const Entry& e : kRanges)
    if (e.name == name) {
      out = RangeValue{e.low, e.high, true};
      return true;
    }
  return false;
}

bool callBuiltinFunction(std::string_view name, const std::vector<Value>& args, Value& out,
                         bool& known) {
  known = true;
  double x = 0;
  double y = 0;
  if (name == "integer" || name == "natural" || name == "positive") {
    if (args.size() != 1) return false;
    if (args[0].isInteger()) {
      out = args[0];
      return true;
    }
    int64_t v = 0;
    if (!realArgument(args, 0, x) || !roundToInteger(x, v)) return false;
    out = Value::integer(v);
    return true;
  }
  if (name == "real") {
    if (args.size() != 1 || !realArgument(args, 0, x)) return false;
    out = Value::real(x);
    return true;
  }
  if (name == "maximum" || name == "minimum" || name == "realmax" || name == "realmin") {
    if (args.size() != 2) return false;
    bool wantMax = name == "maximum" || name == "realmax";
    if (args[0].isInteger() && args[1].isInteger()) {
      int64_t a = args[0].asInteger();
      int64_t b = args[1].asInteger();
      out = Value::integer(wantMax ? std::max(a, b) : std::min(a, b));
      return true;
    }
    if (!realArgument(args, 0, x) || !realArgument(args, 1, y)) return false;
    out = Value::real(wantMax ? std::max(x, y) : std::min(x, y));
    return true;
  }
  struct Unary {
    std::string_view name;
    double (*fn)(double);
    bool positive;  // defined for positive arguments only
  };
  static const Unary kUnary[] = {
      {"ceil", [](double v) { return std::ceil(v); }, false},
      {"floor", [](double v) { return std::floor(v); }, false},
      {"round", [](double v) { return std::round(v); }, false},
      {"trunc", [](double v) { return std::trunc(v); }, false},
      {"sqrt", [](double v) { return std::sqrt(v); }, false},
      {"log2", [](double v) { return std::log2(v); }, true},
      {"log10", [](double v) { return std::log10(v); }, true},
      {"log", [](double v) { return std::log(v); }, true},
      {"exp", [](double v) { return std::exp(v); }, false},
  };
  for (const Unary& u : kUnary) {
    if (u.name != name) continue;
    if (args.size() != 1 || !realArgument(args, 0, x)) return false;
    if ((u.positive && x <= 0) || (name == "sqrt" && x < 0)) return false;
    out = Value::real(u.fn(x));
    return true;
  }
  known = false;
  return false;
}

}  // namespace scan::vhdl
