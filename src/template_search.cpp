// Template lookup by name. The build tree's location is compiled in so that a fresh build finds
// the templates of its own source tree, and only then: an installed binary never looks there.
#include "template_search.h"

#include <algorithm>
#include <filesystem>
#include <system_error>

#include "platform/hostkit.h"

namespace {

namespace fs = std::filesystem;

bool isRegularFile(const fs::path& path) {
  std::error_code error;
  return fs::is_regular_file(path, error);
}

/// True when `inner` is `outer` or lies below it, both resolved to their real paths.
bool isInside(const fs::path& inner, const fs::path& outer) {
  std::error_code error;
  const fs::path realInner = fs::weakly_canonical(inner, error);
  if (error) return false;
  const fs::path realOuter = fs::weakly_canonical(outer, error);
  if (error || realOuter.empty()) return false;
  const fs::path relative = realInner.lexically_relative(realOuter);
  return !relative.empty() && *relative.begin() != "..";
}

}  // namespace

std::vector<std::string> templateFolders() {
  std::vector<std::string> folders = Host::Process::environmentList("PINFORGE_TEMPLATE_PATH");
  const std::string executable = Host::File::executableDirectory();
  if (!executable.empty()) {
    folders.push_back((fs::path(executable) / ".." / "share" / "pinforge" / "templates")
                          .lexically_normal()
                          .string());
#if defined(PINFORGE_SOURCE_TREE) && defined(PINFORGE_BUILD_TREE)
    if (isInside(executable, PINFORGE_BUILD_TREE))
      folders.push_back((fs::path(PINFORGE_SOURCE_TREE) / "templates").string());
#endif
  }
  return folders;
}

std::optional<std::string> findTemplate(std::string_view name) {
  std::error_code error;
  if (name.empty()) return std::nullopt;
  if (fs::exists(fs::symlink_status(fs::path(name), error))) return std::string(name);
  for (const std::string& folder : templateFolders()) {
    for (std::string_view suffix : {"", ".tmpl", ".tcl"}) {
      const fs::path candidate = fs::path(folder) / (std::string(name) + std::string(suffix));
      if (isRegularFile(candidate)) return candidate.string();
    }
  }
  return std::nullopt;
}

std::vector<std::string> availableTemplates() {
  std::vector<std::string> names;
  for (const std::string& folder : templateFolders()) {
    std::error_code error;
    for (fs::directory_iterator entry(folder, error), end; !error && entry != end;
         entry.increment(error)) {
      if (!isRegularFile(entry->path())) continue;
      std::string name = entry->path().filename().string();
      if (name.empty() || name.front() == '.') continue;
      for (std::string_view suffix : {".tmpl", ".tcl"}) {
        if (name.size() > suffix.size() && name.ends_with(suffix)) {
          name.resize(name.size() - suffix.size());
          break;
        }
      }
      names.push_back(std::move(name));
    }
  }
  std::sort(names.begin(), names.end());
  names.erase(std::unique(names.begin(), names.end()), names.end());
  return names;
}
