// The one object of a run: the port extractor, every option and file name, the streams, the
// design data, the port-list builder's scratch fields, the error text and the counts. Its
// operations open the run's files, register design files and report messages in the
// program's one format ("pinforge:<text>" on standard output).
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string_view>

#include "data/typed_lists.h"
#include "platform/hostkit.h"
#include "platform/scan.h"

/// Marks a name that was not given on the command line.
inline constexpr const char* kUndefinedName = "__UNDEFINED__";

class RunContext {
 public:
  enum class Severity { Error, Warning };

  RunContext();
  /// Closes every stream the context still holds. Code that closes one of them earlier (the
  /// entry point closes the output and error streams) resets the field to null.
  ~RunContext();
  RunContext(const RunContext&) = delete;
  RunContext& operator=(const RunContext&) = delete;

  /// Opens the "-err" file for writing; the stream, or null when it cannot be opened.
  std::FILE* openErrorFile(const char* name);
  /// Opens the template for reading; true when it opened.
  bool openTemplateFile(const char* name);
  /// Opens the output for writing and derives its extension; true when it opened.
  bool openOutput(const char* name);
  /// Registers a design file under the current library; true when the file exists.
  bool registerDesignFile(const char* name);
  /// Prints "pinforge:<text>" on standard output, appends it to the error text and counts it.
  void reportMessage(std::string_view text, Severity severity);
  /// The fourteen-line diagnostic dump on standard output.
  void dumpContext() const;
  bool hasErrors() const { return m_ErrorCount != 0; }

  /// Writes the Tcl driver script for a ".tcl" template and runs the script shell on it.
  bool runTclGenerator();

  ScanExtractor m_Extractor;
  int32_t m_Verilog = 0;
  ScanExtractor::Language m_Language = ScanExtractor::Vhdl;
  std::unique_ptr<StbDataList> m_DesignData;
  bool m_Debug = false;
  bool m_NoList = false;
  std::FILE* m_ErrorStream = nullptr;
  std::FILE* m_OutputStream = nullptr;
  std::FILE* m_TemplateStream = nullptr;
  std::FILE* m_InputStream = nullptr;
  std::FILE* m_DebugStream = nullptr;
  Host::StringBase m_ModuleName{kUndefinedName};
  Host::StringBase m_ProjectName{kUndefinedName};
  Host::StringBase m_ProjectFileName;
  Host::StringBase m_OutputExt{kUndefinedName};
  Host::StringBase m_OutputFileName{kUndefinedName};
  Host::StringBase m_LibraryName{"work"};
  Host::StringBase m_InputFileName{kUndefinedName};
  Host::StringBase m_TemplateFileName{kUndefinedName};
  Host::StringBase m_ErrorFileName{kUndefinedName};
  Host::StringBase m_Date;
  Host::StringBase m_LibLocation;
  Host::StringBase m_CurrentPortName;
  int32_t m_CurrentPortDir = -1;
  Host::StringBase m_CurrentPortType;
  int32_t m_CurrentLeft = -1;
  int32_t m_CurrentRangeKind = 0;
  int32_t m_CurrentRight = -1;
  Host::StringBase m_ErrorText;
  uint32_t m_WarningCount = 0;
  uint32_t m_ErrorCount = 0;
};
