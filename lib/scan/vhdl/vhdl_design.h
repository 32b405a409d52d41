// The design as the evaluator sees it: the index plus the declarations of the units that
// were actually needed (the wanted entity, the packages it uses, their bodies), each parsed
// once, on first use.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "scan/vhdl/vhdl_ast.h"
#include "scan/vhdl/vhdl_index.h"

namespace scan::vhdl {

/// The parsed declarations of one entity header, package or package body.
struct UnitScope {
  const UnitRecord* record = nullptr;
  const SourceBuffer* source = nullptr;
  ExprArena arena;
  std::vector<Decl> decls;
  std::unordered_map<std::string, std::vector<size_t>> byKey;  ///< decl indices per name
  bool parseFailed = false;     ///< its header or declarations met an error; decls are partial
  UnitScope* spec = nullptr;    ///< for a package body: its package
  std::vector<UseClause> uses;  ///< context clause with context references expanded
  bool bodyLooked = false;
  UnitScope* body = nullptr;  ///< for a package: its body, once looked up
  std::unordered_map<size_t, std::unique_ptr<FunctionBody>> functions;  ///< by body offset

  /// Declarations called `key` in this unit only.
  const std::vector<size_t>* find(const std::string& key) const;
  void indexDecls();
};

class Design {
 public:
  Design(DesignIndex& index, Diagnostics& diagnostics)
      : m_Index(index), m_Diagnostics(diagnostics) {}

  /// The entity's generics and ports (generics first); null when its header has no name.
  UnitScope* entity(const UnitRecord& record);
  /// Package `name` from `library` ("work" meaning `from`'s library), else from every
  /// registered library in order; null when no library has it.
  UnitScope* package(std::string_view library, std::string_view name, const UnitScope& from);
  /// The body of a package, parsed on first use; null when it has none.
  UnitScope* bodyOf(UnitScope& package);
  /// The parsed body of the function declared at `decl` in `unit`; null on a syntax error.
  const FunctionBody* function(UnitScope& unit, const Decl& decl);
  bool isLibraryName(std::string_view name) const;

 private:
  UnitScope* parse(const UnitRecord& record);
  void expandUses(UnitScope& scope, const std::vector<UseClause>& uses);

  DesignIndex& m_Index;
  Diagnostics& m_Diagnostics;
  std::unordered_map<const UnitRecord*, std::unique_ptr<UnitScope>> m_Scopes;
};

}  // namespace scan::vhdl
