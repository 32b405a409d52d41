// Types are followed through subtypes and array element types to a predefined type or a
// declaration's kind; predefined types are known by name since the IEEE packages are
// rarely among the design files.
#include "scan/vhdl/vhdl_describe.h"

#include <algorithm>
#include <charconv>
#include <cmath>

#include "scan/common/diagnostics.h"
#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_lexer.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {
namespace {

bool isIn(std::string_view name, std::initializer_list<std::string_view> names) {
  for (std::string_view n : names)
    if (n == name) return true;
  return false;
}

std::string realText(double v) {
  char buffer[64];
  auto [end, ec] = std::to_chars(buffer, buffer + sizeof buffer, v);
  std::string text(buffer, ec == std::errc() ? end : buffer);
  // VHDL reals need a point before any exponent: 1.0, 1.0e-09.
  if (text.find('.') == std::string::npos) {
    size_t e = text.find('e');
    text.insert(e == std::string::npos ? text.size() : e, ".0");
  }
  return text;
}

std::string stringText(const std::string& v) {
  std::string text = "\"";
  for (char c : v) {
    text += c;
    if (c == '"') text += '"';
  }
  return text + "\"";
}

Decl* findGeneric(UnitScope& entity, const std::string& key) {
  const std::vector<size_t>* found = entity.find(key);
  if (found == nullptr) return nullptr;
  for (size_t i : *found)
    if (entity.decls[i].kind == DeclKind::Generic) return &entity.decls[i];
  return nullptr;
}

}  // namespace

void Describer::applyOverrides(UnitScope& entity, const std::vector<InterfaceText>& texts,
                               const std::vector<std::pair<std::string, std::string>>& overrides) {
  for (const auto& [name, text] : overrides) {
    std::string key = normalizeName(name);
    m_OverrideSources.push_back(SourceBuffer::fromText("-g " + name, text));
    const SourceBuffer& source = *m_OverrideSources.back();
    Decl* generic = findGeneric(entity, key);
    if (generic == nullptr) {
      for (const InterfaceText& declared : texts)
        if (declared.kind != InterfaceText::Kind::Object && normalizeName(declared.name) == key)
          m_Diagnostics.error(source, 0,
                              "-g " + name + ": generic '" + std::string(declared.name) +
                                  "' is not a constant; -g gives values to constant generics only");
      continue;
    }
    auto scope = std::make_unique<UnitScope>();
    scope->record = entity.record;
    scope->source = &source;
    scope->spec = &entity;  // the value sees the entity's generics and use clauses
    size_t errors = m_Diagnostics.errorCount();
    Parser parser(source, 0, scope->arena, m_Diagnostics);
    ExprId id = parser.parseExpression();
    Value value;
    std::string why;
    if (id != kNoExpr) {
      Lexer rest(source.text(), scope->arena[static_cast<size_t>(id)].end);
      Token after = rest.next();
      if (after.kind != TokenKind::End) {
        why = "unexpected " + quoted(after.text) + " after the value";
        m_Diagnostics.error(source, after.offset, "-g " + name + ": " + why);
      } else if (!m_Evaluator.evaluate(EvalContext{scope.get(), nullptr}, id, value)) {
        why = m_Evaluator.reason();
        m_Diagnostics.error(source, 0, "-g " + name + ": cannot evaluate the value: " + why);
      }
    } else {
      why = "it is not an expression";
      if (m_Diagnostics.errorCount() == errors)
        m_Diagnostics.error(source, 0, "-g " + name + ": the value is not a VHDL expression");
    }
    m_Overridden.push_back(generic);
    if (why.empty()) {
      generic->state = Decl::State::Done;
      generic->cached = std::move(value);
    } else {
      generic->state = Decl::State::Failed;
      generic->failure = "-g " + name + "=" + text + " cannot be evaluated: " + why;
    }
    m_OverrideScopes.push_back(std::move(scope));
  }
}

