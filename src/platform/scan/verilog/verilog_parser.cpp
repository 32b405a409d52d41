// Expressions use precedence climbing; every recursive entry counts depth so that deeply
// nested input ends in an error rather than a stack overflow.
#include "platform/scan/verilog/verilog_parser.h"

#include <cstdlib>

#include "platform/scan/verilog/verilog_preprocessor.h"

namespace scan::verilog {
namespace {

constexpr int kMaxDepth = 400;

int precedence(const Token& token) {
  if (token.kind != TokenKind::Symbol) return 0;
  std::string_view op = token.text;
  if (op == "||") return 1;
  if (op == "&&") return 2;
  if (op == "|") return 3;
  if (op == "^" || op == "~^" || op == "^~") return 4;
  if (op == "&") return 5;
  if (op == "==" || op == "!=" || op == "===" || op == "!==" || op == "==?" || op == "!=?")
    return 6;
  if (op == "<" || op == "<=" || op == ">" || op == ">=") return 7;
  if (op == "<<" || op == ">>" || op == "<<<" || op == ">>>") return 8;
  if (op == "+" || op == "-") return 9;
  if (op == "*" || op == "/" || op == "%") return 10;
  if (op == "**") return 11;
  return 0;
}

bool isUnaryOperator(const Token& token) {
  if (token.kind != TokenKind::Symbol) return false;
  std::string_view op = token.text;
  return op == "+" || op == "-" || op == "!" || op == "~" || op == "&" || op == "|" ||
         op == "^" || op == "~&" || op == "~|" || op == "~^" || op == "^~";
}

bool isTypeWord(Word word) {
  switch (word) {
    case Word::NetKind: case Word::Var: case Word::VariableType: case Word::AtomType:
    case Word::RealType: case Word::Signed: case Word::Unsigned: case Word::Struct:
    case Word::Union: case Word::Enum:
      return true;
    default:
      return false;
  }
}

int atomWidth(std::string_view word) {
  if (word == "byte") return 8;
  if (word == "shortint") return 16;
  if (word == "longint" || word == "time") return 64;
  return 32;
}

class DepthGuard {
 public:
  explicit DepthGuard(int& depth) : m_Depth(depth) { ++m_Depth; }
  ~DepthGuard() { --m_Depth; }
  bool tooDeep() const { return m_Depth > kMaxDepth; }

