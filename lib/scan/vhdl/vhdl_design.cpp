// Lazy parsing of the units a lookup needs, and the library search order for packages.
#include "scan/vhdl/vhdl_design.h"

#include <algorithm>

#include "scan/common/diagnostics.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {
const std::vector<size_t>* UnitScope::find(const std::string& key) const {
  auto it = byKey.find(key);
  return it == byKey.end() ? nullptr : &it->second;
}

void UnitScope::indexDecls() {
  for (size_t i = 0; i < decls.size(); ++i) byKey[decls[i].key].push_back(i);
}

bool Design::isLibraryName(std::string_view name) const {
  if (name == "work" || name == "ieee" || name == "std") return true;
  const std::vector<std::string>& libs = m_Index.libraries();
  return std::find(libs.begin(), libs.end(), name) != libs.end();
}

// Each context declaration is expanded once per unit, which also ends reference cycles; the
// clauses it holds join the end of the work list, so no nesting depth is needed.
void Design::expandUses(UnitScope& scope, const std::vector<UseClause>& uses) {
  std::vector<UseClause> work = uses;
  std::vector<const UnitRecord*> expanded;
  for (size_t next = 0; next < work.size(); ++next) {
    if (!work[next].context) {
      scope.uses.push_back(work[next]);
      continue;
    }
    std::vector<std::string> names = work[next].names;
    if (names.size() < 2) continue;
    std::string library = names[0] == "work" ? scope.record->library : names[0];
    const UnitRecord* context = m_Index.find(UnitKind::Context, library, names[1]);
    for (size_t i = 0; context == nullptr && i < m_Index.libraries().size(); ++i)
      context = m_Index.find(UnitKind::Context, m_Index.libraries()[i], names[1]);
    if (context == nullptr ||
        std::find(expanded.begin(), expanded.end(), context) != expanded.end())
      continue;
    expanded.push_back(context);
    // A context declaration holds nothing but clauses, so the index pass recorded them as
    // the clauses of whatever follows; read them again here.
    const SourceBuffer& source = m_Index.source(*context);
    Lexer lexer(source.text(), context->offset);
    Token t = lexer.next();
    while (t.kind != TokenKind::End &&
           !(t.kind == TokenKind::Identifier && equalsWord(t.text, "end"))) {
      bool isUse = t.kind == TokenKind::Identifier && equalsWord(t.text, "use");
      bool isContext = t.kind == TokenKind::Identifier && equalsWord(t.text, "context") &&
                       t.offset != context->offset;
      t = lexer.next();
      if (!isUse && !isContext) continue;
      UseClause clause;
      clause.context = isContext;
      while (t.kind == TokenKind::Identifier || t.kind == TokenKind::Extended) {
        clause.names.push_back(normalizeName(t.text));
        t = lexer.next();
        if (!t.is('.')) break;
        t = lexer.next();
      }
      work.push_back(std::move(clause));
    }
  }
}

UnitScope* Design::parse(const UnitRecord& record) {
  auto found = m_Scopes.find(&record);
  if (found != m_Scopes.end()) return found->second.get();
  auto scope = std::make_unique<UnitScope>();
  scope->record = &record;
  scope->source = &m_Index.source(record);
  Parser parser(*scope->source, record.offset, scope->arena, m_Diagnostics);
  if (record.kind == UnitKind::Entity) {
    std::vector<Decl> ports;
    scope->parseFailed = !parser.parseEntityHeader(scope->decls, ports);
    for (Decl& port : ports) scope->decls.push_back(std::move(port));
  } else {
    scope->parseFailed = !parser.parsePackage(scope->decls);
  }
  scope->indexDecls();
  expandUses(*scope, record.uses);
  UnitScope* raw = scope.get();
  m_Scopes.emplace(&record, std::move(scope));
  return raw;
}

UnitScope* Design::entity(const UnitRecord& record) { return parse(record); }

UnitScope* Design::package(std::string_view library, std::string_view name, const UnitScope& from) {
  std::string_view named = library == "work" ? std::string_view(from.record->library) : library;
  const UnitRecord* record = m_Index.find(UnitKind::Package, named, name);
  for (size_t i = 0; record == nullptr && i < m_Index.libraries().size(); ++i)
    record = m_Index.find(UnitKind::Package, m_Index.libraries()[i], name);
  if (record == nullptr) return nullptr;
  return parse(*record);
}

UnitScope* Design::bodyOf(UnitScope& package) {
  if (package.record->kind == UnitKind::PackageBody) return &package;
  if (package.bodyLooked) return package.body;
  package.bodyLooked = true;
  const UnitRecord* record =
      m_Index.find(UnitKind::PackageBody, package.record->library, package.record->name);
  if (record == nullptr) return nullptr;
  package.body = parse(*record);
  package.body->spec = &package;
  return package.body;
}

const FunctionBody* Design::function(UnitScope& unit, const Decl& decl) {
  auto found = unit.functions.find(decl.bodyOffset);
  if (found != unit.functions.end()) return found->second.get();
  auto body = std::make_unique<FunctionBody>();
  Parser parser(*unit.source, decl.bodyOffset, unit.arena, m_Diagnostics);
  bool ok = parser.parseFunction(*body);
  const FunctionBody* result = ok ? body.get() : nullptr;
  unit.functions.emplace(decl.bodyOffset, ok ? std::move(body) : nullptr);
  return result;
}

}  // namespace scan::vhdl
