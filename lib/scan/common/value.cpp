#include "scan/common/value.h"

namespace scan {

std::optional<int64_t> Value::toInteger() const {
  if (isInteger()) return asInteger();
  if (isBoolean()) return asBoolean() ? 1 : 0;
  return std::nullopt;
}

std::optional<double> Value::toReal() const {
  if (isReal()) return asReal();
  if (isInteger()) return static_cast<double>(asInteger());
  return std::nullopt;
}

}  // namespace scan