 private:
  int& m_Depth;
};

Stmt block(std::vector<Stmt> body = {}) {
  Stmt stmt;
  stmt.kind = Stmt::Kind::Block;
  stmt.body = std::move(body);
  return stmt;
}

ExprPtr one() {
  auto expr = std::make_shared<Expr>();
  expr->integer = 1;
  return expr;
}

int digitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

}  // namespace

bool parseNumber(std::string_view text, Expr& out) {
  std::string digits;
  for (char c : text)
    if (c != '_' && c != ' ' && c != '\t') digits += c;
  out.kind = Expr::Kind::Number;
  size_t quote = digits.find('\'');
  if (quote == std::string::npos) {
    bool isReal = digits.find_first_of(".eE") != std::string::npos;
    for (char c : digits)
      if (!(c >= '0' && c <= '9') && c != '.' && c != 'e' && c != 'E' && c != '+' && c != '-')
        return out.unknown = true, false;  // time literal
    if (isReal) {
      out.kind = Expr::Kind::Real;
      out.real = std::strtod(digits.c_str(), nullptr);
      return true;
    }
    uint64_t value = 0;
    for (char c : digits) {
      if (value > (UINT64_MAX - 9) / 10) return out.tooWide = true, false;
      value = value * 10 + static_cast<uint64_t>(c - '0');
    }
    if (value > static_cast<uint64_t>(INT64_MAX)) return out.tooWide = true, false;
    out.integer = static_cast<int64_t>(value);
    return true;
  }
  std::string size = digits.substr(0, quote);
  size_t at = quote + 1;
  bool isSigned = false;
  if (at < digits.size() && (digits[at] == 's' || digits[at] == 'S')) {
    isSigned = true;
    ++at;
  }
  if (at >= digits.size()) return out.unknown = true, false;
  char base = static_cast<char>(digits[at] | 0x20);
  if (base == '0' || base == '1') {  // '0 '1: every bit the same
    out.integer = base == '1' ? 1 : 0;
    out.width = 1;
    return at + 1 == digits.size();
  }
  if (base == 'x' || base == 'z') return out.unknown = true, false;
  int radix = base == 'b' ? 2 : base == 'o' ? 8 : base == 'd' ? 10 : base == 'h' ? 16 : 0;
  if (radix == 0 || at + 1 >= digits.size()) return out.unknown = true, false;
  uint64_t value = 0;
  bool overflow = false;
  for (size_t i = at + 1; i < digits.size(); ++i) {
    int d = digitValue(digits[i]);
    if (d < 0 || d >= radix) return out.unknown = true, false;
    if (value > (UINT64_MAX - static_cast<uint64_t>(d)) / static_cast<uint64_t>(radix))
      overflow = true;
    value = value * static_cast<uint64_t>(radix) + static_cast<uint64_t>(d);
  }
  out.isSigned = isSigned;
  if (!size.empty()) {
    long width = std::strtol(size.c_str(), nullptr, 10);
    if (width <= 0) return out.unknown = true, false;
    // Bits above 64 only matter when they are set: 80'h5 is 5, 80'h1_0000_0000_0000_0000 is
    // not a number this reader can hold.
    if (overflow && width > 64) return out.tooWide = true, false;
    out.width = width > 64 ? 64 : static_cast<int>(width);
    if (out.width < 64) {
      value &= (uint64_t{1} << out.width) - 1;
      if (isSigned && (value >> (out.width - 1)) & 1) value |= ~((uint64_t{1} << out.width) - 1);
    }
  }
  if (overflow && size.empty()) return out.tooWide = true, false;
  out.integer = static_cast<int64_t>(value);
  return true;
}

const Token& TokenStream::peek(size_t n) {
  while (m_Ahead.size() <= n) {
    Token token;
    m_Pre.next(token);
    m_Ahead.push_back(token);
    if (token.kind == TokenKind::End) break;
  }
  return n < m_Ahead.size() ? m_Ahead[n] : m_Ahead.back();
}

Token TokenStream::take() {
  Token token = peek();
  if (token.kind != TokenKind::End) m_Ahead.pop_front();
  return token;
}

bool TokenStream::acceptSymbol(std::string_view symbol) {
  if (!peek().isSymbol(symbol)) return false;
  take();
  return true;
}

Word TokenStream::peekWord(size_t n) {
  const Token& token = peek(n);
  return token.kind == TokenKind::Identifier ? classify(token.text) : Word::None;
}

bool TokenStream::acceptWord(Word word) {
  if (peekWord() != word) return false;
  take();
  return true;
}

void Parser::fail(const std::string& text) {
  if (m_Failed) return;
  m_Failed = true;
  m_Error = text;
  m_ErrorAt = m_Tokens.peek();
}

bool Parser::expectSymbol(std::string_view symbol) {
  if (m_Tokens.acceptSymbol(symbol)) return true;
  const Token& next = m_Tokens.peek();
  fail("expected '" + std::string(symbol) + "' but found " +
       (next.kind == TokenKind::End ? std::string("the end of the file")
                                    : "'" + std::string(next.text.substr(0, 40)) + "'"));
  return false;
}

void Parser::skipStatement(Word stop) {
  int depth = 0;
  while (!m_Tokens.atEnd()) {
    const Token& token = m_Tokens.peek();
    if (stop != Word::None && m_Tokens.peekWord() == stop) return;
    if (token.isSymbol("(") || token.isSymbol("[") || token.isSymbol("{")) ++depth;
    if ((token.isSymbol(")") || token.isSymbol("]") || token.isSymbol("}")) && depth > 0) --depth;
    bool end = token.isSymbol(";") && depth == 0;
    m_Tokens.take();
    if (end) return;
  }
}

ExprPtr Parser::make(Expr::Kind kind, const Token& at) {
  auto expr = std::make_shared<Expr>();
  expr->kind = kind;
  expr->source = at.source;
  expr->offset = at.offset;
  return expr;
}

ExprPtr Parser::expression() {
  DepthGuard guard(m_Depth);
  if (guard.tooDeep()) {
    fail("expression nested too deeply");
    return nullptr;
  }
  return ternary();
}

ExprPtr Parser::ternary() {
  Token at = m_Tokens.peek();
  ExprPtr condition = binary(1);
  if (!condition || !m_Tokens.acceptSymbol("?")) return condition;
  ExprPtr yes = expression();
  if (!yes || !expectSymbol(":")) return nullptr;
  ExprPtr no = expression();
  if (!no) return nullptr;
  auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Ternary, at));
  expr->args = {condition, yes, no};
  return expr;
}

