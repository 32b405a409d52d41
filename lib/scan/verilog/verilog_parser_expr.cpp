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

ExprPtr Parser::expression() {
  DepthGuard guard(m_Depth, limits::kVerilogSyntaxNesting);
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
    expr->op = operatorOf(opToken.text);
    expr->args = {left, right};
    left = expr;
  }
  return left;
}

ExprPtr Parser::unary() {
  DepthGuard guard(m_Depth, limits::kVerilogSyntaxNesting);
  if (guard.tooDeep()) {
    fail("expression nested too deeply");
    return nullptr;
  }
  if (isUnaryOperator(m_Tokens.peek())) {
    Token op = m_Tokens.take();
    ExprPtr operand = unary();
    if (!operand) return nullptr;
    auto expr = std::const_pointer_cast<Expr>(make(Expr::Kind::Unary, op));
    expr->op = operatorOf(op.text);
    expr->args = {operand};
    return expr;
  }
  ExprPtr base = primary();
  return base ? postfix(base) : nullptr;
}

ExprPtr Parser::postfix(ExprPtr base) {
  for (int selects = 0;; ++selects) {
    const Token& next = m_Tokens.peek();
    if (selects > limits::kVerilogSyntaxNesting) {  // each select nests the tree one level deeper
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
        select->op = operatorOf(m_Tokens.take().text);
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
      expr->op = Op::PatternKeyed;
      expr->args.push_back(nullptr);
      expr->args.push_back(value);
      continue;
    }
    ExprPtr first = expression();
    if (!first) return nullptr;
    if (expr->args.empty() && m_Tokens.acceptSymbol("{")) {  // '{N{items}}
      expr->op = Op::PatternReplicate;
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
      expr->op = Op::PatternKeyed;
      expr->args.push_back(first);
      expr->args.push_back(value);
      continue;
    }
    if (expr->op == Op::PatternKeyed) {
      fail("expected 'key: value' in an assignment pattern");
      return nullptr;
    }
    expr->args.push_back(first);
  } while (m_Tokens.acceptSymbol(","));
  if (!expectSymbol("}")) return nullptr;
  return expr;
}
}  // namespace scan::verilog
