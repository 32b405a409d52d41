// Expressions of VHDL units, appended to the arena as they are read. Nesting and tree depth
// are capped so that hostile input ends in an error, not a stack overflow.
#include "scan/vhdl/vhdl_parser.h"

#include <algorithm>
#include <cstdlib>

#include "scan/common/diagnostics.h"
#include "scan/common/reader_limits.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_literal.h"

namespace scan::vhdl {

ExprId Parser::add(Expr e) {
  if (e.depth > limits::kVhdlTreeDepth) {
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
  DepthGuard guard(m_Depth, limits::kVhdlSyntaxNesting);
  if (guard.tooDeep()) {
    fail(peek().offset, "expression is too deeply nested");
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
    if (peekWord("and"))
      op = Op::And;
    else if (peekWord("or"))
      op = Op::Or;
    else if (peekWord("xor"))
      op = Op::Xor;
    else if (peekWord("nand"))
      op = Op::Nand;
    else if (peekWord("nor"))
      op = Op::Nor;
    else if (peekWord("xnor"))
      op = Op::Xnor;
    if (op == Op::None || left == kNoExpr) break;
    take();
    left = binary(op, left, parseRelation());
  }
  return left;
}

ExprId Parser::parseRelation() {
  ExprId left = parseShift();
  const Token& t = peek();
  Op op = Op::None;
  if (t.kind == TokenKind::Symbol) {
    std::string_view s = t.text;
    if (s == "=" || s == "?=")
      op = Op::Eq;
    else if (s == "/=" || s == "?/=")
      op = Op::Ne;
    else if (s == "<" || s == "?<")
      op = Op::Lt;
    else if (s == "<=" || s == "?<=")
      op = Op::Le;
    else if (s == ">" || s == "?>")
      op = Op::Gt;
    else if (s == ">=" || s == "?>=")
      op = Op::Ge;
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
  if (accept('-'))
    left = unary(Op::Neg, parseTerm(), begin);
  else if (accept('+'))
    left = unary(Op::Plus, parseTerm(), begin);
  else
    left = parseTerm();
  for (;;) {
    Op op = Op::None;
    if (peek().is('+'))
      op = Op::Add;
    else if (peek().is('-'))
      op = Op::Sub;
    else if (peek().is('&'))
      op = Op::Concat;
    if (op == Op::None || left == kNoExpr) return left;
    take();
    left = binary(op, left, parseTerm());
  }
}

ExprId Parser::parseTerm() {
  ExprId left = parseFactor();
  for (;;) {
    Op op = Op::None;
    if (peek().is('*'))
      op = Op::Mul;
    else if (peek().is('/'))
      op = Op::Div;
    else if (peekWord("mod"))
      op = Op::Mod;
    else if (peekWord("rem"))
      op = Op::Rem;
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
  DepthGuard guard(m_Depth, limits::kVhdlSyntaxNesting);
  if (guard.tooDeep()) {
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
    if (element == kNoExpr) return kNoExpr;
    aggregate = aggregate || m_Arena[element].kind == ExprKind::Range ||
                m_Arena[element].kind == ExprKind::Named;
    depth = std::max(depth, m_Arena[element].depth);
    elements.push_back(element);
    if (!accept(',')) break;
    aggregate = true;
  }
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
    if (peek().is('.') &&
        (isName(peek(1)) || peekWord("all", 1) || peek(1).kind == TokenKind::String)) {
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
      DepthGuard guard(m_Depth, limits::kVhdlSyntaxNesting);
      if (guard.tooDeep()) {
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
        if (arg == kNoExpr) return kNoExpr;
        c.depth = std::max(c.depth, static_cast<uint16_t>(m_Arena[arg].depth + 1));
        c.args.push_back(arg);
      } while (accept(','));
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