std::vector<ScanGeneric> Describer::generics(UnitScope& entity,
                                             const std::vector<InterfaceText>& texts) {
  std::vector<ScanGeneric> out;
  for (const InterfaceText& text : texts) {
    ScanGeneric generic;
    generic.name = std::string(text.name);
    switch (text.kind) {
      case InterfaceText::Kind::Object:
        generic.kind = ScanGeneric::Kind::Constant;
        break;
      case InterfaceText::Kind::Type:
        generic.kind = ScanGeneric::Kind::Type;
        break;
      case InterfaceText::Kind::Package:
        generic.kind = ScanGeneric::Kind::Package;
        break;
      case InterfaceText::Kind::Subprogram:
        generic.kind = ScanGeneric::Kind::Subprogram;
        break;
    }
    generic.typeText = text.typeText;
    generic.defaultText = text.defaultText;
    const std::vector<size_t>* named =
        text.kind == InterfaceText::Kind::Object ? entity.find(normalizeName(text.name)) : nullptr;
    for (size_t i = 0; named != nullptr && i < named->size(); ++i) {
      Decl& decl = entity.decls[(*named)[i]];
      Value value;
      if (decl.offset != text.offset || decl.kind != DeclKind::Generic) continue;
      if (m_Evaluator.constant(&entity, decl, value))
        generic.value = literalText(classify(&entity, decl.subtype, 0), value);
      break;
    }
    out.push_back(std::move(generic));
  }
  return out;
}

Describer::TypeInfo Describer::classify(UnitScope* unit, const SubtypeIndication& subtype,
                                        int depth) {
  if (!subtype.valid() || depth > limits::kVhdlDefinitionChain) return {};
  auto [owner, decl] = m_Evaluator.declarationOf(EvalContext{unit, nullptr}, subtype.typeMark);
  if (decl == nullptr) {
    std::string name = normalizeName(subtype.typeMark.back());
    if (isIn(name, {"std_logic", "std_ulogic", "bit", "x01", "x01z", "ux01", "ux01z"}))
      return {TypeClass::Bit};
    if (isIn(name, {"integer", "natural", "positive"})) return {TypeClass::Integer};
    if (name == "real") return {TypeClass::Real};
    if (name == "boolean") return {TypeClass::Boolean};
    if (name == "character") return {TypeClass::Character};
    if (name == "string") return {TypeClass::String};
    if (isIn(name, {"severity_level", "file_open_kind", "file_open_status"}))
      return {TypeClass::Enum};
    if (isIn(name, {"boolean_vector", "integer_vector", "real_vector", "time_vector"}))
      return {TypeClass::Array};
    if (isIn(name, {"std_logic_vector",
                    "std_ulogic_vector",
                    "bit_vector",
                    "unsigned",
                    "signed",
                    "unresolved_unsigned",
                    "unresolved_signed",
                    "u_unsigned",
                    "u_signed",
                    "ufixed",
                    "sfixed",
                    "u_ufixed",
                    "u_sfixed",
                    "unresolved_ufixed",
                    "unresolved_sfixed",
                    "float",
                    "float32",
                    "float64",
                    "float128",
                    "unresolved_float",
                    "u_float"}))
      return {TypeClass::BitVector};
    return {};
  }
  switch (decl->kind) {
    case DeclKind::Subtype:
      return classify(owner, decl->subtype, depth + 1);
    case DeclKind::ArrayType:
      return {classify(owner, decl->subtype, depth + 1).type == TypeClass::Bit
                  ? TypeClass::BitVector
                  : TypeClass::Array};
    case DeclKind::RangeType: {
      // Integer unless the bounds say real.
      const Expr& range = owner->arena[static_cast<size_t>(decl->range)];
      Value left;
      if (range.kind == ExprKind::Range &&
          m_Evaluator.evaluate(EvalContext{owner, nullptr}, range.a, left) && left.isReal())
        return {TypeClass::Real};
      return {TypeClass::Integer};
    }
    case DeclKind::EnumType:
      return {TypeClass::Enum, owner, decl};
    case DeclKind::RecordType:
      return {TypeClass::Record};
    default:
      return {};
  }
}