ExprPtr Parser::binary(int minPrecedence) {
  ExprPtr left = unary();
  while (left) {
    const Token& op = m_Tokens.peek();
    int p = precedence(op);
    if (p == 0 || p < minPrecedence) break;
    Token opToken = m_Tokens.take();
    ExprPtr right = binary(p + 1);
    if (!right) return nullptr;
    auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Binary, opToken));
    expr->op.assign(opToken.text);
    expr->args = {left, right};
    left = expr;
  }
  return left;
}

ExprPtr Parser::unary() {
  DepthGuard guard(m_Depth);
  if (guard.tooDeep()) {
    fail("expression nested too deeply");
    return nullptr;
  }
  if (isUnaryOperator(m_Tokens.peek())) {
    Token op = m_Tokens.take();
    ExprPtr operand = unary();
    if (!operand) return nullptr;
    auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Unary, op));
    expr->op.assign(op.text);
    expr->args = {operand};
    return expr;
  }
  ExprPtr base = primary();
  return base ? postfix(base) : nullptr;
}

ExprPtr Parser::postfix(ExprPtr base) {
  for (int selects = 0;; ++selects) {
    const Token& next = m_Tokens.peek();
    if (selects > kMaxDepth) {  // each select nests the tree one level deeper
      fail("expression nested too deeply");
      return nullptr;
    }
    if (next.isSymbol("[")) {
      Token at = m_Tokens.take();
      auto select = std::const_pointer_cast<Expr>(make(Expr::Kind::Select, at));
      ExprPtr index = expression();
      if (!index) return nullptr;
      select->args = {base, index};
      const Token& sep = m_Tokens.peek();
      if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
        select->op.assign(m_Tokens.take().text);
        ExprPtr second = expression();
        if (!second) return nullptr;
        select->args.push_back(second);
      }
      if (!expectSymbol("]")) return nullptr;
      base = select;
    } else if (next.isSymbol("'") && m_Tokens.peek(1).isSymbol("(")) {
      m_Tokens.take();
      m_Tokens.take();
      ExprPtr inner = expression();
      if (!inner || !expectSymbol(")")) return nullptr;
      base = inner;  // size and sign casts keep the value
    } else {
      return base;
    }
  }
}

ExprPtr Parser::systemCall(const Token& name) {
  auto call = std::const_pointer_cast<Expr>(make(Expr::Kind::System, name));
  call->name.assign(name.text);
  if (!m_Tokens.acceptSymbol("(")) return call;
  if (m_Tokens.acceptSymbol(")")) return call;
  do {
    Word word = m_Tokens.peekWord();
    if (isTypeWord(word)) {
      auto type = std::make_shared<TypeSpec>();
      Token at = m_Tokens.peek();
      dataType(*type);
      auto arg = std::const_pointer_cast<Expr>(make(Expr::Kind::TypeName, at));
      arg->type = type;
      call->args.push_back(arg);
    } else {
      ExprPtr arg = expression();
      if (!arg) return nullptr;
      call->args.push_back(arg);
    }
  } while (m_Tokens.acceptSymbol(","));
  if (!expectSymbol(")")) return nullptr;
  return call;
}

