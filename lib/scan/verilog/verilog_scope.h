// The named things a constant expression can refer to: parameters, types and functions of a
// unit, a package or the compilation-unit scope, with the packages each scope imports.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "scan/common/value.h"
#include "scan/verilog/verilog_expr.h"

namespace scan::verilog {

struct Parameter {
  ExprId value = kNoExpr;          ///< kNoExpr when the declaration gives no default
  std::shared_ptr<TypeSpec> type;  ///< the declared type, when one is written
  bool isType = false;             ///< a `parameter type`
  std::shared_ptr<TypeSpec> typeValue;
  std::vector<Dimension> unpacked;  ///< a parameter array's dimensions
  // Evaluation state: the value once known, and a mark that catches circular definitions.
  std::optional<Value> cached;
  bool busy = false;
};

/// Everything a scope declares refers to expressions in its own `arena`: parameter values,
/// the dimensions of its types, the statements of its functions (and, for a unit, its ports
/// and the overrides given for its parameters). The arena lives exactly as long as they do.
struct Scope {
  /// The node `id` of this scope's arena.
  const Expr& expr(ExprId id) const { return arena[static_cast<size_t>(id)]; }

  std::string name;
  bool isCompilationUnit = false;
  std::unordered_map<std::string, Parameter> parameters;
  std::unordered_map<std::string, std::shared_ptr<TypeSpec>> typedefs;
  std::unordered_set<std::string> unpackedTypedefs;  ///< typedefs with unpacked dimensions
  std::unordered_map<std::string, std::shared_ptr<Function>> functions;
  std::vector<std::string> wildcardImports;                   ///< import pkg::*
  std::unordered_map<std::string, std::string> namedImports;  ///< name -> package
  ExprArena arena;
};

/// Finds package scopes (parsed on first use) and the compilation-unit scope.
class ScopeProvider {
 public:
  virtual ~ScopeProvider() = default;
  virtual Scope* package(const std::string& name) = 0;
  virtual Scope* compilationUnit() = 0;
};

}  // namespace scan::verilog
