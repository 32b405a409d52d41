// Recursive-descent reading of the pieces a header parse needs: constant expressions, data
// types with their dimensions, and constant functions. Errors are kept (first one wins) for
// the caller to report; nothing here prints.
#pragma once

#include <deque>
#include <string>

#include "scan/verilog/verilog_expr.h"
#include "scan/verilog/verilog_keywords.h"
#include "scan/verilog/verilog_token.h"

namespace scan::verilog {

class Preprocessor;

/// Preprocessed tokens with unlimited lookahead.
class TokenStream {
 public:
  explicit TokenStream(Preprocessor& pre) : m_Pre(pre) {}
  const Token& peek(size_t n = 0);
  Token take();
  bool atEnd() { return peek().kind == TokenKind::End; }
  bool acceptSymbol(std::string_view symbol);
  bool acceptWord(Word word);
  Word peekWord(size_t n = 0);

 private:
  Preprocessor& m_Pre;
  std::deque<Token> m_Ahead;
};

/// Reads from `tokens`; every expression node goes to `arena`, which must outlive the ids
/// handed out.
class Parser {
 public:
  Parser(TokenStream& tokens, ExprArena& arena) : m_Tokens(tokens), m_Arena(arena) {}

  TokenStream& tokens() { return m_Tokens; }
  /// Where the expressions read go.
  ExprArena& arena() { return m_Arena; }
  bool failed() const { return m_Failed; }
  const std::string& errorText() const { return m_Error; }
  const Token& errorAt() const { return m_ErrorAt; }
  void clearError() { m_Failed = false; }
  /// Records an error at the next token (the first error is kept).
  void fail(const std::string& text);
  bool expectSymbol(std::string_view symbol);

  /// One expression, or kNoExpr after an error.
  ExprId expression();
  /// Reads a data type if one starts here: net kind, var, signed, built-in or user type,
  /// struct/union/enum, packed dimensions. False when nothing was read. A user type is only
  /// taken when a name follows it, so `name` alone stays a name.
  bool dataType(TypeSpec& type);
  /// Reads [l:r] or [n] dimensions while they come.
  void dimensions(std::vector<Dimension>& dims);
  /// Reads `function ... endfunction` (the keyword is next).
  std::shared_ptr<Function> function();
  /// Skips to just after the next `;` at bracket depth 0 (or to `stop`).
  void skipStatement(Word stop = Word::None);

  /// True when the tokens at `n` start a user type followed by a declared name.
  bool userTypeAt(size_t n);

 private:
  ExprId ternary();
  ExprId binary(int minPrecedence);
  ExprId unary();
  ExprId postfix(ExprId base);
  ExprId primary();
  ExprId systemCall(const Token& name);
  ExprId concatenation();
  ExprId pattern();
  /// Appends `node` (whose children are already in the arena) and returns its id.
  ExprId add(Expr node);
  void structBody(TypeSpec& type);
  void enumBody(TypeSpec& type);
  bool statement(Function& function, std::vector<Stmt>& out);
  bool assignment(Stmt& stmt);
  /// Sets `stmt.update` to `target op value`.
  void compound(Stmt& stmt, Op op);
  bool declaration(std::vector<Stmt>& out);
  void skipLabel();

  TokenStream& m_Tokens;
  ExprArena& m_Arena;
  bool m_Failed = false;
  std::string m_Error;
  Token m_ErrorAt;
  int m_Depth = 0;
};

/// Value of a literal token; false for x/z digits (`unknown`) or a malformed literal.
bool parseNumber(std::string_view text, Expr& out);

}  // namespace scan::verilog
