// Splits the template into tokens: keyword tokens run from a "%" or "@" to the next "%" or "@"
// (inclusive); text tokens are the runs between them. Counts lines for error messages.
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>

class TokenReader {
 public:
  /// The longest token the reader collects; a template cannot make it hold more.
  static constexpr size_t kMaxTokenSize = 16 * 1024 * 1024;

  explicit TokenReader(std::FILE* stream) : m_Stream(stream) {}

  /// The next token; empty at end of file. Valid until the next call. Any byte, NUL included,
  /// is an ordinary character. A keyword token still open at end of file is returned without
  /// its closing character.
  std::string_view nextToken();
  /// The token that the last nextToken() returned (empty before the first call).
  std::string_view current() const { return m_Buffer; }
  /// 1 plus the number of newlines consumed so far.
  int32_t line() const { return m_Line; }
  /// True once a read has met the end of the stream (a read that needed one more byte and
  /// found none), as the stream's own end-of-file indicator would be.
  bool atEnd() const { return m_AtEnd; }
  /// True when the last token was cut short after passing kMaxTokenSize bytes; the reader is
  /// then of no further use.
  bool tooLong() const { return m_TooLong; }

 private:
  /// Makes at least one unread byte available; false at the end of the stream.
  bool fill();
  /// Moves the unread bytes up to (not including) the next "%" or "@" into the token.
  void takeRun();

  static constexpr size_t kChunkSize = 64 * 1024;

  std::FILE* m_Stream;
  std::string m_Buffer;
  int32_t m_Line = 1;
  std::unique_ptr<char[]> m_Chunk;
  size_t m_Position = 0;
  size_t m_Filled = 0;
  bool m_AtEnd = false;
  bool m_TooLong = false;
};
