// Messages of the port extractor as data: severity, place and text, printed gcc style in one
// place ("file:line:col: error: text", the source line and a caret), with a cap on how many.
#pragma once

#include <cstddef>
#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

namespace scan {

class SourceBuffer;

enum class Severity { Warning, Error };

struct Diagnostic {
  Severity severity = Severity::Error;
  const SourceBuffer* source = nullptr;  ///< null for messages about a whole file
  std::string path;                      ///< used when source is null
  size_t offset = 0;                     ///< byte offset into source
  std::string text;
};

class Diagnostics {
 public:
  /// Messages go to `out` (standard error in a run); at most `cap` are printed.
  explicit Diagnostics(std::FILE* out, size_t cap = 50);

  void report(const Diagnostic& diagnostic);
  void error(const SourceBuffer& source, size_t offset, std::string_view text);
  void warning(const SourceBuffer& source, size_t offset, std::string_view text);
  /// "file: error: text" for a design file that cannot be read at all; the path is also
  /// kept for unreadableFiles().
  void fileError(std::string_view path, std::string_view text);

  size_t errorCount() const { return m_Errors; }
  size_t warningCount() const { return m_Warnings; }
  /// The paths given to fileError, in order; a run with any of them has failed.
  const std::vector<std::string>& unreadableFiles() const { return m_UnreadableFiles; }

  /// The printed form of one message, without the cap; exposed for tests.
  static std::string format(const Diagnostic& diagnostic);

 private:
  std::FILE* m_Out;
  size_t m_Cap;
  size_t m_Printed = 0;
  size_t m_Errors = 0;
  size_t m_Warnings = 0;
  std::vector<std::string> m_UnreadableFiles;
};

}  // namespace scan