ExprPtr Parser::primary() {
  Token token = m_Tokens.peek();
  switch (token.kind) {
    case TokenKind::Number: {
      m_Tokens.take();
      auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Number, token));
      parseNumber(token.text, *expr);
      return expr;
    }
    case TokenKind::String: {
      m_Tokens.take();
      auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::String, token));
      expr->name.assign(token.text.substr(1, token.text.size() >= 2 ? token.text.size() - 2 : 0));
      return expr;
    }
    case TokenKind::SystemName:
      m_Tokens.take();
      return systemCall(token);
    case TokenKind::Identifier: {
      Word word = classify(token.text);
      if (isTypeWord(word)) {  // a cast such as int'(x)
        TypeSpec ignored;
        dataType(ignored);
        if (!m_Tokens.peek().isSymbol("'")) {
          fail("expected an expression but found '" + std::string(token.text) + "'");
          return nullptr;
        }
        m_Tokens.take();
        if (!expectSymbol("(")) return nullptr;
        ExprPtr inner = expression();
        if (!inner || !expectSymbol(")")) return nullptr;
        return inner;
      }
      m_Tokens.take();
      auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Name, token));
      expr->name.assign(token.text);
      if (m_Tokens.peek().isSymbol("::") && m_Tokens.peek(1).kind == TokenKind::Identifier) {
        m_Tokens.take();
        expr->scope = expr->name;
        expr->name.assign(m_Tokens.take().text);
      }
      if (m_Tokens.acceptSymbol("(")) {
        expr->kind = Expr::Kind::Call;
        if (!m_Tokens.acceptSymbol(")")) {
          do {
            ExprPtr arg = expression();
            if (!arg) return nullptr;
            expr->args.push_back(arg);
          } while (m_Tokens.acceptSymbol(","));
          if (!expectSymbol(")")) return nullptr;
        }
      }
      return expr;
    }
    case TokenKind::Symbol:
      if (token.text == "(") {
        m_Tokens.take();
        ExprPtr inner = expression();
        if (!inner || !expectSymbol(")")) return nullptr;
        return inner;
      }
      if (token.text == "'{") {
        m_Tokens.take();
        return pattern(token);
      }
      if (token.text == "{") {
        m_Tokens.take();
        auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Concat, token));
        ExprPtr first = expression();
        if (!first) return nullptr;
        if (m_Tokens.peek().isSymbol("{")) {
          expr->kind = Expr::Kind::Replicate;
          m_Tokens.take();
          expr->args.push_back(first);
          do {
            ExprPtr item = expression();
            if (!item) return nullptr;
            expr->args.push_back(item);
          } while (m_Tokens.acceptSymbol(","));
          if (!expectSymbol("}")) return nullptr;
        } else {
          expr->args.push_back(first);
          while (m_Tokens.acceptSymbol(",")) {
            ExprPtr item = expression();
            if (!item) return nullptr;
            expr->args.push_back(item);
          }
        }
        if (!expectSymbol("}")) return nullptr;
        return expr;
      }
      break;
    default:
      break;
  }
  fail(token.kind == TokenKind::End
           ? std::string("expected an expression but found the end of the file")
           : "expected an expression but found '" + std::string(token.text.substr(0, 40)) + "'");
  return nullptr;
}

ExprPtr Parser::pattern(const Token& at) {
  auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Pattern, at));
  if (m_Tokens.acceptSymbol("}")) return expr;
  do {
    if (m_Tokens.acceptWord(Word::Default)) {
      if (!expectSymbol(":")) return nullptr;
      ExprPtr value = expression();
      if (!value) return nullptr;
      expr->op = ":";
      expr->args.push_back(nullptr);
      expr->args.push_back(value);
      continue;
    }
    ExprPtr first = expression();
    if (!first) return nullptr;
    if (expr->args.empty() && m_Tokens.acceptSymbol("{")) {  // '{N{items}}
      expr->op = "{";
      expr->args.push_back(first);
      do {
        ExprPtr item = expression();
        if (!item) return nullptr;
        expr->args.push_back(item);
      } while (m_Tokens.acceptSymbol(","));
      if (!expectSymbol("}")) return nullptr;
      break;
    }
    if (m_Tokens.acceptSymbol(":")) {
      ExprPtr value = expression();
      if (!value) return nullptr;
      expr->op = ":";
      expr->args.push_back(first);
      expr->args.push_back(value);
      continue;
    }
    if (expr->op == ":") {
      fail("expected 'key: value' in an assignment pattern");
      return nullptr;
    }
    expr->args.push_back(first);
  } while (m_Tokens.acceptSymbol(","));
  if (!expectSymbol("}")) return nullptr;
  return expr;
}

