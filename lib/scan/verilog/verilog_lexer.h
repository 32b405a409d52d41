// The Verilog lexer: turns a run of text into tokens, skipping white space, comments and
// attributes. It knows nothing of directives beyond recognising `name; the preprocessor reads
// directive arguments through the raw-text helpers.
#pragma once

#include <string_view>

#include "scan/verilog/verilog_token.h"

namespace scan {
class Diagnostics;
}

namespace scan::verilog {

class Lexer {
 public:
  /// Lexes [begin, end); *end must be readable (a NUL sentinel). Tokens are placed at their
  /// own offset in `file` when `fixedOffset` is npos, else all at `fixedOffset` (macro text).
  Lexer(const char* begin, const char* end, const SourceBuffer* file, size_t fixedOffset,
        Diagnostics* diagnostics);

  /// The next token; kind End at the end of the text.
  void next(Token& token);

  /// In coarse mode the lexer passes over punctuation, numbers, system names, escaped
  /// identifiers and identifiers that cannot be keywords without returning them: enough for
  /// the index pass, which only looks for keywords, `;`, `:`, `@`, strings and directives.
  void setCoarse(bool coarse) { m_Coarse = coarse; }

  /// Raw access for directives: the current position and the end of the text.
  const char* position() const { return m_Pos; }
  const char* end() const { return m_End; }
  void setPosition(const char* p) { m_Pos = p; }
  /// The file offset a raw position reports at.
  size_t offsetOf(const char* p) const;
  const SourceBuffer* file() const { return m_File; }
  bool inMacroText() const { return m_Fixed != npos; }

  static constexpr size_t npos = static_cast<size_t>(-1);

 private:
  void error(const char* at, std::string_view text);
  const char* skipBlanks(const char* p);
  const char* skipIrrelevant(const char* p);
  const char* lexNumber(const char* p);
  const char* lexBasedDigits(const char* p);

  const char* m_Begin;
  const char* m_Pos;
  const char* m_End;
  const SourceBuffer* m_File;
  size_t m_Fixed;
  Diagnostics* m_Diagnostics;
  bool m_Coarse = false;
};

/// Character classes shared by the lexer and the preprocessor.
bool isIdentifierStart(char c);
bool isIdentifierChar(char c);
bool isBlank(char c);  ///< white space that ends an escaped identifier

}  // namespace scan::verilog
