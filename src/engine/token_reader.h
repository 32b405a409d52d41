// Splits the template into tokens: keyword tokens run from a "%" or "@" to the next "%" or "@"
// (inclusive); text tokens are the runs between them. Counts lines for error messages.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>

class TokenReader {
 public:
  explicit TokenReader(std::FILE* stream) : m_Stream(stream) {}

  /// The next token; empty at end of file. Valid until the next call. Any byte, NUL included,
  /// is an ordinary character. A keyword token still open at end of file is returned without
  /// its closing character.
  std::string_view nextToken();
  /// The token that the last nextToken() returned (empty before the first call).
  std::string_view current() const { return m_Buffer; }
  /// 1 plus the number of newlines consumed so far.
  int32_t line() const { return m_Line; }
  /// True once a read has met the end of the stream.
  bool atEnd() const;

 private:
  std::FILE* m_Stream;
  std::string m_Buffer;
  int32_t m_Line = 1;
};
