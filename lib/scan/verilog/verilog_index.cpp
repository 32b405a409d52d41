// The index walk keeps only a little state per token: whether a statement may start here and
// the keyword of the previous identifier, which is enough to skip every kind of block
// correctly and to note the statements a header parse will revisit.
#include "scan/verilog/verilog_index.h"

#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/verilog/verilog_keywords.h"
#include "scan/verilog/verilog_preprocessor.h"

namespace scan::verilog {

class IndexWalk {
 public:
  IndexWalk(DesignIndex& index, const std::string& library)
      : m_Index(index),
        m_Library(library),
        m_Pre(&index.m_Diagnostics, index.m_Macros, index.m_Sources) {}

  void run(const SourceBuffer& file) {
    m_Pre.start(file, 0, 0);
    topLevel();
  }

 private:
  bool read(Token& token) {
    if (m_HasPending) {
      token = m_Pending;
      m_HasPending = false;
      return true;
    }
    m_Pre.releaseFinishedText();
    return m_Pre.next(token);
  }
  void unread(const Token& token) {
    if (token.kind == TokenKind::End) return;
    m_Pending = token;
    m_HasPending = true;
  }
  Place placeOf(const Token& token) const {
    return {token.source, token.offset, m_Index.m_Macros.logSize(), m_Pre.openConditionals()};
  }
  void error(const Token& at, const std::string& text) {
    if (at.source) m_Index.m_Diagnostics.error(*at.source, at.offset, text);
  }

  void topLevel();
  void unit(UnitKind kind, Word end, const Token& keyword);
  bool body(size_t unit, Word end);
  bool skipBlock(Word open, const Token& start);
  void skipStatement();
  void skipLabel();
  void registerName(DesignIndex::NameMap& names, size_t unit, const Token& at);

  DesignIndex& m_Index;
  const std::string& m_Library;
  Preprocessor m_Pre;
  Token m_Pending;
  bool m_HasPending = false;
};

const char* unitKindName(UnitKind kind) {
  switch (kind) {
    case UnitKind::Module:
      return "module";
    case UnitKind::Interface:
      return "interface";
    case UnitKind::Program:
      return "program";
    case UnitKind::Package:
      return "package";
  }
  return "module";
}

namespace {

const char* wordName(Word word) {
  switch (word) {
    case Word::Endmodule:
      return "endmodule";
    case Word::Endinterface:
      return "endinterface";
    case Word::Endprogram:
      return "endprogram";
    case Word::Endpackage:
      return "endpackage";
    case Word::Endprimitive:
      return "endprimitive";
    case Word::Endclass:
      return "endclass";
    case Word::Endchecker:
      return "endchecker";
    case Word::Endconfig:
      return "endconfig";
    case Word::Endfunction:
      return "endfunction";
    case Word::Endtask:
      return "endtask";
    case Word::Endclocking:
      return "endclocking";
    case Word::Endgroup:
      return "endgroup";
    case Word::Endproperty:
      return "endproperty";
    case Word::Endsequence:
      return "endsequence";
    case Word::Endspecify:
      return "endspecify";
    default:
      return "end";
  }
}

// Bodies are read in coarse mode; the unit headers and the top level are not.
class CoarseScope {
 public:
  explicit CoarseScope(Preprocessor& pre) : m_Pre(pre), m_Was(pre.coarse()) { pre.setCoarse(true); }
  ~CoarseScope() { m_Pre.setCoarse(m_Was); }

