// Each recorded place is read with a fresh token stream over a preprocessor whose macro table
// is moved forward through the compilation unit's log, so a body that defines macros sees
// them exactly as the index pass did.
#include "scan/verilog/verilog_unit.h"

#include "platform/scan.h"
#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/verilog/verilog_parser.h"
#include "scan/verilog/verilog_preprocessor.h"
#include "scan/verilog/verilog_text.h"
#include "scan/verilog/verilog_unit_items.h"

namespace scan::verilog {

class UnitReader::Session {
 public:
  Session(UnitReader& reader) : m_Reader(reader), m_Pre(nullptr, m_Table, reader.m_Sources) {}

  /// Reads the statements at `place` with `read` (called once per statement), their
  /// expressions into `arena`.
  template <typename Read>
  void readAt(const Place& place, ExprArena& arena, Read read) {
    moveTo(place);
    TokenStream tokens(m_Pre);
    Parser parser(tokens, arena);
    for (int guard = 0; guard < 100000; ++guard) {
      read(parser);
      const Token& next = tokens.peek();
      if (next.kind == TokenKind::End || next.source != place.source || next.offset != place.offset)
        break;
      parser.clearError();
    }
  }

  void report(const Parser& parser) {
    const Token& at = parser.errorAt();
    if (!parser.failed()) return;
    ++m_Reported;
    if (at.source) m_Reader.m_Diagnostics.error(*at.source, at.offset, parser.errorText());
  }

  /// Errors reported so far, plus the lexical ones met again while rereading quietly.
  size_t errors() const { return m_Reported + m_Pre.quietErrors(); }

 private:
  void moveTo(const Place& place) {
    if (place.macroLog < m_Position) {
      m_Table = m_Reader.m_Macros.replay(place.macroLog);
    } else {
      m_Table.advance(m_Reader.m_Macros, m_Position, place.macroLog);
    }
    m_Position = place.macroLog;
    m_Pre.start(*place.source, place.offset, place.openConditionals);
  }

