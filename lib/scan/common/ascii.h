// ASCII letter case for the parts of both languages that ignore it: VHDL identifiers and
// keywords, and the base letters of literals. Bytes outside A-Z are left alone, so extended
// identifiers and UTF-8 pass through unchanged.
#pragma once

#include <string>
#include <string_view>

namespace scan {

/// `c` with A-Z mapped to a-z.
constexpr char asciiLower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; }

/// `text` with A-Z mapped to a-z.
inline std::string asciiLowered(std::string_view text) {
  std::string out(text);
  for (char& c : out) c = asciiLower(c);
  return out;
}

/// True when `a` and `b` are equal ignoring ASCII letter case.
inline bool equalsIgnoringCase(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (size_t i = 0; i < a.size(); ++i)
    if (asciiLower(a[i]) != asciiLower(b[i])) return false;
  return true;
}

}  // namespace scan
