// A recursive-descent parser for the parts of VHDL the reader needs exactly: entity headers,
// package declarations and bodies, expressions and subprogram bodies. Everything else is
// skipped token by token. Nesting is capped so hostile input cannot exhaust the stack.
#pragma once

#include <string_view>
#include <vector>

#include "scan/vhdl/vhdl_ast.h"
#include "scan/vhdl/vhdl_lexer.h"

namespace scan {
class Diagnostics;
class SourceBuffer;
}  // namespace scan

namespace scan::vhdl {

/// Normalized lookup key of an identifier: basic identifiers in lowercase, extended ones as
/// written.
std::string normalizeName(std::string_view name);
/// `text` in single quotes for a message, shortened when long.
std::string quoted(std::string_view text);

class Parser {
 public:
  /// Parses `source` from byte `offset`; expressions are appended to `arena`.
  Parser(const SourceBuffer& source, size_t offset, ExprArena& arena, Diagnostics& diagnostics);

  /// Report lexical errors as they are met. Without this the parser only fails on them, for
  /// text the index pass has already read and reported.
  void reportLexicalErrors() { m_ReportLexical = true; }

  /// `entity name is [generic (...);] [port (...);]`. False after a reported syntax error;
  /// what was read before it is kept.
  bool parseEntityHeader(std::vector<Decl>& generics, std::vector<Decl>& ports);
  /// `package [body] name is declarations end`. Subprogram bodies are recorded, not parsed.
  bool parsePackage(std::vector<Decl>& decls);
  /// `[pure|impure] function name [(parameters)] return type is ... end;`.
  bool parseFunction(FunctionBody& body);

 private:
  const Token& peek(size_t ahead = 0);
  Token take();
  bool peekWord(std::string_view lowerWord, size_t ahead = 0);
  bool acceptWord(std::string_view lowerWord);
  bool accept(char symbol);
  bool acceptSymbol(std::string_view symbol);
  bool expect(char symbol);
  bool expectWord(std::string_view lowerWord);
  bool isName(const Token& t) const;
  bool fail(size_t offset, std::string_view text);
  bool failHere(std::string_view text);
  void skipPast(char symbol);
  bool skipToEndOf(std::string_view lowerWord);
  bool skipSubprogramBody();

  /// A declaration of `kind` named by the identifier token `name`, the rest left at defaults.
  static Decl declaration(DeclKind kind, const Token& name);
  bool parseInterfaceList(std::vector<Decl>& out, DeclKind kind);
  bool parseSubtypeIndication(SubtypeIndication& out);
  bool parseTypeMark(SubtypeIndication& out);
  bool parseDeclaration(std::vector<Decl>& out);
  bool parseTypeDeclaration(std::vector<Decl>& out);
  bool parseAlias(std::vector<Decl>& out);
  bool parseSubprogram(std::vector<Decl>& out);
  bool parseStatements(FunctionBody& body, std::vector<int32_t>& list);
  bool parseStatement(FunctionBody& body, std::vector<int32_t>& list);

 public:
  ExprId parseExpression();
  /// An expression, or `a to|downto b`, or `type_mark range a to b`.
  ExprId parseDiscreteRange();

 private:
  ExprId parseRelation();
  ExprId parseShift();
  ExprId parseSimple();
  ExprId parseTerm();
  ExprId parseFactor();
  ExprId parsePrimary();
  ExprId parseName();
  ExprId parseParenthesized();
  ExprId add(Expr e);
  ExprId binary(Op op, ExprId a, ExprId b);
  ExprId unary(Op op, ExprId a, size_t begin);
  size_t lastEnd() const { return m_LastEnd; }

  const SourceBuffer& m_Source;
  Lexer m_Lexer;
  ExprArena& m_Arena;
  Diagnostics& m_Diagnostics;
  Token m_Ahead[3];
  size_t m_Buffered = 0;
  size_t m_LastEnd = 0;
  int m_Depth = 0;
  bool m_Failed = false;
  bool m_ReportLexical = false;
  bool m_WarnOnly = false;  // subprogram bodies: unsupported code is not a design error
};

}  // namespace scan::vhdl
