// A private temporary directory for one test, removed with everything in it afterwards, and
// whole-file reads and writes for what a test puts in or finds there or a stream received.
#pragma once

#include <stdlib.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace pinforge_test {

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

/// Everything left to read from `file`.
inline std::string readRest(std::FILE* file) {
  std::string text;
  char buffer[8192];
  for (size_t got; (got = std::fread(buffer, 1, sizeof buffer, file)) > 0;)
    text.append(buffer, got);
  return text;
}

/// The whole file into `content`; false when it cannot be read.
inline bool readFile(const std::string& path, std::string& content) {
  FilePtr in(std::fopen(path.c_str(), "rb"));
  if (in) content = readRest(in.get());
  return in && std::ferror(in.get()) == 0;
}

/// The whole file, or "<missing>" when it cannot be read.
inline std::string readFile(const std::string& path) {
  std::string content;
  return readFile(path, content) ? content : "<missing>";
}

/// Everything written to `file` so far, read back from its start.
inline std::string readBack(std::FILE* file) {
  std::fflush(file);
  std::rewind(file);
  return readRest(file);
}

/// The first line of every reader message in `text`; later lines of one start with two blanks.
inline std::vector<std::string> messageHeads(const std::string& text) {
  std::vector<std::string> heads;
  for (size_t at = 0; at < text.size();) {
    const size_t end = std::min(text.find('\n', at), text.size());
    if (text.compare(at, 2, "  ") != 0) heads.push_back(text.substr(at, end - at));
    at = end + 1;
  }
  return heads;
}

inline bool writeFile(const std::string& path, std::string_view content, bool executable = false) {
  FilePtr out(std::fopen(path.c_str(), "wb"));
  if (!out || std::fwrite(content.data(), 1, content.size(), out.get()) != content.size())
    return false;
  out.reset();
  return !executable || chmod(path.c_str(), 0755) == 0;
}

class ScratchDir {
 public:
  ScratchDir() {
    std::error_code error;
    std::string pattern =
        (std::filesystem::temp_directory_path(error) / "pinforge-XXXXXX").string();
    if (mkdtemp(pattern.data()) != nullptr) m_Path = pattern;
  }
  ~ScratchDir() {
    std::error_code error;
    if (!m_Path.empty()) std::filesystem::remove_all(m_Path, error);
  }
  ScratchDir(const ScratchDir&) = delete;
  ScratchDir& operator=(const ScratchDir&) = delete;

  /// Empty when the directory could not be created.
  const std::string& path() const { return m_Path; }
  std::string file(const std::string& name) const { return m_Path + "/" + name; }

  bool write(const std::string& name, std::string_view content, bool executable = false) const {
    return writeFile(file(name), content, executable);
  }
  bool makeDir(const std::string& name) const { return mkdir(file(name).c_str(), 0755) == 0; }
  bool exists(const std::string& name) const {
    std::error_code error;
    return std::filesystem::exists(file(name), error);
  }
  /// The whole file, or "<missing>" when it cannot be read.
  std::string read(const std::string& name) const { return readFile(file(name)); }
  /// The names in the directory, so a test sees every file a step left behind.
  std::set<std::string> names() const {
    std::set<std::string> found;
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(m_Path, error))
      found.insert(entry.path().filename().string());
    return found;
  }

 private:
  std::string m_Path;
};

}  // namespace pinforge_test
