// The token stream with lookahead, literal values and the parser's error handling; the
// grammar itself is in verilog_parser_expr, _types and _function.
#include "scan/verilog/verilog_parser.h"

#include <cstdlib>

#include "scan/verilog/verilog_preprocessor.h"

namespace scan::verilog {
namespace {

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

ExprId Parser::add(Expr node) {
  m_Arena.push_back(std::move(node));
  return static_cast<ExprId>(m_Arena.size() - 1);
}
}  // namespace scan::verilog
