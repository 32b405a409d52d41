// Splitting a list such as PATH, shared by the host twins, which differ only in the separator
// and in how they read the environment.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Host {

/// The entries of `list` separated by `separator`, in order, empty entries left out.
inline std::vector<std::string> splitPathList(std::string_view list, char separator) {
  std::vector<std::string> entries;
  while (!list.empty()) {
    const size_t at = list.find(separator);
    if (at != 0) entries.emplace_back(list.substr(0, at));
    if (at == std::string_view::npos) break;
    list.remove_prefix(at + 1);
  }
  return entries;
}

}  // namespace Host
