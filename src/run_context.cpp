// The run context's own operations: opening the run's files, registering design files,
// reporting messages in the program's one format and the diagnostic dump.
#include "run_context.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

namespace {

void closeIfOpen(std::FILE*& stream) {
  if (stream != nullptr) std::fclose(stream);
  stream = nullptr;
}

void writeText(std::FILE* stream, std::string_view text) {
  std::fwrite(text.data(), 1, text.size(), stream);
}

void dumpLine(std::string_view label, std::string_view value) {
  writeText(stdout, label);
  writeText(stdout, value);
  writeText(stdout, "\n");
  std::fflush(stdout);
}

std::string_view openState(const std::FILE* stream) {
  return stream != nullptr ? "Open" : "Not Open";
}

}  // namespace

RunContext::RunContext() = default;

RunContext::~RunContext() {
  closeIfOpen(m_InputStream);
  closeIfOpen(m_TemplateStream);
}

std::FILE* RunContext::openErrorFile(const char* name, std::string& error) {
  m_ErrorFileName = std::string_view(name);
  m_ErrorStream = nullptr;
  if (m_ErrorFile.open(name, Host::OutputFile::Placement::InPlace, error))
    m_ErrorStream = m_ErrorFile.stream();
  return m_ErrorStream;
}

bool RunContext::openTemplateFile(const char* name, std::string& error) {
  m_TemplateFileName = std::string_view(name);
  closeIfOpen(m_TemplateStream);
  // Some systems open a directory for reading; it can never be read as a template.
  std::error_code status;
  if (std::filesystem::is_directory(name, status)) {
    error = std::strerror(EISDIR);
    return false;
  }
  // "e": the Tcl shell the run may start must not inherit the template.
  m_TemplateStream = std::fopen(name, "re");
  if (m_TemplateStream == nullptr) error = std::strerror(errno);
  return m_TemplateStream != nullptr;
}

bool RunContext::openOutput(const char* name, std::string& error) {
  m_OutputFileName = std::string_view(name);
  // The extension starts after the first dot anywhere in the name, directory part included.
  const std::string_view whole(name);
  const size_t dot = whole.find('.');
  m_OutputExt = dot == std::string_view::npos ? std::string_view() : whole.substr(dot + 1);
  m_OutputStream = nullptr;
  if (m_Output.open(name, Host::OutputFile::Placement::Replace, error))
    m_OutputStream = m_Output.stream();
  return m_OutputStream != nullptr;
}

bool RunContext::openTraceFile(std::string& error) {
  m_DebugStream = nullptr;
  if (m_TraceFile.open(kTraceFileName, Host::OutputFile::Placement::InPlaceNoFollow, error))
    m_DebugStream = m_TraceFile.stream();
  return m_DebugStream != nullptr;
}

bool RunContext::closeOutput(std::string& error) {
  m_OutputStream = nullptr;
  return m_Output.close(error);
}

void RunContext::closeTraceFile() {
  if (m_DebugStream == nullptr) return;
  m_DebugStream = nullptr;
  std::string error;
  if (!m_TraceFile.close(error)) {
    std::string text = "Unable to write trace file ";
    text += kTraceFileName;
    text += ": ";
    text += error;
    reportMessage(text, Severity::Error);
  }
}

bool RunContext::registerDesignFile(const char* name) {
  m_Extractor.addDesignFile(m_LibraryName.c_str(), name, m_Language);
  m_InputFileName = std::string_view(name);
  return Host::File::isfile(name);
}

void RunContext::reportMessage(std::string_view text, Severity severity) {
  std::string line = "pinforge:";
  line += text;
  line += '\n';
  if (severity == Severity::Error)
    ++m_ErrorCount;
  else
    ++m_WarningCount;
  m_ErrorText += line;
  writeText(stdout, line);
}

void RunContext::dumpContext() const {
  dumpLine("FpErr         ", openState(m_ErrorStream));
  dumpLine("FpStb         ", openState(m_OutputStream));
  dumpLine("FpTemplate    ", openState(m_TemplateStream));
  dumpLine("FpInput       ", openState(m_InputStream));
  dumpLine("FpDebug       ", openState(m_DebugStream));
  dumpLine("Module        ", m_ModuleName.view());
  dumpLine("Project       ", m_ProjectName.view());
  dumpLine("Output Ext    ", m_OutputExt.view());
  dumpLine("Output File   ", m_OutputFileName.view());
  dumpLine("Library       ", m_LibraryName.view());
  dumpLine("Input File    ", m_InputFileName.view());
  dumpLine("Template File ", m_TemplateFileName.view());
  dumpLine("Error File    ", m_ErrorFileName.view());
  dumpLine("Date          ", m_Date.view());
}
