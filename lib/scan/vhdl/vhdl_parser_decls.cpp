// Declarations of VHDL units: entity headers, interface lists, packages, types, aliases and
// subprogram headers. The parser stops at the first syntax error it reports.
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {

Decl Parser::declaration(DeclKind kind, const Token& name) {
  Decl d;
  d.kind = kind;
  d.key = normalizeName(name.text);
  d.name = name.text;
  d.offset = name.offset;
  return d;
}

bool Parser::parseEntityHeader(std::vector<Decl>& generics, std::vector<Decl>& ports) {
  if (!expectWord("entity")) return false;
  if (!isName(peek())) return failHere("expected the entity name");
  take();
  if (!expectWord("is")) return false;
  if (acceptWord("generic")) {
    if (!parseInterfaceList(generics, DeclKind::Generic) || !expect(';')) return false;
  }
  if (acceptWord("port")) {
    if (!parseInterfaceList(ports, DeclKind::Port) || !expect(';')) return false;
  }
  return !m_Failed;
}

bool Parser::parseInterfaceList(std::vector<Decl>& out, DeclKind kind) {
  if (!expect('(')) return false;
  for (;;) {
    // A declaration is complete only at the ';' or ')' after it: one cut short is dropped,
    // so a truncated header never invents objects.
    size_t first = out.size();
    auto dropGroup = [&] {
      out.resize(first);
      return false;
    };
    if (peekWord("type") || peekWord("function") || peekWord("procedure") || peekWord("impure") ||
        peekWord("pure") || peekWord("package")) {
      // Generic subprograms and packages carry no bounds for ports; ports of a generic type
      // are scalars as far as ranges go.
      if (peekWord("type") && isName(peek(1))) {
        take();
        Token name = take();
        Decl d = declaration(DeclKind::OtherType, name);
        out.push_back(std::move(d));
      }
      long depth = 0;
      while (!m_Failed && peek().kind != TokenKind::End) {
        if (depth == 0 && (peek().is(';') || peek().is(')'))) break;
        Token t = take();
        if (t.is('(')) ++depth;
        if (t.is(')')) --depth;
      }
    } else {
      acceptWord("constant") || acceptWord("signal") || acceptWord("variable") ||
          acceptWord("file");
      for (;;) {
        if (!isName(peek())) {
          failHere("expected an interface name");
          return dropGroup();
        }
        Token name = take();
        Decl d = declaration(kind, name);
        out.push_back(std::move(d));
        if (!accept(',')) break;
      }
      if (!expect(':')) return dropGroup();
      Mode mode = Mode::In;
      if (acceptWord("in"))
        mode = Mode::In;
      else if (acceptWord("out"))
        mode = Mode::Out;
      else if (acceptWord("inout"))
        mode = Mode::Inout;
      else if (acceptWord("buffer"))
        mode = Mode::Buffer;
      else if (acceptWord("linkage"))
        mode = Mode::Linkage;
      SubtypeIndication subtype;
      if (!parseSubtypeIndication(subtype)) return dropGroup();
      acceptWord("bus");
      ExprId init = kNoExpr;
      if (acceptSymbol(":=")) {
        init = parseExpression();
        if (init == kNoExpr) return dropGroup();
      }
      for (size_t i = first; i < out.size(); ++i) {
        out[i].mode = mode;
        out[i].subtype = subtype;
        out[i].init = init;
      }
    }
    if (accept(';')) {
      if (peek().is(')')) {  // tolerated trailing semicolon
        take();
        return true;
      }
      continue;
    }
    return expect(')') || dropGroup();
  }
}

bool Parser::parseTypeMark(SubtypeIndication& out) {
  out.typeMark.clear();
  if (!isName(peek())) return failHere("expected a type name");
  out.offset = peek().offset;
  out.typeMark.push_back(take().text);
  while (peek().is('.') && isName(peek(1))) {
    take();
    out.typeMark.push_back(take().text);
  }
  return true;
}

bool Parser::parseSubtypeIndication(SubtypeIndication& out) {
  if (peek().is('(')) {  // element resolution of a 2008 resolved composite
    take();
    skipPast(')');
  }
  if (!parseTypeMark(out)) return false;
  if (isName(peek()) && !peekWord("bus")) {  // the first name was a resolution function
    if (!parseTypeMark(out)) return false;
  }
  if (acceptWord("range")) {
    out.rangeConstraint = parseDiscreteRange();
    return out.rangeConstraint != kNoExpr;
  }
  bool first = true;
  while (peek().is('(')) {
    take();
    do {
      ExprId r = parseDiscreteRange();
      if (r == kNoExpr) return false;
      if (first) out.indexConstraint.push_back(r);
    } while (accept(','));
    if (!expect(')')) return false;
    first = false;  // later parentheses constrain the elements
  }
  return true;
}

bool Parser::parsePackage(std::vector<Decl>& decls) {
  if (!expectWord("package")) return false;
  acceptWord("body");
  if (!isName(peek())) return failHere("expected the package name");
  take();
  if (!expectWord("is")) return false;
  if (acceptWord("new")) return true;  // an instance has nothing of its own to read
  if (acceptWord("generic")) {
    std::vector<Decl> generics;
    if (!parseInterfaceList(generics, DeclKind::Generic) || !expect(';')) return false;
    if (peekWord("generic") && peekWord("map", 1)) {
      take();
      take();
      if (!expect('(')) return false;
      skipPast(')');
      accept(';');
    }
  }
  while (!m_Failed) {
    if (peek().kind == TokenKind::End) return failHere("expected 'end' of the package");
    if (acceptWord("end")) {
      skipPast(';');
      return true;
    }
    if (!parseDeclaration(decls)) return false;
  }
  return false;
}

bool Parser::parseDeclaration(std::vector<Decl>& out) {
  if (peekWord("constant")) {
    take();
    size_t first = out.size();
    do {
      if (!isName(peek())) return failHere("expected a constant name");
      Token name = take();
      Decl d = declaration(DeclKind::Constant, name);
      out.push_back(std::move(d));
    } while (accept(','));
    SubtypeIndication subtype;
    if (!expect(':') || !parseSubtypeIndication(subtype)) return false;
    ExprId init = kNoExpr;
    if (acceptSymbol(":=") && (init = parseExpression()) == kNoExpr) return false;
    for (size_t i = first; i < out.size(); ++i) {
      out[i].subtype = subtype;
      out[i].init = init;
    }
    return expect(';');
  }
  if (peekWord("subtype")) {
    take();
    if (!isName(peek())) return failHere("expected a subtype name");
    Token name = take();
    Decl d = declaration(DeclKind::Subtype, name);
    if (!expectWord("is") || !parseSubtypeIndication(d.subtype)) return false;
    out.push_back(std::move(d));
    return expect(';');
  }
  if (peekWord("type")) return parseTypeDeclaration(out);
  if (peekWord("function") || peekWord("procedure") || peekWord("pure") || peekWord("impure"))
    return parseSubprogram(out);
  if (peekWord("alias")) return parseAlias(out);
  if (peekWord("component")) return skipToEndOf("component");
  if (peekWord("package")) {  // nested package or package instance
    take();
    take();
    if (acceptWord("is") && !peekWord("new")) return skipToEndOf("package");
    skipPast(';');
    return !m_Failed;
  }
  skipPast(';');
  return !m_Failed;
}

// `alias name [: subtype] is name [signature];`. Aliases of operators and character
// literals are skipped: no bound can name them.
bool Parser::parseAlias(std::vector<Decl>& out) {
  take();  // alias
  if (!isName(peek())) {
    skipPast(';');
    return !m_Failed;
  }
  Token name = take();
  Decl d = declaration(DeclKind::Alias, name);
  if (accept(':') && !parseSubtypeIndication(d.subtype)) return false;
  if (!expectWord("is")) return false;
  if (!isName(peek())) return failHere("expected the aliased name");
  d.init = parseName();
  if (d.init == kNoExpr) return false;
  out.push_back(std::move(d));
  skipPast(';');  // a signature of a subprogram alias
  return !m_Failed;
}

bool Parser::parseTypeDeclaration(std::vector<Decl>& out) {
  take();  // type
  if (!isName(peek())) return failHere("expected a type name");
  Token name = take();
  Decl d = declaration(DeclKind::OtherType, name);
  if (accept(';')) return true;  // incomplete type
  if (!expectWord("is")) return false;
  if (acceptWord("array")) {
    d.kind = DeclKind::ArrayType;
    if (!expect('(')) return false;
    do {
      ExprId r = parseDiscreteRange();
      if (r == kNoExpr) return false;
      d.indexRanges.push_back(r);
    } while (accept(','));
    if (!expect(')') || !expectWord("of") || !parseSubtypeIndication(d.subtype)) return false;
    out.push_back(std::move(d));
    return expect(';');
  }
  if (acceptWord("range")) {
    d.kind = DeclKind::RangeType;
    d.range = parseDiscreteRange();
    if (d.range == kNoExpr) return false;
    out.push_back(std::move(d));
    if (peekWord("units")) return skipToEndOf("units");
    return expect(';');
  }
  if (peek().is('(')) {
    take();
    d.kind = DeclKind::EnumType;
    std::vector<Decl> literals;
    do {
      const Token& t = peek();
      if (!isName(t) && t.kind != TokenKind::Character) return failHere("expected a literal");
      Token lit = take();
      Decl l;
      l.kind = DeclKind::EnumLiteral;
      l.key = normalizeName(lit.text);
      l.name = lit.text;
      l.offset = lit.offset;
      l.position = static_cast<int64_t>(literals.size());
      literals.push_back(std::move(l));
    } while (accept(','));
    if (!expect(')')) return false;
    d.position = static_cast<int64_t>(literals.size());
    out.push_back(std::move(d));
    for (Decl& l : literals) out.push_back(std::move(l));
    return expect(';');
  }
  if (acceptWord("record")) {
    d.kind = DeclKind::RecordType;
    while (!acceptWord("end")) {
      size_t first = d.fieldKeys.size();
      do {
        if (!isName(peek())) return failHere("expected a field name");
        d.fieldKeys.push_back(normalizeName(take().text));
      } while (accept(','));
      SubtypeIndication subtype;
      if (!expect(':') || !parseSubtypeIndication(subtype) || !expect(';')) return false;
      d.fieldTypes.resize(first);
      d.fieldTypes.resize(d.fieldKeys.size(), subtype);
    }
    out.push_back(std::move(d));
    if (!expectWord("record")) return false;
    if (isName(peek())) take();
    return expect(';');
  }
  if (acceptWord("protected")) {
    out.push_back(std::move(d));
    return skipToEndOf("protected");
  }
  out.push_back(std::move(d));
  skipPast(';');
  return !m_Failed;
}

bool Parser::parseSubprogram(std::vector<Decl>& out) {
  size_t start = peek().offset;
  bool isFunction = true;
  if (acceptWord("pure") || acceptWord("impure")) {
  }
  if (acceptWord("procedure"))
    isFunction = false;
  else if (!expectWord("function"))
    return false;
  const Token& nameToken = peek();
  if (!isName(nameToken) && nameToken.kind != TokenKind::String)
    return failHere("expected a subprogram name");
  Token name = take();
  Decl d = declaration(DeclKind::Function, name);
  d.bodyOffset = start;
  if (acceptWord("generic")) {
    std::vector<Decl> generics;
    if (!parseInterfaceList(generics, DeclKind::Generic)) return false;
  }
  acceptWord("parameter");
  if (peek().is('(')) {
    std::vector<Decl> parameters;
    if (!parseInterfaceList(parameters, DeclKind::Constant)) return false;
    d.parameterCount = parameters.size();
  }
  if (isFunction) {
    SubtypeIndication result;
    if (!expectWord("return") || !parseTypeMark(result)) return false;
  }
  if (acceptWord("is")) {
    if (acceptWord("new")) {
      skipPast(';');
      return !m_Failed;
    }
    d.hasBody = true;
    if (!skipSubprogramBody()) return false;
  } else if (!expect(';')) {
    return false;
  }
  if (isFunction) out.push_back(std::move(d));
  return true;
}
}  // namespace scan::vhdl
