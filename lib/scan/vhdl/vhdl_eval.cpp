// Expression evaluation and name resolution. Names resolve through a call's frame, the
// unit's own declarations (a package body sees its package), then the unit's use clauses;
// what no package declares falls back to the predefined types and functions.
#include "scan/vhdl/vhdl_eval.h"

#include <cmath>

#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_parser.h"
#include "scan/vhdl/vhdl_types.h"

namespace scan::vhdl {
namespace {

bool isTypeDecl(DeclKind k) {
  return k == DeclKind::Subtype || k == DeclKind::ArrayType || k == DeclKind::RangeType ||
         k == DeclKind::EnumType || k == DeclKind::RecordType || k == DeclKind::OtherType;
}

bool isObjectDecl(DeclKind k) {
  return k == DeclKind::Constant || k == DeclKind::Generic || k == DeclKind::Port ||
         k == DeclKind::Variable;
}

}  // namespace

int64_t RangeValue::length() const {
  int64_t n = ascending ? right - left + 1 : left - right + 1;
  return n < 0 ? 0 : n;
}

bool Evaluator::failWith(std::string reason) {
  if (m_Reason.empty()) m_Reason = std::move(reason);
  return false;
}

bool Evaluator::constant(UnitScope* unit, Decl& decl, Value& out) {
  m_Reason.clear();
  m_Steps = 0;
  return constantValue(unit, decl, out);
}

bool Evaluator::evaluate(const EvalContext& context, ExprId id, Value& out) {
  m_Reason.clear();
  m_Steps = 0;
  return eval(context, id, out);
}

std::pair<UnitScope*, Decl*> Evaluator::declarationOf(
    const EvalContext& context, const std::vector<std::string_view>& typeMark) {
  if (typeMark.empty()) return {nullptr, nullptr};
  Found f = resolveMark(context, typeMark);
  return {f.unit, f.decl};
}

bool Evaluator::step() {
  if (++m_Steps <= kStepLimit) return true;
  return failWith("a function did not finish within " + std::to_string(kStepLimit) + " steps");
}

bool Evaluator::eval(const EvalContext& c, ExprId id, Value& out) {
  if (id == kNoExpr) return failWith("missing expression");
  DepthGuard guard(m_Depth, limits::kVhdlEvalNesting);
  if (guard.tooDeep()) return failWith("evaluation is nested too deeply");
  const Expr& e = c.unit->arena[static_cast<size_t>(id)];
  switch (e.kind) {
    case ExprKind::Literal:
      if (e.value.isNone()) return failWith("literal " + quoted(e.text) + " is out of range");
      out = e.value;
      return true;
    case ExprKind::Name:
    case ExprKind::Selected:
      return evalName(c, e, out);
    case ExprKind::Call:
      return evalCall(c, e, out);
    case ExprKind::Attribute:
      return evalAttribute(c, e, out);
    case ExprKind::Qualified: {
      const Expr& mark = c.unit->arena[static_cast<size_t>(e.a)];
      SubtypeIndication type;
      if (mark.kind == ExprKind::Name) type.typeMark = {mark.text};
      return evalAs(c, e.b, c.unit, &type, out);
    }
    case ExprKind::Aggregate:
      return evalAggregate(c, e, nullptr, out);
    case ExprKind::Unary:
      return evalUnary(c, e, out);
    case ExprKind::Binary:
      return evalBinary(c, e, out);
    default: {
      std::string_view text = c.unit->source->text().substr(e.begin, e.end - e.begin);
      return failWith(quoted(text) + " is not a constant value");
    }
  }
}

// ---- names ----

Evaluator::Found Evaluator::pick(UnitScope* unit, const std::string& key, size_t arity) {
  Found f;
  if (unit == nullptr) return f;
  const std::vector<size_t>* list = unit->find(key);
  if (list == nullptr) return f;
  size_t chosen = (*list)[0];
  if (arity != kAnyArity) {
    for (size_t i : *list)
      if (unit->decls[i].kind == DeclKind::Function && unit->decls[i].parameterCount >= arity) {
        chosen = i;
        if (unit->decls[i].parameterCount == arity) break;
      }
  }
  f.unit = unit;
  f.decl = &unit->decls[chosen];
  return followAlias(f, arity);
}

// An alias stands for what it names. One that names no declaration (a predefined type, a
// record field) is kept: its target is evaluated or looked up by name where it is used.
Evaluator::Found Evaluator::followAlias(Found f, size_t arity) {
  if (f.decl == nullptr || f.decl->kind != DeclKind::Alias) return f;
  if (m_AliasHops >= limits::kVhdlDefinitionChain) return f;
  ++m_AliasHops;
  const Expr& target = f.unit->arena[static_cast<size_t>(f.decl->init)];
  Found named = resolve(EvalContext{f.unit, nullptr}, target, arity);
  --m_AliasHops;
  return named ? named : f;
}

Evaluator::Found Evaluator::lookup(const EvalContext& c, const std::string& key, size_t arity) {
  Found f;
  if (Frame* frame = c.frame) {
    for (auto it = frame->loopVariables.rbegin(); it != frame->loopVariables.rend(); ++it)
      if (it->first == key) {
        f.local = &it->second;
        return f;
      }
    const FunctionBody& fn = *frame->function;
    for (size_t i = 0; i < fn.parameters.size(); ++i)
      if (fn.parameters[i].key == key) {
        f.local = &frame->parameters[i];
        f.localDecl = &fn.parameters[i];
        return f;
      }
    for (size_t i = 0; i < fn.locals.size(); ++i)
      if (fn.locals[i].key == key && fn.locals[i].kind != DeclKind::Function &&
          !isTypeDecl(fn.locals[i].kind)) {
        f.local = &frame->locals[i];
        f.localDecl = &fn.locals[i];
        return f;
      }
  }
  for (UnitScope* s = c.unit; s != nullptr; s = s->spec)
    if ((f = pick(s, key, arity))) return f;
  for (UnitScope* s = c.unit; s != nullptr; s = s->spec) {
    for (const UseClause& use : s->uses) {
      const std::vector<std::string>& n = use.names;
      UnitScope* package = nullptr;
      if (n.size() >= 3 && (n[2] == "all" || n[2] == key)) {
        package = m_Design.package(n[0], n[1], *s);
      } else if (n.size() == 2 && !m_Design.isLibraryName(n[0]) && (n[1] == "all" || n[1] == key)) {
        package = m_Design.package("work", n[0], *s);
      }
      if (package != nullptr && (f = pick(package, key, arity))) return f;
    }
  }
  return f;
}

Evaluator::Found Evaluator::resolve(const EvalContext& c, const Expr& e, size_t arity) {
  if (e.kind == ExprKind::Name) return lookup(c, e.key, arity);
  if (e.kind != ExprKind::Selected) return {};
  const Expr& prefix = c.unit->arena[static_cast<size_t>(e.a)];
  UnitScope* package = nullptr;
  if (prefix.kind == ExprKind::Name) {
    if (!m_Design.isLibraryName(prefix.key))
      package = m_Design.package("work", prefix.key, *c.unit);
  } else if (prefix.kind == ExprKind::Selected) {
    const Expr& library = c.unit->arena[static_cast<size_t>(prefix.a)];
    if (library.kind == ExprKind::Name)
      package = m_Design.package(library.key, prefix.key, *c.unit);
  }
  return pick(package, e.key, arity);
}

Evaluator::Found Evaluator::resolveMark(const EvalContext& c,
                                        const std::vector<std::string_view>& mark) {
  if (mark.size() == 1) return lookup(c, normalizeName(mark[0]), kAnyArity);
  UnitScope* package = nullptr;
  if (mark.size() == 2 && !m_Design.isLibraryName(normalizeName(mark[0])))
    package = m_Design.package("work", normalizeName(mark[0]), *c.unit);
  else if (mark.size() == 3)
    package = m_Design.package(normalizeName(mark[0]), normalizeName(mark[1]), *c.unit);
  return pick(package, normalizeName(mark.back()), kAnyArity);
}

bool Evaluator::constantValue(UnitScope* unit, Decl& decl, Value& out) {
  switch (decl.state) {
    case Decl::State::Done:
      out = decl.cached;
      return true;
    case Decl::State::Busy:
      return failWith(quoted(decl.name) + " is defined in terms of itself");
    case Decl::State::Failed:
      return failWith(decl.failure);
    case Decl::State::Fresh:
      break;
  }
  decl.state = Decl::State::Busy;
  bool ok = false;
  if (decl.init != kNoExpr) {
    ok = evalAs(EvalContext{unit, nullptr}, decl.init, unit, &decl.subtype, out);
  } else if (decl.kind == DeclKind::Constant && unit->record->kind == UnitKind::Package) {
    UnitScope* body = m_Design.bodyOf(*unit);
    Found full = body ? pick(body, decl.key, kAnyArity) : Found{};
    if (full.decl != nullptr && full.decl->kind == DeclKind::Constant && full.decl->init != kNoExpr)
      ok = constantValue(body, *full.decl, out);
    else
      failWith("deferred constant " + quoted(decl.name) + " has no value in a package body");
  } else if (decl.kind == DeclKind::Generic) {
    failWith("generic " + quoted(decl.name) + " has no default value");
  } else {
    failWith(quoted(decl.name) + " has no value");
  }
  if (ok) {
    decl.state = Decl::State::Done;
    decl.cached = out;
  } else {
    decl.state = Decl::State::Failed;
    decl.failure = m_Reason;
  }
  return ok;
}

bool Evaluator::foundValue(const Found& f, std::string_view name, Value& out) {
  if (f.local != nullptr) {
    if (f.local->isNone()) return failWith(quoted(name) + " has no value");
    out = *f.local;
    return true;
  }
  switch (f.decl->kind) {
    case DeclKind::Constant:
    case DeclKind::Generic:
      return constantValue(f.unit, *f.decl, out);
    case DeclKind::EnumLiteral:
      out = Value::integer(f.decl->position);
      return true;
    case DeclKind::Function:
      return callFunction(f.unit, *f.decl, {}, out);
    case DeclKind::Alias:
      return eval(EvalContext{f.unit, nullptr}, f.decl->init, out);
    default:
      return failWith(quoted(name) + " is not a constant");
  }
}

bool Evaluator::evalName(const EvalContext& c, const Expr& e, Value& out) {
  if (e.kind == ExprKind::Selected && isValuePrefix(c, c.unit->arena[static_cast<size_t>(e.a)]))
    return selectField(c, e, out);
  Found f = resolve(c, e, kAnyArity);
  if (f.decl != nullptr && f.decl->kind == DeclKind::Function) f = resolve(c, e, 0);
  if (f) return foundValue(f, e.text, out);
  if (e.kind == ExprKind::Name) {
    if (equalsWord(e.text, "true") || equalsWord(e.text, "false")) {
      out = Value::boolean(equalsWord(e.text, "true"));
      return true;
    }
    static constexpr std::pair<std::string_view, double> kMathConstants[] = {
        {"math_pi", 3.14159265358979323846},
        {"math_e", 2.71828182845904523536},
        {"math_2_pi", 6.28318530717958647693},
        {"math_log_of_2", 0.69314718055994530942}};
    for (const auto& [name, v] : kMathConstants)
      if (equalsWord(e.text, name)) {
        out = Value::real(v);
        return true;
      }
  }
  std::string_view text = c.unit->source->text().substr(e.begin, e.end - e.begin);
  return failWith(quoted(text) + " is not declared");
}

bool Evaluator::evalCall(const EvalContext& c, const Expr& e, Value& out) {
  const Expr& prefix = c.unit->arena[static_cast<size_t>(e.a)];
  std::string_view text = c.unit->source->text().substr(prefix.begin, prefix.end - prefix.begin);
  Found f = resolve(c, prefix, e.args.size());
  if (f.local != nullptr ||
      (f.decl != nullptr && (isObjectDecl(f.decl->kind) || f.decl->kind == DeclKind::Alias)) ||
      (!f && prefix.kind != ExprKind::Name && isValuePrefix(c, prefix))) {
    Value array;
    return eval(c, e.a, array) && indexValue(c, e, array, out);
  }
  std::vector<Value> args(e.args.size());
  for (size_t i = 0; i < e.args.size(); ++i)
    if (!eval(c, e.args[i], args[i])) return false;
  if (f.decl != nullptr && f.decl->kind == DeclKind::Function)
    return callFunction(f.unit, *f.decl, args, out);
  if (f.decl != nullptr && isTypeDecl(f.decl->kind)) {  // conversion to a user integer type
    int64_t v = 0;
    if (args.size() == 1 && args[0].isInteger()) {
      out = args[0];
      return true;
    }
    std::optional<double> r = args.size() == 1 ? args[0].toReal() : std::nullopt;
    if (!r || !roundToInteger(*r, v)) return failWith("cannot convert to " + quoted(text));
    out = Value::integer(v);
    return true;
  }
  bool known = false;
  if (callBuiltinFunction(prefix.key, args, out, known)) return true;
  if (known) return failWith("invalid arguments to " + quoted(text));
  return failWith(quoted(text) + " is not declared");
}

// ---- operators ----

bool Evaluator::evalUnary(const EvalContext& c, const Expr& e, Value& out) {
  Value a;
  if (!eval(c, e.a, a)) return false;
  switch (e.op) {
    case Op::Plus:
      out = a;
      return true;
    case Op::Neg:
    case Op::Abs:
      if (a.isInteger()) {
        int64_t v = a.asInteger();
        if (e.op == Op::Abs && v >= 0) {
          out = a;
          return true;
        }
        if (!checkedSub(0, v, v)) return failWith("integer overflow");
        out = Value::integer(v);
        return true;
      }
      if (a.isReal()) {
        out = Value::real(e.op == Op::Abs ? std::fabs(a.asReal()) : -a.asReal());
        return true;
      }
      break;
    case Op::Not:
      if (a.isBoolean()) {
        out = Value::boolean(!a.asBoolean());
        return true;
      }
      break;
    default:
      break;
  }
  std::string_view text = c.unit->source->text().substr(e.begin, e.end - e.begin);
  return failWith("cannot evaluate " + quoted(text));
}

// A left-associative chain (a+b+c+...) is walked down its left operands and folded back up
// in a loop, so its length costs no evaluation depth.
bool Evaluator::evalBinary(const EvalContext& c, const Expr& top, Value& out) {
  if (c.unit->arena[static_cast<size_t>(top.a)].kind != ExprKind::Binary) {
    Value a;
    return eval(c, top.a, a) && applyBinary(c, top, a, out);
  }
  std::vector<const Expr*> chain{&top};
  for (;;) {
    const Expr& left = c.unit->arena[static_cast<size_t>(chain.back()->a)];
    if (left.kind != ExprKind::Binary) break;
    chain.push_back(&left);
  }
  Value value;
  if (!eval(c, chain.back()->a, value)) return false;
  for (auto it = chain.rbegin(); it != chain.rend(); ++it) {
    Value next;
    if (!applyBinary(c, **it, value, next)) return false;
    value = std::move(next);
  }
  out = std::move(value);
  return true;
}

bool Evaluator::applyBinary(const EvalContext& c, const Expr& e, const Value& a, Value& out) {
  // Short-circuit forms, as VHDL evaluates them.
  if ((e.op == Op::And || e.op == Op::Or) && a.isBoolean() && a.asBoolean() == (e.op == Op::Or)) {
    out = a;
    return true;
  }
  Value b;
  if (!eval(c, e.b, b)) return false;
  std::string_view text = c.unit->source->text().substr(e.begin, e.end - e.begin);
  if (a.isInteger() && b.isInteger()) {
    int64_t x = a.asInteger();
    int64_t y = b.asInteger();
    int64_t r = 0;
    bool ok = true;
    switch (e.op) {
      case Op::Add:
        ok = checkedAdd(x, y, r);
        break;
      case Op::Sub:
        ok = checkedSub(x, y, r);
        break;
      case Op::Mul:
        ok = checkedMul(x, y, r);
        break;
      case Op::Div:
        ok = checkedDiv(x, y, r);
        break;
      case Op::Rem:
        ok = y != 0 && checkedDiv(x, y, r) && checkedSub(x, r * y, r);
        break;
      case Op::Mod:
        ok = y != 0 && checkedDiv(x, y, r) && checkedSub(x, r * y, r);
        if (ok && r != 0 && ((r < 0) != (y < 0))) r += y;
        break;
      case Op::Pow:
        ok = checkedPow(x, y, r);
        break;
      case Op::Eq:
        out = Value::boolean(x == y);
        return true;
      case Op::Ne:
        out = Value::boolean(x != y);
        return true;
      case Op::Lt:
        out = Value::boolean(x < y);
        return true;
      case Op::Le:
        out = Value::boolean(x <= y);
        return true;
      case Op::Gt:
        out = Value::boolean(x > y);
        return true;
      case Op::Ge:
        out = Value::boolean(x >= y);
        return true;
      default:
        return failWith("cannot evaluate " + quoted(text));
    }
    if (!ok) return failWith("arithmetic overflow or division by zero in " + quoted(text));
    out = Value::integer(r);
    return true;
  }
  std::optional<double> x = a.toReal();
  std::optional<double> y = b.toReal();
  if (x && y && !a.isBoolean() && !b.isBoolean()) {
    switch (e.op) {
      case Op::Add:
        out = Value::real(*x + *y);
        return true;
      case Op::Sub:
        out = Value::real(*x - *y);
        return true;
      case Op::Mul:
        out = Value::real(*x * *y);
        return true;
      case Op::Div:
        if (*y == 0) return failWith("division by zero in " + quoted(text));
        out = Value::real(*x / *y);
        return true;
      case Op::Pow:
        out = Value::real(std::pow(*x, *y));
        return true;
      case Op::Eq:
        out = Value::boolean(*x == *y);
        return true;
      case Op::Ne:
        out = Value::boolean(*x != *y);
        return true;
      case Op::Lt:
        out = Value::boolean(*x < *y);
        return true;
      case Op::Le:
        out = Value::boolean(*x <= *y);
        return true;
      case Op::Gt:
        out = Value::boolean(*x > *y);
        return true;
      case Op::Ge:
        out = Value::boolean(*x >= *y);
        return true;
      default:
        break;
    }
  }
  if (a.isBoolean() && b.isBoolean()) {
    bool p = a.asBoolean();
    bool q = b.asBoolean();
    switch (e.op) {
      case Op::And:
        out = Value::boolean(p && q);
        return true;
      case Op::Or:
        out = Value::boolean(p || q);
        return true;
      case Op::Xor:
        out = Value::boolean(p != q);
        return true;
      case Op::Nand:
        out = Value::boolean(!(p && q));
        return true;
      case Op::Nor:
        out = Value::boolean(!(p || q));
        return true;
      case Op::Xnor:
        out = Value::boolean(p == q);
        return true;
      case Op::Eq:
        out = Value::boolean(p == q);
        return true;
      case Op::Ne:
        out = Value::boolean(p != q);
        return true;
      default:
        break;
    }
  }
  if (a.isString() && b.isString()) {
    switch (e.op) {
      case Op::Eq:
        out = Value::boolean(a.asString() == b.asString());
        return true;
      case Op::Ne:
        out = Value::boolean(a.asString() != b.asString());
        return true;
      case Op::Concat:
        out = Value::string(a.asString() + b.asString());
        return true;
      default:
        break;
    }
  }
  return failWith("cannot evaluate " + quoted(text));
}

}  // namespace scan::vhdl
