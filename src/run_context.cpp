// The run context's own operations: opening and closing the run's files, registering design
// files, reporting messages in the program's one format and the diagnostic dump.
#include "run_context.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

#include "message_lines.h"

namespace {

void dumpLine(std::string_view label, std::string_view value) {
  std::string line(label);
  line += value;
  writeLine(stdout, line);
  std::fflush(stdout);
}

std::string_view openState(const std::FILE* stream) {
  return stream != nullptr ? "Open" : "Not Open";
}

}  // namespace

RunContext::RunContext() = default;

RunContext::~RunContext() = default;

std::FILE* RunContext::openErrorFile(const char* name, std::string& error) {
  m_ErrorFileName = std::string_view(name);
  m_ErrorFile.open(name, Host::OutputFile::Placement::InPlace, error);
  return errorStream();
}

bool RunContext::openTemplateFile(const char* name, std::string& error) {
  m_TemplateFileName = std::string_view(name);
  m_TemplateStream.reset();
  // Some systems open a directory for reading; it can never be read as a template.
  std::error_code status;
  if (std::filesystem::is_directory(name, status)) {
    error = std::strerror(EISDIR);
    return false;
  }
  // "e": the Tcl shell the run may start must not inherit the template.
  m_TemplateStream.reset(std::fopen(name, "re"));
  if (!m_TemplateStream) error = std::strerror(errno);
  return m_TemplateStream != nullptr;
}

bool RunContext::openOutput(const char* name, std::string& error) {
  m_OutputFileName = std::string_view(name);
  // The extension starts after the first dot anywhere in the name, directory part included.
  const std::string_view whole(name);
  const size_t dot = whole.find('.');
  m_OutputExt = dot == std::string_view::npos ? std::string_view() : whole.substr(dot + 1);
  return m_Output.open(name, Host::OutputFile::Placement::Replace, error);
}

bool RunContext::openTraceFile(std::string& error) {
  return m_TraceFile.open(kTraceFileName, Host::OutputFile::Placement::InPlaceNoFollow, error);
}

bool RunContext::closeOutput() {
  std::string error;
  if (m_Output.close(error)) return true;
  reportFileFailure("write", "output file", m_OutputFileName.view(), error);
  return false;
}

bool RunContext::commitOutput() {
  std::string error;
  if (m_Output.commit(error)) return true;
  reportFileFailure("replace", "output file", m_OutputFileName.view(), error);
  return false;
}

bool RunContext::closeErrorFile() {
  std::string error;
  if (errorStream() == nullptr || m_ErrorFile.close(error)) return true;
  reportFileFailure("write", "error file", m_ErrorFileName.view(), error);
  return false;
}

void RunContext::closeTraceFile() {
  std::string error;
  if (debugStream() == nullptr || m_TraceFile.close(error)) return;
  reportFileFailure("write", "trace file", kTraceFileName, error);
}

void RunContext::reportFileFailure(std::string_view action, std::string_view what,
                                   std::string_view name, std::string_view why) {
  reportMessage(fileFailureText(action, what, name, why), Severity::Error);
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
  dumpLine("FpErr         ", openState(errorStream()));
  dumpLine("FpStb         ", openState(outputStream()));
  dumpLine("FpTemplate    ", openState(templateStream()));
  dumpLine("FpInput       ", openState(m_InputStream.get()));
  dumpLine("FpDebug       ", openState(debugStream()));
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
