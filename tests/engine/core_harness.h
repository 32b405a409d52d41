// Test rig for the template engine: a Forge over temporary files and a small hand-built design,
// with helpers to run a template and read back the output, the trace and the result.
#pragma once

#include <cstdio>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "data/typed_lists.h"
#include "engine/forge.h"

namespace enginetest {

struct FileCloser {
  void operator()(std::FILE* f) const { std::fclose(f); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

/// A temporary file holding `text` (any bytes), positioned at its start.
inline File fileWith(std::string_view text) {
  File file(std::tmpfile());
  std::fwrite(text.data(), 1, text.size(), file.get());
  std::rewind(file.get());
  return file;
}

/// Everything written to `file` so far.
inline std::string contentsOf(std::FILE* file) {
  std::fflush(file);
  const long end = std::ftell(file);
  std::string text(static_cast<size_t>(end), '\0');
  std::rewind(file);
  const size_t got = std::fread(text.data(), 1, text.size(), file);
  text.resize(got);
  std::fseek(file, 0, SEEK_END);
  return text;
}

struct Port {
  const char* name;
  int left;
  int right;
  char dir;
};

/// The header values every rig carries.
inline constexpr const char* kProject = "proj";
inline constexpr const char* kModule = "Top_Level2";
inline constexpr const char* kFileName = "top_pins";
inline constexpr const char* kExt = "txt";
inline constexpr const char* kTool = "pinforge";
inline constexpr const char* kTitle = "top";
inline constexpr const char* kDate = "Sun Dec 06 10:00:00 2026";

/// A processor over `templateText` with the given ports; tracing when `withTrace`.
class Rig {
 public:
  explicit Rig(std::string_view templateText, const std::vector<Port>& ports = {},
               bool withTrace = false)
      : m_Template(fileWith(templateText)),
        m_Output(std::tmpfile()),
        m_Trace(withTrace ? std::tmpfile() : nullptr),
        m_Data(kProject, kModule, kFileName, kExt, kTool, "", kTitle, kDate),
        forge(m_Output.get(), m_Template.get(), m_Trace.get(), &m_Data) {
    for (const Port& p : ports) m_Data.appendOwned(new PortRecord(p.name, p.left, p.right, p.dir));
  }

  std::string output() const { return contentsOf(m_Output.get()); }
  std::string trace() const { return m_Trace ? contentsOf(m_Trace.get()) : std::string(); }
  std::string message() const {
    std::string text;
    forge.getResult(text);
    return text;
  }
  StbDataList& data() { return m_Data; }

 private:
  File m_Template;
  File m_Output;
  File m_Trace;
  StbDataList m_Data;

 public:
  Forge forge;
};

/// The recorded message of a template error on `line`.
inline std::string errorAt(int line, std::string_view text) {
  return "Error - Syntax error in template file line " + std::to_string(line) + "\n" +
         std::string(text) + "\n";
}

inline constexpr const char* kNoErrors = "No errors or warnings";

}  // namespace enginetest
