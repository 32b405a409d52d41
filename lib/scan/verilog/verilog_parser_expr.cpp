// Expressions use precedence climbing; every recursive entry counts depth so that deeply
// nested input ends in an error rather than a stack overflow.
#include "scan/verilog/verilog_parser.h"

#include "scan/verilog/verilog_parser_support.h"

namespace scan::verilog {
namespace {

int precedence(const Token& token) {
  if (token.kind != TokenKind::Symbol) return 0;
  switch (operatorOf(token.text)) {
    case Op::LogicalOr:
      return 1;
    case Op::LogicalAnd:
      return 2;
    case Op::BitOr:
      return 3;
    case Op::BitXor:
    case Op::BitXnor:
    case Op::BitXnorAlt:
      return 4;
    case Op::BitAnd:
      return 5;
    case Op::Equal:
    case Op::NotEqual:
    case Op::CaseEqual:
    case Op::CaseNotEqual:
    case Op::WildEqual:
    case Op::WildNotEqual:
      return 6;
    case Op::Less:
    case Op::LessEqual:
    case Op::Greater:
    case Op::GreaterEqual:
      return 7;
    case Op::ShiftLeft:
    case Op::ShiftRight:
    case Op::ArithShiftLeft:
    case Op::ArithShiftRight:
      return 8;
    case Op::Plus:
    case Op::Minus:
      return 9;
    case Op::Times:
    case Op::Divide:
    case Op::Modulo:
      return 10;
    case Op::Power:
      return 11;
    default:
      return 0;
  }
}

bool isUnaryOperator(const Token& token) {
  if (token.kind != TokenKind::Symbol) return false;
  std::string_view op = token.text;
  return op == "+" || op == "-" || op == "!" || op == "~" || op == "&" || op == "|" || op == "^" ||
         op == "~&" || op == "~|" || op == "~^" || op == "^~";
}

}  // namespace

ExprId Parser::expression() {
  DepthGuard guard(m_Depth, limits::kVerilogSyntaxNesting);
  if (guard.tooDeep()) {
    fail("expression nested too deeply");
    return kNoExpr;
  }
  return ternary();
}

ExprId Parser::ternary() {
  ExprId condition = binary(1);
  if (condition == kNoExpr || !m_Tokens.acceptSymbol("?")) return condition;
  ExprId yes = expression();
  if (yes == kNoExpr || !expectSymbol(":")) return kNoExpr;
  ExprId no = expression();
  if (no == kNoExpr) return kNoExpr;
  Expr expr = node(Expr::Kind::Ternary);
  expr.args = {condition, yes, no};
  return add(std::move(expr));
}

ExprId Parser::binary(int minPrecedence) {
  ExprId left = unary();
  while (left != kNoExpr) {
    const Token& op = m_Tokens.peek();
    int p = precedence(op);
    if (p == 0 || p < minPrecedence) break;
    Token opToken = m_Tokens.take();
    ExprId right = binary(p + 1);
    if (right == kNoExpr) return kNoExpr;
    Expr expr = node(Expr::Kind::Binary, operatorOf(opToken.text));
    expr.args = {left, right};
    left = add(std::move(expr));
  }
  return left;
}

ExprId Parser::unary() {
  DepthGuard guard(m_Depth, limits::kVerilogSyntaxNesting);
  if (guard.tooDeep()) {
    fail("expression nested too deeply");
    return kNoExpr;
  }
  if (isUnaryOperator(m_Tokens.peek())) {
    Token op = m_Tokens.take();
    ExprId operand = unary();
    if (operand == kNoExpr) return kNoExpr;
    Expr expr = node(Expr::Kind::Unary, operatorOf(op.text));
    expr.args = {operand};
    return add(std::move(expr));
  }
  ExprId base = primary();
  return base == kNoExpr ? kNoExpr : postfix(base);
}

ExprId Parser::postfix(ExprId base) {
  for (int selects = 0;; ++selects) {
    const Token& next = m_Tokens.peek();
    if (selects > limits::kVerilogSyntaxNesting) {  // each select nests the tree one level deeper
      fail("expression nested too deeply");
      return kNoExpr;
    }
    if (next.isSymbol("[")) {
      m_Tokens.take();
      Expr select = node(Expr::Kind::Select);
      ExprId index = expression();
      if (index == kNoExpr) return kNoExpr;
      select.args = {base, index};
      const Token& sep = m_Tokens.peek();
      if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
        select.op = operatorOf(m_Tokens.take().text);
        ExprId second = expression();
        if (second == kNoExpr) return kNoExpr;
        select.args.push_back(second);
      }
      if (!expectSymbol("]")) return kNoExpr;
      base = add(std::move(select));
    } else if (next.isSymbol("'") && m_Tokens.peek(1).isSymbol("(")) {
      m_Tokens.take();
      m_Tokens.take();
      ExprId inner = expression();
      if (inner == kNoExpr || !expectSymbol(")")) return kNoExpr;
      base = inner;  // size and sign casts keep the value
    } else {
      return base;
    }
  }
}

ExprId Parser::systemCall(const Token& name) {
  Expr call = node(Expr::Kind::System, Op::None, name.text);
  if (!m_Tokens.acceptSymbol("(") || m_Tokens.acceptSymbol(")")) return add(std::move(call));
  do {
    if (isTypeWord(m_Tokens.peekWord())) {
      auto type = std::make_shared<TypeSpec>();
      dataType(*type);
      Expr arg = node(Expr::Kind::TypeName);
      arg.type = std::move(type);
      call.args.push_back(add(std::move(arg)));
    } else {
      ExprId arg = expression();
      if (arg == kNoExpr) return kNoExpr;
      call.args.push_back(arg);
    }
  } while (m_Tokens.acceptSymbol(","));
  if (!expectSymbol(")")) return kNoExpr;
  return add(std::move(call));
}

