// Hints stay outside the readers: they look only at what the readers list and at the design
// files' names and first lines, so a reader that lists nothing simply gives no hint.
#include "run_hints.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <numeric>

#include "owned_stream.h"

namespace {

char lower(char c) { return static_cast<char>(std::tolower(static_cast<unsigned char>(c))); }

std::string lowered(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), lower);
  return result;
}

bool endsWithAny(std::string_view file, std::initializer_list<std::string_view> suffixes) {
  const std::string name = lowered(file);
  return std::any_of(suffixes.begin(), suffixes.end(),
                     [&](std::string_view suffix) { return name.ends_with(suffix); });
}

/// Levenshtein distance of two texts, compared without letter case.
size_t editDistance(std::string_view a, std::string_view b) {
  std::vector<size_t> row(b.size() + 1);
  std::iota(row.begin(), row.end(), size_t{0});
  for (size_t i = 1; i <= a.size(); ++i) {
    size_t diagonal = row[0];
    row[0] = i;
    for (size_t j = 1; j <= b.size(); ++j) {
      const size_t above = row[j];
      const size_t change = diagonal + (lower(a[i - 1]) == lower(b[j - 1]) ? 0 : 1);
      row[j] = std::min({above + 1, row[j - 1] + 1, change});
      diagonal = above;
    }
  }
  return row[b.size()];
}

bool isIdentifierChar(char c) {
  return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_';
}

/// The name of the first "entity NAME is" that begins a line in the file's first 64 KiB;
/// empty when there is none or the file cannot be read.
std::string declaredEntity(const std::string& path) {
  const OwnedStream file(std::fopen(path.c_str(), "rb"));
  if (!file) return std::string();
  std::string text(64 * 1024, '\0');
  text.resize(std::fread(text.data(), 1, text.size(), file.get()));
  size_t at = 0;
  while (at < text.size()) {
    const size_t end = std::min(text.find('\n', at), text.size());
    std::string_view line(text.data() + at, end - at);
    at = end + 1;
    auto skipBlanks = [&line] {
      while (!line.empty() && (line.front() == ' ' || line.front() == '\t')) line.remove_prefix(1);
    };
    auto word = [&line] {
      size_t length = 0;
      while (length < line.size() && isIdentifierChar(line[length])) ++length;
      std::string_view result = line.substr(0, length);
      line.remove_prefix(length);
      return result;
    };
    skipBlanks();
    if (lowered(word()) != "entity") continue;
    skipBlanks();
    const std::string_view name = word();
    skipBlanks();
    if (!name.empty() && lowered(word()) == "is") return std::string(name);
  }
  return std::string();
}

}  // namespace

bool hasVerilogExtension(std::string_view file) {
  return endsWithAny(file, {".v", ".sv", ".vh", ".svh"});
}

std::vector<std::string> closestNames(std::string_view wanted,
                                      const std::vector<std::string>& names, size_t most) {
  std::vector<std::string> distinct;
  for (const std::string& name : names)
    if (std::find(distinct.begin(), distinct.end(), name) == distinct.end())
      distinct.push_back(name);
  std::vector<size_t> distances;
  for (const std::string& name : distinct) distances.push_back(editDistance(wanted, name));
  std::vector<size_t> order(distinct.size());
  std::iota(order.begin(), order.end(), size_t{0});
  std::stable_sort(order.begin(), order.end(),
                   [&](size_t a, size_t b) { return distances[a] < distances[b]; });
  std::vector<std::string> closest;
  for (size_t i = 0; i < order.size() && i < most; ++i) closest.push_back(distinct[order[i]]);
  return closest;
}

std::string unitNotFoundHint(std::string_view wanted, const std::vector<ScanUnitInfo>& units) {
  if (units.empty()) return std::string();
  std::vector<std::string> candidates;
  for (const ScanUnitInfo& unit : units)
    if (unit.kind == "entity" || unit.kind == "module" || unit.kind == "interface" ||
        unit.kind == "program")
      candidates.push_back(unit.name);
  std::string text = std::to_string(units.size());
  text += units.size() == 1 ? " design unit was read" : " design units were read";
  const std::vector<std::string> closest = closestNames(wanted, candidates, 5);
  if (closest.empty()) return text + ", none of them an entity or a module.";
  text += closest.size() == 1 ? "; the closest name is: " : "; the closest names are: ";
  for (size_t i = 0; i < closest.size(); ++i) {
    if (i != 0) text += ", ";
    text += closest[i];
  }
  return text + ".";
}

std::string languageHint(const std::vector<ScanExtractor::RegisteredFile>& files, bool verilog) {
  for (const ScanExtractor::RegisteredFile& file : files) {
    if (!verilog && hasVerilogExtension(file.path)) {
      const bool system = endsWithAny(file.path, {".sv", ".svh"});
      return file.path + " looks like " + (system ? "SystemVerilog" : "Verilog") +
             "; read it with -lang " + (system ? "sv." : "verilog.");
    }
    if (!verilog) continue;
    if (endsWithAny(file.path, {".vhd", ".vhdl"}))
      return file.path + " looks like VHDL; read it with -lang vhdl.";
    if (const std::string entity = declaredEntity(file.path); !entity.empty())
      return file.path + " looks like VHDL (it declares entity " + entity +
             "); read it with -lang vhdl.";
  }
  return std::string();
}

std::string unknownGenericMessage(std::string_view module, std::string_view name,
                                  const std::vector<ScanGeneric>& generics, bool verilog) {
  const std::string_view word = verilog ? "parameter" : "generic";
  std::string text = "-g ";
  text += name;
  text += ": ";
  text += module;
  text += " has no ";
  text += word;
  if (generics.empty()) return text + "s.";
  text += ' ';
  text += name;
  text += "; its ";
  text += word;
  text += "s are ";
  for (size_t i = 0; i < generics.size(); ++i) {
    if (i != 0) text += ", ";
    text += generics[i].name;
  }
  return text + ".";
}
