// The string helper: formatting, comparison with or without ASCII case, replacement and ASCII
// case conversion. Every operation is length-aware, so texts may hold NUL bytes.
#include <cstdarg>
#include <cstdio>
#include <string>
#include <string_view>

#include "platform/hostkit.h"

namespace {

unsigned char asciiLower(unsigned char c) {
  return (c >= 'A' && c <= 'Z') ? static_cast<unsigned char>(c - 'A' + 'a') : c;
}

unsigned char asciiUpper(unsigned char c) {
  return (c >= 'a' && c <= 'z') ? static_cast<unsigned char>(c - 'a' + 'A') : c;
}

unsigned char fold(char c, bool ignoreCase) {
  const auto byte = static_cast<unsigned char>(c);
  return ignoreCase ? asciiLower(byte) : byte;
}

// Bytes compare as unsigned values, like strcmp; a proper prefix sorts first.
int compareBytes(std::string_view a, std::string_view b, bool ignoreCase) {
  const size_t common = a.size() < b.size() ? a.size() : b.size();
  for (size_t i = 0; i < common; ++i) {
    const int difference = fold(a[i], ignoreCase) - fold(b[i], ignoreCase);
    if (difference != 0) return difference;
  }
  if (a.size() == b.size()) return 0;
  return a.size() < b.size() ? -1 : 1;
}

bool matchesAt(std::string_view text, size_t position, std::string_view pattern, bool ignoreCase) {
  return compareBytes(text.substr(position, pattern.size()), pattern, ignoreCase) == 0;
}

}  // namespace

namespace Host {

void StringBase::Format(const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  va_list measuring;
  va_copy(measuring, arguments);
  const int length = std::vsnprintf(nullptr, 0, format, measuring);
  va_end(measuring);
  if (length < 0) {
    m_Text.clear();
  } else {
    m_Text.assign(static_cast<size_t>(length) + 1, '\0');
    std::vsnprintf(m_Text.data(), m_Text.size(), format, arguments);
    m_Text.pop_back();
  }
  va_end(arguments);
}

int StringBase::Compare(std::string_view other, int mode) const {
  return compareBytes(m_Text, other, mode == 1);
}

int StringBase::Replace(std::string_view from, std::string_view to, int mode) {
  if (from.empty()) return 0;
  const bool ignoreCase = mode == 1;
  std::string result;
  int replacements = 0;
  size_t position = 0;
  while (position < m_Text.size()) {
    if (position + from.size() <= m_Text.size() && matchesAt(m_Text, position, from, ignoreCase)) {
      result.append(to);
      position += from.size();
      ++replacements;
    } else {
      result.push_back(m_Text[position]);
      ++position;
    }
  }
  if (replacements > 0) m_Text = std::move(result);
  return replacements;
}

void StringBase::MakeUpper() {
  for (char& c : m_Text) c = static_cast<char>(asciiUpper(static_cast<unsigned char>(c)));
}

void StringBase::MakeLower() {
  for (char& c : m_Text) c = static_cast<char>(asciiLower(static_cast<unsigned char>(c)));
}

}  // namespace Host
