// The index pass: one lexing sweep per file that records every design unit (kind, name,
// library, offset) and the use clauses in front of it. Bodies are skipped token by token;
// nothing else is kept, so a 100 MB netlist costs little more than reading it.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "scan/common/source_buffer.h"

namespace scan {
class Diagnostics;
}

namespace scan::vhdl {

enum class UnitKind : uint8_t {
  Entity,
  Architecture,
  Package,
  PackageBody,
  PackageInstance,
  Configuration,
  Context,
};

/// `use a.b.c;` (or `context a.b;`) as normalized names.
struct UseClause {
  std::vector<std::string> names;
  bool context = false;
};

struct UnitRecord {
  UnitKind kind = UnitKind::Entity;
  std::string name;     ///< normalized
  std::string library;  ///< normalized
  uint32_t file = 0;
  size_t offset = 0;  ///< the unit's first keyword
  std::vector<UseClause> uses;
};

class DesignIndex {
 public:
  explicit DesignIndex(Diagnostics& diagnostics) : m_Diagnostics(diagnostics) {}

  /// Indexes `source` as part of `library`. Units already known keep their first
  /// definition; the later one is reported as a warning.
  void addSource(std::unique_ptr<SourceBuffer> source, std::string_view library);
  /// Remembers `library` in the search order without adding a file.
  void addLibrary(std::string_view library);

  /// The unit of `kind` called `name` (normalized) in `library` (normalized), or null.
  const UnitRecord* find(UnitKind kind, std::string_view library, std::string_view name) const;
  const SourceBuffer& source(const UnitRecord& unit) const { return *m_Sources[unit.file]; }
  /// Every registered unit (architectures and configurations are not kept).
  const std::vector<UnitRecord>& units() const { return m_Units; }
  /// Every unit header read, in file order: architectures, configurations and ignored
  /// duplicates too; their use clauses are not kept.
  const std::vector<UnitRecord>& unitsMet() const { return m_Met; }
  /// Normalized library names in the order of their first registration.
  const std::vector<std::string>& libraries() const { return m_Libraries; }

 private:
  void registerUnit(UnitRecord unit, size_t nameOffset, const SourceBuffer& source);

  Diagnostics& m_Diagnostics;
  std::vector<std::unique_ptr<SourceBuffer>> m_Sources;
  std::vector<std::string> m_Libraries;
  std::vector<UnitRecord> m_Units;
  std::vector<UnitRecord> m_Met;
  std::unordered_map<std::string, size_t> m_ByKey;
};

}  // namespace scan::vhdl