std::optional<std::string> Describer::literalText(const TypeInfo& type, const Value& v) const {
  bool character = v.isString() && v.asString().size() == 1;
  switch (type.type) {
    case TypeClass::Integer:
      if (v.isInteger()) return std::to_string(v.asInteger());
      break;
    case TypeClass::Real:
      if (v.isReal() && std::isfinite(v.asReal())) return realText(v.asReal());
      break;
    case TypeClass::Boolean:
      if (v.isBoolean()) return v.asBoolean() ? "true" : "false";
      break;
    case TypeClass::Bit:
    case TypeClass::Character:
      if (character) return "'" + v.asString() + "'";
      break;
    case TypeClass::String:
      if (v.isString()) return stringText(v.asString());
      break;
    case TypeClass::Enum: {
      if (character) return "'" + v.asString() + "'";
      if (type.decl == nullptr || !v.isInteger() || v.asInteger() < 0 ||
          v.asInteger() >= type.decl->position)
        break;
      size_t at = static_cast<size_t>(type.decl - type.unit->decls.data()) + 1 +
                  static_cast<size_t>(v.asInteger());
      if (at < type.unit->decls.size() && type.unit->decls[at].kind == DeclKind::EnumLiteral)
        return std::string(type.unit->decls[at].name);
      break;
    }
    default:
      break;
  }
  return std::nullopt;
}

ScanPort::Kind Describer::portKind(UnitScope& entity, const SubtypeIndication& subtype) {
  switch (classify(&entity, subtype, 0).type) {
    case TypeClass::Bit:
      return ScanPort::Kind::Bit;
    case TypeClass::BitVector:
      return ScanPort::Kind::BitVector;
    case TypeClass::Integer:
      return ScanPort::Kind::Integer;
    case TypeClass::Boolean:
    case TypeClass::Character:
    case TypeClass::Enum:
      return ScanPort::Kind::Enum;
    case TypeClass::Record:
      return ScanPort::Kind::Record;
    case TypeClass::String:
    case TypeClass::Array:
      return ScanPort::Kind::Array;
    case TypeClass::Real:
    case TypeClass::Other:
      return ScanPort::Kind::Other;
  }
  return ScanPort::Kind::Other;
}

// Follows the names of `failed` and of the defaults of the generics it uses, so a width
// taken from a generic whose default uses another generic names the one to give.
const Decl* Describer::genericWithoutValue(UnitScope& entity, const Expr& failed) const {
  std::vector<const Expr*> work{&failed};
  std::vector<const Decl*> seen;
  while (!work.empty()) {
    const Expr& e = *work.back();
    work.pop_back();
    auto push = [&](ExprId id) {
      if (id != kNoExpr) work.push_back(&entity.arena[static_cast<size_t>(id)]);
    };
    push(e.a);
    push(e.b);
    for (ExprId arg : e.args) push(arg);
    if (e.kind != ExprKind::Name) continue;
    const Decl* generic = findGeneric(entity, e.key);
    if (generic == nullptr || generic->state == Decl::State::Done ||
        std::find(seen.begin(), seen.end(), generic) != seen.end())
      continue;
    seen.push_back(generic);
    // A failed -g value names itself in the reason.
    if (std::find(m_Overridden.begin(), m_Overridden.end(), generic) != m_Overridden.end())
      continue;
    if (generic->init == kNoExpr) return generic;
    push(generic->init);
  }
  return nullptr;
}

