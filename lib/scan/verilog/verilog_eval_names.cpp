// Names, selects, concatenations and the system and user function calls of constant
// expressions: where a value comes from before an operator sees it.
#include "scan/verilog/verilog_eval.h"

#include <bit>
#include <cmath>

#include "scan/verilog/verilog_eval_support.h"

namespace scan::verilog {
namespace {

int64_t clog2(int64_t n) {
  if (n <= 1) return 0;
  return 64 - std::countl_zero(static_cast<uint64_t>(n - 1));
}

}  // namespace

bool Evaluator::evalElement(const Expr& select, const std::string& name, Parameter& parameter,
                            Scope& owner, Scope& scope, Locals* locals, Value& out) {
  if (select.args.size() != 2) return fail("a slice of parameter array '" + name + "'");
  Value index;
  int64_t i = 0, left = 0, right = 0;
  if (!eval(select.args[1], scope, locals, index) || !toInteger(index, i)) return false;
  const Dimension& dim = parameter.unpacked[0];
  Value bound;
  if (!eval(dim.left, owner, nullptr, bound) || !toInteger(bound, left)) return false;
  if (dim.right != kNoExpr) {
    if (!eval(dim.right, owner, nullptr, bound) || !toInteger(bound, right)) return false;
  } else {
    right = left - 1;
    left = 0;
  }
  int64_t position = left <= right ? i - left : left - i;
  if (position < 0 || position > (left <= right ? right - left : left - right))
    return fail("index " + std::to_string(i) + " is outside parameter array '" + name + "'");
  if (parameter.value == kNoExpr) return fail("parameter '" + name + "' has no value");
  const Expr& pattern = owner.expr(parameter.value);
  if (pattern.kind != Expr::Kind::Pattern)
    return fail("parameter array '" + name + "' is not given an assignment pattern");
  const std::vector<ExprId>& items = pattern.args;
  ExprId element = kNoExpr;
  size_t at = static_cast<size_t>(position);
  if (pattern.op == Op::PatternReplicate) {
    size_t count = items.size() - 1;
    if (count > 0) element = items[1 + at % count];
  } else if (pattern.op == Op::PatternKeyed) {
    for (size_t k = 0; k + 1 < items.size() && element == kNoExpr; k += 2) {
      Value key;
      int64_t keyIndex = 0;
      if (items[k] == kNoExpr) continue;
      if (!eval(items[k], owner, nullptr, key) || !toInteger(key, keyIndex)) return false;
      if (keyIndex == i) element = items[k + 1];
    }
    for (size_t k = 0; k + 1 < items.size() && element == kNoExpr; k += 2)
      if (items[k] == kNoExpr) element = items[k + 1];
  } else if (at < items.size()) {
    element = items[at];
  }
  if (element == kNoExpr)
    return fail("the assignment pattern of '" + name + "' has no element " + std::to_string(i));
  if (!eval(element, owner, nullptr, out)) return false;
  return !parameter.type || convert(*parameter.type, owner, out);
}

bool Evaluator::evalName(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  if (expr.scope.empty() && locals) {
    auto it = locals->find(expr.name);
    if (it != locals->end()) {
      out = it->second;
      return true;
    }
  }
  Scope* owner = nullptr;
  Parameter* parameter = nullptr;
  if (!expr.scope.empty()) {
    Scope* package = m_Scopes.package(expr.scope);
    if (!package)
      return failAt(Unresolved::Kind::UnknownPackage, expr.scope,
                    "unknown package '" + expr.scope + "'");
    auto it = package->parameters.find(expr.name);
    if (it != package->parameters.end()) {
      owner = package;
      parameter = &it->second;
    }
  } else {
    parameter = findParameter(expr.name, scope, owner);
  }
  if (!parameter)
    return failAt(
        Unresolved::Kind::UnknownName, expr.name,
        "unknown name '" + (expr.scope.empty() ? "" : expr.scope + "::") + expr.name + "'");
  return evalParameter(expr.name, *parameter, *owner, out);
}

bool Evaluator::sizedValue(const Expr& expr, Scope& scope, Locals* locals, int64_t& value,
                           int64_t& width) {
  if (expr.kind == Expr::Kind::Number && expr.width > 0 && !expr.unknown) {
    value = expr.integer;
    width = expr.width;
    return true;
  }
  if (expr.kind == Expr::Kind::Concat || expr.kind == Expr::Kind::Replicate) {
    int64_t count = 1;
    size_t first = 0;
    if (expr.kind == Expr::Kind::Replicate) {
      Value times;
      if (!eval(expr.args[0], scope, locals, times) || !toInteger(times, count)) return false;
      if (count < 0 || count > 4096) return fail("replication count out of range");
      first = 1;
    }
    uint64_t acc = 0;
    int64_t total = 0;
    for (int64_t r = 0; r < count; ++r)
      for (size_t i = first; i < expr.args.size(); ++i) {
        int64_t v = 0, w = 0;
        if (!sizedValue(scope.expr(expr.args[i]), scope, locals, v, w)) return false;
        acc = (w >= 64 ? 0 : acc << w) | (static_cast<uint64_t>(v) & lowMask(w));
        total += w;
      }
    value = static_cast<int64_t>(acc);
    width = total;
    return true;
  }
  if (expr.kind == Expr::Kind::Name) {
    Scope* owner = nullptr;
    Parameter* parameter = expr.scope.empty() ? findParameter(expr.name, scope, owner) : nullptr;
    if (parameter && parameter->type && !locals) {
      Value v;
      if (!evalParameter(expr.name, *parameter, *owner, v) || !toInteger(v, value)) return false;
      return typeWidth(*parameter->type, *owner, width);
    }
  }
  return fail("a concatenation needs sized operands");
}

bool Evaluator::evalBits(const Expr& arg, Scope& scope, Locals* locals, int64_t& width) {
  if (arg.kind == Expr::Kind::TypeName) return typeWidth(*arg.type, scope, width);
  if (arg.kind == Expr::Kind::Name) {
    Scope* owner = nullptr;
    if (const TypeSpec* type = findType(arg.scope, arg.name, scope, owner))
      return typeWidth(*type, *owner, width);
    Parameter* parameter = arg.scope.empty() ? findParameter(arg.name, scope, owner) : nullptr;
    if (parameter && parameter->type) return typeWidth(*parameter->type, *owner, width);
    if (parameter && parameter->value != kNoExpr) {
      if (const Expr& value = owner->expr(parameter->value);
          value.kind == Expr::Kind::Number && value.width > 0) {
        width = value.width;
        return true;
      }
      Value v;
      if (!evalParameter(arg.name, *parameter, *owner, v)) return false;
      width = v.isString() ? static_cast<int64_t>(v.asString().size()) * 8 : 32;
      return true;
    }
  }
  int64_t value = 0;
  return sizedValue(arg, scope, locals, value, width);
}

bool Evaluator::evalSystem(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  const std::string& name = expr.name;
  if (name == "$bits") {
    int64_t width = 0;
    if (expr.args.size() != 1) return fail("$bits takes one argument");
    if (!evalBits(scope.expr(expr.args[0]), scope, locals, width)) return false;
    out = Value::integer(width);
    return true;
  }
  std::vector<Value> args;
  for (ExprId arg : expr.args) {
    if (scope.expr(arg).kind == Expr::Kind::TypeName) return fail(name + " does not take a type");
    Value v;
    if (!eval(arg, scope, locals, v)) return false;
    args.push_back(std::move(v));
  }
  auto needs = [&](size_t count) {
    return args.size() == count ||
           fail(name + " takes " + std::to_string(count) + " argument" + (count == 1 ? "" : "s"));
  };
  if (name == "$clog2") {
    int64_t n = 0;
    if (!needs(1) || !toInteger(args[0], n)) return false;
    out = Value::integer(clog2(n));
    return true;
  }
  if (name == "$signed" || name == "$unsigned") {
    if (!needs(1)) return false;
    out = args[0];
    if (!out.isInteger()) return true;
    uint64_t bits = static_cast<uint64_t>(out.asInteger());
    if (int w = out.unsignedWidth(); w && name == "$signed") {
      if (w < 64 && (bits >> (w - 1)) & 1) bits |= ~lowMask(w);
      out = Value::integer(static_cast<int64_t>(bits));
    } else if (!w && name == "$unsigned") {
      out = unsignedValue(bits, fitsBound(out.asInteger()) ? 32 : 64);
    }
    return true;
  }
  if (name == "$rtoi" || name == "$itor" || name == "$floor" || name == "$ceil" || name == "$ln" ||
      name == "$log10" || name == "$exp" || name == "$sqrt") {
    if (!needs(1)) return false;
    std::optional<double> x = args[0].toReal();
    if (!x) return fail(name + " needs a number");
    if (name == "$rtoi") {
      if (!(std::fabs(*x) < 9.2e18)) return fail("real value out of integer range");
      out = Value::integer(static_cast<int64_t>(*x));
      return true;
    }
    double r = name == "$itor"    ? *x
               : name == "$floor" ? std::floor(*x)
               : name == "$ceil"  ? std::ceil(*x)
               : name == "$ln"    ? std::log(*x)
               : name == "$log10" ? std::log10(*x)
               : name == "$exp"   ? std::exp(*x)
                                  : std::sqrt(*x);
    out = Value::real(r);
    return true;
  }
  if (name == "$pow") {
    if (!needs(2)) return false;
    std::optional<double> x = args[0].toReal(), y = args[1].toReal();
    if (!x || !y) return fail("$pow needs numbers");
    out = Value::real(std::pow(*x, *y));
    return true;
  }
  return fail("unsupported system function " + name);
}

bool Evaluator::evalCall(const Expr& expr, Scope& scope, Locals* locals, Value& out) {
  Scope* owner = nullptr;
  Function* function = nullptr;
  if (!expr.scope.empty()) {
    if (Scope* package = m_Scopes.package(expr.scope)) {
      auto it = package->functions.find(expr.name);
      if (it != package->functions.end()) {
        owner = package;
        function = it->second.get();
      }
    }
  } else {
    function = findFunction(expr.name, scope, owner);
  }
  if (!function) return fail("unknown function '" + expr.name + "'");
  if (!function->supported)
    return fail("function '" + expr.name + "' uses statements that cannot be evaluated");
  if (expr.args.size() != function->inputs.size())
    return fail("function '" + expr.name + "' takes " + std::to_string(function->inputs.size()) +
                " argument(s)");
  if (m_Depth >= limits::kVerilogDefinitionNesting) return fail("function calls nested too deeply");
  Locals frame;
  for (size_t i = 0; i < expr.args.size(); ++i) {
    Value v;
    if (!eval(expr.args[i], scope, locals, v)) return false;
    frame[function->inputs[i]] = v;
  }
  frame[function->name] = Value::integer(0);
  ++m_Depth;
  Flow flow = Flow::Normal;
  std::string savedReturn = std::move(m_ReturnName);
  m_ReturnName = function->name;
  bool ok = run(function->body, *owner, frame, flow);
  m_ReturnName = std::move(savedReturn);
  --m_Depth;
  if (!ok) return false;
  out = frame[function->name];
  return true;
}
}  // namespace scan::verilog
