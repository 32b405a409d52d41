// A private temporary directory for one test, removed with everything in it afterwards, and
// small whole-file helpers for what a test puts in or finds there.
#pragma once

#include <stdlib.h>

#include <cstdio>
#include <filesystem>
#include <memory>
#include <string>
#include <system_error>

namespace pinforge_test {

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

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

  /// Writes `content` to the file `name` inside the directory; false on failure.
  bool write(const std::string& name, const std::string& content) const {
    FilePtr out(std::fopen(file(name).c_str(), "wb"));
    return out && std::fwrite(content.data(), 1, content.size(), out.get()) == content.size();
  }
  bool exists(const std::string& name) const {
    std::error_code error;
    return std::filesystem::exists(file(name), error);
  }
  /// The whole file, or "<missing>" when it cannot be read.
  std::string read(const std::string& name) const { return readFile(file(name)); }

  static std::string readFile(const std::string& path) {
    FilePtr in(std::fopen(path.c_str(), "rb"));
    if (!in) return "<missing>";
    std::string content;
    char buffer[4096];
    size_t got;
    while ((got = std::fread(buffer, 1, sizeof buffer, in.get())) > 0) content.append(buffer, got);
    return content;
  }

 private:
  std::string m_Path;
};

}  // namespace pinforge_test
