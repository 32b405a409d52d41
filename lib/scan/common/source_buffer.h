// A design file's bytes, mapped once and kept for the whole run. The text is always followed
// by a NUL byte so lexers can look one byte ahead without bounds checks; locations are byte
// offsets, turned into line and column only when a message is printed.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace scan {

struct LineColumn {
  size_t line = 1;    ///< 1-based
  size_t column = 1;  ///< 1-based, counted in bytes
};

class SourceBuffer {
 public:
  /// Maps `path` read-only. Returns null and sets `error` on failure: the system's reason, or
  /// "is a directory" / "not a regular file" for anything but a regular file (a FIFO, a
  /// device), which is refused without being opened for reading.
  static std::unique_ptr<SourceBuffer> open(const std::string& path, std::string& error);
  /// A buffer over text held in memory (preprocessed text, tests, fuzzing).
  static std::unique_ptr<SourceBuffer> fromText(std::string path, std::string text);

  ~SourceBuffer();
  SourceBuffer(const SourceBuffer&) = delete;
  SourceBuffer& operator=(const SourceBuffer&) = delete;

  const std::string& path() const { return m_Path; }
  /// The file's bytes; `text().data()[text().size()]` is always '\0'.
  std::string_view text() const { return {m_Data, m_Size}; }
  const char* begin() const { return m_Data; }
  const char* end() const { return m_Data + m_Size; }

  /// Line and column of a byte offset (offsets past the end clamp to the end).
  LineColumn locate(size_t offset) const;
  /// The whole line holding `offset`, without its line end.
  std::string_view lineText(size_t offset) const;

 private:
  SourceBuffer() = default;
  void buildLineIndex() const;

  std::string m_Path;
  const char* m_Data = "";
  size_t m_Size = 0;
  void* m_Mapping = nullptr;
  size_t m_MappingSize = 0;
  std::string m_Owned;
  mutable std::vector<size_t> m_LineStarts;  // built on the first locate()
};

/// Line numbers of offsets, counted forward from the last question so that the ports of a
/// unit at the end of a large file cost one pass over it and no line table.
class LineCounter {
 public:
  /// The 1-based line of `offset` in `source` (offsets past the end clamp to the end).
  size_t lineOf(const SourceBuffer& source, size_t offset);

 private:
  const SourceBuffer* m_Source = nullptr;
  size_t m_Offset = 0;
  size_t m_Line = 1;
};

}  // namespace scan
