// Table-driven scanning keeps the index pass near memory speed on gate-level netlists, where
// almost every byte belongs to an identifier, an escaped name or punctuation.
#include "scan/verilog/verilog_lexer.h"

#include <array>
#include <cstring>

#include "scan/common/diagnostics.h"
#include "scan/verilog/verilog_keywords.h"

namespace scan::verilog {
namespace {

enum : uint8_t { kSpace = 1, kIdStart = 2, kIdChar = 4, kDigit = 8, kBasedDigit = 16, kEnd = 32 };

constexpr std::array<uint8_t, 256> makeClasses() {
  std::array<uint8_t, 256> t{};
  for (unsigned char c : {' ', '\t', '\n', '\r', '\v', '\f'}) t[c] = kSpace;
  t[0] = kEnd;
  for (int c = 'a'; c <= 'z'; ++c) t[c] = kIdStart | kIdChar;
  for (int c = 'A'; c <= 'Z'; ++c) t[c] = kIdStart | kIdChar;
  t['_'] = kIdStart | kIdChar | kBasedDigit;
  t['$'] = kIdChar;
  for (int c = '0'; c <= '9'; ++c) t[c] = kIdChar | kDigit | kBasedDigit;
  for (unsigned char c :
       {'a', 'b', 'c', 'd', 'e', 'f', 'A', 'B', 'C', 'D', 'E', 'F', 'x', 'X', 'z', 'Z'})
    t[c] |= kBasedDigit;
  t['?'] = kBasedDigit;
  return t;
}

constexpr std::array<uint8_t, 256> kClass = makeClasses();

inline uint8_t cls(char c) { return kClass[static_cast<unsigned char>(c)]; }

// Length of the operator at p (max munch); p[0..3] are readable thanks to the sentinel.
size_t operatorLength(const char* p) {
  char b = p[1], c = b ? p[2] : '\0';
  switch (p[0]) {
    case '.':
      return b == '*' ? 2 : 1;
    case '<':
      if (b == '<') return c == '<' ? (p[3] == '=' ? 4 : 3) : c == '=' ? 3 : 2;
      if (b == '-' && c == '>') return 3;
      return b == '=' ? 2 : 1;
    case '>':
      if (b == '>') return c == '>' ? (p[3] == '=' ? 4 : 3) : c == '=' ? 3 : 2;
      return b == '=' ? 2 : 1;
    case '=':
    case '!':
      if (b == '=') return c == '=' || c == '?' ? 3 : 2;
      return 1;
    case '*':
      return b == '*' || b == '=' ? 2 : 1;
    case '&':
      return b == '&' || b == '=' ? 2 : 1;
    case '|':
      if ((b == '-' || b == '=') && c == '>') return 3;
      return b == '|' || b == '=' ? 2 : 1;
    case '~':
      return b == '&' || b == '|' || b == '^' ? 2 : 1;
    case '^':
      return b == '~' || b == '=' ? 2 : 1;
    case ':':
      return b == ':' || b == '=' || b == '/' ? 2 : 1;
    case '+':
      return b == ':' || b == '+' || b == '=' ? 2 : 1;
    case '-':
      if (b == '>' && c == '>') return 3;
      return b == ':' || b == '-' || b == '=' || b == '>' ? 2 : 1;
    case '/':
    case '%':
      return b == '=' ? 2 : 1;
    default:
      return 1;
  }
}

inline bool isBaseLetter(char c) {
  switch (c) {
    case 'b':
    case 'B':
    case 'o':
    case 'O':
    case 'd':
    case 'D':
    case 'h':
    case 'H':
      return true;
    default:
      return false;
  }
}

}  // namespace

bool isIdentifierStart(char c) { return (cls(c) & kIdStart) != 0; }
bool isIdentifierChar(char c) { return (cls(c) & kIdChar) != 0; }
bool isBlank(char c) { return (cls(c) & kSpace) != 0; }

Lexer::Lexer(const char* begin, const char* end, const SourceBuffer* file, size_t fixedOffset,
             Diagnostics* diagnostics)
    : m_Begin(begin),
      m_Pos(begin),
      m_End(end),
      m_File(file),
      m_Fixed(fixedOffset),
      m_Diagnostics(diagnostics) {}

size_t Lexer::offsetOf(const char* p) const {
  return m_Fixed != npos ? m_Fixed : static_cast<size_t>(p - m_Begin);
}

void Lexer::error(const char* at, std::string_view text) {
  if (m_Diagnostics && m_File) m_Diagnostics->error(*m_File, offsetOf(at), text);
}

const char* Lexer::skipBlanks(const char* p) {
  for (;;) {
    while (cls(*p) & kSpace) ++p;
    if (*p == '/') {
      if (p[1] == '/') {
        const void* nl = std::memchr(p, '\n', static_cast<size_t>(m_End - p));
        p = nl ? static_cast<const char*>(nl) + 1 : m_End;
        continue;
      }
      if (p[1] == '*') {
        std::string_view rest(p + 2, static_cast<size_t>(m_End - p - 2));
        size_t close = rest.find("*/");
        if (close == std::string_view::npos) {
          error(p, "unterminated comment");
          return m_End;
        }
        p += 2 + close + 2;
        continue;
      }
    } else if (*p == '(' && p[1] == '*' && p[2] != ')' && p + 1 < m_End) {
      std::string_view rest(p + 2, static_cast<size_t>(m_End - p - 2));
      size_t close = rest.find("*)");
      if (close == std::string_view::npos) {
        error(p, "unterminated attribute");
        return m_End;
      }
      p += 2 + close + 2;
      continue;
    }
    return p;
  }
}

const char* Lexer::lexBasedDigits(const char* p) {
  // p is at the quote: [sS] base letter, optional blanks, then digits.
  ++p;
  if (*p == 's' || *p == 'S') ++p;
  ++p;
  while (*p == ' ' || *p == '\t') ++p;
  while (cls(*p) & kBasedDigit) ++p;
  return p;
}

const char* Lexer::lexNumber(const char* p) {
  while (cls(*p) & kDigit || *p == '_') ++p;
  if (*p == '.' && (cls(p[1]) & kDigit)) {
    ++p;
    while (cls(*p) & kDigit || *p == '_') ++p;
  }
  if ((*p == 'e' || *p == 'E') &&
      ((cls(p[1]) & kDigit) || ((p[1] == '+' || p[1] == '-') && (cls(p[2]) & kDigit)))) {
    p += 2;
    while (cls(*p) & kDigit) ++p;
  }
  const char* q = p;
  while (*q == ' ' || *q == '\t') ++q;
  if (*q == '\'') {
    const char* base = q[1] == 's' || q[1] == 'S' ? q + 2 : q + 1;
    if (isBaseLetter(*base)) return lexBasedDigits(q);
  }
  // Time literals (10ns, 1step) are one token.
  while (cls(*p) & kIdChar) ++p;
  return p;
}

const char* Lexer::skipIrrelevant(const char* p) {
  for (;;) {
    char c = *p;
    uint8_t k = cls(c);
    if (k & kSpace) {
      ++p;
      continue;
    }
    if (k & kIdStart) {
      const char* q = p + 1;
      while (cls(*q) & kIdChar) ++q;
      if (classify(std::string_view(p, static_cast<size_t>(q - p))) != Word::None) return p;
      p = q;
      continue;
    }
    if (k & kDigit) {
      p = lexNumber(p);
      continue;
    }
    switch (c) {
      case '\\':
        if (p + 1 >= m_End || (cls(p[1]) & kSpace)) return p;
        ++p;
        while (!(cls(*p) & (kSpace | kEnd))) ++p;
        if (*p == '\0' && p < m_End) ++p;
        continue;
      case '$':
        if (!(cls(p[1]) & kIdChar)) return p;
        ++p;
        while (cls(*p) & kIdChar) ++p;
        continue;
      case '/':
        if (p[1] != '/' && p[1] != '*') return p;
        p = skipBlanks(p);
        continue;
      case '(':
        if (p[1] == '*' && p[2] != ')') {
          p = skipBlanks(p);
          continue;
        }
        ++p;
        continue;
      case ')':
      case ',':
      case '.':
      case '[':
      case ']':
      case '{':
      case '}':
      case '=':
      case '#':
      case '+':
      case '-':
      case '*':
      case '&':
      case '|':
      case '~':
      case '^':
      case '!':
      case '<':
      case '>':
      case '?':
      case '%':
        ++p;
        continue;
      default:
        return p;
    }
  }
}

void Lexer::next(Token& token) {
  const char* p = m_Coarse ? skipIrrelevant(m_Pos) : skipBlanks(m_Pos);
  token.source = m_File;
  token.offset = offsetOf(p);
  if (p >= m_End) {
    m_Pos = m_End;
    token.kind = TokenKind::End;
    token.text = {};
    return;
  }
  const char* start = p;
  char c = *p;
  if (cls(c) & kIdStart) {
    ++p;
    while (cls(*p) & kIdChar) ++p;
    token.kind = TokenKind::Identifier;
  } else if (cls(c) & kDigit) {
    p = lexNumber(p);
    token.kind = TokenKind::Number;
  } else {
    switch (c) {
      case '(':
      case ')':
      case ',':
      case ';':
      case '[':
      case ']':
      case '{':
      case '}':
      case '@':
        token.kind = TokenKind::Symbol;
        ++p;
        break;
      case '\\':
        ++p;
        while (p < m_End && !(cls(*p) & kSpace)) ++p;
        token.kind = p - start > 1 ? TokenKind::Identifier : TokenKind::Symbol;
        break;
      case '"':
        ++p;
        while (p < m_End && *p != '"' && *p != '\n') p += *p == '\\' && p + 1 < m_End ? 2 : 1;
        if (p < m_End && *p == '"') {
          ++p;
        } else {
          error(start, "unterminated string");
        }
        token.kind = TokenKind::String;
        break;
      case '$':
        ++p;
        while (cls(*p) & kIdChar) ++p;
        token.kind = p - start > 1 ? TokenKind::SystemName : TokenKind::Symbol;
        break;
      case '`':
        ++p;
        if (cls(*p) & kIdStart) {
          while (cls(*p) & kIdChar) ++p;
          token.kind = TokenKind::Directive;
          token.text = std::string_view(start + 1, static_cast<size_t>(p - start - 1));
          m_Pos = p;
          return;
        }
        if (*p == '`' || *p == '"') ++p;
        token.kind = TokenKind::Symbol;
        break;
      case '\'': {
        const char* base = p[1] == 's' || p[1] == 'S' ? p + 2 : p + 1;
        if (isBaseLetter(*base)) {
          p = lexBasedDigits(p);
          token.kind = TokenKind::Number;
        } else if (p[1] == '0' || p[1] == '1' || p[1] == 'x' || p[1] == 'X' || p[1] == 'z' ||
                   p[1] == 'Z') {
          p += 2;
          token.kind = TokenKind::Number;
        } else {
          p += p[1] == '{' ? 2 : 1;
          token.kind = TokenKind::Symbol;
        }
        break;
      }
      case '#':
        token.kind = TokenKind::Symbol;
        p += p[1] == '#' ? 2 : 1;
        break;
      default:
        token.kind = TokenKind::Symbol;
        p += operatorLength(p);
        break;
    }
  }
  token.text = std::string_view(start, static_cast<size_t>(p - start));
  m_Pos = p;
}

}  // namespace scan::verilog
