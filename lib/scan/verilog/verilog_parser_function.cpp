// Constant functions: the declarations and statements a function body may hold, read into
// the small statement tree the evaluator's interpreter runs.
#include "scan/verilog/verilog_parser.h"

#include "scan/verilog/verilog_parser_support.h"

namespace scan::verilog {
namespace {

Stmt block(std::vector<Stmt> body = {}) {
  Stmt stmt;
  stmt.kind = Stmt::Kind::Block;
  stmt.body = std::move(body);
  return stmt;
}

Expr one() {
  Expr expr;
  expr.integer = 1;
  return expr;
}

}  // namespace

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

void Parser::compound(Stmt& stmt, Op op) {
  ExprId target = add(node(Expr::Kind::Name, Op::None, stmt.target));
  Expr update = node(Expr::Kind::Binary, op);
  update.args = {target, stmt.value};
  stmt.update = add(std::move(update));
}

bool Parser::assignment(Stmt& stmt) {
  stmt.kind = Stmt::Kind::Assign;
  if (m_Tokens.peek().isSymbol("++") || m_Tokens.peek().isSymbol("--")) {
    Op op = m_Tokens.take().text[0] == '+' ? Op::Plus : Op::Minus;
    if (m_Tokens.peek().kind != TokenKind::Identifier) return false;
    stmt.target.assign(m_Tokens.take().text);
    stmt.value = add(one());
    compound(stmt, op);
    return true;
  }
  if (m_Tokens.peek().kind != TokenKind::Identifier) return false;
  stmt.target.assign(m_Tokens.take().text);
  if (m_Tokens.acceptSymbol("[")) {  // x[i] = ..., x[hi:lo] = ..., x[i +: w] = ...
    if ((stmt.index = expression()) == kNoExpr) return false;
    const Token& sep = m_Tokens.peek();
    if (sep.isSymbol(":") || sep.isSymbol("+:") || sep.isSymbol("-:")) {
      stmt.selectOp = operatorOf(m_Tokens.take().text);
      if ((stmt.indexEnd = expression()) == kNoExpr) return false;
    }
    if (!expectSymbol("]")) return false;
    if (!m_Tokens.peek().isSymbol("=") && !m_Tokens.peek().isSymbol("<=")) return false;
  }
  const Token& op = m_Tokens.peek();
  if (op.isSymbol("++") || op.isSymbol("--")) {
    stmt.value = add(one());
    compound(stmt, m_Tokens.take().text[0] == '+' ? Op::Plus : Op::Minus);
    return true;
  }
  if (op.kind != TokenKind::Symbol ||
      !(op.text == "=" || op.text == "+=" || op.text == "-=" || op.text == "*=" ||
        op.text == "/=" || op.text == "%=" || op.text == "&=" || op.text == "|=" ||
        op.text == "^=" || op.text == "<<=" || op.text == ">>=" || op.text == "<="))
    return false;
  Op update = Op::None;
  if (!op.isSymbol("<=")) {
    Token assign = m_Tokens.take();
    if (assign.text.size() > 1) update = operatorOf(assign.text.substr(0, assign.text.size() - 1));
  }
  stmt.value = expression();
  if (stmt.value == kNoExpr) return false;
  if (update != Op::None) compound(stmt, update);
  return true;
}

// Reads one statement into `out`; false when the function uses something unsupported.
bool Parser::statement(Function& function, std::vector<Stmt>& out) {
  DepthGuard guard(m_Depth, limits::kVerilogSyntaxNesting);
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
      if (!expectSymbol("(") || (stmt.value = expression()) == kNoExpr || !expectSymbol(")"))
        return false;
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
      if (!expectSymbol(";") || (stmt.value = expression()) == kNoExpr || !expectSymbol(";"))
        return false;
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
      if (!expectSymbol("(") || (stmt.value = expression()) == kNoExpr || !expectSymbol(")"))
        return false;
      Stmt body = block();
      if (!statement(function, body.body)) return false;
      stmt.body.push_back(std::move(body));
      break;
    }
    case Word::Return:
      m_Tokens.take();
      stmt.kind = Stmt::Kind::Return;
      if (!m_Tokens.peek().isSymbol(";") && (stmt.value = expression()) == kNoExpr) return false;
      if (!expectSymbol(";")) return false;
      break;
    case Word::Case: {
      m_Tokens.take();
      stmt.kind = Stmt::Kind::Case;
      if (!expectSymbol("(") || (stmt.value = expression()) == kNoExpr || !expectSymbol(")"))
        return false;
      while (!m_Failed && !m_Tokens.atEnd() && !m_Tokens.acceptWord(Word::Endcase)) {
        std::vector<ExprId> labels;
        bool isDefault = m_Tokens.acceptWord(Word::Default);
        if (!isDefault) {
          do {
            ExprId label = expression();
            if (label == kNoExpr) return false;
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
