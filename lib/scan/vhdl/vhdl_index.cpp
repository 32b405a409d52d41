// The sweep recognizes a design unit by its keyword at the start of a statement (after a
// semicolon or at the top of the file); a keyword anywhere else belongs to a body. Every
// `end` closes what came before, so the use clauses kept for a unit are exactly those
// between the previous unit's end and its own keyword.
#include "scan/vhdl/vhdl_index.h"

#include <algorithm>

#include "scan/common/diagnostics.h"
#include "scan/vhdl/vhdl_lexer.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {
namespace {

const char* kindWord(UnitKind kind) {
  switch (kind) {
    case UnitKind::Entity:
      return "entity";
    case UnitKind::Architecture:
      return "architecture";
    case UnitKind::Package:
      return "package";
    case UnitKind::PackageBody:
      return "package body";
    case UnitKind::PackageInstance:
      return "package";
    case UnitKind::Configuration:
      return "configuration";
    case UnitKind::Context:
      return "context";
  }
  return "unit";
}

std::string unitKey(UnitKind kind, std::string_view library, std::string_view name) {
  // Package instances share the namespace of packages.
  char k = kind == UnitKind::PackageInstance ? static_cast<char>(UnitKind::Package)
                                             : static_cast<char>(kind);
  std::string key(1, static_cast<char>('0' + k));
  key.append(library).push_back('\0');
  key.append(name);
  return key;
}

bool isNameToken(const Token& t) {
  return t.kind == TokenKind::Extended ||
         (t.kind == TokenKind::Identifier && !isReservedWord(t.text));
}

// Reads the tokens of one file; the unit keywords are handled here.
class Sweep {
 public:
  Sweep(const SourceBuffer& source, Diagnostics& diagnostics)
      : m_Source(source), m_Lexer(source.text()), m_Diagnostics(diagnostics) {}

  template <typename OnUnit>
  void run(OnUnit onUnit);

 private:
  Token next() {
    Token t = m_Lexer.next();
    while (t.kind == TokenKind::Invalid) {
      if (!m_ErrorInUnit) m_Diagnostics.error(m_Source, t.offset, t.error);
      m_ErrorInUnit = true;
      t = m_Lexer.next();
    }
    return t;
  }
  void syntaxError(const Token& at, std::string_view text) {
    if (!m_ErrorInUnit) m_Diagnostics.error(m_Source, at.offset, text);
    m_ErrorInUnit = true;
  }
  // `a.b.c {, a.b.c} ;` into the pending clauses; returns the semicolon.
  Token readUseList(bool context);
  // `entity name is`, `package [body] name is [new]`, `architecture a of e is`...: registers
  // the unit and returns the first token after its header.
  template <typename OnUnit>
  Token readUnitHeader(Token keyword, UnitKind kind, OnUnit& onUnit);

