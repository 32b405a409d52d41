// Ranges: index and range constraints, attributes of types and objects, and the shape of a
// port's subtype (scalar, constrained array, unconstrained array).
#include <cmath>

#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_eval.h"
#include "scan/vhdl/vhdl_parser.h"
#include "scan/vhdl/vhdl_types.h"

namespace scan::vhdl {
namespace {

std::string markText(const std::vector<std::string_view>& mark) {
  std::string out;
  for (std::string_view part : mark) {
    if (!out.empty()) out += '.';
    out += part;
  }
  return out;
}

std::string_view sourceText(const EvalContext& c, const Expr& e) {
  return c.unit->source->text().substr(e.begin, e.end - e.begin);
}

}  // namespace

bool Evaluator::evalRange(const EvalContext& c, ExprId id, RangeValue& out) {
  if (id == kNoExpr) return failWith("missing range");
  const Expr& e = c.unit->arena[static_cast<size_t>(id)];
  switch (e.kind) {
    case ExprKind::Range: {
      Value left;
      Value right;
      if (!eval(c, e.a, left) || !eval(c, e.b, right)) return false;
      std::optional<int64_t> l = left.isInteger() ? left.toInteger() : std::nullopt;
      std::optional<int64_t> r = right.isInteger() ? right.toInteger() : std::nullopt;
      if (!l || !r)
        return failWith("the bounds of " + quoted(sourceText(c, e)) + " are not integers");
      out = RangeValue{*l, *r, e.op == Op::To};
      return true;
    }
    case ExprKind::Attribute: {
      bool reverse = equalsWord(e.text, "reverse_range");
      if (!reverse && !equalsWord(e.text, "range")) break;
      if (!prefixRange(c, c.unit->arena[static_cast<size_t>(e.a)], out)) return false;
      if (reverse) out = RangeValue{out.right, out.left, !out.ascending};
      return true;
    }
    case ExprKind::Name:
    case ExprKind::Selected: {
      Found f = resolve(c, e, static_cast<size_t>(-1));
      if (f.decl != nullptr && f.decl->kind != DeclKind::Constant &&
          f.decl->kind != DeclKind::Generic)
        return declRange(f.unit, *f.decl, out);
      if (!f && builtinRange(e.key, out)) return true;
      break;
    }
    case ExprKind::Box:
      return failWith("the range is unconstrained");
    default:
      break;
  }
  return failWith(quoted(sourceText(c, e)) + " is not a range");
}

bool Evaluator::typeRange(const EvalContext& c, const std::vector<std::string_view>& mark,
                          RangeValue& out) {
  Found f = resolveMark(c, mark);
  if (f.decl != nullptr) return declRange(f.unit, *f.decl, out);
  if (builtinRange(normalizeName(mark.back()), out)) return true;
  if (builtinShape(normalizeName(mark.back())) == BuiltinShape::UnconstrainedArray)
    return failWith("type " + quoted(markText(mark)) + " is unconstrained");
  return failWith("type " + quoted(markText(mark)) + " is not declared");
}

bool Evaluator::subtypeRange(const EvalContext& c, const SubtypeIndication& s, RangeValue& out) {
  if (!s.indexConstraint.empty() &&
      c.unit->arena[static_cast<size_t>(s.indexConstraint[0])].kind != ExprKind::Open)
    return evalRange(c, s.indexConstraint[0], out);
  if (s.rangeConstraint != kNoExpr) return evalRange(c, s.rangeConstraint, out);
  if (!s.valid()) return failWith("missing type");
  return typeRange(c, s.typeMark, out);
}

bool Evaluator::declRange(UnitScope* unit, Decl& decl, RangeValue& out) {
  DepthGuard guard(m_Depth, limits::kVhdlEvalNesting);
  if (guard.tooDeep()) return failWith("types are nested too deeply");
  EvalContext c{unit, nullptr};
  switch (decl.kind) {
    case DeclKind::Subtype:
      return subtypeRange(c, decl.subtype, out);
    case DeclKind::ArrayType:
      return evalRange(c, decl.indexRanges[0], out);
    case DeclKind::RangeType:
      return evalRange(c, decl.range, out);
    case DeclKind::EnumType:
      out = RangeValue{0, decl.position - 1, true};
      return true;
    case DeclKind::Constant:
    case DeclKind::Generic:
    case DeclKind::Port:
    case DeclKind::Variable: {
      std::string saved = m_Reason;
      if (subtypeRange(c, decl.subtype, out)) return true;
      // An unconstrained constant takes its bounds from its value.
      Value v;
      if ((decl.kind != DeclKind::Constant && decl.kind != DeclKind::Generic) ||
          decl.init == kNoExpr)
        return false;
      m_Reason = saved;
      if (!constantValue(unit, decl, v)) return false;
      if (v.isComposite()) return compositeRange(v, decl.name, out);
      if (!v.isString()) return false;
      int64_t n = static_cast<int64_t>(v.asString().size());
      bool isString =
          !decl.subtype.typeMark.empty() && equalsWord(decl.subtype.typeMark.back(), "string");
      out = isString ? RangeValue{1, n, true} : RangeValue{0, n - 1, true};
      return true;
    }
    case DeclKind::Alias: {
      const Expr& target = unit->arena[static_cast<size_t>(decl.init)];
      if (target.kind == ExprKind::Name && builtinRange(target.key, out)) return true;
      Value v;
      if (!eval(c, decl.init, v)) return false;
      if (v.isComposite()) return compositeRange(v, decl.name, out);
      return failWith(quoted(decl.name) + " has no range");
    }
    default:
      return failWith(quoted(decl.name) + " has no range");
  }
}

bool Evaluator::compositeRange(const Value& v, std::string_view name, RangeValue& out) {
  const Composite& a = v.asComposite();
  if (!a.fields.empty()) return failWith("record " + quoted(name) + " has no range");
  int64_t n = static_cast<int64_t>(a.elements.size());
  out = RangeValue{a.left, a.ascending ? a.left + n - 1 : a.left - n + 1, a.ascending};
  return true;
}

bool Evaluator::prefixRange(const EvalContext& c, const Expr& prefix, RangeValue& out) {
  if (prefix.kind == ExprKind::Selected &&
      isValuePrefix(c, c.unit->arena[static_cast<size_t>(prefix.a)])) {
    Value v;
    if (!selectField(c, prefix, v)) return false;
    if (v.isComposite()) return compositeRange(v, prefix.text, out);
    return failWith(quoted(sourceText(c, prefix)) + " has no range");
  }
  if (prefix.kind != ExprKind::Name && prefix.kind != ExprKind::Selected) {
    // A qualified aggregate or string, or T'image(x) (a string indexed from 1): the bounds
    // follow from the value.
    Value v;
    bool image = prefix.kind == ExprKind::Attribute && prefix.key == "image";
    ExprId id = prefix.kind == ExprKind::Qualified ? prefix.b : kNoExpr;
    bool ok = image ? evalImage(c, prefix, v) : id != kNoExpr && eval(c, id, v);
    if (ok && v.isComposite()) return compositeRange(v, sourceText(c, prefix), out);
    if (!ok || !v.isString())
      return failWith("attribute prefix " + quoted(sourceText(c, prefix)) + " is not supported");
    int64_t first = image ? 1 : 0;
    out = RangeValue{first, first + static_cast<int64_t>(v.asString().size()) - 1, true};
    return true;
  }
  Found f = resolve(c, prefix, static_cast<size_t>(-1));
  if (f.local != nullptr) {
    if (f.local->isComposite()) return compositeRange(*f.local, prefix.text, out);
    if (f.local->isString()) {
      out = RangeValue{0, static_cast<int64_t>(f.local->asString().size()) - 1, true};
      return true;
    }
    if (f.localDecl != nullptr) return subtypeRange(c, f.localDecl->subtype, out);
    return failWith(quoted(prefix.text) + " has no range");
  }
  if (f.decl != nullptr) return declRange(f.unit, *f.decl, out);
  if (prefix.kind == ExprKind::Name && builtinRange(prefix.key, out)) return true;
  return failWith(quoted(sourceText(c, prefix)) + " is not declared");
}

bool Evaluator::evalAttribute(const EvalContext& c, const Expr& e, Value& out) {
  const Expr& prefix = c.unit->arena[static_cast<size_t>(e.a)];
  const std::string& attribute = e.key;
  if (attribute == "image") return evalImage(c, e, out);
  if (attribute == "pos" || attribute == "val" || attribute == "succ" || attribute == "pred") {
    Value v;
    if (e.args.size() != 1 || !eval(c, e.args[0], v)) return false;
    if (v.isString() && v.asString().size() == 1)  // a character's position is its code
      v = Value::integer(static_cast<unsigned char>(v.asString()[0]));
    std::optional<int64_t> position = v.toInteger();
    if (!position) return failWith("cannot evaluate " + quoted(sourceText(c, e)));
    int64_t n = *position;
    if (attribute == "succ" && !checkedAdd(n, 1, n)) return failWith("integer overflow");
    if (attribute == "pred" && !checkedSub(n, 1, n)) return failWith("integer overflow");
    out = Value::integer(n);
    return true;
  }
  RangeValue r;
  if (attribute == "left" || attribute == "right" || attribute == "high" || attribute == "low" ||
      attribute == "length" || attribute == "ascending") {
    if (!prefixRange(c, prefix, r)) return false;
    if (attribute == "left")
      out = Value::integer(r.left);
    else if (attribute == "right")
      out = Value::integer(r.right);
    else if (attribute == "high")
      out = Value::integer(r.high());
    else if (attribute == "low")
      out = Value::integer(r.low());
    else if (attribute == "length")
      out = Value::integer(r.length());
    else
      out = Value::boolean(r.ascending);
    return true;
  }
  return failWith("attribute " + quoted(sourceText(c, e)) + " is not supported in bounds");
}

Evaluator::Shape Evaluator::shapeOfDecl(UnitScope* unit, const Decl& decl, RangeValue& out,
                                        const Expr*& failed, int depth) {
  EvalContext c{unit, nullptr};
  if (depth > limits::kVhdlDefinitionChain) {
    failWith("subtype " + quoted(decl.name) + " is defined in terms of itself");
    return Shape::Failed;
  }
  switch (decl.kind) {
    case DeclKind::ArrayType: {
      ExprId first = decl.indexRanges[0];
      if (unit->arena[static_cast<size_t>(first)].kind == ExprKind::Box)
        return Shape::Unconstrained;
      if (evalRange(c, first, out)) return Shape::Array;
      failed = &unit->arena[static_cast<size_t>(first)];
      return Shape::Failed;
    }
    case DeclKind::Subtype: {
      const SubtypeIndication& s = decl.subtype;
      if (!s.indexConstraint.empty() &&
          unit->arena[static_cast<size_t>(s.indexConstraint[0])].kind != ExprKind::Open) {
        if (evalRange(c, s.indexConstraint[0], out)) return Shape::Array;
        failed = &unit->arena[static_cast<size_t>(s.indexConstraint[0])];
        return Shape::Failed;
      }
      if (s.rangeConstraint != kNoExpr) return Shape::Scalar;
      Found f = resolveMark(c, s.typeMark);
      if (f.decl != nullptr) return shapeOfDecl(f.unit, *f.decl, out, failed, depth + 1);
      switch (builtinShape(normalizeName(s.typeMark.back()))) {
        case BuiltinShape::Scalar:
          return Shape::Scalar;
        case BuiltinShape::UnconstrainedArray:
          return Shape::Unconstrained;
        case BuiltinShape::NotBuiltin:
          return Shape::Unknown;
      }
      return Shape::Unknown;
    }
    case DeclKind::RangeType:
    case DeclKind::EnumType:
    case DeclKind::RecordType:
    case DeclKind::OtherType:
      return Shape::Scalar;
    case DeclKind::Alias: {  // of a predefined type: the aliases of declared ones were followed
      const Expr& target = unit->arena[static_cast<size_t>(decl.init)];
      switch (builtinShape(target.kind == ExprKind::Name ? target.key : std::string())) {
        case BuiltinShape::Scalar:
          return Shape::Scalar;
        case BuiltinShape::UnconstrainedArray:
          return Shape::Unconstrained;
        case BuiltinShape::NotBuiltin:
          return Shape::Unknown;
      }
      return Shape::Unknown;
    }
    default:
      return Shape::Unknown;
  }
}

Evaluator::Shape Evaluator::portShape(const EvalContext& c, const SubtypeIndication& s,
                                      RangeValue& out, const Expr*& failed) {
  m_Reason.clear();
  m_Steps = 0;
  failed = nullptr;
  if (!s.indexConstraint.empty()) {
    const Expr& first = c.unit->arena[static_cast<size_t>(s.indexConstraint[0])];
    if (first.kind != ExprKind::Open) {
      if (evalRange(c, s.indexConstraint[0], out)) return Shape::Array;
      failed = &first;
      return Shape::Failed;
    }
  }
  if (s.rangeConstraint != kNoExpr) {
    if (evalRange(c, s.rangeConstraint, out)) return Shape::Array;
    failed = &c.unit->arena[static_cast<size_t>(s.rangeConstraint)];
    return Shape::Failed;
  }
  if (!s.valid()) return Shape::Unknown;
  Found f = resolveMark(c, s.typeMark);
  if (f.decl != nullptr) return shapeOfDecl(f.unit, *f.decl, out, failed, 0);
  switch (builtinShape(normalizeName(s.typeMark.back()))) {
    case BuiltinShape::Scalar:
      return Shape::Scalar;
    case BuiltinShape::UnconstrainedArray:
      return Shape::Unconstrained;
    case BuiltinShape::NotBuiltin:
      return Shape::Unknown;
  }
  return Shape::Unknown;
}

}  // namespace scan::vhdl
