// Printing is the only place that turns offsets into line:column, so lexers stay cheap.
#include "scan/common/diagnostics.h"

#include <algorithm>

#include "scan/common/source_buffer.h"

namespace scan {
namespace {

// A source line is shown around the caret only; netlists can have multi-megabyte lines.
constexpr size_t kContextWidth = 120;

const char* severityName(Severity severity) {
  return severity == Severity::Error ? "error" : "warning";
}

// Keeps a diagnostic on one terminal line whatever bytes the file holds.
void appendPrintable(std::string& out, std::string_view text) {
  for (char c : text) {
    unsigned char byte = static_cast<unsigned char>(c);
    out.push_back(byte == '\t' || (byte >= 0x20 && byte != 0x7f) ? c : '?');
  }
}

}  // namespace

Diagnostics::Diagnostics(std::FILE* out, size_t cap) : m_Out(out), m_Cap(cap) {}

std::string Diagnostics::format(const Diagnostic& d) {
  std::string out;
  if (d.source == nullptr) {
    out += d.path + ": " + severityName(d.severity) + ": ";
    appendPrintable(out, d.text);
    out += '\n';
    return out;
  }
  LineColumn where = d.source->locate(d.offset);
  out += d.source->path() + ":" + std::to_string(where.line) + ":" + std::to_string(where.column) +
         ": " + severityName(d.severity) + ": ";
  appendPrintable(out, d.text);
  out += '\n';
  std::string_view line = d.source->lineText(d.offset);
  size_t caret = where.column - 1;
  size_t start = caret > kContextWidth / 2 ? caret - kContextWidth / 2 : 0;
  start = std::min(start, line.size());
  std::string_view shown = line.substr(start, kContextWidth);
  out += "  ";
  appendPrintable(out, shown);
  out += "\n  ";
  for (size_t i = start; i < caret && i - start < shown.size(); ++i)
    out += line[i] == '\t' ? '\t' : ' ';
  out += "^\n";
  return out;
}

void Diagnostics::report(const Diagnostic& diagnostic) {
  if (diagnostic.severity == Severity::Error)
    ++m_Errors;
  else
    ++m_Warnings;
  if (m_Out == nullptr) return;
  if (m_Printed < m_Cap) {
    std::string text = format(diagnostic);
    std::fwrite(text.data(), 1, text.size(), m_Out);
  } else if (m_Printed == m_Cap) {
    std::fputs("pinforge: too many messages from the design files; the rest are not shown\n",
               m_Out);
  }
  ++m_Printed;
}

void Diagnostics::error(const SourceBuffer& source, size_t offset, std::string_view text) {
  report({Severity::Error, &source, {}, offset, std::string(text)});
}

void Diagnostics::warning(const SourceBuffer& source, size_t offset, std::string_view text) {
  report({Severity::Warning, &source, {}, offset, std::string(text)});
}

void Diagnostics::fileError(std::string_view path, std::string_view text) {
  m_UnreadableFiles.emplace_back(path);
  report({Severity::Error, nullptr, std::string(path), 0, std::string(text)});
}

}  // namespace scan
