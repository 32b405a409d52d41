// Constant evaluation: parameters on demand (each once, in the scope that declares it),
// operators with checked arithmetic, the system functions bounds use, and constant functions
// run by a small interpreter with a step limit.
#pragma once

#include <string>
#include <unordered_map>

#include "scan/verilog/verilog_scope.h"

namespace scan::verilog {

class Evaluator {
 public:
  explicit Evaluator(ScopeProvider& scopes) : m_Scopes(scopes) {}

  /// Evaluates `expr` of `scope`'s arena in `scope`; on failure error() says why.
  bool evaluate(ExprId expr, Scope& scope, Value& out);
  /// Like evaluate, then converts to an integer (reals round to nearest).
  bool integer(ExprId expr, Scope& scope, int64_t& out);
  /// The number of bits of `type` declared in `scope`.
  bool typeWidth(const TypeSpec& type, Scope& scope, int64_t& width);
  /// The typedef or type parameter `name` (in `package` when set) seen from `scope`.
  const TypeSpec* findType(const std::string& package, const std::string& name, Scope& scope,
                           Scope*& owner);

  const std::string& error() const { return m_Error; }

  /// What the last failed evaluate or integer call stopped at, when it was a name: a
  /// parameter without value, or a package or name declared nowhere. Messages use it to say
  /// how to fix the failure.
  struct Unresolved {
    enum class Kind { None, ParameterWithoutValue, UnknownPackage, UnknownName };
    Kind kind = Kind::None;
    std::string name;
  };
  const Unresolved& unresolved() const { return m_Unresolved; }

 private:
  using Locals = std::unordered_map<std::string, Value>;
  enum class Flow { Normal, Return };

  bool eval(ExprId id, Scope& scope, Locals* locals, Value& out);
  /// Applies the binary operator `expr` to the value `a` of its left operand.
  bool binary(const Expr& expr, const Value& a, Scope& scope, Locals* locals, Value& out);
  bool unsignedBinary(Op op, const Value& a, const Value& b, int64_t x, int64_t y, Value& out);
  bool convert(const TypeSpec& type, Scope& scope, Value& value);
  bool evalElement(const Expr& select, const std::string& name, Parameter& parameter, Scope& owner,
                   Scope& scope, Locals* locals, Value& out);
  bool assignSelect(const Stmt& stmt, const Value& v, Scope& scope, Locals& locals);
  bool evalName(const Expr& expr, Scope& scope, Locals* locals, Value& out);
  bool evalParameter(const std::string& name, Parameter& parameter, Scope& owner, Value& out);
  bool evalSystem(const Expr& expr, Scope& scope, Locals* locals, Value& out);
  bool evalCall(const Expr& expr, Scope& scope, Locals* locals, Value& out);
  bool evalBits(const Expr& arg, Scope& scope, Locals* locals, int64_t& width);
  bool sizedValue(const Expr& expr, Scope& scope, Locals* locals, int64_t& value, int64_t& width);
  bool run(const std::vector<Stmt>& body, Scope& scope, Locals& locals, Flow& flow);
  bool runOne(const Stmt& stmt, Scope& scope, Locals& locals, Flow& flow);
  bool toInteger(const Value& value, int64_t& out);
  bool fail(std::string text);
  bool failAt(Unresolved::Kind kind, const std::string& name, std::string text);

  Parameter* findParameter(const std::string& name, Scope& scope, Scope*& owner);
  Function* findFunction(const std::string& name, Scope& scope, Scope*& owner);
  template <typename Map>
  typename Map::mapped_type* findInScopes(const std::string& name, Scope& scope,
                                          Map Scope::*members, Scope*& owner, int depth = 0);

  ScopeProvider& m_Scopes;
  std::string m_Error;
  Unresolved m_Unresolved;
  size_t m_Steps = 0;
  int m_Depth = 0;
  int m_Nesting = 0;
  std::string m_ReturnName;
};

}  // namespace scan::verilog
