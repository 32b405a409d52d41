// Lifecycle and error state of the template processor, and its trace output.
#include "engine/forge.h"

#include <cstdarg>

Forge::Forge(std::FILE* output, std::FILE* templateStream, std::FILE* debug, StbDataList* dataList)
    : m_Output(output),
      m_Template(templateStream),
      m_Debug(debug),
      m_DataList(dataList),
      m_Reader(templateStream) {}

Forge::~Forge() = default;

uint32_t Forge::getResult(std::string& message) const {
  message = m_Message;
  return m_Status;
}

namespace {

// Where to cut `text` so that at most `limit` bytes stay and no UTF-8 sequence is split.
size_t cutPoint(std::string_view text, size_t limit) {
  if (text.size() <= limit) return text.size();
  size_t cut = limit;
  // Back off over continuation bytes, then over the lead byte they belong to.
  size_t back = 0;
  while (cut > 0 && back < 3 && (static_cast<unsigned char>(text[cut]) & 0xC0) == 0x80) {
    --cut;
    ++back;
  }
  return cut;
}

}  // namespace

void Forge::reportError(std::string_view text) {
  if (m_Status != kStatusOk) return;
  m_Status = kStatusTemplateError;
  std::string message = "Error - Syntax error in template file line ";
  message += std::to_string(m_Reader.line());
  message += '\n';
  message += text;
  message += '\n';
  if (message.size() > kMessageCapacity) {
    // Keep the closing newline so the report still ends its line.
    message.resize(cutPoint(message, kMessageCapacity - 1));
    message += '\n';
  }
  m_Message = std::move(message);
}

void Forge::reportRangeError(const PortRecord& port) {
  if (m_Status != kStatusOk) return;
  m_Status = kStatusTemplateError;
  // Not cut to kMessageCapacity: the problem text says how to fix the design, and is needed
  // whole.
  std::string message = "Error - Template file line ";
  message += std::to_string(m_Reader.line());
  message += " needs the range of port ";
  message += port.m_Name;
  message += ", which could not be evaluated:\n";
  message += port.rangeProblem();
  message += '\n';
  m_Message = std::move(message);
}

void Forge::reportValueError(const GenericRecord& generic) {
  if (m_Status != kStatusOk) return;
  m_Status = kStatusTemplateError;
  std::string message = "Error - Template file line ";
  message += std::to_string(m_Reader.line());
  message += " needs the value of generic ";
  message += generic.m_Name;
  message += ", which has neither a default nor a -g value; give one with -g ";
  message += generic.m_Name;
  message += "=VALUE\n";
  m_Message = std::move(message);
}

void Forge::trace(const char* format, ...) const {
  if (m_Debug == nullptr) return;
  va_list args;
  va_start(args, format);
  std::vfprintf(m_Debug, format, args);
  va_end(args);
}