  const SourceBuffer& m_Source;
  Lexer m_Lexer;
  Diagnostics& m_Diagnostics;
  bool m_ErrorInUnit = false;
  std::vector<UseClause> m_Pending;
};

Token Sweep::readUseList(bool context) {
  Token t = next();
  for (;;) {
    UseClause clause;
    clause.context = context;
    while (isNameToken(t) || (t.kind == TokenKind::Identifier && equalsWord(t.text, "all"))) {
      clause.names.push_back(normalizeName(t.text));
      t = next();
      if (!t.is('.')) break;
      t = next();
    }
    if (clause.names.empty()) {
      syntaxError(t, "expected a selected name in the clause");
      return t;
    }
    m_Pending.push_back(std::move(clause));
    if (!t.is(',')) break;
    t = next();
  }
  if (!t.is(';')) syntaxError(t, "expected ';' after the clause");
  return t;
}

template <typename OnUnit>
void Sweep::run(OnUnit onUnit) {
  for (;;) {
    Token t = m_Lexer.nextAtStatementStart();
    if (t.kind == TokenKind::End) return;
    if (t.kind == TokenKind::Invalid) {
      if (!m_ErrorInUnit) m_Diagnostics.error(m_Source, t.offset, t.error);
      m_ErrorInUnit = true;
      continue;
    }
    std::string_view w = t.text;
    if (t.kind != TokenKind::Identifier || w.size() < 3 || w.size() > 13) continue;
    if (equalsWord(w, "end")) {
      m_Pending.clear();
      continue;
    }
    // The rest reads whole tokens; `t` ends as the first token not consumed, which the fast
    // path reads again.
    UnitKind kind;
    if (equalsWord(w, "use")) {
      t = readUseList(false);
    } else if (equalsWord(w, "library")) {
      while (t.kind != TokenKind::End && !t.is(';')) t = next();
    } else if (equalsWord(w, "entity")) {
      kind = UnitKind::Entity;
      t = readUnitHeader(t, kind, onUnit);
    } else if (equalsWord(w, "architecture")) {
      kind = UnitKind::Architecture;
      t = readUnitHeader(t, kind, onUnit);
    } else if (equalsWord(w, "package")) {
      kind = UnitKind::Package;
      t = readUnitHeader(t, kind, onUnit);
    } else if (equalsWord(w, "configuration")) {
      kind = UnitKind::Configuration;
      t = readUnitHeader(t, kind, onUnit);
    } else if (equalsWord(w, "context")) {
      kind = UnitKind::Context;
      t = readUnitHeader(t, kind, onUnit);
    } else {
      continue;
    }
    m_Lexer.seek(t.offset, false);
  }
}

template <typename OnUnit>
Token Sweep::readUnitHeader(Token keyword, UnitKind kind, OnUnit& onUnit) {
  m_ErrorInUnit = false;
  Token t = next();
  if (kind == UnitKind::Package && t.kind == TokenKind::Identifier && equalsWord(t.text, "body")) {
    kind = UnitKind::PackageBody;
    t = next();
  }
  if (!isNameToken(t)) {
    syntaxError(t, std::string("expected a name after '") + kindWord(kind) + "'");
    m_Pending.clear();
    return t;
  }
  Token name = t;
  t = next();
  if (kind == UnitKind::Context && !(t.kind == TokenKind::Identifier && equalsWord(t.text, "is"))) {
    // A context reference in a context clause, not a declaration.
    m_Lexer.seek(name.offset, false);
    return readUseList(true);
  }
  if (kind == UnitKind::Architecture || kind == UnitKind::Configuration) {
    if (!(t.kind == TokenKind::Identifier && equalsWord(t.text, "of"))) {
      syntaxError(t, "expected 'of'");
      m_Pending.clear();
      return t;
    }
    t = next();
    if (isNameToken(t)) t = next();
  }
  if (!(t.kind == TokenKind::Identifier && equalsWord(t.text, "is"))) {
    syntaxError(t, "expected 'is'");
    m_Pending.clear();
    return t;
  }
  t = next();
  if (kind == UnitKind::Package && t.kind == TokenKind::Identifier && equalsWord(t.text, "new"))
    kind = UnitKind::PackageInstance;
  UnitRecord unit;
  unit.kind = kind;
  unit.name = normalizeName(name.text);
  unit.offset = keyword.offset;
  unit.uses = std::move(m_Pending);
  m_Pending.clear();
  onUnit(std::move(unit), name.offset);
  return t;
}

}  // namespace

void DesignIndex::addLibrary(std::string_view library) {
  std::string name = normalizeName(library);
  if (std::find(m_Libraries.begin(), m_Libraries.end(), name) == m_Libraries.end())
    m_Libraries.push_back(std::move(name));
}

void DesignIndex::addSource(std::unique_ptr<SourceBuffer> source, std::string_view library) {
  addLibrary(library);
  std::string lib = normalizeName(library);
  uint32_t file = static_cast<uint32_t>(m_Sources.size());
  m_Sources.push_back(std::move(source));
  const SourceBuffer& buffer = *m_Sources.back();
  Sweep sweep(buffer, m_Diagnostics);
  sweep.run([&](UnitRecord unit, size_t nameOffset) {
    unit.library = lib;
    unit.file = file;
    registerUnit(std::move(unit), nameOffset, buffer);
  });
}

void DesignIndex::registerUnit(UnitRecord unit, size_t nameOffset, const SourceBuffer& source) {
  m_Met.push_back(unit);
  m_Met.back().uses.clear();
  if (unit.kind == UnitKind::Architecture || unit.kind == UnitKind::Configuration) return;
  std::string key = unitKey(unit.kind, unit.library, unit.name);
  auto [it, inserted] = m_ByKey.try_emplace(std::move(key), m_Units.size());
  if (!inserted) {
    const UnitRecord& first = m_Units[it->second];
    LineColumn where = m_Sources[first.file]->locate(first.offset);
    m_Diagnostics.warning(source, nameOffset,
                          std::string(kindWord(unit.kind)) + " '" + unit.name +
                              "' is already defined in library '" + unit.library + "' at " +
                              m_Sources[first.file]->path() + ":" + std::to_string(where.line) +
                              "; this definition is ignored");
    return;
  }
  m_Units.push_back(std::move(unit));
}

const UnitRecord* DesignIndex::find(UnitKind kind, std::string_view library,
                                    std::string_view name) const {
  auto it = m_ByKey.find(unitKey(kind, library, name));
  return it == m_ByKey.end() ? nullptr : &m_Units[it->second];
}

}  // namespace scan::vhdl