 private:
  Preprocessor& m_Pre;
  bool m_Was;
};

bool startsNewUnit(Word word) {
  return word == Word::Module || word == Word::Macromodule || word == Word::Package;
}

// Statements whose place a header parse may need.
bool isDeclaration(Word word) {
  switch (word) {
    case Word::Input:
    case Word::Output:
    case Word::Inout:
    case Word::Ref:
    case Word::Parameter:
    case Word::Localparam:
    case Word::Typedef:
    case Word::Import:
    case Word::NetKind:
    case Word::VariableType:
    case Word::AtomType:
    case Word::RealType:
    case Word::Var:
    case Word::Function:
      return true;
    default:
      return false;
  }
}

}  // namespace

void IndexWalk::skipStatement() {
  Token token;
  while (read(token))
    if (token.isSymbol(";")) return;
}

void IndexWalk::skipLabel() {
  Token token;
  if (!read(token)) return;
  if (!token.isSymbol(":")) {
    unread(token);
    return;
  }
  // The label itself is no keyword, so coarse lexing would pass over it.
  bool coarse = m_Pre.coarse();
  m_Pre.setCoarse(false);
  if (read(token) && token.kind != TokenKind::Identifier) unread(token);
  m_Pre.setCoarse(coarse);
}

bool IndexWalk::skipBlock(Word open, const Token& start) {
  CoarseScope coarse(m_Pre);
  Word close = closingWord(open);
  size_t depth = 1;
  Token token;
  while (read(token)) {
    if (token.kind != TokenKind::Identifier) continue;
    Word word = classify(token.text);
    if (word == close) {
      if (--depth == 0) {
        skipLabel();
        return true;
      }
    } else if (word == open) {
      ++depth;
    } else if (word == Word::Endmodule || startsNewUnit(word)) {
      error(start, std::string("missing ") + wordName(close) + " for this block");
      unread(token);
      return false;
    }
  }
  error(start, std::string("missing ") + wordName(close) + " for this block");
  return false;
}

void IndexWalk::registerName(DesignIndex::NameMap& names, size_t unit, const Token& at) {
  const UnitRecord& record = m_Index.m_Units[unit];
  auto [it, inserted] = names.emplace(record.name, unit);
  if (inserted) return;
  const UnitRecord& first = m_Index.m_Units[it->second];
  std::string where;
  if (first.start.source) {
    where = first.start.source->path() + ":" +
            std::to_string(first.start.source->locate(first.start.offset).line);
  }
  if (at.source)
    m_Index.m_Diagnostics.warning(*at.source, at.offset,
                                  std::string(unitKindName(record.kind)) + " '" + record.name +
                                      "' is already declared at " + where +
                                      "; the first declaration is used");
}

void IndexWalk::unit(UnitKind kind, Word end, const Token& keyword) {
  UnitRecord record;
  record.kind = kind;
  record.library = m_Library;
  record.start = placeOf(keyword);
  record.unitScopeBefore = m_Index.m_UnitScope.size();
  Token name;
  bool named = read(name);
  if (named && name.kind == TokenKind::Identifier &&
      (classify(name.text) == Word::Static || classify(name.text) == Word::Automatic))
    named = read(name);
  if (!named || name.kind != TokenKind::Identifier) {
    error(keyword, std::string("expected a name after '") + unitKindName(kind) + "'");
    if (named) unread(name);
  } else {
    record.name.assign(name.text);
  }
  size_t index = m_Index.m_Units.size();
  m_Index.m_Units.push_back(std::move(record));
  if (!m_Index.m_Units[index].name.empty())
    registerName(kind == UnitKind::Package ? m_Index.m_Packages : m_Index.m_Designs, index, name);
  if (!body(index, end))
    error(keyword, std::string("missing ") + wordName(end) + " for " + unitKindName(kind) + " '" +
                       m_Index.m_Units[index].name + "'");
}

bool IndexWalk::body(size_t unit, Word end) {
  CoarseScope coarse(m_Pre);
  bool statementStart = false;
  bool afterDpi = false;
  Word previous = Word::None;
  Token token;
  while (read(token)) {
    bool atStart = statementStart;
    statementStart = false;
    if (token.kind != TokenKind::Identifier) {
      if (token.isSymbol(";")) statementStart = true;
      if (token.kind != TokenKind::String) afterDpi = false;
      previous = Word::None;
      continue;
    }
    Word word = classify(token.text);
    if (word == Word::None) {
      previous = word;
      continue;
    }
    if (word == end) {
      skipLabel();
      return true;
    }
    if (startsNewUnit(word) || word == Word::Endmodule) {
      unread(token);
      return false;
    }
    if (atStart && isDeclaration(word)) {
      std::vector<Place>& places = m_Index.m_Units[unit].declarations;
      Place place = placeOf(token);
      if (places.empty() || places.back().source != place.source ||
          places.back().offset != place.offset)
        places.push_back(place);
    }
    switch (word) {
      case Word::Function:
      case Word::Task:
        if (!afterDpi && previous != Word::Extern && !skipBlock(word, token)) return false;
        statementStart = true;
        break;
      case Word::Class:
        if (previous != Word::Typedef && !skipBlock(word, token)) return false;
        statementStart = true;
        break;
      case Word::Covergroup:
      case Word::Property:
      case Word::Sequence:
      case Word::Checker:
        if (atStart && !skipBlock(word, token)) return false;
        statementStart = atStart;
        break;
      case Word::Specify:
        if (!skipBlock(word, token)) return false;
        statementStart = true;
        break;
      case Word::Clocking: {
        Token next;
        if (read(next) && next.kind == TokenKind::Identifier && read(next)) {
        }
        if (next.isSymbol("@")) {
          if (!skipBlock(word, token)) return false;
          statementStart = true;
        } else {
          unread(next);
        }
        break;
      }
      case Word::Import:
      case Word::Export: {
        Token next;
        if (read(next)) {
          if (next.kind == TokenKind::String)
            afterDpi = true;
          else
            unread(next);
        }
        break;
      }
      case Word::OtherEnd:
      case Word::Endcase:
      case Word::Endfunction:
      case Word::Endtask:
      case Word::Generate:
        skipLabel();
        statementStart = true;
        break;
      default:
        break;
    }
    if (word != Word::Import && word != Word::Export) previous = word;
  }
  return false;
}

void IndexWalk::topLevel() {
  bool statementStart = true;
  bool afterDpi = false;
  Word previous = Word::None;
  Token token;
  while (read(token)) {
    bool atStart = statementStart;
    statementStart = false;
    if (token.kind != TokenKind::Identifier) {
      if (token.isSymbol(";")) statementStart = true;
      if (token.kind != TokenKind::String) afterDpi = false;
      previous = Word::None;
      continue;
    }
    Word word = classify(token.text);
    switch (word) {
      case Word::Module:
      case Word::Macromodule:
        unit(UnitKind::Module, Word::Endmodule, token);
        statementStart = true;
        break;
      case Word::Interface: {
        Token next;
        if (read(next) && next.kind == TokenKind::Identifier &&
            classify(next.text) == Word::Class) {
          skipBlock(Word::Class, next);
        } else {
          unread(next);
          unit(UnitKind::Interface, Word::Endinterface, token);
        }
        statementStart = true;
        break;
      }
      case Word::Program:
        unit(UnitKind::Program, Word::Endprogram, token);
        statementStart = true;
        break;
      case Word::Package:
        unit(UnitKind::Package, Word::Endpackage, token);
        statementStart = true;
        break;
      case Word::Class:
        if (previous != Word::Typedef) skipBlock(word, token);
        statementStart = true;
        break;
      case Word::Primitive:
      case Word::Checker:
      case Word::Config:
      case Word::Task:
        skipBlock(word, token);
        statementStart = true;
        break;
      case Word::Function:
        if (afterDpi || previous == Word::Extern) break;
        m_Index.m_UnitScope.push_back(placeOf(token));
        skipBlock(word, token);
        statementStart = true;
        break;
      case Word::Extern:
      case Word::Library:
        skipStatement();
        statementStart = true;
        break;
      case Word::Import:
      case Word::Export: {
        Token next;
        if (read(next) && next.kind == TokenKind::String) {
          afterDpi = true;
        } else {
          unread(next);
          if (word == Word::Import && atStart) m_Index.m_UnitScope.push_back(placeOf(token));
        }
        break;
      }
      case Word::Parameter:
      case Word::Localparam:
      case Word::Typedef:
        if (atStart) m_Index.m_UnitScope.push_back(placeOf(token));
        break;
      default:
        break;
    }
    if (word != Word::Import && word != Word::Export) previous = word;
  }
}

DesignIndex::DesignIndex(Diagnostics& diagnostics, MacroTable& macros, SourceStore& sources)
    : m_Diagnostics(diagnostics), m_Macros(macros), m_Sources(sources) {}

void DesignIndex::indexFile(const SourceBuffer& file, const std::string& library) {
  IndexWalk walk(*this, library);
  walk.run(file);
}

const UnitRecord* DesignIndex::find(std::string_view name) const {
  auto it = m_Designs.find(name);
  return it == m_Designs.end() ? nullptr : &m_Units[it->second];
}

const UnitRecord* DesignIndex::findPackage(std::string_view name) const {
  auto it = m_Packages.find(name);
  return it == m_Packages.end() ? nullptr : &m_Units[it->second];
}

}  // namespace scan::verilog
