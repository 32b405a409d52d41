// Token lookahead, error reporting and skipping for the VHDL parser; the grammar is in
// vhdl_parser_decls (declarations), vhdl_parser_expr (expressions) and vhdl_parser_body.
#include "scan/vhdl/vhdl_parser.h"

#include <algorithm>
#include <cstdlib>

#include "scan/common/ascii.h"
#include "scan/common/diagnostics.h"
#include "scan/common/source_buffer.h"
#include "scan/vhdl/vhdl_literal.h"

namespace scan::vhdl {

std::string normalizeName(std::string_view name) {
  if (!name.empty() && name[0] == '\\') return std::string(name);
  return asciiLowered(name);
}

std::string quoted(std::string_view text) {
  constexpr size_t kLongest = 60;
  std::string out;
  out.reserve(std::min(text.size(), kLongest) + 5);
  out += '\'';
  out.append(text.substr(0, text.size() > kLongest ? kLongest - 3 : kLongest));
  if (text.size() > kLongest) out += "...";
  out += '\'';
  return out;
}

Parser::Parser(const SourceBuffer& source, size_t offset, ExprArena& arena,
               Diagnostics& diagnostics)
    : m_Source(source),
      m_Lexer(source.text(), offset),
      m_Arena(arena),
      m_Diagnostics(diagnostics) {}

const Token& Parser::peek(size_t ahead) {
  while (m_Buffered <= ahead) {
    Token t = m_Lexer.next();
    if (t.kind == TokenKind::Invalid) {
      // The index pass already reported the lexical errors of indexed files; saying it
      // again here would print every such error twice.
      if (m_ReportLexical) fail(t.offset, t.error);
      m_Failed = true;
      t = Token{TokenKind::End, {}, t.offset, nullptr};
    }
    m_Ahead[m_Buffered++] = t;
  }
  return m_Ahead[ahead];
}

Token Parser::take() {
  Token t = peek();
  if (t.kind == TokenKind::End) return t;
  m_LastEnd = t.offset + t.text.size();
  for (size_t i = 1; i < m_Buffered; ++i) m_Ahead[i - 1] = m_Ahead[i];
  --m_Buffered;
  return t;
}

bool Parser::peekWord(std::string_view lowerWord, size_t ahead) {
  const Token& t = peek(ahead);
  return t.kind == TokenKind::Identifier && equalsWord(t.text, lowerWord);
}

bool Parser::acceptWord(std::string_view lowerWord) {
  if (!peekWord(lowerWord)) return false;
  take();
  return true;
}

bool Parser::accept(char symbol) {
  if (!peek().is(symbol)) return false;
  take();
  return true;
}

bool Parser::acceptSymbol(std::string_view symbol) {
  if (!peek().isSymbol(symbol)) return false;
  take();
  return true;
}

bool Parser::fail(size_t offset, std::string_view text) {
  if (!m_Failed && m_WarnOnly)
    m_Diagnostics.warning(m_Source, offset, text);
  else if (!m_Failed)
    m_Diagnostics.error(m_Source, offset, text);
  m_Failed = true;
  return false;
}

bool Parser::failHere(std::string_view text) {
  const Token& t = peek();
  std::string message(text);
  if (t.kind == TokenKind::End)
    message += ", found the end of the file";
  else if (t.text.size() <= 40)
    message += ", found '" + std::string(t.text) + "'";
  return fail(t.offset, message);
}

bool Parser::expect(char symbol) {
  if (m_Failed) return false;
  if (accept(symbol)) return true;
  return failHere(std::string("expected '") + symbol + "'");
}

bool Parser::expectWord(std::string_view lowerWord) {
  if (m_Failed) return false;
  if (acceptWord(lowerWord)) return true;
  return failHere("expected '" + std::string(lowerWord) + "'");
}

bool Parser::isName(const Token& t) const {
  return t.kind == TokenKind::Extended ||
         (t.kind == TokenKind::Identifier && !isReservedWord(t.text));
}

void Parser::skipPast(char symbol) {
  long depth = 0;
  while (!m_Failed && peek().kind != TokenKind::End) {
    Token t = take();
    if (depth <= 0 && t.is(symbol)) return;
    if (t.is('('))
      ++depth;
    else if (t.is(')'))
      --depth;
  }
}

bool Parser::skipToEndOf(std::string_view lowerWord) {
  while (!m_Failed && peek().kind != TokenKind::End) {
    if (acceptWord("end") && acceptWord(lowerWord)) {
      skipPast(';');
      return true;
    }
    take();
  }
  return failHere("expected 'end " + std::string(lowerWord) + "'");
}

// Subprogram bodies are skipped by counting: each body opened by `is` needs one plain `end`;
// `end if`, `end loop` and the like close statements, not bodies.
bool Parser::skipSubprogramBody() {
  long open = 1;
  bool pendingSubprogram = false;
  while (!m_Failed && peek().kind != TokenKind::End) {
    Token t = take();
    if (t.kind != TokenKind::Identifier) {
      if (t.is(';')) pendingSubprogram = false;
      continue;
    }
    if (equalsWord(t.text, "function") || equalsWord(t.text, "procedure")) {
      pendingSubprogram = true;
    } else if (equalsWord(t.text, "is") && pendingSubprogram) {
      pendingSubprogram = false;
      if (!peekWord("new")) ++open;
    } else if (equalsWord(t.text, "end")) {
      static constexpr std::string_view kStatementEnds[] = {
          "if",        "case",  "loop",    "record",   "units", "protected",
          "component", "block", "process", "generate", "for"};
      bool statement = false;
      for (std::string_view word : kStatementEnds) statement = statement || peekWord(word);
      if (statement) {
        take();
        continue;
      }
      if (--open == 0) {
        skipPast(';');
        return true;
      }
    }
  }
  return failHere("expected 'end' of the subprogram body");
}
}  // namespace scan::vhdl
