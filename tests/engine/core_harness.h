// Test rig for the template engine: a Forge over temporary files and a hand-built design.
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

inline File fileWith(std::string_view text) {
  File file(std::tmpfile());
  std::fwrite(text.data(), 1, text.size(), file.get());
  std::rewind(file.get());
  return file;
}

inline std::string contentsOf(std::FILE* file) {
  std::fflush(file);
  std::string text(static_cast<size_t>(std::ftell(file)), '\0');
  std::rewind(file);
  text.resize(std::fread(text.data(), 1, text.size(), file));
  return text;
}

struct Port {
  const char* name;
  int left;
  int right;
  char dir;
};

/// A processor over `templateText`; tracing when `withTrace`. Module "Top_Level2", ext "txt".
class Rig {
 public:
  explicit Rig(std::string_view templateText, const std::vector<Port>& ports = {},
               bool withTrace = false)
      : m_Template(fileWith(templateText)),
        m_Output(std::tmpfile()),
        m_Trace(withTrace ? std::tmpfile() : nullptr),
        m_Data("proj", "Top_Level2", "top_pins", "txt", "pinforge", "", "top", "today"),
        forge(m_Output.get(), m_Template.get(), m_Trace.get(), &m_Data) {
    for (const Port& p : ports) m_Data.appendOwned(new PortRecord(p.name, p.left, p.right, p.dir));
  }

  std::string output() const { return contentsOf(m_Output.get()); }
  std::string trace() const { return contentsOf(m_Trace.get()); }
  std::string message() const {
    std::string text;
    forge.getResult(text);
    return text;
  }

 private:
  File m_Template;
  File m_Output;
  File m_Trace;
  StbDataList m_Data;

 public:
  Forge forge;
};

inline std::string errorAt(int line, std::string_view text) {
  return "Error - Syntax error in template file line " + std::to_string(line) + "\n" +
         std::string(text) + "\n";
}

inline constexpr const char* kNoErrors = "No errors or warnings";

}  // namespace enginetest