void Parser::dimensions(std::vector<Dimension>& dims) {
  while (!m_Failed && m_Tokens.peek().isSymbol("[")) {
    m_Tokens.take();
    Dimension dim;
    if (m_Tokens.peek().isSymbol("]") || m_Tokens.peek().isSymbol("$") ||
        m_Tokens.peek().isSymbol("*")) {
      skipStatement();  // dynamic or associative: no bits to count
      fail("unsupported dimension");
      return;
    }
    dim.left = expression();
    if (!dim.left) return;
    if (m_Tokens.acceptSymbol(":")) {
      dim.right = expression();
      if (!dim.right) return;
    }
    if (!expectSymbol("]")) return;
    dims.push_back(std::move(dim));
  }
}

bool Parser::userTypeAt(size_t n) {
  if (m_Tokens.peek(n).kind != TokenKind::Identifier) return false;
  if (classify(m_Tokens.peek(n).text) != Word::None) return false;
  const Token& next = m_Tokens.peek(n + 1);
  if (next.isSymbol("::")) return m_Tokens.peek(n + 2).kind == TokenKind::Identifier;
  if (next.isSymbol(".")) return m_Tokens.peek(n + 2).kind == TokenKind::Identifier;
  if (next.kind == TokenKind::Identifier) return classify(next.text) == Word::None;
  if (!next.isSymbol("[")) return false;
  // T [3:0] name, as opposed to name [3:0]: a name must follow the brackets.
  size_t i = n + 1;
  int depth = 0;
  for (size_t guard = 0; guard < 10000; ++guard, ++i) {
    const Token& token = m_Tokens.peek(i);
    if (token.kind == TokenKind::End) return false;
    if (token.isSymbol("[")) ++depth;
    if (token.isSymbol("]")) --depth;
    if (depth == 0 && !token.isSymbol("]") && !token.isSymbol("[")) return false;
    if (depth == 0 && token.isSymbol("]") && !m_Tokens.peek(i + 1).isSymbol("["))
      return m_Tokens.peek(i + 1).kind == TokenKind::Identifier;
  }
  return false;
}

void Parser::structBody(TypeSpec& type) {
  type.base = TypeSpec::Base::Struct;
  m_Tokens.acceptWord(Word::Packed);
  if (!m_Tokens.acceptWord(Word::Signed)) m_Tokens.acceptWord(Word::Unsigned);
  if (!expectSymbol("{")) return;
  while (!m_Failed && !m_Tokens.atEnd() && !m_Tokens.acceptSymbol("}")) {
    TypeSpec member;
    if (!dataType(member)) {
      fail("expected a member type");
      return;
    }
    do {
      if (m_Tokens.peek().kind != TokenKind::Identifier) {
        fail("expected a member name");
        return;
      }
      m_Tokens.take();
      std::vector<Dimension> unpacked;
      dimensions(unpacked);
      if (m_Tokens.acceptSymbol("=") && !expression()) return;
      type.members.push_back(member);
    } while (m_Tokens.acceptSymbol(","));
    if (!expectSymbol(";")) return;
  }
}

void Parser::enumBody(TypeSpec& type) {
  type.base = TypeSpec::Base::Enum;
  TypeSpec base;
  if (!m_Tokens.peek().isSymbol("{")) dataType(base);
  if (base.base == TypeSpec::Base::Implicit && base.packed.empty()) {
    base.base = TypeSpec::Base::Atom;
    base.atomWidth = 32;
  } else if (base.base == TypeSpec::Base::Implicit) {
    base.base = TypeSpec::Base::Bit;
  }
  type.members.push_back(base);
  if (!expectSymbol("{")) return;
  int depth = 1;
  while (depth > 0 && !m_Tokens.atEnd()) {
    Token token = m_Tokens.take();
    if (token.isSymbol("{")) ++depth;
    if (token.isSymbol("}")) --depth;
  }
}

