// Reads the template in large blocks and cuts tokens out of them with one scan per run of
// text, so the cost per byte stays small. The token buffer is reused for every token and
// allocates only while a token outgrows every earlier one.
#include "engine/token_reader.h"

#include <algorithm>

namespace {

bool isKeywordMark(char c) { return c == '%' || c == '@'; }

}  // namespace

bool TokenReader::fill() {
  if (m_Position < m_Filled) return true;
  if (m_AtEnd) return false;
  if (!m_Chunk) m_Chunk = std::make_unique<char[]>(kChunkSize);
  m_Position = 0;
  m_Filled = std::fread(m_Chunk.get(), 1, kChunkSize, m_Stream);
  if (m_Filled == 0) m_AtEnd = true;
  return m_Filled > 0;
}

void TokenReader::takeRun() {
  const char* begin = m_Chunk.get() + m_Position;
  const char* end = m_Chunk.get() + m_Filled;
  const char* stop = std::find_if(begin, end, isKeywordMark);
  m_Line += static_cast<int32_t>(std::count(begin, stop, '\n'));
  m_Buffer.append(begin, stop);
  m_Position += static_cast<size_t>(stop - begin);
}

std::string_view TokenReader::nextToken() {
  m_Buffer.clear();
  if (!fill()) return m_Buffer;
  const char first = m_Chunk[m_Position++];
  if (first == '\n') ++m_Line;
  m_Buffer.push_back(first);
  const bool keyword = isKeywordMark(first);
  while (fill()) {
    takeRun();
    if (m_Buffer.size() > kMaxTokenSize) {
      m_TooLong = true;
      break;
    }
    if (m_Position < m_Filled) {
      // A mark closes a keyword token and belongs to it; after text it opens the next token.
      if (keyword) m_Buffer.push_back(m_Chunk[m_Position++]);
      break;
    }
  }
  return m_Buffer;
}
