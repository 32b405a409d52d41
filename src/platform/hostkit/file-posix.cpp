// Files on a POSIX system: tests and removals by name, temporary files created exclusively,
// and the directory of the running executable.
#include <sys/stat.h>
#include <unistd.h>

#include <climits>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>

#include "platform/hostkit.h"

namespace {

std::string temporaryDirectory() {
  const char* fromEnvironment = std::getenv("TMPDIR");
  std::string directory =
      (fromEnvironment != nullptr && fromEnvironment[0] != '\0') ? fromEnvironment : "/tmp";
  while (directory.size() > 1 && directory.back() == '/') directory.pop_back();
  return directory;
}

}  // namespace

namespace Host {

bool File::isfile(const char* path) {
  struct stat status {};
  return path != nullptr && ::stat(path, &status) == 0 && S_ISREG(status.st_mode);
}

bool File::remove(const char* path) { return path != nullptr && ::unlink(path) == 0; }

bool File::remove_f(const char* path) {
  if (path == nullptr) return false;
  struct stat status {};
  if (::lstat(path, &status) == 0 && S_ISREG(status.st_mode) && (status.st_mode & S_IWUSR) == 0)
    ::chmod(path, status.st_mode | S_IWUSR);
  return ::unlink(path) == 0;
}

StringBase File::tmpnam(const char* /*buffer*/) {
  // Reserve a name by creating the file, then free it again for the caller to create.
  std::string name;
  std::FILE* reserved = createTemporary("", name);
  if (reserved == nullptr) return StringBase();
  std::fclose(reserved);
  ::unlink(name.c_str());
  return StringBase(std::move(name));
}

std::string File::temporaryDirectory() { return ::temporaryDirectory(); }

std::FILE* File::createTemporary(std::string_view suffix, std::string& name) {
  if (suffix.find('/') != std::string_view::npos || suffix.find('\0') != std::string_view::npos ||
      suffix.size() > INT_MAX)
    return nullptr;
  std::string pattern = temporaryDirectory() + "/pinforge-XXXXXX";
  pattern.append(suffix);
  const int descriptor = ::mkstemps(pattern.data(), static_cast<int>(suffix.size()));
  if (descriptor < 0) return nullptr;
  std::FILE* stream = ::fdopen(descriptor, "w");
  if (stream == nullptr) {
    ::close(descriptor);
    ::unlink(pattern.c_str());
    return nullptr;
  }
  name = std::move(pattern);
  return stream;
}

std::string File::executableDirectory() {
  std::string path(PATH_MAX, '\0');
  const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
  if (length <= 0 || static_cast<size_t>(length) >= path.size()) return std::string();
  path.resize(static_cast<size_t>(length));
  return FileName(path).GetDirectory().str();
}

}  // namespace Host
