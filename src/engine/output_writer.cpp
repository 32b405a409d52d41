// The single path to the output: copies text through the stream's buffer, keeps the output
// column, drops newlines and tabs of template text on request, and breaks lines after the
// signal delimiter once the column has passed the line width.
#include "engine/forge.h"

namespace {

// Writes `run` and updates `column` as one character at a time would. False on a failed write.
bool writeRun(std::FILE* out, std::string_view run, uint32_t& column) {
  if (run.empty()) return true;
  const size_t written = std::fwrite(run.data(), 1, run.size(), out);
  const std::string_view done = run.substr(0, written);
  const size_t lastNewline = done.rfind('\n');
  if (lastNewline == std::string_view::npos) {
    column += static_cast<uint32_t>(done.size());
  } else {
    column = static_cast<uint32_t>(done.size() - lastNewline - 1);
  }
  return written == run.size();
}

}  // namespace

bool Forge::writeText(std::string_view text, bool suppress) {
  bool ok = true;
  if (suppress) {
    size_t start = 0;
    while (ok && start <= text.size()) {
      const size_t stop = text.find_first_of("\n\t", start);
      const size_t end = stop == std::string_view::npos ? text.size() : stop;
      ok = writeRun(m_Output, text.substr(start, end - start), m_Column);
      start = end + 1;
    }
  } else {
    ok = writeRun(m_Output, text, m_Column);
  }
  if (text == m_SigDelim && static_cast<int32_t>(m_Column) > m_OutLineWidth) {
    if (!ok) return true;
    ok = writeRun(m_Output, m_EolDelim, m_Column);
  }
  return !ok;
}

std::string Forge::makeVariableToken(std::string_view word) {
  std::string token;
  token.reserve(word.size() + 2);
  token += '%';
  token += word;
  token += '%';
  return token;
}

const std::string& Forge::displayName(const PortRecord& port) const {
  if (m_Map && port.m_MappedName.has_value()) return *port.m_MappedName;
  return port.m_Name;
}