bool Parser::dataType(TypeSpec& type) {
  DepthGuard guard(m_Depth);  // struct members and enum bases nest types in types
  if (guard.tooDeep()) {
    fail("data type nested too deeply");
    return false;
  }
  bool read = false;
  for (;;) {
    const Token& token = m_Tokens.peek();
    Word word = m_Tokens.peekWord();
    if (token.isSymbol("[")) {
      dimensions(type.packed);
      return true;
    }
    if (token.kind != TokenKind::Identifier) return read;
    switch (word) {
      case Word::NetKind:
      case Word::Var:
        if (type.written.empty() || type.base == TypeSpec::Base::Implicit)
          type.written.assign(token.text);
        break;
      case Word::VariableType:
        type.base = TypeSpec::Base::Bit;
        type.written.assign(token.text);
        break;
      case Word::AtomType:
        type.base = TypeSpec::Base::Atom;
        type.atomWidth = atomWidth(token.text);
        type.written.assign(token.text);
        break;
      case Word::RealType:
        type.base = TypeSpec::Base::Real;
        type.written.assign(token.text);
        break;
      case Word::Signed:
      case Word::Unsigned:
        type.signing = word == Word::Signed ? 1 : -1;
        break;
      case Word::Struct:
      case Word::Union:
        type.isUnion = word == Word::Union;
        type.written.assign(token.text);
        m_Tokens.take();
        structBody(type);
        return true;
      case Word::Enum:
        type.written.assign(token.text);
        m_Tokens.take();
        enumBody(type);
        return true;
      case Word::None:
        if (read && type.base != TypeSpec::Base::Implicit) return true;
        if (!userTypeAt(0)) return read;
        type.base = TypeSpec::Base::Named;
        type.name.assign(m_Tokens.take().text);
        if (m_Tokens.acceptSymbol("::")) {
          type.scope = type.name;
          type.name.assign(m_Tokens.take().text);
        } else if (m_Tokens.peek().isSymbol(".") &&
                   m_Tokens.peek(1).kind == TokenKind::Identifier &&
                   m_Tokens.peek(2).kind == TokenKind::Identifier) {
          m_Tokens.take();
          type.modport.assign(m_Tokens.take().text);
          type.isInterface = true;
          type.written = type.name;
          return true;
        }
        type.written = type.name;
        read = true;
        continue;
      default:
        return read;
    }
    m_Tokens.take();
    read = true;
  }
}

void Parser::skipLabel() {
  if (m_Tokens.peek().isSymbol(":") && m_Tokens.peek(1).kind == TokenKind::Identifier) {
    m_Tokens.take();
    m_Tokens.take();
  }
}

bool Parser::declaration(std::vector<Stmt>& out) {
  TypeSpec type;
  if (!dataType(type)) return false;
  do {
    if (m_Tokens.peek().kind != TokenKind::Identifier) {
      fail("expected a variable name");
      return true;
    }
    Stmt stmt;
    stmt.kind = Stmt::Kind::Declare;
    stmt.target.assign(m_Tokens.take().text);
    std::vector<Dimension> unpacked;
    dimensions(unpacked);
    if (m_Tokens.acceptSymbol("=")) stmt.value = expression();
    out.push_back(std::move(stmt));
  } while (!m_Failed && m_Tokens.acceptSymbol(","));
  return true;
}

bool Parser::assignment(Stmt& stmt) {
  stmt.kind = Stmt::Kind::Assign;
  if (m_Tokens.peek().isSymbol("++") || m_Tokens.peek().isSymbol("--")) {
    stmt.op = m_Tokens.take().text[0] == '+' ? "+=" : "-=";
    if (m_Tokens.peek().kind != TokenKind::Identifier) return false;
    stmt.target.assign(m_Tokens.take().text);
    stmt.value = one();
    return true;
  }
  if (m_Tokens.peek().kind != TokenKind::Identifier) return false;
  stmt.target.assign(m_Tokens.take().text);
  if (m_Tokens.acceptSymbol("[")) {  // x[i] = ..., x[hi:lo] = ..., x[i +: w] = ...
    if (!(stmt.index = expression())) return false;
    const Token& sep = m_Tokens.peek();
    if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
      stmt.selectOp.assign(m_Tokens.take().text);
      if (!(stmt.indexEnd = expression())) return false;
    }
    if (!expectSymbol("]")) return false;
    if (!m_Tokens.peek().isSymbol("=") && !m_Tokens.peek().isSymbol("<=")) return false;
  }
  const Token& op = m_Tokens.peek();
  if (op.isSymbol("++") || op.isSymbol("--")) {
    stmt.op = m_Tokens.take().text[0] == '+' ? "+=" : "-=";
    stmt.value = one();
    return true;
  }
  if (op.kind != TokenKind::Symbol ||
      !(op.text == "=" || op.text == "+=" || op.text == "-=" || op.text == "*=" ||
        op.text == "/=" || op.text == "%=" || op.text == "&=" || op.text == "|=" ||
        op.text == "^=" || op.text == "<<=" || op.text == ">>=" || op.text == "<="))
    return false;
  stmt.op = op.text == "<=" ? "=" : std::string(m_Tokens.take().text);
  stmt.value = expression();
  return stmt.value != nullptr;
}

