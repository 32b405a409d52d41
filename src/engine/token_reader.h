// Splits the template into tokens: keyword tokens run from a "%" or "@" to the next "%" or "@"
// (inclusive); text tokens are the runs between them. Counts lines for error messages.
#pragma once

#include <cstdio>
#include <string>
#include <string_view>

class TokenReader {
 public:
  explicit TokenReader(std::FILE* stream) : m_Stream(stream) {}

  /// The next token; empty at end of file. Valid until the next call. Any byte, NUL included,
  /// is an ordinary character.
  std::string_view nextToken();
  /// 1 plus the number of newlines consumed so far.
  int32_t line() const { return m_Line; }
  /// True once a read has met the end of the stream.
  bool atEnd() const;

 private:
  std::FILE* m_Stream;
  std::string m_Buffer;
  int32_t m_Line = 1;
};