  UnitReader& m_Reader;
  MacroTable m_Table;
  size_t m_Position = 0;
  size_t m_Reported = 0;
  Preprocessor m_Pre;
};

namespace {

int directionOf(Word word) {
  switch (word) {
    case Word::Input:
      return ScanPort::Input;
    case Word::Output:
      return ScanPort::Output;
    case Word::Inout:
      return ScanPort::Inout;
    case Word::Ref:
      return ScanPort::Ref;
    default:
      return 0;
  }
}

bool startsAnsiPort(Parser& parser) {
  TokenStream& tokens = parser.tokens();
  switch (tokens.peekWord()) {
    case Word::Input:
    case Word::Output:
    case Word::Inout:
    case Word::Ref:
    case Word::Interface:
      return true;
    default:
      return isTypeWord(tokens.peekWord()) || tokens.peek().isSymbol("[") || parser.userTypeAt(0);
  }
}

void readAnsiPorts(Parser& parser, UnitModel& model) {
  TokenStream& tokens = parser.tokens();
  const PortDeclaration* previous = nullptr;
  for (;;) {
    PortDeclaration port;
    int direction = directionOf(tokens.peekWord());
    if (direction) tokens.take();
    bool hasType = false;
    Token typeStart = tokens.peek();
    if (tokens.acceptWord(Word::Interface)) {
      port.type.base = TypeSpec::Base::Named;
      port.type.isInterface = true;
      port.type.written = "interface";
      port.type.name = "interface";
      if (tokens.acceptSymbol(".") && tokens.peek().kind == TokenKind::Identifier)
        port.type.modport.assign(tokens.take().text);
      hasType = true;
    } else {
      hasType = parser.dataType(port.type);
    }
    if (parser.failed()) return;
    const Token& name = tokens.peek();
    if (name.kind != TokenKind::Identifier || classify(name.text) != Word::None) {
      parser.fail("expected a port name");
      return;
    }
    if (hasType) {
      port.typeText = writtenBetween(typeStart, name);
      if (port.typeText.empty()) port.typeText = port.type.written;
    }
    port.name.assign(name.text);
    port.source = name.source;
    port.offset = name.offset;
    tokens.take();
    std::vector<Dimension> unpacked;
    parser.dimensions(unpacked);
    port.unpacked = !unpacked.empty();
    if (tokens.acceptSymbol("=") && parser.expression() == kNoExpr) return;
    // A header cut short keeps no half-read name such as `outpu`.
    if (!tokens.peek().isSymbol(",") && !tokens.peek().isSymbol(")")) {
      parser.expectSymbol(")");
      return;
    }
    if (port.type.isInterface) {
      port.direction = ScanPort::InterfacePort;
    } else if (direction) {
      port.direction = direction;
    } else if (!hasType && previous) {
      port.direction = previous->direction;
      port.type = previous->type;
      port.typeText = previous->typeText;
      port.maybeInterface = previous->maybeInterface;
    } else {
      port.direction = previous ? previous->direction : ScanPort::Inout;
      port.maybeInterface = port.type.base == TypeSpec::Base::Named && port.type.scope.empty() &&
                            port.type.packed.empty();
    }
    model.ports.push_back(std::move(port));
    previous = &model.ports.back();
    if (!tokens.acceptSymbol(",")) return;
  }
}

bool readPortMember(Parser& parser, PortReference::Member& member) {
  TokenStream& tokens = parser.tokens();
  if (tokens.peek().kind != TokenKind::Identifier) {
    parser.fail("expected a port name");
    return false;
  }
  member.signal.assign(tokens.take().text);
  if (!tokens.acceptSymbol("[")) return true;
  member.left = parser.expression();
  if (member.left == kNoExpr) return false;
  const Token& sep = tokens.peek();
  if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
    member.op = operatorOf(tokens.take().text);
    member.right = parser.expression();
    if (member.right == kNoExpr) return false;
  }
  return parser.expectSymbol("]");
}

bool readPortExpression(Parser& parser, PortReference& ref) {
  TokenStream& tokens = parser.tokens();
  if (tokens.acceptSymbol("{")) {
    do {
      PortReference::Member member;
      if (!readPortMember(parser, member)) return false;
      ref.members.push_back(std::move(member));
    } while (tokens.acceptSymbol(","));
    return parser.expectSymbol("}");
  }
  PortReference::Member member;
  if (!readPortMember(parser, member)) return false;
  ref.members.push_back(std::move(member));
  return true;
}

void readNonAnsiList(Parser& parser, UnitModel& model) {
  TokenStream& tokens = parser.tokens();
  for (;;) {
    if (tokens.peek().isSymbol(",")) {
      tokens.take();
      continue;
    }
    if (tokens.peek().isSymbol(")")) return;
    PortReference ref;
    const Token at = tokens.peek();
    ref.source = at.source;
    ref.offset = at.offset;
    if (tokens.acceptSymbol(".")) {
      if (tokens.peek().kind != TokenKind::Identifier) {
        parser.fail("expected a port name after '.'");
        return;
      }
      ref.name.assign(tokens.take().text);
      if (!parser.expectSymbol("(")) return;
      if (!tokens.peek().isSymbol(")") && !readPortExpression(parser, ref)) return;
      if (!parser.expectSymbol(")")) return;
    } else {
      bool concatenation = tokens.peek().isSymbol("{");
      if (!readPortExpression(parser, ref)) return;
      if (!concatenation) ref.name = ref.members[0].signal;
    }
    ref.text = writtenBetween(at, tokens.peek());
    if (!tokens.peek().isSymbol(",") && !tokens.peek().isSymbol(")")) {
      parser.expectSymbol(")");
      return;
    }
    model.headerList.push_back(std::move(ref));
    if (!tokens.acceptSymbol(",")) return;
  }
}

void readHeader(Parser& parser, UnitModel& model) {
  TokenStream& tokens = parser.tokens();
  tokens.take();  // the unit keyword
  if (!tokens.acceptWord(Word::Static)) tokens.acceptWord(Word::Automatic);
  model.scope.name.assign(tokens.take().text);
  while (tokens.acceptWord(Word::Import)) {
    readImports(parser, model.scope, &model.imports);
    if (parser.failed()) return;
  }
  if (tokens.acceptSymbol("#")) {
    model.parameterList = true;
    if (!parser.expectSymbol("(")) return;
    if (!tokens.acceptSymbol(")")) {
      readParameters(parser, model.scope, false, &model.parameters);
      if (parser.failed() || !parser.expectSymbol(")")) return;
    }
  }
  if (tokens.acceptSymbol("(")) {
    if (!tokens.acceptSymbol(")")) {
      model.ansi = startsAnsiPort(parser);
      if (model.ansi)
        readAnsiPorts(parser, model);
      else
        readNonAnsiList(parser, model);
      if (parser.failed() || !parser.expectSymbol(")")) return;
    }
  }
  parser.expectSymbol(";");
}

// Body statements of a unit: scope items, and for non-ANSI headers the port declarations
// and the net or variable declarations of the listed names. A unit without a `#(...)` list
// is parameterised by its body's parameters; the imports of a non-ANSI body are part of the
// context its port declarations need. True when the item was a port declaration of a non-ANSI
// unit.
bool readBodyItem(Parser& parser, UnitModel& model, const std::unordered_set<std::string>& listed) {
  TokenStream& tokens = parser.tokens();
  Word word = tokens.peekWord();
  if (word == Word::Parameter && !model.parameterList) {
    readParameters(parser, model.scope, false, &model.parameters);
    if (!parser.failed()) parser.expectSymbol(";");
    return false;
  }
  if (word == Word::Import && !model.ansi) {
    tokens.take();
    readImports(parser, model.scope, &model.imports);
    return false;
  }
  if (readScopeItem(parser, model.scope)) return false;
  int direction = directionOf(word);
  if (direction) tokens.take();
  if (model.ansi && direction) {
    parser.skipStatement();
    return false;
  }
  TypeSpec type;
  Token typeStart = tokens.peek();
  bool hasType = parser.dataType(type);
  std::string typeText = hasType ? writtenBetween(typeStart, tokens.peek()) : std::string();
  if (hasType && typeText.empty()) typeText = type.written;
  if (!direction && !hasType) {
    parser.skipStatement();
    return false;
  }
  if (tokens.peek().isSymbol("#") || tokens.peek().isSymbol("(")) {  // delay or strength
    parser.skipStatement();
    return direction != 0;
  }
  do {
    const Token& name = tokens.peek();
    if (name.kind != TokenKind::Identifier) break;
    std::string text(name.text);
    const SourceBuffer* source = name.source;
    size_t offset = name.offset;
    tokens.take();
    std::vector<Dimension> unpacked;
    parser.dimensions(unpacked);
    if (direction) {
      PortDeclaration port;
      port.name = text;
      port.type = type;
      port.typeText = typeText;
      port.unpacked = !unpacked.empty();
      port.direction = direction;
      port.source = source;
      port.offset = offset;
      model.declared.emplace(text, std::move(port));
    } else if (listed.count(text)) {
      model.netTypes.emplace(text, NetDeclaration{type, typeText, !unpacked.empty()});
    }
    if (tokens.peek().isSymbol("=")) break;
  } while (!parser.failed() && tokens.acceptSymbol(","));
  if (direction && !parser.failed() && !tokens.peek().isSymbol(";") && !tokens.peek().isSymbol("="))
    parser.expectSymbol(";");
  parser.skipStatement();
  return direction != 0;
}

}  // namespace

