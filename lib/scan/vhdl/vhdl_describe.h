// What the selected entity means beyond its port ranges: the generics' values after
// command-line overrides, what kind of type each port has, and what to do about a range
// that could not be evaluated.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/scan.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_eval.h"
#include "scan/vhdl/vhdl_header_text.h"

namespace scan::vhdl {

class Describer {
 public:
  Describer(Design& design, Evaluator& evaluator, Diagnostics& diagnostics)
      : m_Design(design), m_Evaluator(evaluator), m_Diagnostics(diagnostics) {}

  /// Gives each constant generic of `entity` named in `overrides` (names ignore case) the
  /// value of its VHDL expression before anything reads it; the expression sees the entity's
  /// use clauses and the generics' values as they stand at that point, in command-line
  /// order. Names that match no generic of `texts` are left to the caller; naming a type,
  /// package or subprogram generic is an error. A value that cannot be evaluated is reported
  /// as an error, and the generic then fails every evaluation with that reason instead of
  /// falling back to its default.
  void applyOverrides(UnitScope& entity, const std::vector<InterfaceText>& texts,
                      const std::vector<std::pair<std::string, std::string>>& overrides);

  /// The generics of `entity` in declaration order, from their texts; source lines are
  /// left to the caller.
  std::vector<ScanGeneric> generics(UnitScope& entity, const std::vector<InterfaceText>& texts);

  /// The kind of a port of `subtype`, declared in `entity`.
  ScanPort::Kind portKind(UnitScope& entity, const SubtypeIndication& subtype);

  /// The unit whose expressions hold `failed`, an expression the evaluator named for a
  /// port of `subtype`: the entity, or a package along the type's subtypes. Null when it is
  /// none of those.
  UnitScope* ownerOf(UnitScope& entity, const SubtypeIndication& subtype, const Expr& failed);

  /// Why a port range failed and how to fix it: a generic without a value (and the `-g` to
  /// give), a package no design file declares, else the evaluator's `reason`. `failed` is
  /// the expression that could not be evaluated when it is one of the entity's (null
  /// otherwise); `typeMark` the port's type.
  std::string failureHint(UnitScope& entity, const Expr* failed,
                          const std::vector<std::string_view>& typeMark, const std::string& reason);

 private:
  enum class TypeClass {
    Bit,
    BitVector,
    Integer,
    Real,
    Boolean,
    Character,
    String,
    Enum,
    Record,
    Array,
    Other
  };
  struct TypeInfo {
    TypeClass type = TypeClass::Other;
    UnitScope* unit = nullptr;   ///< for Enum: where the type is declared
    const Decl* decl = nullptr;  ///< for Enum: the type, its literals follow it
  };

  TypeInfo classify(UnitScope* unit, const SubtypeIndication& subtype, int depth);
  std::optional<std::string> literalText(const TypeInfo& type, const Value& value) const;
  const Decl* genericWithoutValue(UnitScope& entity, const Expr& failed) const;
  std::string missingPackage(UnitScope& entity, const Expr* failed,
                             const std::vector<std::string_view>& typeMark);

  Design& m_Design;
  Evaluator& m_Evaluator;
  Diagnostics& m_Diagnostics;
  // The text and expressions of each override stay alive with the values taken from them.
  std::vector<std::unique_ptr<SourceBuffer>> m_OverrideSources;
  std::vector<std::unique_ptr<UnitScope>> m_OverrideScopes;
  std::vector<const Decl*> m_Overridden;
};

}  // namespace scan::vhdl
