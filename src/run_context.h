// The one object of a run: the port extractor, every option and file name, the files the run
// reads and writes, the design data, the error text and the counts. Its operations open and
// close the run's files, register design files and report messages in the program's one
// format ("pinforge:<text>" on standard output).
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>

#include "data/typed_lists.h"
#include "owned_stream.h"
#include "platform/hostkit.h"
#include "platform/scan.h"

/// Marks a name that was not given on the command line.
inline constexpr const char* kUndefinedName = "__UNDEFINED__";
/// The trace file debug mode writes in the current folder.
inline constexpr const char* kTraceFileName = "forge.deb";

class RunContext {
 public:
  enum class Severity { Error, Warning };

  RunContext();
  /// Every file still open closes with its owner: the output, error and trace files with
  /// their OutputFile members (an output that was never committed leaves no trace), the
  /// template with its stream.
  ~RunContext();
  RunContext(const RunContext&) = delete;
  RunContext& operator=(const RunContext&) = delete;

  /// Opens the "-err" file for writing (in place, like fopen "w"); the stream, or null with
  /// the reason in `error`.
  std::FILE* openErrorFile(const char* name, std::string& error);
  /// Opens the template for reading; true when it opened, else false with the reason.
  bool openTemplateFile(const char* name, std::string& error);
  /// Opens the output for writing and derives its extension; true when it opened, else false
  /// with the reason. A regular output is written beside the target and only replaces it when
  /// the run commits it (see Host::OutputFile).
  bool openOutput(const char* name, std::string& error);
  /// Opens the trace file "forge.deb" in the current folder without following a symlink.
  bool openTraceFile(std::string& error);
  /// Closes the output stream; false, after reporting "Unable to write output file ...",
  /// when any write to it failed. Every later call reports that failure again.
  bool closeOutput();
  /// Puts the closed output in place; false after reporting "Unable to replace output file
  /// ...".
  bool commitOutput();
  /// Closes the "-err" file; false, after reporting it, when a write to it failed.
  bool closeErrorFile();
  /// Closes the trace file and reports a failed write to it as an error.
  void closeTraceFile();
  /// Registers a design file under the current library; true when the file exists.
  bool registerDesignFile(const char* name);
  /// Prints "pinforge:<text>" on standard output, appends it to the error text and counts it.
  void reportMessage(std::string_view text, Severity severity);
  /// The fourteen-line diagnostic dump on standard output.
  void dumpContext() const;
  bool hasErrors() const { return m_ErrorCount != 0; }

  /// Writes the Tcl driver script for a ".tcl" template and runs the script shell on it.
  bool runTclGenerator();

  /// True when the design files are read as Verilog or SystemVerilog.
  bool isVerilog() const { return m_Language == ScanExtractor::Verilog; }
  /// The open streams of the run's files; null before they open and after they close.
  std::FILE* errorStream() const { return m_ErrorFile.stream(); }
  std::FILE* outputStream() const { return m_Output.stream(); }
  std::FILE* templateStream() const { return m_TemplateStream.get(); }
  std::FILE* debugStream() const { return m_TraceFile.stream(); }

  ScanExtractor m_Extractor;
  /// What -g, -D and -I ask of the readers; handed to the extractor before it parses.
  ScanSettings m_ScanSettings;
  ScanExtractor::Language m_Language = ScanExtractor::Vhdl;
  /// Created by the design flow once the unit is found; the expansion only borrows it.
  std::unique_ptr<StbDataList> m_DesignData;
  bool m_Debug = false;
  Host::OutputFile m_Output;
  Host::OutputFile m_ErrorFile;
  Host::OutputFile m_TraceFile;
  OwnedStream m_TemplateStream;
  /// No operation opens it; the dump shows it.
  OwnedStream m_InputStream;
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
  Host::StringBase m_ErrorText;
  uint32_t m_WarningCount = 0;
  uint32_t m_ErrorCount = 0;

 private:
  /// "Unable to <action> <what> <name>: <why>" as an error.
  void reportFileFailure(std::string_view action, std::string_view what, std::string_view name,
                         std::string_view why);
};
