// Values are 64-bit signed integers or reals; Verilog's width rules are not modelled because
// bound expressions never depend on them beyond the sized literals handled here.
#include "scan/verilog/verilog_eval.h"

#include <cmath>

#include "scan/verilog/verilog_eval_support.h"

namespace scan::verilog {

bool Evaluator::fail(std::string text) {
  if (m_Error.empty()) m_Error = std::move(text);
  return false;
}

bool Evaluator::failAt(Unresolved::Kind kind, const std::string& name, std::string text) {
  if (m_Error.empty()) m_Unresolved = {kind, name};
  return fail(std::move(text));
}

bool Evaluator::toInteger(const Value& value, int64_t& out) {
  if (value.isReal()) {
    double r = std::round(value.asReal());
    if (!(r >= -9.2e18 && r <= 9.2e18)) return fail("real value out of integer range");
    out = static_cast<int64_t>(r);
    return true;
  }
  if (std::optional<int64_t> v = value.toInteger()) {
    out = *v;
    return true;
  }
  return fail("a string is not a number");
}

bool Evaluator::evaluate(ExprId expr, Scope& scope, Value& out) {
  m_Error.clear();
  m_Unresolved = {};
  m_Steps = 0;
  m_Depth = 0;
  m_Nesting = 0;
  return eval(expr, scope, nullptr, out);
}

bool Evaluator::integer(ExprId expr, Scope& scope, int64_t& out) {
  Value value;
  return evaluate(expr, scope, value) && toInteger(value, out);
}

// Parameters and functions resolve alike: the scope itself, a named import, the packages of
// wildcard imports (without following their own imports), then the compilation unit.
template <typename Map>
typename Map::mapped_type* Evaluator::findInScopes(const std::string& name, Scope& scope,
                                                   Map Scope::*members, Scope*& owner, int depth) {
  if (depth > 8) return nullptr;
  auto it = (scope.*members).find(name);
  if (it != (scope.*members).end()) {
    owner = &scope;
    return &it->second;
  }
  auto named = scope.namedImports.find(name);
  if (named != scope.namedImports.end())
    if (Scope* package = m_Scopes.package(named->second))
      if (auto* found = findInScopes(name, *package, members, owner, depth + 1)) return found;
  for (const std::string& packageName : scope.wildcardImports)
    if (Scope* package = m_Scopes.package(packageName)) {
      auto local = (package->*members).find(name);
      if (local != (package->*members).end()) {
        owner = package;
        return &local->second;
      }
    }
  if (!scope.isCompilationUnit)
    if (Scope* unit = m_Scopes.compilationUnit())
      return findInScopes(name, *unit, members, owner, depth + 1);
  return nullptr;
}

Parameter* Evaluator::findParameter(const std::string& name, Scope& scope, Scope*& owner) {
  return findInScopes(name, scope, &Scope::parameters, owner);
}

Function* Evaluator::findFunction(const std::string& name, Scope& scope, Scope*& owner) {
  std::shared_ptr<Function>* found = findInScopes(name, scope, &Scope::functions, owner);
  return found ? found->get() : nullptr;
}

const TypeSpec* Evaluator::findType(const std::string& package, const std::string& name,
                                    Scope& scope, Scope*& owner) {
  if (!package.empty()) {
    Scope* found = m_Scopes.package(package);
    if (!found) return nullptr;
    return findType("", name, *found, owner);
  }
  Scope* current = &scope;
  for (int depth = 0; current && depth < 8; ++depth) {
    auto it = current->typedefs.find(name);
    if (it != current->typedefs.end()) {
      owner = current;
      return it->second.get();
    }
    auto parameter = current->parameters.find(name);
    if (parameter != current->parameters.end() && parameter->second.isType &&
        parameter->second.typeValue) {
      owner = current;
      return parameter->second.typeValue.get();
    }
    auto named = current->namedImports.find(name);
    if (named != current->namedImports.end())
      if (Scope* imported = m_Scopes.package(named->second)) {
        auto local = imported->typedefs.find(name);
        if (local != imported->typedefs.end()) {
          owner = imported;
          return local->second.get();
        }
      }
    for (const std::string& packageName : current->wildcardImports)
      if (Scope* imported = m_Scopes.package(packageName)) {
        auto local = imported->typedefs.find(name);
        if (local != imported->typedefs.end()) {
          owner = imported;
          return local->second.get();
        }
      }
    current = current->isCompilationUnit ? nullptr : m_Scopes.compilationUnit();
  }
  return nullptr;
}

bool Evaluator::typeWidth(const TypeSpec& type, Scope& scope, int64_t& width) {
  DepthGuard guard(m_Depth, limits::kVerilogDefinitionNesting);
  if (guard.tooDeep()) return fail("type definitions nested too deeply");
  int64_t element = 1;
  switch (type.base) {
    case TypeSpec::Base::Implicit:
    case TypeSpec::Base::Bit:
      break;
    case TypeSpec::Base::Atom:
      element = type.atomWidth;
      break;
    case TypeSpec::Base::Real:
      return fail("type '" + type.written + "' has no bit width");
    case TypeSpec::Base::Named: {
      Scope* owner = nullptr;
      const TypeSpec* found = findType(type.scope, type.name, scope, owner);
      if (!found) return fail("unknown type '" + type.name + "'");
      if (!typeWidth(*found, *owner, element)) return false;
      break;
    }
    case TypeSpec::Base::Struct:
      element = 0;
      for (const TypeSpec& member : type.members) {
        int64_t memberWidth = 0;
        if (!typeWidth(member, scope, memberWidth)) return false;
        if (type.isUnion)
          element = std::max(element, memberWidth);
        else if (!checkedAdd(element, memberWidth, element))
          return fail("type too wide");
      }
      break;
    case TypeSpec::Base::Enum:
      if (type.members.empty() || !typeWidth(type.members[0], scope, element)) return false;
      break;
  }
  for (const Dimension& dim : type.packed) {
    int64_t left = 0, right = 0, size = 0;
    Value value;
    if (!eval(dim.left, scope, nullptr, value) || !toInteger(value, left)) return false;
    if (dim.right != kNoExpr) {
      if (!eval(dim.right, scope, nullptr, value) || !toInteger(value, right)) return false;
      if (!checkedSub(left, right, size)) return fail("dimension too large");
      size = (size < 0 ? -size : size) + 1;
    } else {
      size = left;
    }
    if (!checkedMul(element, size, element)) return fail("type too wide");
  }
  width = element;
  return true;
}

bool Evaluator::evalParameter(const std::string& name, Parameter& parameter, Scope& owner,
                              Value& out) {
  if (parameter.cached) {
    out = *parameter.cached;
    return true;
  }
  if (parameter.isType) return fail("'" + name + "' is a type, not a value");
  if (parameter.value == kNoExpr)
    return failAt(Unresolved::Kind::ParameterWithoutValue, name,
                  "parameter '" + name + "' has no value");
  if (parameter.busy) return fail("parameter '" + name + "' depends on itself");
  parameter.busy = true;
  bool ok = eval(parameter.value, owner, nullptr, out);
  parameter.busy = false;
  if (!ok) return false;
  if (parameter.type && !convert(*parameter.type, owner, out)) return false;
  parameter.cached = out;
  return true;
}

// A declared type sets the value's width and signedness as Verilog assignment would:
// truncated, then sign-extended or kept unsigned.
bool Evaluator::convert(const TypeSpec& type, Scope& scope, Value& value) {
  if (!value.isInteger()) return true;
  int64_t width = 0;
  bool isSigned = false;
  switch (type.base) {
    case TypeSpec::Base::Atom:
      width = type.atomWidth;
      isSigned = type.signing >= 0 && type.written != "time";
      break;
    case TypeSpec::Base::Bit:
    case TypeSpec::Base::Implicit:
      if (type.packed.empty() && type.base == TypeSpec::Base::Implicit) return true;
      if (!typeWidth(type, scope, width)) return false;
      isSigned = type.signing > 0;
      break;
    default:
      return true;
  }
  if (width <= 0) return true;
  uint64_t bits = static_cast<uint64_t>(value.asInteger()) & lowMask(width);
  if (!isSigned) {
    value = unsignedValue(bits, width);
  } else {
    if (width < 64 && (bits >> (width - 1)) & 1) bits |= ~lowMask(width);
    value = Value::integer(static_cast<int64_t>(bits));
  }
  return true;
}
}  // namespace scan::verilog
