// Splits the argument text of a directive token into fields, each field with a separator set
// of its own, the way the directive syntax of @IFHAS and @MAPSIGNAL is defined.
#pragma once

#include <optional>
#include <string_view>

/// Takes the next field from `rest`: skips leading characters of `separators`, then runs up to
/// the next character of `separators` (which is consumed) or to the end of `rest`. Empty result
/// when only separators remain; `rest` is then left empty, so every later field is missing too.
inline std::optional<std::string_view> nextField(std::string_view& rest,
                                                 std::string_view separators) {
  const size_t start = rest.find_first_not_of(separators);
  if (start == std::string_view::npos) {
    rest = {};
    return std::nullopt;
  }
  const size_t end = rest.find_first_of(separators, start);
  const std::string_view field =
      rest.substr(start, end == std::string_view::npos ? end : end - start);
  rest = end == std::string_view::npos ? std::string_view{} : rest.substr(end + 1);
  return field;
}
