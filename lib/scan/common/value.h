// The constant evaluators' value: integer, real, boolean or string. Integer arithmetic is
// checked, so an overflowing bound is reported instead of wrapping into a wrong width.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "scan/common/checked_math.h"

namespace scan {

struct Composite;

class Value {
 public:
  Value() = default;
  static Value integer(int64_t v) { return Value(v); }
  /// A Verilog unsigned integer of `width` bits (1..64): `bits` already masked to the width.
  /// Arithmetic on it wraps at the width instead of being checked.
  static Value unsignedInteger(int64_t bits, int width) {
    Value value(bits);
    value.m_UnsignedWidth = width;
    return value;
  }
  static Value real(double v) { return Value(v); }
  static Value boolean(bool v) { return Value(v); }
  static Value string(std::string v) { return Value(std::move(v)); }
  static Value composite(Composite v);

  bool isNone() const { return m_Data.index() == 0; }
  bool isInteger() const { return std::holds_alternative<int64_t>(m_Data); }
  bool isReal() const { return std::holds_alternative<double>(m_Data); }
  bool isBoolean() const { return std::holds_alternative<bool>(m_Data); }
  bool isString() const { return std::holds_alternative<std::string>(m_Data); }
  bool isComposite() const {
    return std::holds_alternative<std::shared_ptr<const Composite>>(m_Data);
  }
  /// The width of an unsigned integer; 0 for every other value.
  int unsignedWidth() const { return m_UnsignedWidth; }

  int64_t asInteger() const { return std::get<int64_t>(m_Data); }
  double asReal() const { return std::get<double>(m_Data); }
  bool asBoolean() const { return std::get<bool>(m_Data); }
  const std::string& asString() const { return std::get<std::string>(m_Data); }
  const Composite& asComposite() const {
    return *std::get<std::shared_ptr<const Composite>>(m_Data);
  }

  /// An integer, or a boolean as 0/1; nothing for reals, strings and none.
  std::optional<int64_t> toInteger() const;
  /// A real, or an integer widened; nothing otherwise.
  std::optional<double> toReal() const;

 private:
  template <typename T>
  explicit Value(T v) : m_Data(std::move(v)) {}
  std::variant<std::monostate, int64_t, double, bool, std::string, std::shared_ptr<const Composite>>
      m_Data;
  int m_UnsignedWidth = 0;
};

/// An array or record value. An array keeps its index range's left bound and direction; a
/// record keeps its field names (normalized), one per element.
struct Composite {
  std::vector<Value> elements;
  std::vector<std::string> fields;
  int64_t left = 0;
  bool ascending = true;
};

inline Value Value::composite(Composite v) {
  return Value(std::shared_ptr<const Composite>(std::make_shared<Composite>(std::move(v))));
}

}  // namespace scan
