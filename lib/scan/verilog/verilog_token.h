// Tokens of the Verilog reader. A token's text points into a design file, a macro body or an
// expansion kept alive by the preprocessor; its place is always a byte offset in a real file
// (for expanded text, the place of the outermost macro use).
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace scan {
class SourceBuffer;
}

namespace scan::verilog {

enum class TokenKind : uint8_t {
  End,
  Identifier,  ///< plain or escaped (escaped ones keep their backslash)
  SystemName,  ///< $clog2, $bits, ... (text includes the dollar)
  Directive,   ///< `name (text is the name without the backquote)
  Number,
  String,  ///< text includes the quotes
  Symbol,
};

struct Token {
  TokenKind kind = TokenKind::End;
  std::string_view text;
  const SourceBuffer* source = nullptr;
  size_t offset = 0;

  bool isSymbol(std::string_view s) const { return kind == TokenKind::Symbol && text == s; }
  bool isWord(std::string_view s) const { return kind == TokenKind::Identifier && text == s; }
};

}  // namespace scan::verilog
