// Subprogram bodies, parsed only when a bound calls the function: declarations of
// parameters, constants and variables, then sequential statements.
#include "scan/common/diagnostics.h"
#include "scan/common/reader_limits.h"
#include "scan/vhdl/vhdl_parser.h"

namespace scan::vhdl {
bool Parser::parseFunction(FunctionBody& body) {
  m_WarnOnly = true;
  if (acceptWord("pure") || acceptWord("impure")) {
  }
  if (!expectWord("function")) return false;
  if (!isName(peek())) return failHere("expected a function name");
  body.name = take().text;
  if (acceptWord("generic")) {
    std::vector<Decl> generics;
    if (!parseInterfaceList(generics, DeclKind::Generic)) return false;
  }
  acceptWord("parameter");
  if (peek().is('(') && !parseInterfaceList(body.parameters, DeclKind::Constant)) return false;
  SubtypeIndication result;
  if (!expectWord("return") || !parseTypeMark(result) || !expectWord("is")) return false;
  while (!m_Failed && !peekWord("begin")) {
    if (peek().kind == TokenKind::End) return failHere("expected 'begin'");
    bool variable = peekWord("variable");
    if (variable || peekWord("constant")) {
      take();
      size_t first = body.locals.size();
      do {
        if (!isName(peek())) return failHere("expected a name");
        Token name = take();
        Decl d = declaration(variable ? DeclKind::Variable : DeclKind::Constant, name);
        body.locals.push_back(std::move(d));
      } while (accept(','));
      SubtypeIndication subtype;
      if (!expect(':') || !parseSubtypeIndication(subtype)) return false;
      ExprId init = kNoExpr;
      if (acceptSymbol(":=") && (init = parseExpression()) == kNoExpr) return false;
      for (size_t i = first; i < body.locals.size(); ++i) {
        body.locals[i].subtype = subtype;
        body.locals[i].init = init;
      }
      if (!expect(';')) return false;
    } else if (!parseDeclaration(body.locals)) {
      return false;
    }
  }
  take();  // begin
  if (!parseStatements(body, body.top) || !expectWord("end")) return false;
  acceptWord("function");
  if (isName(peek()) || peek().kind == TokenKind::String) take();
  return expect(';');
}

bool Parser::parseStatements(FunctionBody& body, std::vector<int32_t>& list) {
  while (!m_Failed) {
    if (peekWord("end") || peekWord("elsif") || peekWord("else") || peekWord("when")) return true;
    if (peek().kind == TokenKind::End) return failHere("expected 'end'");
    if (!parseStatement(body, list)) return false;
  }
  return false;
}

bool Parser::parseStatement(FunctionBody& body, std::vector<int32_t>& list) {
  DepthGuard guard(m_Depth, limits::kVhdlStatementNesting);
  if (guard.tooDeep()) return fail(peek().offset, "statements are too deeply nested");
  Stmt s;
  s.offset = peek().offset;
  if (isName(peek()) && peek(1).is(':')) {
    s.label = take().text;
    take();
  }
  auto endOf = [this](std::string_view word) {
    if (!expectWord("end") || !expectWord(word)) return false;
    if (isName(peek())) take();
    return expect(';');
  };
  if (acceptWord("if")) {
    s.kind = StmtKind::If;
    do {
      ExprId condition = parseExpression();
      if (condition == kNoExpr || !expectWord("then")) return false;
      s.conditions.push_back(condition);
      s.branches.emplace_back();
      if (!parseStatements(body, s.branches.back())) return false;
    } while (acceptWord("elsif"));
    if (acceptWord("else")) {
      s.branches.emplace_back();
      if (!parseStatements(body, s.branches.back())) return false;
    }
    if (!endOf("if")) return false;
  } else if (peekWord("for") || peekWord("while") || peekWord("loop")) {
    if (acceptWord("for")) {
      s.kind = StmtKind::For;
      if (!isName(peek())) return failHere("expected a loop variable");
      s.name = take().text;
      s.key = normalizeName(s.name);
      if (!expectWord("in") || (s.expr = parseDiscreteRange()) == kNoExpr) return false;
    } else if (acceptWord("while")) {
      s.kind = StmtKind::While;
      if ((s.expr = parseExpression()) == kNoExpr) return false;
    } else {
      s.kind = StmtKind::Loop;
    }
    if (!expectWord("loop")) return false;
    s.branches.emplace_back();
    if (!parseStatements(body, s.branches.back()) || !endOf("loop")) return false;
  } else if (acceptWord("case")) {
    s.kind = StmtKind::Case;
    if ((s.expr = parseExpression()) == kNoExpr || !expectWord("is")) return false;
    while (acceptWord("when")) {
      s.choices.emplace_back();
      do {
        ExprId choice = parseDiscreteRange();
        if (choice == kNoExpr) return false;
        s.choices.back().push_back(choice);
      } while (accept('|'));
      if (!acceptSymbol("=>")) return failHere("expected '=>'");
      s.branches.emplace_back();
      if (!parseStatements(body, s.branches.back())) return false;
    }
    if (!endOf("case")) return false;
  } else if (acceptWord("return")) {
    s.kind = StmtKind::Return;
    if (!peek().is(';') && (s.expr = parseExpression()) == kNoExpr) return false;
    if (!expect(';')) return false;
  } else if (peekWord("exit") || peekWord("next")) {
    s.kind = peekWord("exit") ? StmtKind::Exit : StmtKind::Next;
    take();
    if (isName(peek())) s.label = take().text;
    if (acceptWord("when") && (s.expr = parseExpression()) == kNoExpr) return false;
    if (!expect(';')) return false;
  } else if (acceptWord("null")) {
    s.kind = StmtKind::Null;
    if (!expect(';')) return false;
  } else if (peekWord("report") || peekWord("assert")) {
    s.kind = StmtKind::Null;
    skipPast(';');
  } else if (isName(peek()) && peek(1).isSymbol(":=")) {
    s.kind = StmtKind::Assign;
    s.name = take().text;
    s.key = normalizeName(s.name);
    take();
    if ((s.expr = parseExpression()) == kNoExpr || !expect(';')) return false;
  } else {
    return failHere("unsupported statement in a function used for a bound");
  }
  body.statements.push_back(std::move(s));
  list.push_back(static_cast<int32_t>(body.statements.size() - 1));
  return !m_Failed;
}

}  // namespace scan::vhdl
