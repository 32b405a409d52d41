// Declarations and expressions of VHDL units. The parser stops at the first syntax error it
// reports; callers keep what was read before it.
#include "platform/scan/vhdl/vhdl_parser.h"

#include <algorithm>
#include <cstdlib>

#include "platform/scan/common/diagnostics.h"
#include "platform/scan/common/source_buffer.h"
#include "platform/scan/vhdl/vhdl_literal.h"

namespace scan::vhdl {
namespace {

// Parentheses and statements may nest this deep; real designs stay far below.
constexpr int kMaxNesting = 200;
// An operator chain such as a+b+c+... builds a tree this deep at most.
constexpr uint16_t kMaxTreeDepth = 1000;

}  // namespace

std::string normalizeName(std::string_view name) {
  std::string out(name);
  if (!out.empty() && out[0] == '\\') return out;
  for (char& c : out)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
  return out;
}

std::string quoted(std::string_view text) {
  constexpr size_t kLongest = 60;
  std::string out;
  out.reserve(std::min(text.size(), kLongest) + 5);
  out += '\'';
  out.append(text.substr(0, text.size() > kLongest ? kLongest - 3 : kLongest));
  if (text.size() > kLongest) out += "...";
  out += '\'';
  return out;
}

Parser::Parser(const SourceBuffer& source, size_t offset, ExprArena& arena,
               Diagnostics& diagnostics)
    : m_Source(source), m_Lexer(source.text(), offset), m_Arena(arena),
      m_Diagnostics(diagnostics) {}

const Token& Parser::peek(size_t ahead) {
  while (m_Buffered <= ahead) {
    Token t = m_Lexer.next();
    if (t.kind == TokenKind::Invalid) {
      // The index pass already reported the lexical errors of indexed files; saying it
      // again here would print every such error twice.
      if (m_ReportLexical) fail(t.offset, t.error);
      m_Failed = true;
      t = Token{TokenKind::End, {}, t.offset, nullptr};
    }
    m_Ahead[m_Buffered++] = t;
  }
  return m_Ahead[ahead];
}

Token Parser::take() {
  Token t = peek();
  if (t.kind == TokenKind::End) return t;
  m_LastEnd = t.offset + t.text.size();
  for (size_t i = 1; i < m_Buffered; ++i) m_Ahead[i - 1] = m_Ahead[i];
  --m_Buffered;
  return t;
}

bool Parser::peekWord(std::string_view lowerWord, size_t ahead) {
  const Token& t = peek(ahead);
  return t.kind == TokenKind::Identifier && equalsWord(t.text, lowerWord);
}

bool Parser::acceptWord(std::string_view lowerWord) {
  if (!peekWord(lowerWord)) return false;
  take();
  return true;
}

bool Parser::accept(char symbol) {
  if (!peek().is(symbol)) return false;
  take();
  return true;
}

bool Parser::acceptSymbol(std::string_view symbol) {
  if (!peek().isSymbol(symbol)) return false;
  take();
  return true;
}

bool Parser::fail(size_t offset, std::string_view text) {
  if (!m_Failed && m_WarnOnly) m_Diagnostics.warning(m_Source, offset, text);
  else if (!m_Failed) m_Diagnostics.error(m_Source, offset, text);
  m_Failed = true;
  return false;
}

bool Parser::failHere(std::string_view text) {
  const Token& t = peek();
  std::string message(text);
  if (t.kind == TokenKind::End)
    message += ", found the end of the file";
  else if (t.text.size() <= 40)
    message += ", found '" + std::string(t.text) + "'";
  return fail(t.offset, message);
}

bool Parser::expect(char symbol) {
  if (m_Failed) return false;
  if (accept(symbol)) return true;
  return failHere(std::string("expected '") + symbol + "'");
}

bool Parser::expectWord(std::string_view lowerWord) {
  if (m_Failed) return false;
  if (acceptWord(lowerWord)) return true;
  return failHere("expected '" + std::string(lowerWord) + "'");
}

bool Parser::isName(const Token& t) const {
  return t.kind == TokenKind::Extended ||
         (t.kind == TokenKind::Identifier && !isReservedWord(t.text));
}

void Parser::skipPast(char symbol) {
  long depth = 0;
  while (!m_Failed && peek().kind != TokenKind::End) {
    Token t = take();
    if (depth <= 0 && t.is(symbol)) return;
    if (t.is('(')) ++depth;
    else if (t.is(')')) --depth;
  }
}

bool Parser::skipToEndOf(std::string_view lowerWord) {
  while (!m_Failed && peek().kind != TokenKind::End) {
    if (acceptWord("end") && acceptWord(lowerWord)) {
      skipPast(';');
      return true;
    }
    take();
  }
  return failHere("expected 'end " + std::string(lowerWord) + "'");
}

// Subprogram bodies are skipped by counting: each body opened by `is` needs one plain `end`;
// `end if`, `end loop` and the like close statements, not bodies.
bool Parser::skipSubprogramBody() {
  long open = 1;
  bool pendingSubprogram = false;
  while (!m_Failed && peek().kind != TokenKind::End) {
    Token t = take();
    if (t.kind != TokenKind::Identifier) {
      if (t.is(';')) pendingSubprogram = false;
      continue;
    }
    if (equalsWord(t.text, "function") || equalsWord(t.text, "procedure")) {
      pendingSubprogram = true;
    } else if (equalsWord(t.text, "is") && pendingSubprogram) {
      pendingSubprogram = false;
      if (!peekWord("new")) ++open;
    } else if (equalsWord(t.text, "end")) {
      static constexpr std::string_view kStatementEnds[] = {
          "if", "case", "loop", "record", "units", "protected", "component", "block",
          "process", "generate", "for"};
      bool statement = false;
      for (std::string_view word : kStatementEnds) statement = statement || peekWord(word);
      if (statement) {
        take();
        continue;
      }
      if (--open == 0) {
        skipPast(';');
        return true;
      }
    }
  }
  return failHere("expected 'end' of the subprogram body");
}

// ---- design unit headers and declarations ----

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
    if (peekWord("type") || peekWord("function") || peekWord("procedure") ||
        peekWord("impure") || peekWord("pure") || peekWord("package")) {
      // Generic subprograms and packages carry no bounds for ports; ports of a generic type
      // are scalars as far as ranges go.
      if (peekWord("type") && isName(peek(1))) {
        take();
        Token name = take();
        Decl d;
        d.kind = DeclKind::OtherType;
        d.key = normalizeName(name.text);
        d.name = name.text;
        d.offset = name.offset;
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
        Decl d;
        d.kind = kind;
        d.key = normalizeName(name.text);
        d.name = name.text;
        d.offset = name.offset;
        out.push_back(std::move(d));
        if (!accept(',')) break;
      }
      if (!expect(':')) return dropGroup();
      Mode mode = Mode::In;
      if (acceptWord("in")) mode = Mode::In;
      else if (acceptWord("out")) mode = Mode::Out;
      else if (acceptWord("inout")) mode = Mode::Inout;
      else if (acceptWord("buffer")) mode = Mode::Buffer;
      else if (acceptWord("linkage")) mode = Mode::Linkage;
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
      Decl d;
      d.kind = DeclKind::Constant;
      d.key = normalizeName(name.text);
      d.name = name.text;
      d.offset = name.offset;
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
    Decl d;
    d.kind = DeclKind::Subtype;
    d.key = normalizeName(name.text);
    d.name = name.text;
    d.offset = name.offset;
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
  Decl d;
  d.kind = DeclKind::Alias;
  d.key = normalizeName(name.text);
  d.name = name.text;
  d.offset = name.offset;
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
  Decl d;
  d.key = normalizeName(name.text);
  d.name = name.text;
  d.offset = name.offset;
  d.kind = DeclKind::OtherType;
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
  if (acceptWord("pure") || acceptWord("impure")) {}
  if (acceptWord("procedure")) isFunction = false;
  else if (!expectWord("function")) return false;
  const Token& nameToken = peek();
  if (!isName(nameToken) && nameToken.kind != TokenKind::String)
    return failHere("expected a subprogram name");
  Token name = take();
  Decl d;
  d.kind = DeclKind::Function;
  d.key = normalizeName(name.text);
  d.name = name.text;
  d.offset = name.offset;
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

// ---- expressions ----

ExprId Parser::add(Expr e) {
  if (e.depth > kMaxTreeDepth) {
    fail(e.begin, "expression is too deeply nested");
    return kNoExpr;
  }
  m_Arena.push_back(std::move(e));
  return static_cast<ExprId>(m_Arena.size() - 1);
}

ExprId Parser::binary(Op op, ExprId a, ExprId b) {
  if (a == kNoExpr || b == kNoExpr) return kNoExpr;
  Expr e;
  e.kind = op == Op::To || op == Op::Downto ? ExprKind::Range : ExprKind::Binary;
  e.op = op;
  e.a = a;
  e.b = b;
  e.begin = m_Arena[a].begin;
  e.end = m_Arena[b].end;
  // Only real nesting counts: the evaluator walks a left operand chain (a+b+c+...) in a
  // loop, so a long flat chain is no deeper than its deepest right operand.
  e.depth = std::max(m_Arena[a].depth, static_cast<uint16_t>(m_Arena[b].depth + 1));
  return add(std::move(e));
}

ExprId Parser::unary(Op op, ExprId a, size_t begin) {
  if (a == kNoExpr) return kNoExpr;
  Expr e;
  e.kind = ExprKind::Unary;
  e.op = op;
  e.a = a;
  e.begin = begin;
  e.end = m_Arena[a].end;
  e.depth = static_cast<uint16_t>(m_Arena[a].depth + 1);
  return add(std::move(e));
}

ExprId Parser::parseDiscreteRange() {
  if (m_Failed) return kNoExpr;
  if (peekWord("open")) {
    Expr e;
    e.kind = ExprKind::Open;
    e.begin = peek().offset;
    e.end = e.begin + 4;
    take();
    return add(std::move(e));
  }
  ExprId left = parseExpression();
  if (left == kNoExpr) return kNoExpr;
  if (acceptWord("to")) return binary(Op::To, left, parseExpression());
  if (acceptWord("downto")) return binary(Op::Downto, left, parseExpression());
  if (acceptWord("range")) {
    if (peek().isSymbol("<>")) {
      Expr e;
      e.kind = ExprKind::Box;
      e.a = left;
      e.begin = m_Arena[left].begin;
      e.end = peek().offset + 2;
      take();
      return add(std::move(e));
    }
    return parseDiscreteRange();
  }
  return left;
}

ExprId Parser::parseExpression() {
  if (m_Failed) return kNoExpr;
  if (++m_Depth > kMaxNesting) {
    fail(peek().offset, "expression is too deeply nested");
    --m_Depth;
    return kNoExpr;
  }
  size_t begin = peek().offset;
  ExprId left;
  if (acceptSymbol("??")) {
    left = unary(Op::Plus, parseRelation(), begin);
  } else {
    left = parseRelation();
  }
  for (;;) {
    Op op = Op::None;
    if (peekWord("and")) op = Op::And;
    else if (peekWord("or")) op = Op::Or;
    else if (peekWord("xor")) op = Op::Xor;
    else if (peekWord("nand")) op = Op::Nand;
    else if (peekWord("nor")) op = Op::Nor;
    else if (peekWord("xnor")) op = Op::Xnor;
    if (op == Op::None || left == kNoExpr) break;
    take();
    left = binary(op, left, parseRelation());
  }
  --m_Depth;
  return left;
}

ExprId Parser::parseRelation() {
  ExprId left = parseShift();
  const Token& t = peek();
  Op op = Op::None;
  if (t.kind == TokenKind::Symbol) {
    std::string_view s = t.text;
    if (s == "=" || s == "?=") op = Op::Eq;
    else if (s == "/=" || s == "?/=") op = Op::Ne;
    else if (s == "<" || s == "?<") op = Op::Lt;
    else if (s == "<=" || s == "?<=") op = Op::Le;
    else if (s == ">" || s == "?>") op = Op::Gt;
    else if (s == ">=" || s == "?>=") op = Op::Ge;
  }
  if (op == Op::None || left == kNoExpr) return left;
  take();
  return binary(op, left, parseShift());
}

ExprId Parser::parseShift() {
  ExprId left = parseSimple();
  static constexpr std::string_view kShifts[] = {"sll", "srl", "sla", "sra", "rol", "ror"};
  for (std::string_view word : kShifts)
    if (left != kNoExpr && peekWord(word)) {
      take();
      return binary(Op::None, left, parseSimple());  // never evaluated for bounds
    }
  return left;
}

ExprId Parser::parseSimple() {
  size_t begin = peek().offset;
  ExprId left;
  if (accept('-')) left = unary(Op::Neg, parseTerm(), begin);
  else if (accept('+')) left = unary(Op::Plus, parseTerm(), begin);
  else left = parseTerm();
  for (;;) {
    Op op = Op::None;
    if (peek().is('+')) op = Op::Add;
    else if (peek().is('-')) op = Op::Sub;
    else if (peek().is('&')) op = Op::Concat;
    if (op == Op::None || left == kNoExpr) return left;
    take();
    left = binary(op, left, parseTerm());
  }
}

ExprId Parser::parseTerm() {
  ExprId left = parseFactor();
  for (;;) {
    Op op = Op::None;
    if (peek().is('*')) op = Op::Mul;
    else if (peek().is('/')) op = Op::Div;
    else if (peekWord("mod")) op = Op::Mod;
    else if (peekWord("rem")) op = Op::Rem;
    if (op == Op::None || left == kNoExpr) return left;
    take();
    left = binary(op, left, parseFactor());
  }
}

ExprId Parser::parseFactor() {
  size_t begin = peek().offset;
  if (acceptWord("abs")) return unary(Op::Abs, parsePrimary(), begin);
  if (acceptWord("not")) return unary(Op::Not, parsePrimary(), begin);
  static constexpr std::string_view kReductions[] = {"and", "or", "xor", "nand", "nor", "xnor"};
  for (std::string_view word : kReductions)
    if (acceptWord(word)) return unary(Op::None, parsePrimary(), begin);
  ExprId left = parsePrimary();
  if (left != kNoExpr && acceptSymbol("**")) return binary(Op::Pow, left, parsePrimary());
  return left;
}

ExprId Parser::parsePrimary() {
  if (m_Failed) return kNoExpr;
  const Token& t = peek();
  Expr e;
  e.begin = t.offset;
  e.end = t.offset + t.text.size();
  switch (t.kind) {
    case TokenKind::Number:
    case TokenKind::String:
    case TokenKind::BitString:
    case TokenKind::Character: {
      Token lit = take();
      e.kind = ExprKind::Literal;
      e.text = lit.text;
      e.value = literalValue(lit);
      ExprId id = add(std::move(e));
      // A physical literal such as 10 ns: the unit is irrelevant to bounds.
      if (lit.kind == TokenKind::Number && peek().kind == TokenKind::Identifier &&
          !isReservedWord(peek().text))
        take();
      return id;
    }
    case TokenKind::Identifier:
    case TokenKind::Extended:
      if (equalsWord(t.text, "null")) {
        take();
        e.kind = ExprKind::Aggregate;
        return add(std::move(e));
      }
      if (equalsWord(t.text, "others")) {
        take();
        e.kind = ExprKind::Others;
        return add(std::move(e));
      }
      if (t.kind == TokenKind::Identifier && isReservedWord(t.text)) break;
      return parseName();
    case TokenKind::Symbol:
      if (t.is('(')) return parseParenthesized();
      break;
    default:
      break;
  }
  failHere("expected an expression");
  return kNoExpr;
}

// `(e)` is a parenthesized expression; anything with a comma, a choice or a range is an
// aggregate. Aggregates keep their elements, named ones as Named, so constant tables and
// records can be read.
ExprId Parser::parseParenthesized() {
  size_t begin = peek().offset;
  take();
  if (++m_Depth > kMaxNesting) {
    --m_Depth;
    fail(begin, "expression is too deeply nested");
    return kNoExpr;
  }
  std::vector<ExprId> elements;
  uint16_t depth = 1;
  bool aggregate = false;
  for (;;) {
    ExprId element = parseDiscreteRange();
    std::vector<ExprId> choices;
    bool named = false;
    while (element != kNoExpr && !named && (peek().is('|') || peek().isSymbol("=>"))) {
      choices.push_back(element);
      named = peek().isSymbol("=>");
      take();
      element = named ? parseExpression() : parseDiscreteRange();
    }
    if (element != kNoExpr && !choices.empty() && !named) {
      failHere("expected '=>'");
      element = kNoExpr;
    }
    if (element != kNoExpr && named) {
      Expr n;
      n.kind = ExprKind::Named;
      n.a = element;
      n.begin = m_Arena[choices[0]].begin;
      n.end = m_Arena[element].end;
      n.depth = m_Arena[element].depth;
      for (ExprId choice : choices) n.depth = std::max(n.depth, m_Arena[choice].depth);
      ++n.depth;
      n.args = std::move(choices);
      element = add(std::move(n));
    }
    if (element == kNoExpr) {
      --m_Depth;
      return kNoExpr;
    }
    aggregate = aggregate || m_Arena[element].kind == ExprKind::Range ||
                m_Arena[element].kind == ExprKind::Named;
    depth = std::max(depth, m_Arena[element].depth);
    elements.push_back(element);
    if (!accept(',')) break;
    aggregate = true;
  }
  --m_Depth;
  if (!expect(')')) return kNoExpr;
  if (!aggregate) {
    ExprId inner = elements[0];
    m_Arena[inner].begin = begin;
    m_Arena[inner].end = lastEnd();
    return inner;
  }
  Expr e;
  e.kind = ExprKind::Aggregate;
  e.args = std::move(elements);
  e.begin = begin;
  e.end = lastEnd();
  e.depth = static_cast<uint16_t>(depth + 1);
  return add(std::move(e));
}

ExprId Parser::parseName() {
  Token first = take();
  Expr e;
  e.kind = ExprKind::Name;
  e.text = first.text;
  e.key = normalizeName(first.text);
  e.begin = first.offset;
  e.end = first.offset + first.text.size();
  ExprId id = add(std::move(e));
  while (id != kNoExpr && !m_Failed) {
    size_t begin = m_Arena[id].begin;
    uint16_t depth = static_cast<uint16_t>(m_Arena[id].depth + 1);
    if (peek().is('.') && (isName(peek(1)) || peekWord("all", 1) ||
                           peek(1).kind == TokenKind::String)) {
      take();
      Token suffix = take();
      Expr s;
      s.kind = ExprKind::Selected;
      s.a = id;
      s.text = suffix.text;
      s.key = normalizeName(suffix.text);
      s.begin = begin;
      s.end = suffix.offset + suffix.text.size();
      s.depth = depth;
      id = add(std::move(s));
    } else if (peek().is('\'') && peek(1).is('(')) {
      take();
      ExprId inner = parseParenthesized();
      if (inner == kNoExpr) return kNoExpr;
      Expr q;
      q.kind = ExprKind::Qualified;
      q.a = id;
      q.b = inner;
      q.begin = begin;
      q.end = lastEnd();
      q.depth = static_cast<uint16_t>(std::max(depth, m_Arena[inner].depth) + 1);
      id = add(std::move(q));
    } else if (peek().is('\'') &&
               (peek(1).kind == TokenKind::Identifier || peek(1).kind == TokenKind::Extended)) {
      take();
      Token attribute = take();
      Expr a;
      a.kind = ExprKind::Attribute;
      a.a = id;
      a.text = attribute.text;
      a.key = normalizeName(attribute.text);
      a.begin = begin;
      a.depth = depth;
      if (peek().is('(') && !equalsWord(attribute.text, "range") &&
          !equalsWord(attribute.text, "reverse_range")) {
        take();
        ExprId arg = parseExpression();
        if (arg == kNoExpr || !expect(')')) return kNoExpr;
        a.args.push_back(arg);
      } else if (peek().is('(')) {  // 'range(n) names a dimension; only the first is read
        take();
        skipPast(')');
      }
      a.end = lastEnd();
      id = add(std::move(a));
    } else if (peek().is('(')) {
      take();
      if (++m_Depth > kMaxNesting) {
        --m_Depth;
        fail(begin, "expression is too deeply nested");
        return kNoExpr;
      }
      Expr c;
      c.kind = ExprKind::Call;
      c.a = id;
      c.begin = begin;
      c.depth = depth;
      do {
        if (isName(peek()) && peek(1).isSymbol("=>")) {  // named association: order assumed
          take();
          take();
        }
        ExprId arg = parseDiscreteRange();
        if (arg == kNoExpr) {
          --m_Depth;
          return kNoExpr;
        }
        c.depth = std::max(c.depth, static_cast<uint16_t>(m_Arena[arg].depth + 1));
        c.args.push_back(arg);
      } while (accept(','));
      --m_Depth;
      if (!expect(')')) return kNoExpr;
      c.end = lastEnd();
      id = add(std::move(c));
    } else {
      break;
    }
  }
  return id;
}

}  // namespace scan::vhdl
