// libFuzzer entry for the Verilog preprocessor: the input is a small file set, written to a
// scratch folder, so `include searches, `define/`undef, macro arguments and conditional
// blocks all run against real files. The first part is top.v; each line "//--- NAME" starts
// another file, inc/NAME, found through an include folder. Must never crash or hang.
#include <stdlib.h>

#include <cctype>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "platform/scan.h"
#include "scan/common/diagnostics.h"
#include "scan/language_reader.h"

namespace {

namespace fs = std::filesystem;

constexpr std::string_view kFileMarker = "//--- ";
constexpr size_t kMaxFiles = 8;
constexpr size_t kMaxNameLength = 32;

struct SourcePart {
  std::string name;
  std::string text;
};

fs::path& scratchFolder() {
  static fs::path folder;
  return folder;
}

void removeScratchFolder() {
  std::error_code ignored;
  fs::remove_all(scratchFolder(), ignored);
}

/// Made once per process and removed at exit, so a run leaves nothing behind.
bool prepareScratchFolder() {
  if (!scratchFolder().empty()) return true;
  const char* tmp = std::getenv("TMPDIR");
  std::string pattern = std::string(tmp && *tmp ? tmp : "/tmp") + "/pinforge-ppfuzz-XXXXXX";
  if (mkdtemp(pattern.data()) == nullptr) return false;
  scratchFolder() = pattern;
  std::atexit(removeScratchFolder);
  // The include folder is named twice, as -I and as PINFORGE_INCLUDE, so both searches run.
  return setenv("PINFORGE_INCLUDE", (scratchFolder() / "inc").string().c_str(), 1) == 0;
}

/// File names keep to a harmless alphabet so an input can never write outside the folder.
std::string safeName(std::string_view wanted, size_t index) {
  std::string name;
  for (char c : wanted) {
    if (name.size() == kMaxNameLength) break;
    if (std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '.') name += c;
  }
  if (name.empty() || name[0] == '.') name = "f" + std::to_string(index) + ".vh";
  return name;
}

std::vector<SourcePart> splitParts(std::string_view input) {
  std::vector<SourcePart> parts{{"top.v", ""}};
  size_t at = 0;
  while (at <= input.size()) {
    size_t end = input.find('\n', at);
    std::string_view line = input.substr(at, end == std::string_view::npos ? end : end - at + 1);
    if (line.substr(0, kFileMarker.size()) == kFileMarker && parts.size() < kMaxFiles) {
      std::string_view name = line.substr(kFileMarker.size());
      while (!name.empty() && (name.back() == '\n' || name.back() == '\r')) name.remove_suffix(1);
      parts.push_back({safeName(name, parts.size()), ""});
    } else {
      parts.back().text.append(line);
    }
    if (end == std::string_view::npos) break;
    at = end + 1;
  }
  return parts;
}

bool writeFile(const fs::path& path, const std::string& text) {
  std::FILE* file = std::fopen(path.string().c_str(), "wb");
  if (file == nullptr) return false;
  bool ok = std::fwrite(text.data(), 1, text.size(), file) == text.size();
  return std::fclose(file) == 0 && ok;
}

/// Unit names the text puts after "module ", for units the index may not list.
std::vector<std::string> namedModules(const std::string& text) {
  std::vector<std::string> names;
  size_t at = 0;
  while (names.size() < 4 && (at = text.find("module ", at)) != std::string::npos) {
    at += 7;
    size_t end = at;
    while (end < text.size() &&
           (std::isalnum(static_cast<unsigned char>(text[end])) || text[end] == '_'))
      ++end;
    if (end > at) names.emplace_back(text, at, end - at);
  }
  return names;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (!prepareScratchFolder()) return 0;
  const fs::path& root = scratchFolder();
  const fs::path includes = root / "inc";
  std::error_code error;
  fs::remove_all(includes, error);
  fs::create_directory(includes, error);
  if (error) return 0;

  std::string input(reinterpret_cast<const char*>(data), size);
  std::vector<SourcePart> parts = splitParts(input);
  if (!writeFile(root / parts[0].name, parts[0].text)) return 0;
  for (size_t i = 1; i < parts.size(); ++i)
    if (!writeFile(includes / parts[i].name, parts[i].text)) return 0;

  ScanSettings settings;
  settings.macros = {{"FUZZ", std::nullopt}, {"WIDTH", "8"}};
  settings.includeDirectories = {includes.string()};
  scan::Diagnostics diagnostics(nullptr);
  std::unique_ptr<scan::LanguageReader> reader = scan::makeVerilogReader(diagnostics, settings);
  reader->indexFiles({{"work", (root / parts[0].name).string()}});

  std::vector<std::string> names = namedModules(input);
  for (const ScanUnitInfo& unit : reader->listUnits())
    if (names.size() < 8) names.push_back(unit.name);
  for (const std::string& name : names) {
    if (!reader->selectUnit("work", name)) continue;
    scan::UnitDescription unit;
    reader->readUnit(unit);
  }
  return 0;
}
