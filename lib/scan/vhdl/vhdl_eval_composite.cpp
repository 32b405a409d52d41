// Array and record values: aggregates shaped by their target type, indexing, field
// selection, and the 'image attribute. Bounds of real designs come from such constants
// (width tables, fixed-point formats held in records).
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "scan/common/ascii.h"
#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_eval.h"
#include "scan/vhdl/vhdl_parser.h"
#include "scan/vhdl/vhdl_types.h"

namespace scan::vhdl {
namespace {

// An aggregate such as (0 to 2**30 => 0) would otherwise allocate without bound.
constexpr int64_t kMaxElements = 1 << 20;

std::string_view sourceText(const EvalContext& c, const Expr& e) {
  return c.unit->source->text().substr(e.begin, e.end - e.begin);
}

// The shortest digits that read back as `v`, written d.ddd with an exponent unless it is 0:
// 2.5, 1.0e-3, -3.0, 1.2345675e5.
std::string realImage(double v) {
  if (v == 0) return "0.0";
  if (!std::isfinite(v)) return v > 0 ? "inf" : v < 0 ? "-inf" : "nan";
  char buffer[40];
  for (int precision = 0; precision < 17; ++precision) {
    std::snprintf(buffer, sizeof buffer, "%.*e", precision, v);
    if (std::strtod(buffer, nullptr) == v) break;
  }
  std::string text(buffer);
  size_t e = text.find('e');
  std::string mantissa = text.substr(0, e);
  long exponent = std::strtol(text.c_str() + e + 1, nullptr, 10);
  if (mantissa.find('.') == std::string::npos) mantissa += ".0";
  return exponent == 0 ? mantissa : mantissa + "e" + std::to_string(exponent);
}

}  // namespace

bool Evaluator::evalAs(const EvalContext& c, ExprId id, UnitScope* typeUnit,
                       const SubtypeIndication* subtype, Value& out) {
  if (id == kNoExpr || subtype == nullptr || !subtype->valid() ||
      c.unit->arena[static_cast<size_t>(id)].kind != ExprKind::Aggregate)
    return eval(c, id, out);
  TargetType type;
  std::string saved = m_Reason;
  if (!describeType(typeUnit, *subtype, type, 0)) {
    m_Reason = saved;
    return eval(c, id, out);
  }
  return evalAggregate(c, c.unit->arena[static_cast<size_t>(id)], &type, out);
}

bool Evaluator::describeType(UnitScope* unit, const SubtypeIndication& s, TargetType& out,
                             int depth) {
  if (depth > limits::kVhdlDefinitionChain)
    return failWith("a subtype is defined in terms of itself");
  EvalContext c{unit, nullptr};
  if (!out.constrained && !s.indexConstraint.empty() &&
      unit->arena[static_cast<size_t>(s.indexConstraint[0])].kind != ExprKind::Open) {
    if (!evalRange(c, s.indexConstraint[0], out.bounds)) return false;
    out.constrained = true;
  }
  Found f = resolveMark(c, s.typeMark);
  if (f.decl == nullptr) {
    std::string name = normalizeName(s.typeMark.back());
    if (builtinShape(name) != BuiltinShape::UnconstrainedArray) return false;
    // Predefined arrays are indexed by natural, string by positive.
    out.indexed = true;
    out.index = RangeValue{name == "string" ? 1 : 0, 2147483647, true};
    return true;
  }
  switch (f.decl->kind) {
    case DeclKind::Subtype:
      return describeType(f.unit, f.decl->subtype, out, depth + 1);
    case DeclKind::RecordType:
      out.record = f.decl;
      out.recordUnit = f.unit;
      return true;
    case DeclKind::ArrayType: {
      const Expr& first = f.unit->arena[static_cast<size_t>(f.decl->indexRanges[0])];
      EvalContext inner{f.unit, nullptr};
      if (first.kind == ExprKind::Box) {
        if (!evalRange(inner, first.a, out.index)) return false;
        out.indexed = true;
      } else if (!out.constrained) {
        if (!evalRange(inner, f.decl->indexRanges[0], out.bounds)) return false;
        out.constrained = true;
      }
      out.element = &f.decl->subtype;
      out.elementUnit = f.unit;
      return true;
    }
    default:
      return false;
  }
}

bool Evaluator::evalElement(const EvalContext& c, ExprId id, const TargetType* type, Value& out) {
  if (type == nullptr || type->element == nullptr) return eval(c, id, out);
  return evalAs(c, id, type->elementUnit, type->element, out);
}

bool Evaluator::evalRecordAggregate(const EvalContext& c, const Expr& e, const TargetType& type,
                                    Value& out) {
  const Decl& record = *type.record;
  const size_t count = record.fieldKeys.size();
  std::vector<Value> values(count);
  std::vector<bool> set(count, false);
  auto assign = [&](size_t field, ExprId value) {
    if (!evalAs(c, value, type.recordUnit, &record.fieldTypes[field], values[field])) return false;
    set[field] = true;
    return true;
  };
  size_t position = 0;
  for (ExprId id : e.args) {
    const Expr& element = c.unit->arena[static_cast<size_t>(id)];
    if (element.kind != ExprKind::Named) {
      if (position >= count)
        return failWith("aggregate " + quoted(sourceText(c, e)) + " has too many elements");
      if (!assign(position++, id)) return false;
      continue;
    }
    for (ExprId choiceId : element.args) {
      const Expr& choice = c.unit->arena[static_cast<size_t>(choiceId)];
      if (choice.kind == ExprKind::Others) {
        for (size_t i = 0; i < count; ++i)
          if (!set[i] && !assign(i, element.a)) return false;
        continue;
      }
      auto it = std::find(record.fieldKeys.begin(), record.fieldKeys.end(), choice.key);
      if (choice.kind != ExprKind::Name || it == record.fieldKeys.end())
        return failWith(quoted(sourceText(c, choice)) + " is not a field of " +
                        quoted(record.name));
      if (!assign(static_cast<size_t>(it - record.fieldKeys.begin()), element.a)) return false;
    }
  }
  for (size_t i = 0; i < count; ++i)
    if (!set[i])
      return failWith("aggregate " + quoted(sourceText(c, e)) + " gives field " +
                      quoted(record.fieldKeys[i]) + " no value");
  Composite composite;
  composite.elements = std::move(values);
  composite.fields = record.fieldKeys;
  out = Value::composite(std::move(composite));
  return true;
}

bool Evaluator::evalAggregate(const EvalContext& c, const Expr& e, const TargetType* type,
                              Value& out) {
  if (type != nullptr && type->record != nullptr) return evalRecordAggregate(c, e, *type, out);
  // Explicit choices first: (index, value expression), in the order written.
  std::vector<std::pair<int64_t, ExprId>> chosen;
  std::vector<ExprId> positional;
  ExprId others = kNoExpr;
  for (ExprId id : e.args) {
    const Expr& element = c.unit->arena[static_cast<size_t>(id)];
    if (element.kind != ExprKind::Named) {
      positional.push_back(id);
      continue;
    }
    for (ExprId choiceId : element.args) {
      const Expr& choice = c.unit->arena[static_cast<size_t>(choiceId)];
      if (choice.kind == ExprKind::Others) {
        others = element.a;
        continue;
      }
      RangeValue r;
      if (choice.kind == ExprKind::Range || choice.kind == ExprKind::Attribute) {
        if (!evalRange(c, choiceId, r)) return false;
      } else {
        Value v;
        if (!eval(c, choiceId, v)) return false;
        if (!v.isInteger())
          return failWith("choice " + quoted(sourceText(c, choice)) + " is not an index");
        r = RangeValue{v.asInteger(), v.asInteger(), true};
      }
      if (static_cast<int64_t>(chosen.size()) + r.length() > kMaxElements)
        return failWith("aggregate " + quoted(sourceText(c, e)) + " is too large");
      for (int64_t i = r.low(), n = r.length(); n > 0; --n, ++i) chosen.emplace_back(i, element.a);
    }
  }
  if (!positional.empty() && !chosen.empty())
    return failWith("aggregate " + quoted(sourceText(c, e)) +
                    " mixes positional and named elements");
  RangeValue bounds;
  if (type != nullptr && type->constrained) {
    bounds = type->bounds;
  } else if (!chosen.empty()) {
    auto [low, high] = std::minmax_element(chosen.begin(), chosen.end());
    bool ascending = type == nullptr || !type->indexed || type->index.ascending;
    bounds = ascending ? RangeValue{low->first, high->first, true}
                       : RangeValue{high->first, low->first, false};
  } else if (others != kNoExpr) {
    return failWith("aggregate " + quoted(sourceText(c, e)) + " has 'others' but no bounds");
  } else {
    int64_t n = static_cast<int64_t>(positional.size());
    bool indexed = type != nullptr && type->indexed;
    int64_t left = indexed ? type->index.left : 0;
    bool ascending = !indexed || type->index.ascending;
    bounds = RangeValue{left, ascending ? left + n - 1 : left - n + 1, ascending};
  }
  int64_t length = bounds.length();
  if (length > kMaxElements)
    return failWith("aggregate " + quoted(sourceText(c, e)) + " is too large");
  std::vector<ExprId> slots(static_cast<size_t>(length), kNoExpr);
  for (size_t i = 0; i < positional.size(); ++i) {
    if (i >= slots.size())
      return failWith("aggregate " + quoted(sourceText(c, e)) + " has too many elements");
    slots[i] = positional[i];
  }
  for (const auto& [index, value] : chosen) {
    int64_t at = bounds.ascending ? index - bounds.left : bounds.left - index;
    if (index < bounds.low() || index > bounds.high())
      return failWith("choice " + std::to_string(index) + " of " + quoted(sourceText(c, e)) +
                      " is out of range");
    slots[static_cast<size_t>(at)] = value;
  }
  Composite composite;
  composite.left = bounds.left;
  composite.ascending = bounds.ascending;
  composite.elements.resize(slots.size());
  for (size_t i = 0; i < slots.size(); ++i) {
    ExprId value = slots[i] == kNoExpr ? others : slots[i];
    if (value == kNoExpr)
      return failWith("aggregate " + quoted(sourceText(c, e)) + " leaves elements without a value");
    if (!evalElement(c, value, type, composite.elements[i])) return false;
  }
  out = Value::composite(std::move(composite));
  return true;
}

bool Evaluator::indexValue(const EvalContext& c, const Expr& call, const Value& array, Value& out) {
  std::string_view text = sourceText(c, call);
  if (!array.isComposite() || !array.asComposite().fields.empty() || call.args.size() != 1)
    return failWith("indexing " + quoted(text) + " is not supported in bounds");
  const Composite& a = array.asComposite();
  Value index;
  if (!eval(c, call.args[0], index)) return false;
  if (!index.isInteger()) return failWith("the index in " + quoted(text) + " is not an integer");
  int64_t i = index.asInteger();
  int64_t position = 0;
  if (!checkedSub(a.ascending ? i : a.left, a.ascending ? a.left : i, position) || position < 0 ||
      position >= static_cast<int64_t>(a.elements.size()))
    return failWith("the index in " + quoted(text) + " is out of range");
  out = a.elements[static_cast<size_t>(position)];
  return true;
}

bool Evaluator::isValuePrefix(const EvalContext& c, const Expr& prefix) {
  switch (prefix.kind) {
    case ExprKind::Call:
    case ExprKind::Qualified:
      return true;
    case ExprKind::Name: {
      Found f = lookup(c, prefix.key, kAnyArity);
      return f.local != nullptr || (f.decl != nullptr && (f.decl->kind == DeclKind::Constant ||
                                                          f.decl->kind == DeclKind::Generic ||
                                                          f.decl->kind == DeclKind::Alias));
    }
    case ExprKind::Selected:
      return isValuePrefix(c, c.unit->arena[static_cast<size_t>(prefix.a)]);
    default:
      return false;
  }
}

bool Evaluator::selectField(const EvalContext& c, const Expr& e, Value& out) {
  Value record;
  if (!eval(c, e.a, record)) return false;
  const Composite* r = record.isComposite() ? &record.asComposite() : nullptr;
  auto it = r ? std::find(r->fields.begin(), r->fields.end(), e.key)
              : std::vector<std::string>::const_iterator{};
  if (r == nullptr || it == r->fields.end())
    return failWith(quoted(sourceText(c, c.unit->arena[static_cast<size_t>(e.a)])) +
                    " has no field " + quoted(e.text));
  out = r->elements[static_cast<size_t>(it - r->fields.begin())];
  return true;
}

// T'image(x): integers in decimal, booleans and enumeration literals by name (basic
// identifiers in lowercase), characters in quotes, reals as GHDL writes them.
bool Evaluator::evalImage(const EvalContext& c, const Expr& e, Value& out) {
  Value v;
  if (e.args.size() != 1 || !eval(c, e.args[0], v)) return false;
  const Expr& prefix = c.unit->arena[static_cast<size_t>(e.a)];
  Found f = prefix.kind == ExprKind::Name || prefix.kind == ExprKind::Selected
                ? resolve(c, prefix, kAnyArity)
                : Found{};
  for (int hops = 0; f.decl != nullptr && f.decl->kind == DeclKind::Subtype &&
                     hops < limits::kVhdlDefinitionChain;
       ++hops)
    f = resolveMark(EvalContext{f.unit, nullptr}, f.decl->subtype.typeMark);
  if (f.decl != nullptr && f.decl->kind == DeclKind::EnumType && v.isInteger()) {
    size_t at = static_cast<size_t>(f.decl - f.unit->decls.data());
    int64_t position = v.asInteger();
    if (position < 0 || position >= f.decl->position)
      return failWith("the value in " + quoted(sourceText(c, e)) + " is out of range");
    std::string_view name = f.unit->decls[at + 1 + static_cast<size_t>(position)].name;
    out =
        Value::string(name[0] == '\\' || name[0] == '\'' ? std::string(name) : asciiLowered(name));
    return true;
  }
  if (v.isBoolean()) {
    out = Value::string(v.asBoolean() ? "true" : "false");
  } else if (v.isInteger()) {
    out = Value::string(std::to_string(v.asInteger()));
  } else if (v.isReal()) {
    out = Value::string(realImage(v.asReal()));
  } else if (v.isString() && v.asString().size() == 1) {
    out = Value::string("'" + v.asString() + "'");
  } else {
    return failWith("cannot evaluate " + quoted(sourceText(c, e)));
  }
  return true;
}

}  // namespace scan::vhdl
