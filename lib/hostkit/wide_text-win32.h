// The program keeps every name in UTF-8; Windows takes and gives names in UTF-16. These two
// conversions are the only place where the two meet, used by the Windows twins of the platform
// files.
#pragma once

#include <windows.h>

#include <climits>
#include <string>
#include <string_view>

namespace Host::win32 {

/// UTF-8 to UTF-16. Bytes that are not valid UTF-8 become U+FFFD; a NUL byte stays a NUL, so
/// callers that pass the result to the system must refuse names holding one.
inline std::wstring widen(std::string_view text) {
  if (text.empty() || text.size() > INT_MAX) return std::wstring();
  const int length = static_cast<int>(text.size());
  const int needed = ::MultiByteToWideChar(CP_UTF8, 0, text.data(), length, nullptr, 0);
  if (needed <= 0) return std::wstring();
  std::wstring wide(static_cast<size_t>(needed), L'\0');
  ::MultiByteToWideChar(CP_UTF8, 0, text.data(), length, wide.data(), needed);
  return wide;
}

/// UTF-16 to UTF-8.
inline std::string narrow(std::wstring_view text) {
  if (text.empty() || text.size() > INT_MAX) return std::string();
  const int length = static_cast<int>(text.size());
  const int needed =
      ::WideCharToMultiByte(CP_UTF8, 0, text.data(), length, nullptr, 0, nullptr, nullptr);
  if (needed <= 0) return std::string();
  std::string result(static_cast<size_t>(needed), '\0');
  ::WideCharToMultiByte(CP_UTF8, 0, text.data(), length, result.data(), needed, nullptr, nullptr);
  return result;
}

/// True when `name` can be handed to the system: not empty and without a NUL byte.
inline bool usableName(std::string_view name) {
  return !name.empty() && name.find('\0') == std::string_view::npos;
}

}  // namespace Host::win32