std::string Describer::missingPackage(UnitScope& entity, const Expr* failed,
                                      const std::vector<std::string_view>& typeMark) {
  std::vector<std::vector<std::string>> named;
  for (const UseClause& use : entity.uses)
    if (!use.context) named.push_back(use.names);
  // Selected names in the expression: pkg.NAME and lib.pkg.NAME.
  std::vector<const Expr*> work;
  if (failed != nullptr) work.push_back(failed);
  while (!work.empty()) {
    const Expr& e = *work.back();
    work.pop_back();
    for (ExprId id : {e.a, e.b})
      if (id != kNoExpr) work.push_back(&entity.arena[static_cast<size_t>(id)]);
    for (ExprId arg : e.args) work.push_back(&entity.arena[static_cast<size_t>(arg)]);
    if (e.kind != ExprKind::Selected) continue;
    const Expr& prefix = entity.arena[static_cast<size_t>(e.a)];
    if (prefix.kind == ExprKind::Name) {
      if (entity.find(prefix.key) == nullptr) named.push_back({prefix.key, e.key});
    } else if (prefix.kind == ExprKind::Selected) {
      const Expr& library = entity.arena[static_cast<size_t>(prefix.a)];
      if (library.kind == ExprKind::Name) named.push_back({library.key, prefix.key, e.key});
    }
  }
  if (typeMark.size() >= 2) {
    std::vector<std::string> mark;
    for (std::string_view part : typeMark) mark.push_back(normalizeName(part));
    named.push_back(std::move(mark));
  }
  for (const std::vector<std::string>& n : named) {
    if (n.size() < 2) continue;
    bool library = m_Design.isLibraryName(n[0]) || n.size() >= 3;
    std::string lib = library ? n[0] : "work";
    const std::string& package = library ? n[1] : n[0];
    if (lib == "ieee" || lib == "std") continue;
    if (m_Design.package(lib, package, entity) == nullptr) return package;
  }
  return "";
}

UnitScope* Describer::ownerOf(UnitScope& entity, const SubtypeIndication& subtype,
                              const Expr& failed) {
  // The evaluator names the first index range, or the range constraint, of a subtype
  // along the port's type; comparing addresses with those few candidates is enough.
  auto holds = [&failed](UnitScope& unit, const std::vector<ExprId>& index, ExprId range) {
    if (!index.empty() && &unit.arena[static_cast<size_t>(index[0])] == &failed) return true;
    return range != kNoExpr && &unit.arena[static_cast<size_t>(range)] == &failed;
  };
  if (holds(entity, subtype.indexConstraint, subtype.rangeConstraint)) return &entity;
  UnitScope* unit = &entity;
  const SubtypeIndication* s = &subtype;
  for (int depth = 0; depth <= limits::kVhdlDefinitionChain && s->valid(); ++depth) {
    auto [owner, decl] = m_Evaluator.declarationOf(EvalContext{unit, nullptr}, s->typeMark);
    if (decl == nullptr) return nullptr;
    if (decl->kind == DeclKind::ArrayType)
      return holds(*owner, decl->indexRanges, kNoExpr) ? owner : nullptr;
    if (decl->kind != DeclKind::Subtype) return nullptr;
    if (holds(*owner, decl->subtype.indexConstraint, decl->subtype.rangeConstraint)) return owner;
    unit = owner;
    s = &decl->subtype;
  }
  return nullptr;
}

std::string Describer::failureHint(UnitScope& entity, const Expr* failed,
                                   const std::vector<std::string_view>& typeMark,
                                   const std::string& reason) {
  if (failed != nullptr) {
    if (const Decl* generic = genericWithoutValue(entity, *failed)) {
      std::string name(generic->name);
      return "generic '" + name + "' has no value; give one with -g " + name + "=VALUE";
    }
  }
  if (reason.empty() || reason.find("is not declared") != std::string::npos) {
    std::string package = missingPackage(entity, failed, typeMark);
    if (!package.empty())
      return "package '" + package + "' is not in any design file; add the file that declares it";
  }
  return reason;
}

}  // namespace scan::vhdl
