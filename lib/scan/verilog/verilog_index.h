// The index pass: one preprocessed walk over every file that records each design unit's name
// and place, and the places of the body statements a later header parse may need. No trees
// are built; bodies are skipped token by token.
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "scan/verilog/verilog_macros.h"

namespace scan {
class Diagnostics;
class SourceBuffer;
}  // namespace scan

namespace scan::verilog {

class SourceStore;

/// A place the preprocessor can restart from: the file offset, the macro table as it stood
/// (a position in its log) and the conditional branches open there.
struct Place {
  const SourceBuffer* source = nullptr;
  size_t offset = 0;
  size_t macroLog = 0;
  size_t openConditionals = 0;
};

enum class UnitKind { Module, Interface, Program, Package };

struct UnitRecord {
  UnitKind kind = UnitKind::Module;
  std::string name;
  std::string library;
  Place start;  ///< the unit's keyword
  /// Body statements that may declare ports, parameters, types, functions or imports.
  std::vector<Place> declarations;
  /// How many compilation-unit declarations came before the unit: the file-level imports
  /// among them apply to it.
  size_t unitScopeBefore = 0;
};

/// "module", "interface", "program" or "package".
const char* unitKindName(UnitKind kind);

class DesignIndex {
 public:
  DesignIndex(Diagnostics& diagnostics, MacroTable& macros, SourceStore& sources);

  /// Indexes one file; macros defined so far stay defined.
  void indexFile(const SourceBuffer& file, const std::string& library);

  /// The first module, interface or program named `name`, or null.
  const UnitRecord* find(std::string_view name) const;
  const UnitRecord* findPackage(std::string_view name) const;
  /// Declarations outside every unit (the compilation-unit scope).
  const std::vector<Place>& unitScope() const { return m_UnitScope; }
  /// Every unit met, in file order, duplicates included.
  const std::vector<UnitRecord>& units() const { return m_Units; }

 private:
  struct Hash {
    using is_transparent = void;
    size_t operator()(std::string_view s) const { return std::hash<std::string_view>{}(s); }
  };
  using NameMap = std::unordered_map<std::string, size_t, Hash, std::equal_to<>>;

  Diagnostics& m_Diagnostics;
  MacroTable& m_Macros;
  SourceStore& m_Sources;
  std::vector<UnitRecord> m_Units;
  NameMap m_Designs;
  NameMap m_Packages;
  std::vector<Place> m_UnitScope;

  friend class IndexWalk;
};

}  // namespace scan::verilog
