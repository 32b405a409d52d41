// Reads the template one byte at a time through the stream's own buffering. The token buffer
// is reused for every token, so reading a long template allocates only while a token outgrows
// every earlier one.
#include "engine/token_reader.h"

namespace {

bool isKeywordMark(int c) { return c == '%' || c == '@'; }

}  // namespace

std::string_view TokenReader::nextToken() {
  m_Buffer.clear();
  int c = std::getc(m_Stream);
  if (c == EOF) return m_Buffer;
  const bool keyword = isKeywordMark(c);
  for (;;) {
    if (c == '\n') ++m_Line;
    m_Buffer.push_back(static_cast<char>(c));
    c = std::getc(m_Stream);
    if (c == EOF) break;
    if (isKeywordMark(c)) {
      // A mark closes a keyword token and belongs to it; it opens the token after a text run.
      if (keyword) {
        m_Buffer.push_back(static_cast<char>(c));
      } else {
        std::ungetc(c, m_Stream);
      }
      break;
    }
  }
  return m_Buffer;
}

bool TokenReader::atEnd() const { return std::feof(m_Stream) != 0; }
