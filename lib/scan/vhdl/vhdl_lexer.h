// Tokens of VHDL source text. The lexer works straight on the mapped bytes (which end in a
// NUL sentinel) and builds nothing: a token is a kind, a view of its text and an offset.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace scan::vhdl {

enum class TokenKind : uint8_t {
  End,         ///< end of the text
  Identifier,  ///< basic identifier or reserved word
  Extended,    ///< extended identifier, backslashes included
  Number,      ///< decimal or based literal
  Character,   ///< 'c', quotes included
  String,      ///< "text", quotes included
  BitString,   ///< [size]base"digits"
  Symbol,      ///< delimiter, simple or compound
  Invalid,     ///< a byte sequence that is no token; `error` says why
};

struct Token {
  TokenKind kind = TokenKind::End;
  std::string_view text;
  size_t offset = 0;
  const char* error = nullptr;  ///< reason, for Invalid tokens only

  bool is(char symbol) const {
    return kind == TokenKind::Symbol && text.size() == 1 && text[0] == symbol;
  }
  bool isSymbol(std::string_view symbol) const {
    return kind == TokenKind::Symbol && text == symbol;
  }
};

/// True when `a` equals the lowercase word `lower` ignoring ASCII letter case.
bool equalsWord(std::string_view a, std::string_view lower);
/// True when `word` is a VHDL-2008 reserved word (any letter case).
bool isReservedWord(std::string_view word);

class Lexer {
 public:
  /// Lexes `text` from `start`; `text.data()[text.size()]` must be readable and '\0'.
  explicit Lexer(std::string_view text, size_t start = 0);

  Token next();
  /// The fast path of the index pass: skips everything except identifiers that start a
  /// statement (after a semicolon or at the start), every `end`, invalid tokens and the end of
  /// the text, without building tokens for what it skips.
  Token nextAtStatementStart();
  /// Continues lexing at `offset`, as if nothing that allows a tick came before.
  void seek(size_t offset, bool statementStart);
  /// Offset of the next unread byte.
  size_t position() const { return static_cast<size_t>(m_Cursor - m_Begin); }

 private:
  enum class Tick : uint8_t { No, AfterWord, AfterBracket };
  bool tickFollows() const;
  Token make(TokenKind kind, const char* start);
  Token invalid(const char* start, const char* why);
  Token lexNumber(const char* start);
  Token lexQuoted(const char* start, TokenKind kind);
  Token lexExtended(const char* start);
  bool skipBlockComment();

  const char* m_Begin;
  const char* m_Cursor;
  const char* m_End;
  Tick m_Tick = Tick::No;        // whether the previous token may carry an attribute
  std::string_view m_LastWord;   // the previous token, when it was a basic identifier
  bool m_StatementStart = true;  // the previous token was a semicolon, or there was none
};

}  // namespace scan::vhdl