// Reads one statement into `out`; false when the function uses something unsupported.
bool Parser::statement(Function& function, std::vector<Stmt>& out) {
  DepthGuard guard(m_Depth);
  if (guard.tooDeep()) {
    fail("statements nested too deeply");
    return false;
  }
  Word word = m_Tokens.peekWord();
  Stmt stmt;
  if (m_Tokens.acceptSymbol(";")) return true;
  switch (word) {
    case Word::Begin: {
      m_Tokens.take();
      skipLabel();
      stmt.kind = Stmt::Kind::Block;
      while (!m_Failed && !m_Tokens.atEnd() && !(m_Tokens.peekWord() == Word::OtherEnd)) {
        if (m_Tokens.peekWord() == Word::Endfunction) return false;
        if (!statement(function, stmt.body)) return false;
      }
      m_Tokens.take();
      skipLabel();
      break;
    }
    case Word::If: {
      m_Tokens.take();
      stmt.kind = Stmt::Kind::If;
      if (!expectSymbol("(") || !(stmt.value = expression()) || !expectSymbol(")")) return false;
      std::vector<Stmt> yes, no;
      if (!statement(function, yes)) return false;
      if (m_Tokens.acceptWord(Word::Else) && !statement(function, no)) return false;
      stmt.body.push_back(block(std::move(yes)));
      stmt.body.push_back(block(std::move(no)));
      break;
    }
    case Word::For: {
      m_Tokens.take();
      stmt.kind = Stmt::Kind::For;
      if (!expectSymbol("(")) return false;
      Stmt init = block();
      if (!declaration(init.body)) {
        do {
          Stmt one;
          if (!assignment(one)) return false;
          init.body.push_back(std::move(one));
        } while (m_Tokens.acceptSymbol(","));
      }
      if (!expectSymbol(";") || !(stmt.value = expression()) || !expectSymbol(";")) return false;
      Stmt step = block();
      do {
        Stmt one;
        if (!assignment(one)) return false;
        step.body.push_back(std::move(one));
      } while (m_Tokens.acceptSymbol(","));
      if (!expectSymbol(")")) return false;
      Stmt body = block();
      if (!statement(function, body.body)) return false;
      stmt.body = {std::move(init), std::move(step), std::move(body)};
      break;
    }
    case Word::While:
    case Word::Repeat: {
      m_Tokens.take();
      stmt.kind = word == Word::While ? Stmt::Kind::While : Stmt::Kind::Repeat;
      if (!expectSymbol("(") || !(stmt.value = expression()) || !expectSymbol(")")) return false;
      Stmt body = block();
      if (!statement(function, body.body)) return false;
      stmt.body.push_back(std::move(body));
      break;
    }
    case Word::Return:
      m_Tokens.take();
      stmt.kind = Stmt::Kind::Return;
      if (!m_Tokens.peek().isSymbol(";") && !(stmt.value = expression())) return false;
      if (!expectSymbol(";")) return false;
      break;
    case Word::Case: {
      m_Tokens.take();
      stmt.kind = Stmt::Kind::Case;
      if (!expectSymbol("(") || !(stmt.value = expression()) || !expectSymbol(")")) return false;
      while (!m_Failed && !m_Tokens.atEnd() && !m_Tokens.acceptWord(Word::Endcase)) {
        std::vector<ExprPtr> labels;
        bool isDefault = m_Tokens.acceptWord(Word::Default);
        if (!isDefault) {
          do {
            ExprPtr label = expression();
            if (!label) return false;
            labels.push_back(label);
          } while (m_Tokens.acceptSymbol(","));
        }
        m_Tokens.acceptSymbol(":");
        std::vector<Stmt> body;
        if (!statement(function, body)) return false;
        if (isDefault) {
          stmt.hasDefault = true;
          stmt.labels.emplace_back();
          stmt.body.push_back(block(std::move(body)));
          continue;
        }
        stmt.labels.push_back(std::move(labels));
        stmt.body.push_back(block(std::move(body)));
      }
      // The default branch is kept last so the interpreter finds it after every label.
      for (size_t i = 0; i + 1 < stmt.body.size(); ++i) {
        if (stmt.labels[i].empty()) {
          std::swap(stmt.labels[i], stmt.labels.back());
          std::swap(stmt.body[i], stmt.body.back());
          break;
        }
      }
      break;
    }
    default:
      if (isTypeWord(word) || userTypeAt(0)) {
        if (!declaration(out)) return false;
        return expectSymbol(";");
      }
      if (!assignment(stmt) || !expectSymbol(";")) return false;
      break;
  }
  if (m_Failed) return false;
  out.push_back(std::move(stmt));
  return true;
}

