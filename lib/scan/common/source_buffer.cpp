// Platform-independent parts of SourceBuffer: in-memory buffers and offset → line:column.
#include <algorithm>
#include <cstring>

#include "scan/common/source_buffer.h"

namespace scan {

std::unique_ptr<SourceBuffer> SourceBuffer::fromText(std::string path, std::string text) {
  std::unique_ptr<SourceBuffer> buffer(new SourceBuffer);
  buffer->m_Path = std::move(path);
  buffer->m_Owned = std::move(text);  // std::string keeps a NUL after its last byte
  buffer->m_Data = buffer->m_Owned.c_str();
  buffer->m_Size = buffer->m_Owned.size();
  return buffer;
}

void SourceBuffer::buildLineIndex() const {
  m_LineStarts.push_back(0);
  for (size_t i = 0; i < m_Size; ++i)
    if (m_Data[i] == '\n') m_LineStarts.push_back(i + 1);
}

LineColumn SourceBuffer::locate(size_t offset) const {
  if (m_LineStarts.empty()) buildLineIndex();
  offset = std::min(offset, m_Size);
  auto after = std::upper_bound(m_LineStarts.begin(), m_LineStarts.end(), offset);
  size_t line = static_cast<size_t>(after - m_LineStarts.begin());
  return {line, offset - m_LineStarts[line - 1] + 1};
}

std::string_view SourceBuffer::lineText(size_t offset) const {
  LineColumn where = locate(offset);
  size_t start = m_LineStarts[where.line - 1];
  size_t stop = start;
  while (stop < m_Size && m_Data[stop] != '\n') ++stop;
  if (stop > start && m_Data[stop - 1] == '\r') --stop;
  return {m_Data + start, stop - start};
}

size_t LineCounter::lineOf(const SourceBuffer& source, size_t offset) {
  offset = std::min(offset, source.text().size());
  if (m_Source != &source || offset < m_Offset) {
    m_Source = &source;
    m_Offset = 0;
    m_Line = 1;
  }
  const char* p = source.begin() + m_Offset;
  const char* end = source.begin() + offset;
  while (p < end) {
    const void* nl = std::memchr(p, '\n', static_cast<size_t>(end - p));
    if (!nl) break;
    ++m_Line;
    p = static_cast<const char*>(nl) + 1;
  }
  m_Offset = offset;
  return m_Line;
}

}  // namespace scan