UnitReader::UnitReader(Diagnostics& diagnostics, const MacroTable& macros, SourceStore& sources)
    : m_Diagnostics(diagnostics), m_Macros(macros), m_Sources(sources) {}

void UnitReader::readUnit(const UnitRecord& unit, UnitModel& model) {
  Session session(*this);
  bool headerRead = false;
  session.readAt(unit.start, model.scope.arena, [&](Parser& parser) {
    if (headerRead) return;
    headerRead = true;
    readHeader(parser, model);
    session.report(parser);
    model.headerErrors = session.errors();
  });
  std::unordered_set<std::string> listed;
  for (const PortReference& ref : model.headerList)
    for (const PortReference::Member& member : ref.members) listed.insert(member.signal);
  for (const Place& place : unit.declarations)
    session.readAt(place, model.scope.arena, [&](Parser& parser) {
      size_t before = session.errors();
      if (!readBodyItem(parser, model, listed)) return;
      session.report(parser);
      model.headerErrors += session.errors() - before;
    });
}

void UnitReader::readScope(const std::vector<Place>& places, Scope& scope) {
  Session session(*this);
  for (const Place& place : places)
    session.readAt(place, scope.arena, [&](Parser& parser) {
      if (!readScopeItem(parser, scope)) parser.skipStatement();
    });
}

std::vector<std::string> UnitReader::readImports(const std::vector<Place>& places, size_t count) {
  Session session(*this);
  std::vector<std::string> imports;
  Scope ignored;
  for (size_t i = 0; i < count && i < places.size(); ++i)
    session.readAt(places[i], ignored.arena, [&](Parser& parser) {
      if (parser.tokens().acceptWord(Word::Import))
        verilog::readImports(parser, ignored, &imports);
      else
        parser.skipStatement();
    });
  return imports;
}

bool UnitReader::readValue(const SourceBuffer& buffer, bool isType, ExprArena& arena, ExprId& value,
                           std::shared_ptr<TypeSpec>& type) {
  size_t errors = m_Diagnostics.errorCount();
  MacroTable macros = m_Macros.replay(m_Macros.logSize());
  Preprocessor pre(&m_Diagnostics, macros, m_Sources);
  pre.start(buffer, 0, 0);
  TokenStream tokens(pre);
  Parser parser(tokens, arena);
  if (isType) {
    type = std::make_shared<TypeSpec>();
    if (!typeValue(parser, *type) && !parser.failed()) parser.fail("expected a data type");
  } else {
    value = parser.expression();
  }
  if (!parser.failed() && !tokens.atEnd())
    parser.fail("unexpected '" + std::string(tokens.peek().text.substr(0, 40)) +
                "' after the value");
  // The lexer reports what it skipped (an unterminated string or comment) on its own.
  if (!parser.failed()) return m_Diagnostics.errorCount() == errors;
  const Token& at = parser.errorAt();
  if (at.source)
    m_Diagnostics.error(*at.source, at.offset, parser.errorText());
  else
    m_Diagnostics.fileError(buffer.path(), parser.errorText());
  return false;
}

}  // namespace scan::verilog