std::shared_ptr<Function> Parser::function() {
  auto function = std::make_shared<Function>();
  Token keyword = m_Tokens.take();
  function->source = keyword.source;
  function->offset = keyword.offset;
  if (!m_Tokens.acceptWord(Word::Automatic)) m_Tokens.acceptWord(Word::Static);
  TypeSpec returnType;
  dataType(returnType);
  if (m_Tokens.peek().kind != TokenKind::Identifier) {
    fail("expected a function name");
    skipStatement(Word::Endfunction);
    m_Tokens.acceptWord(Word::Endfunction);
    return nullptr;
  }
  function->name.assign(m_Tokens.take().text);
  if (m_Tokens.acceptSymbol("(")) {
    while (!m_Failed && !m_Tokens.atEnd() && !m_Tokens.acceptSymbol(")")) {
      Word word = m_Tokens.peekWord();
      if (word == Word::Input || word == Word::Output || word == Word::Inout || word == Word::Ref)
        m_Tokens.take();
      TypeSpec type;
      dataType(type);
      if (m_Tokens.peek().kind != TokenKind::Identifier) {
        fail("expected an argument name");
        break;
      }
      function->inputs.emplace_back(m_Tokens.take().text);
      std::vector<Dimension> unpacked;
      dimensions(unpacked);
      if (m_Tokens.acceptSymbol("=")) expression();
      if (!m_Tokens.acceptSymbol(",") && !m_Tokens.peek().isSymbol(")")) {
        fail("expected ',' or ')' in the argument list");
        break;
      }
    }
  }
  if (!m_Failed) expectSymbol(";");
  while (!m_Failed && !m_Tokens.atEnd() && m_Tokens.peekWord() != Word::Endfunction) {
    Word word = m_Tokens.peekWord();
    if (word == Word::Input) {
      m_Tokens.take();
      TypeSpec type;
      dataType(type);
      do {
        if (m_Tokens.peek().kind != TokenKind::Identifier) break;
        function->inputs.emplace_back(m_Tokens.take().text);
      } while (m_Tokens.acceptSymbol(","));
      expectSymbol(";");
      continue;
    }
    if (word == Word::Parameter || word == Word::Localparam) {
      m_Tokens.take();
      if (!declaration(function->body)) {
        do {
          Stmt stmt;
          stmt.kind = Stmt::Kind::Declare;
          stmt.target.assign(m_Tokens.take().text);
          if (m_Tokens.acceptSymbol("=")) stmt.value = expression();
          function->body.push_back(std::move(stmt));
        } while (!m_Failed && m_Tokens.acceptSymbol(","));
      }
      expectSymbol(";");
      continue;
    }
    if (!statement(*function, function->body)) {
      function->supported = false;
      clearError();
      skipStatement(Word::Endfunction);
    }
  }
  if (!m_Tokens.acceptWord(Word::Endfunction)) {
    fail("missing endfunction for function '" + function->name + "'");
    return nullptr;
  }
  skipLabel();
  return function;
}

}  // namespace scan::verilog
