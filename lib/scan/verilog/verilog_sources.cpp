// Include files are looked up the way designers expect from other tools: next to the file
// that includes them first, then in the run's directories.
#include "scan/verilog/verilog_sources.h"

#include <filesystem>

namespace scan::verilog {

SourceStore::SourceStore(std::string_view includePath, std::vector<std::string> designDirectories) {
  m_SearchPath.push_back(".");
  while (!includePath.empty()) {
    size_t colon = includePath.find(':');
    std::string_view dir = includePath.substr(0, colon);
    if (!dir.empty()) m_SearchPath.emplace_back(dir);
    if (colon == std::string_view::npos) break;
    includePath.remove_prefix(colon + 1);
  }
  for (std::string& dir : designDirectories) m_SearchPath.push_back(std::move(dir));
}

std::string SourceStore::directoryOf(const std::string& path) {
  size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  return slash == 0 ? "/" : path.substr(0, slash);
}

const SourceBuffer* SourceStore::openFile(const std::string& path, std::string& error) {
  // One buffer per real file, however it is named, so include cycles are seen.
  std::error_code failure;
  std::filesystem::path canonical = std::filesystem::canonical(path, failure);
  std::string key = failure ? path : canonical.string();
  auto known = m_ByPath.find(key);
  if (known != m_ByPath.end()) return known->second;
  std::unique_ptr<SourceBuffer> buffer = SourceBuffer::open(path, error);
  if (!buffer) return nullptr;
  const SourceBuffer* result = adopt(std::move(buffer));
  m_ByPath.emplace(key, result);
  return result;
}

const SourceBuffer* SourceStore::adopt(std::unique_ptr<SourceBuffer> buffer) {
  m_Buffers.push_back(std::move(buffer));
  return m_Buffers.back().get();
}

const SourceBuffer* SourceStore::findInclude(std::string_view name, const SourceBuffer* includer,
                                             std::string& error) {
  error.clear();
  if (name.empty() || name.find('\0') != std::string_view::npos) return nullptr;
  std::vector<std::string> candidates;
  if (name.front() == '/') {
    candidates.emplace_back(name);
  } else {
    std::vector<std::string> dirs;
    if (includer) dirs.push_back(directoryOf(includer->path()));
    dirs.insert(dirs.end(), m_SearchPath.begin(), m_SearchPath.end());
    for (const std::string& dir : dirs)
      candidates.push_back(dir == "." ? std::string(name) : dir + "/" + std::string(name));
  }
  for (const std::string& path : candidates) {
    if (const SourceBuffer* found = openFile(path, error)) return found;
    // The first file that exists is the one meant: say why it cannot be read rather than
    // going on to a namesake further down the path.
    std::error_code failure;
    if (std::filesystem::exists(std::filesystem::status(path, failure))) return nullptr;
  }
  error.clear();
  return nullptr;
}

}  // namespace scan::verilog
