// File-name helper: splits a path at its last separator, either '/' or '\\', so names written
// for either system work.
#include <string_view>

#include "platform/hostkit.h"

namespace {

constexpr std::string_view kSeparators = "/\\";

bool isSeparator(char c) { return kSeparators.find(c) != std::string_view::npos; }

size_t tailStart(std::string_view path) {
  const size_t last = path.find_last_of(kSeparators);
  return last == std::string_view::npos ? 0 : last + 1;
}

}  // namespace

namespace Host {

StringBase FileName::GetTail() const {
  return StringBase(std::string_view(m_Path).substr(tailStart(m_Path)));
}

StringBase FileName::GetExtension() const {
  const std::string_view tail = std::string_view(m_Path).substr(tailStart(m_Path));
  // The dots that begin a hidden file's name ("..", ".profile") start no extension.
  const size_t firstNonDot = tail.find_first_not_of('.');
  if (firstNonDot == std::string_view::npos) return StringBase();
  const size_t dot = tail.rfind('.');
  if (dot == std::string_view::npos || dot < firstNonDot) return StringBase();
  return StringBase(tail.substr(dot));
}

StringBase FileName::GetDirectory() const {
  std::string_view directory = std::string_view(m_Path).substr(0, tailStart(m_Path));
  while (directory.size() > 1 && isSeparator(directory.back())) directory.remove_suffix(1);
  return StringBase(directory);
}

}  // namespace Host
