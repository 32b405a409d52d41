// A table-driven VHDL lexer. The index pass runs it over whole netlists, so the common paths
// (blanks, comments, identifiers, simple delimiters) are a few table lookups per byte.
#include "scan/vhdl/vhdl_lexer.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "scan/common/ascii.h"

namespace scan::vhdl {
namespace {

enum CharClass : uint8_t { Other, Blank, Letter, Digit, Delim };

constexpr std::array<uint8_t, 256> makeClasses() {
  std::array<uint8_t, 256> t{};
  for (int c = 0; c < 256; ++c) {
    if (c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f')
      t[c] = Blank;
    else if ((c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c >= 0x80)
      t[c] = Letter;
    else if (c >= '0' && c <= '9')
      t[c] = Digit;
  }
  for (char c : std::string_view("&()*+,-./:;<=>|[]?@'")) t[static_cast<unsigned char>(c)] = Delim;
  return t;
}

constexpr std::array<uint8_t, 256> kClass = makeClasses();

inline uint8_t classOf(char c) { return kClass[static_cast<unsigned char>(c)]; }
inline bool isWordChar(char c) {
  uint8_t k = classOf(c);
  return k == Letter || k == Digit || c == '_';
}

constexpr std::string_view kReserved[] = {"abs",
                                          "access",
                                          "after",
                                          "alias",
                                          "all",
                                          "and",
                                          "architecture",
                                          "array",
                                          "assert",
                                          "assume",
                                          "assume_guarantee",
                                          "attribute",
                                          "begin",
                                          "block",
                                          "body",
                                          "buffer",
                                          "bus",
                                          "case",
                                          "component",
                                          "configuration",
                                          "constant",
                                          "context",
                                          "cover",
                                          "default",
                                          "disconnect",
                                          "downto",
                                          "else",
                                          "elsif",
                                          "end",
                                          "entity",
                                          "exit",
                                          "fairness",
                                          "file",
                                          "for",
                                          "force",
                                          "function",
                                          "generate",
                                          "generic",
                                          "group",
                                          "guarded",
                                          "if",
                                          "impure",
                                          "in",
                                          "inertial",
                                          "inout",
                                          "is",
                                          "label",
                                          "library",
                                          "linkage",
                                          "literal",
                                          "loop",
                                          "map",
                                          "mod",
                                          "nand",
                                          "new",
                                          "next",
                                          "nor",
                                          "not",
                                          "null",
                                          "of",
                                          "on",
                                          "open",
                                          "or",
                                          "others",
                                          "out",
                                          "package",
                                          "parameter",
                                          "port",
                                          "postponed",
                                          "procedure",
                                          "process",
                                          "property",
                                          "protected",
                                          "pure",
                                          "range",
                                          "record",
                                          "register",
                                          "reject",
                                          "release",
                                          "rem",
                                          "report",
                                          "restrict",
                                          "restrict_guarantee",
                                          "return",
                                          "rol",
                                          "ror",
                                          "select",
                                          "sequence",
                                          "severity",
                                          "shared",
                                          "signal",
                                          "sla",
                                          "sll",
                                          "sra",
                                          "srl",
                                          "strong",
                                          "subtype",
                                          "then",
                                          "to",
                                          "transport",
                                          "type",
                                          "unaffected",
                                          "units",
                                          "until",
                                          "use",
                                          "variable",
                                          "vmode",
                                          "vprop",
                                          "vunit",
                                          "wait",
                                          "when",
                                          "while",
                                          "with",
                                          "xnor",
                                          "xor"};

// A base specifier of a bit-string literal: b o x d, optionally prefixed by u or s.
bool isBaseSpecifier(const char* p, size_t n) {
  if (n == 0 || n > 2) return false;
  char last = asciiLower(p[n - 1]);
  bool base = last == 'b' || last == 'o' || last == 'x' || last == 'd';
  if (n == 1) return base;
  char sign = asciiLower(p[0]);
  return base && last != 'd' && (sign == 'u' || sign == 's');
}

}  // namespace

bool equalsWord(std::string_view a, std::string_view lowerWord) {
  if (a.size() != lowerWord.size()) return false;
  for (size_t i = 0; i < a.size(); ++i)
    if (asciiLower(a[i]) != lowerWord[i]) return false;
  return true;
}

bool isReservedWord(std::string_view word) {
  if (word.size() < 2 || word.size() > 18) return false;
  char buffer[18];
  for (size_t i = 0; i < word.size(); ++i) buffer[i] = asciiLower(word[i]);
  std::string_view key(buffer, word.size());
  return std::binary_search(std::begin(kReserved), std::end(kReserved), key);
}

Lexer::Lexer(std::string_view text, size_t start)
    : m_Begin(text.data()),
      m_Cursor(text.data() + std::min(start, text.size())),
      m_End(text.data() + text.size()) {}

Token Lexer::make(TokenKind kind, const char* start) {
  Token t{kind, std::string_view(start, static_cast<size_t>(m_Cursor - start)),
          static_cast<size_t>(start - m_Begin), nullptr};
  m_Tick = Tick::No;
  m_StatementStart = false;
  if (kind == TokenKind::Identifier) {
    m_Tick = Tick::AfterWord;
    m_LastWord = t.text;
  } else if (kind == TokenKind::Extended) {
    m_Tick = Tick::AfterBracket;
  } else if (kind == TokenKind::Symbol && t.text.size() == 1) {
    if (t.text[0] == ')' || t.text[0] == ']') m_Tick = Tick::AfterBracket;
    m_StatementStart = t.text[0] == ';';
  }
  return t;
}

// After a name or a closing bracket a quote is a tick (x'range, f(a)'length); after a
// reserved word other than `all` it opens a character literal (when '0').
bool Lexer::tickFollows() const {
  if (m_Tick == Tick::AfterBracket) return true;
  if (m_Tick == Tick::No) return false;
  return equalsWord(m_LastWord, "all") || !isReservedWord(m_LastWord);
}

void Lexer::seek(size_t offset, bool statementStart) {
  m_Cursor = m_Begin + std::min(offset, static_cast<size_t>(m_End - m_Begin));
  m_Tick = Tick::No;
  m_StatementStart = statementStart;
}

Token Lexer::nextAtStatementStart() {
  for (;;) {
    const char* p = m_Cursor;
    while (classOf(*p) == Blank) ++p;
    m_Cursor = p;
    char c = *p;
    uint8_t k = classOf(c);
    if (k == Letter) {
      const char* start = p;
      ++p;
      while (isWordChar(*p)) ++p;
      size_t n = static_cast<size_t>(p - start);
      m_Cursor = p;
      if (*p == '"' && isBaseSpecifier(start, n)) {
        Token t = lexQuoted(start, TokenKind::BitString);
        if (t.kind == TokenKind::Invalid) return t;
        continue;
      }
      bool statementStart = m_StatementStart;
      m_StatementStart = false;
      m_Tick = Tick::AfterWord;
      m_LastWord = std::string_view(start, n);
      if (statementStart || (n == 3 && equalsWord(m_LastWord, "end")))
        return Token{TokenKind::Identifier, m_LastWord, static_cast<size_t>(start - m_Begin),
                     nullptr};
      continue;
    }
    if (k == Digit) {
      Token t = lexNumber(p);
      if (t.kind == TokenKind::Invalid) return t;
      continue;
    }
    if (c == ';') {
      ++m_Cursor;
      m_StatementStart = true;
      m_Tick = Tick::No;
      continue;
    }
    if (c == '-' && p[1] == '-') {
      const void* eol = std::memchr(p, '\n', static_cast<size_t>(m_End - p));
      m_Cursor = eol ? static_cast<const char*>(eol) + 1 : m_End;
      continue;
    }
    if (c == '/' && p[1] == '*') {
      if (!skipBlockComment()) {
        m_Cursor = m_End;
        return invalid(p, "unterminated block comment");
      }
      continue;
    }
    // Strings, extended identifiers, stray bytes and the end: the token starts right here.
    if (c == '"' || c == '\\' || k == Other) {
      bool statementStart = m_StatementStart;
      Token t = next();
      if (t.kind == TokenKind::End || t.kind == TokenKind::Invalid) return t;
      if (t.kind == TokenKind::Extended && statementStart) return t;
      continue;
    }
    // A delimiter: only a quote needs care, for the tick ambiguity.
    if (c == '\'' && !tickFollows() && p + 2 < m_End && p[2] == '\'' && p[1] != '\0') {
      m_Cursor += 3;
    } else {
      ++m_Cursor;
    }
    m_StatementStart = false;
    m_Tick = c == ')' || c == ']' ? Tick::AfterBracket : Tick::No;
  }
}

Token Lexer::invalid(const char* start, const char* why) {
  if (m_Cursor == start) ++m_Cursor;
  Token t = make(TokenKind::Invalid, start);
  t.error = why;
  return t;
}

bool Lexer::skipBlockComment() {
  const char* p = m_Cursor + 2;
  while (p + 1 < m_End) {
    const void* star = std::memchr(p, '*', static_cast<size_t>(m_End - p));
    if (star == nullptr) break;
    p = static_cast<const char*>(star);
    if (p[1] == '/') {
      m_Cursor = p + 2;
      return true;
    }
    ++p;
  }
  return false;
}

Token Lexer::next() {
  for (;;) {
    while (classOf(*m_Cursor) == Blank) ++m_Cursor;
    if (m_Cursor[0] == '-' && m_Cursor[1] == '-') {
      const void* eol = std::memchr(m_Cursor, '\n', static_cast<size_t>(m_End - m_Cursor));
      m_Cursor = eol ? static_cast<const char*>(eol) + 1 : m_End;
      continue;
    }
    if (m_Cursor[0] == '/' && m_Cursor[1] == '*') {
      const char* start = m_Cursor;
      if (!skipBlockComment()) {
        m_Cursor = m_End;
        return invalid(start, "unterminated block comment");
      }
      continue;
    }
    break;
  }
  const char* start = m_Cursor;
  if (m_Cursor >= m_End) {
    Token t{TokenKind::End, {}, static_cast<size_t>(m_End - m_Begin), nullptr};
    return t;
  }
  char c = *m_Cursor;
  switch (classOf(c)) {
    case Letter: {
      ++m_Cursor;
      while (isWordChar(*m_Cursor)) ++m_Cursor;
      if (*m_Cursor == '"' && isBaseSpecifier(start, static_cast<size_t>(m_Cursor - start)))
        return lexQuoted(start, TokenKind::BitString);
      return make(TokenKind::Identifier, start);
    }
    case Digit:
      return lexNumber(start);
    case Delim:
      break;
    default:
      if (c == '"') return lexQuoted(start, TokenKind::String);
      if (c == '\\') return lexExtended(start);
      return invalid(start, "stray character");
  }
  if (c == '\'') {
    if (!tickFollows() && m_Cursor + 2 < m_End && m_Cursor[2] == '\'' && m_Cursor[1] != '\0') {
      m_Cursor += 3;
      return make(TokenKind::Character, start);
    }
    ++m_Cursor;
    return make(TokenKind::Symbol, start);
  }
  char n = m_Cursor[1];
  size_t length = 1;
  switch (c) {
    case '=':
      length = n == '>' ? 2 : 1;
      break;
    case '*':
      length = n == '*' ? 2 : 1;
      break;
    case ':':
      length = n == '=' ? 2 : 1;
      break;
    case '/':
      length = n == '=' ? 2 : 1;
      break;
    case '>':
      length = n == '=' ? 2 : 1;
      break;
    case '<':
      length = n == '=' || n == '>' ? 2 : 1;
      break;
    case '?':
      if (n == '/' && m_Cursor[2] == '=')
        length = 3;
      else if ((n == '<' || n == '>') && m_Cursor[2] == '=')
        length = 3;
      else if (n == '?' || n == '=' || n == '<' || n == '>')
        length = 2;
      break;
    default:
      break;
  }
  m_Cursor += length;
  return make(TokenKind::Symbol, start);
}

Token Lexer::lexNumber(const char* start) {
  auto digits = [this](bool extended) {
    while (isWordChar(*m_Cursor) && (extended || classOf(*m_Cursor) != Letter)) ++m_Cursor;
  };
  digits(false);
  if (*m_Cursor == '#') {
    ++m_Cursor;
    while (isWordChar(*m_Cursor) || *m_Cursor == '.') ++m_Cursor;
    if (*m_Cursor != '#') return invalid(start, "unterminated based literal");
    ++m_Cursor;
  } else {
    const char* letters = m_Cursor;
    while (classOf(*m_Cursor) == Letter && m_Cursor - letters < 3) ++m_Cursor;
    if (*m_Cursor == '"' && isBaseSpecifier(letters, static_cast<size_t>(m_Cursor - letters)))
      return lexQuoted(start, TokenKind::BitString);
    m_Cursor = letters;
    if (*m_Cursor == '.' && classOf(m_Cursor[1]) == Digit) {
      ++m_Cursor;
      digits(false);
    }
  }
  if ((*m_Cursor == 'e' || *m_Cursor == 'E') &&
      (classOf(m_Cursor[1]) == Digit ||
       ((m_Cursor[1] == '+' || m_Cursor[1] == '-') && classOf(m_Cursor[2]) == Digit))) {
    m_Cursor += 2;
    digits(false);
  }
  return make(TokenKind::Number, start);
}

// A NUL byte inside quotes is no graphic character; the token still ends at its closing
// quote so that lexing resumes in step with the text.
Token Lexer::lexQuoted(const char* start, TokenKind kind) {
  ++m_Cursor;  // opening quote
  bool nul = false;
  for (;;) {
    char c = *m_Cursor;
    if (c == '"') {
      if (m_Cursor[1] == '"') {
        m_Cursor += 2;
        continue;
      }
      ++m_Cursor;
      return nul ? invalid(start, "NUL byte in a string literal") : make(kind, start);
    }
    if (c == '\n' || m_Cursor >= m_End) return invalid(start, "unterminated string literal");
    nul = nul || c == '\0';
    ++m_Cursor;
  }
}

Token Lexer::lexExtended(const char* start) {
  ++m_Cursor;
  bool nul = false;
  for (;;) {
    char c = *m_Cursor;
    if (c == '\\') {
      if (m_Cursor[1] == '\\') {
        m_Cursor += 2;
        continue;
      }
      ++m_Cursor;
      return nul ? invalid(start, "NUL byte in an extended identifier")
                 : make(TokenKind::Extended, start);
    }
    if (c == '\n' || m_Cursor >= m_End) return invalid(start, "unterminated extended identifier");
    nul = nul || c == '\0';
    ++m_Cursor;
  }
}

}  // namespace scan::vhdl