ExprId Parser::primary() {
  Token token = m_Tokens.peek();
  switch (token.kind) {
    case TokenKind::Number: {
      m_Tokens.take();
      Expr expr;
      parseNumber(token.text, expr);
      return add(std::move(expr));
    }
    case TokenKind::String:
      m_Tokens.take();
      return add(node(Expr::Kind::String, Op::None,
                      token.text.substr(1, token.text.size() >= 2 ? token.text.size() - 2 : 0)));
    case TokenKind::SystemName:
      m_Tokens.take();
      return systemCall(token);
    case TokenKind::Identifier: {
      if (isTypeWord(classify(token.text))) {  // a cast such as int'(x)
        TypeSpec ignored;
        dataType(ignored);
        if (!m_Tokens.peek().isSymbol("'")) {
          fail("expected an expression but found '" + std::string(token.text) + "'");
          return kNoExpr;
        }
        m_Tokens.take();
        if (!expectSymbol("(")) return kNoExpr;
        ExprId inner = expression();
        if (inner == kNoExpr || !expectSymbol(")")) return kNoExpr;
        return inner;
      }
      m_Tokens.take();
      Expr expr = node(Expr::Kind::Name, Op::None, token.text);
      if (m_Tokens.peek().isSymbol("::") && m_Tokens.peek(1).kind == TokenKind::Identifier) {
        m_Tokens.take();
        expr.scope = std::move(expr.name);
        expr.name.assign(m_Tokens.take().text);
      }
      if (m_Tokens.acceptSymbol("(")) {
        expr.kind = Expr::Kind::Call;
        if (!m_Tokens.acceptSymbol(")")) {
          do {
            ExprId arg = expression();
            if (arg == kNoExpr) return kNoExpr;
            expr.args.push_back(arg);
          } while (m_Tokens.acceptSymbol(","));
          if (!expectSymbol(")")) return kNoExpr;
        }
      }
      return add(std::move(expr));
    }
    case TokenKind::Symbol:
      if (token.text == "(") {
        m_Tokens.take();
        ExprId inner = expression();
        if (inner == kNoExpr || !expectSymbol(")")) return kNoExpr;
        return inner;
      }
      if (token.text == "'{") {
        m_Tokens.take();
        return pattern();
      }
      if (token.text == "{") {
        m_Tokens.take();
        return concatenation();
      }
      break;
    default:
      break;
  }
  fail(token.kind == TokenKind::End
           ? std::string("expected an expression but found the end of the file")
           : "expected an expression but found '" + std::string(token.text.substr(0, 40)) + "'");
  return kNoExpr;
}

// {a, b, ...} or {n{a, b, ...}}, the '{' taken.
ExprId Parser::concatenation() {
  Expr expr = node(Expr::Kind::Concat);
  ExprId first = expression();
  if (first == kNoExpr) return kNoExpr;
  expr.args.push_back(first);
  if (m_Tokens.peek().isSymbol("{")) {
    expr.kind = Expr::Kind::Replicate;
    m_Tokens.take();
    do {
      ExprId item = expression();
      if (item == kNoExpr) return kNoExpr;
      expr.args.push_back(item);
    } while (m_Tokens.acceptSymbol(","));
    if (!expectSymbol("}")) return kNoExpr;
  } else {
    while (m_Tokens.acceptSymbol(",")) {
      ExprId item = expression();
      if (item == kNoExpr) return kNoExpr;
      expr.args.push_back(item);
    }
  }
  if (!expectSymbol("}")) return kNoExpr;
  return add(std::move(expr));
}

ExprId Parser::pattern() {
  Expr expr = node(Expr::Kind::Pattern);
  if (m_Tokens.acceptSymbol("}")) return add(std::move(expr));
  do {
    if (m_Tokens.acceptWord(Word::Default)) {
      if (!expectSymbol(":")) return kNoExpr;
      ExprId value = expression();
      if (value == kNoExpr) return kNoExpr;
      expr.op = Op::PatternKeyed;
      expr.args.push_back(kNoExpr);
      expr.args.push_back(value);
      continue;
    }
    ExprId first = expression();
    if (first == kNoExpr) return kNoExpr;
    if (expr.args.empty() && m_Tokens.acceptSymbol("{")) {  // '{N{items}}
      expr.op = Op::PatternReplicate;
      expr.args.push_back(first);
      do {
        ExprId item = expression();
        if (item == kNoExpr) return kNoExpr;
        expr.args.push_back(item);
      } while (m_Tokens.acceptSymbol(","));
      if (!expectSymbol("}")) return kNoExpr;
      break;
    }
    if (m_Tokens.acceptSymbol(":")) {
      ExprId value = expression();
      if (value == kNoExpr) return kNoExpr;
      expr.op = Op::PatternKeyed;
      expr.args.push_back(first);
      expr.args.push_back(value);
      continue;
    }
    if (expr.op == Op::PatternKeyed) {
      fail("expected 'key: value' in an assignment pattern");
      return kNoExpr;
    }
    expr.args.push_back(first);
  } while (m_Tokens.acceptSymbol(","));
  if (!expectSymbol("}")) return kNoExpr;
  return add(std::move(expr));
}
}  // namespace scan::verilog
