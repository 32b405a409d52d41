// Platform-independent parts of SourceBuffer: in-memory buffers and offset → line:column.
#include <algorithm>

#include "platform/scan/common/source_buffer.h"

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

}  // namespace scan
