// Each recorded place is read with a fresh token stream over a preprocessor whose macro table
// is moved forward through the compilation unit's log, so a body that defines macros sees
// them exactly as the index pass did.
#include "platform/scan/verilog/verilog_unit.h"

#include "platform/scan.h"
#include "platform/scan/common/diagnostics.h"
#include "platform/scan/verilog/verilog_parser.h"
#include "platform/scan/verilog/verilog_preprocessor.h"

namespace scan::verilog {

class UnitReader::Session {
 public:
  Session(UnitReader& reader) : m_Reader(reader), m_Pre(nullptr, m_Table, reader.m_Sources) {}

  /// Reads the statements at `place` with `read` (called once per statement).
  template <typename Read>
  void readAt(const Place& place, Read read) {
    moveTo(place);
    TokenStream tokens(m_Pre);
    Parser parser(tokens);
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
    case Word::Input: return ScanPort::Input;
    case Word::Output: return ScanPort::Output;
    case Word::Inout: return ScanPort::Inout;
    case Word::Ref: return ScanPort::Ref;
    default: return 0;
  }
}

bool startsAnsiPort(Parser& parser) {
  TokenStream& tokens = parser.tokens();
  switch (tokens.peekWord()) {
    case Word::Input: case Word::Output: case Word::Inout: case Word::Ref: case Word::Interface:
    case Word::NetKind: case Word::Var: case Word::VariableType: case Word::AtomType:
    case Word::RealType: case Word::Signed: case Word::Unsigned: case Word::Struct:
    case Word::Union: case Word::Enum:
      return true;
    default:
      return tokens.peek().isSymbol("[") || parser.userTypeAt(0);
  }
}

void readImports(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  if (tokens.peek().kind == TokenKind::String) {  // DPI import
    parser.skipStatement();
    return;
  }
  do {
    if (tokens.peek().kind != TokenKind::Identifier) {
      parser.fail("expected a package name after 'import'");
      return;
    }
    std::string package(tokens.take().text);
    if (!parser.expectSymbol("::")) return;
    if (tokens.acceptSymbol("*")) {
      scope.wildcardImports.push_back(package);
    } else if (tokens.peek().kind == TokenKind::Identifier) {
      scope.namedImports.emplace(std::string(tokens.take().text), package);
    } else {
      parser.fail("expected a name or '*' after '::'");
      return;
    }
  } while (tokens.acceptSymbol(","));
  parser.expectSymbol(";");
}

// A parameter list, up to (not including) the closing ')' or ';'.
void readParameters(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  std::shared_ptr<TypeSpec> type;
  bool isType = false;
  for (;;) {
    Word word = tokens.peekWord();
    if (word == Word::Parameter || word == Word::Localparam) {
      tokens.take();
      type.reset();
      isType = false;
    }
    if (tokens.acceptWord(Word::Type)) {
      isType = true;
      type.reset();
    } else {
      TypeSpec written;
      if (parser.dataType(written)) {
        type = std::make_shared<TypeSpec>(std::move(written));
        isType = false;
      }
    }
    if (parser.failed()) return;
    if (tokens.peek().kind != TokenKind::Identifier) {
      parser.fail("expected a parameter name");
      return;
    }
    std::string name(tokens.take().text);
    Parameter parameter;
    parser.dimensions(parameter.unpacked);
    parameter.type = type;
    parameter.isType = isType;
    if (tokens.acceptSymbol("=")) {
      if (isType) {
        auto value = std::make_shared<TypeSpec>();
        if (!parser.dataType(*value)) {
          parser.fail("expected a type after '='");
          return;
        }
        parameter.typeValue = value;
      } else {
        parameter.value = parser.expression();
        if (!parameter.value) return;
      }
    }
    scope.parameters.emplace(std::move(name), std::move(parameter));
    if (!tokens.acceptSymbol(",")) return;
  }
}

void readTypedef(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  auto type = std::make_shared<TypeSpec>();
  if (!parser.dataType(*type) || tokens.peek().kind != TokenKind::Identifier) {
    parser.skipStatement();
    return;
  }
  std::string name(tokens.take().text);
  std::vector<Dimension> unpacked;
  parser.dimensions(unpacked);
  if (parser.expectSymbol(";")) scope.typedefs.emplace(std::move(name), std::move(type));
}

// The declarations any scope may hold; false when the statement is something else.
bool readScopeItem(Parser& parser, Scope& scope) {
  TokenStream& tokens = parser.tokens();
  switch (tokens.peekWord()) {
    case Word::Parameter:
    case Word::Localparam:
      readParameters(parser, scope);
      if (!parser.failed()) parser.expectSymbol(";");
      return true;
    case Word::Typedef:
      tokens.take();
      readTypedef(parser, scope);
      return true;
    case Word::Import:
      tokens.take();
      readImports(parser, scope);
      return true;
    case Word::Function:
      if (std::shared_ptr<Function> function = parser.function())
        scope.functions.emplace(function->name, function);
      return true;
    default:
      return false;
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
    port.name.assign(name.text);
    port.source = name.source;
    port.offset = name.offset;
    tokens.take();
    std::vector<Dimension> unpacked;
    parser.dimensions(unpacked);
    if (tokens.acceptSymbol("=") && !parser.expression()) return;
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
  if (!member.left) return false;
  const Token& sep = tokens.peek();
  if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
    member.op.assign(tokens.take().text);
    member.right = parser.expression();
    if (!member.right) return false;
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
    const Token& at = tokens.peek();
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
    readImports(parser, model.scope);
    if (parser.failed()) return;
  }
  if (tokens.acceptSymbol("#")) {
    if (!parser.expectSymbol("(")) return;
    if (!tokens.acceptSymbol(")")) {
      readParameters(parser, model.scope);
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
// and the net or variable declarations of the listed names.
// True when the item was a port declaration of a non-ANSI unit.
bool readBodyItem(Parser& parser, UnitModel& model,
                  const std::unordered_set<std::string>& listed) {
  TokenStream& tokens = parser.tokens();
  if (readScopeItem(parser, model.scope)) return false;
  Word word = tokens.peekWord();
  int direction = directionOf(word);
  if (direction) tokens.take();
  if (model.ansi && direction) {
    parser.skipStatement();
    return false;
  }
  TypeSpec type;
  bool hasType = parser.dataType(type);
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
    if (direction) {
      PortDeclaration port;
      port.name = text;
      port.type = type;
      port.direction = direction;
      port.source = name.source;
      port.offset = name.offset;
      model.declared.emplace(text, std::move(port));
    } else if (listed.count(text)) {
      model.netTypes.emplace(text, type);
    }
    tokens.take();
    std::vector<Dimension> unpacked;
    parser.dimensions(unpacked);
    if (tokens.peek().isSymbol("=")) break;
  } while (!parser.failed() && tokens.acceptSymbol(","));
  if (direction && !parser.failed() && !tokens.peek().isSymbol(";") &&
      !tokens.peek().isSymbol("="))
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
  session.readAt(unit.start, [&](Parser& parser) {
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
    session.readAt(place, [&](Parser& parser) {
      size_t before = session.errors();
      if (!readBodyItem(parser, model, listed)) return;
      session.report(parser);
      model.headerErrors += session.errors() - before;
    });
}

void UnitReader::readScope(const std::vector<Place>& places, Scope& scope) {
  Session session(*this);
  for (const Place& place : places)
    session.readAt(place, [&](Parser& parser) {
      if (!readScopeItem(parser, scope)) parser.skipStatement();
    });
}

}  // namespace scan::verilog
