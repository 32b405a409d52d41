// The Tcl path: writes a temporary driver script that defines the run's names and the design
// data (ports, generics, declared types, context) as Tcl variables, appends the Tcl template's
// text, and runs the script shell `runscr` on it, found beside this program or else on PATH.
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>

#include "message_lines.h"
#include "owned_stream.h"
#include "run_context.h"
#include "tcl_driver_script.h"

namespace {

constexpr const char* kScriptShell = "runscr";

/// Keeps the end of what the script shell prints, so a failure can show the Tcl error without
/// holding the whole output of a script that prints without end.
class OutputTail : public Host::ChildOutput {
 public:
  static constexpr size_t kKeptBytes = 64 * 1024;

  explicit OutputTail(std::string& tail) : m_Tail(tail) {}

  bool OnOutput(std::string_view text) override {
    m_Tail.append(text.substr(text.size() > kKeptBytes ? text.size() - kKeptBytes : 0));
    m_Seen += text.size();
    if (m_Tail.size() > kKeptBytes) m_Tail.erase(0, m_Tail.size() - kKeptBytes);
    return true;
  }
  /// How many bytes of the output are no longer kept.
  size_t dropped() const { return m_Seen - m_Tail.size(); }

 private:
  std::string& m_Tail;
  size_t m_Seen = 0;
};

/// Backslash before every character Tcl would interpret inside a double-quoted word, so any
/// name or path arrives verbatim and none can run a command. A carriage return and ^Z are
/// written as escapes: Tcl reads a script file with CR/LF translation and ends it at a ^Z.
std::string tclEscaped(std::string_view text) {
  std::string result;
  result.reserve(text.size());
  for (char c : text) {
    if (c == '\r') {
      result += "\\r";
      continue;
    }
    if (c == '\x1a') {
      result += "\\032";
      continue;
    }
    if (c == '\\' || c == '"' || c == '$' || c == '[' || c == ']') result += '\\';
    result += c;
  }
  return result;
}

void appendSetLine(std::string& script, std::string_view variable, std::string_view value) {
  script += "set ";
  script += variable;
  script += " \"";
  script += tclEscaped(value);
  script += "\"\n";
}

/// " \"text\"": one list item, escaped.
std::string quotedItem(std::string_view text) { return " \"" + tclEscaped(text) + '"'; }

/// One bound as a list item: empty when the range could not be evaluated, so a template that
/// computes with it fails instead of using a wrong width.
std::string boundItem(const PortRecord& port, int32_t bound) {
  return port.isRangeUnknown() ? std::string(" \"\"") : ' ' + std::to_string(bound);
}

std::string listLine(std::string_view variable, const std::string& items) {
  std::string line = "set ";
  line += variable;
  line += " [ list " + items + " ]\n";
  return line;
}

/// The generics, the declared port types, the context and the language, behind everything
/// the script held before them.
std::string designDetails(StbDataList& design) {
  std::string names;
  std::string types;
  std::string defaults;
  std::string values;
  for (const GenericRecord& generic : design.m_Generics) {
    names += quotedItem(generic.m_Name);
    types += quotedItem(generic.m_Type);
    defaults += quotedItem(generic.m_Default);
    values += quotedItem(generic.m_Value);
  }
  std::string portTypes;
  for (PortRecord* port = design.first(); design.hasCurrent(); port = design.next())
    portTypes += quotedItem(port->m_DeclaredType);

  std::string text = "\n# Generic Definitions\n";
  text += listLine("GenericName", names);
  text += listLine("GenericType", types);
  text += listLine("GenericDefault", defaults);
  text += listLine("GenericValue", values);
  text += "set TotalGenerics " + std::to_string(design.m_Generics.size()) + '\n';
  text += "\n# Declared Types and Context\n";
  text += listLine("PortType", portTypes);
  appendSetLine(text, "Context", design.m_Context);
  appendSetLine(text, "Language",
                design.m_Language == DesignLanguage::Verilog ? "verilog" : "vhdl");
  return text;
}

bool writeAll(std::FILE* stream, std::string_view text) {
  return std::fwrite(text.data(), 1, text.size(), stream) == text.size();
}

/// Copies the whole Tcl template, byte for byte, behind the script's head; false when it
/// cannot be read or the script cannot be written.
bool appendTemplate(const char* name, std::FILE* script) {
  const OwnedStream from(std::fopen(name, "re"));
  if (!from) return false;
  char buffer[8192];
  size_t got;
  while ((got = std::fread(buffer, 1, sizeof buffer, from.get())) > 0)
    if (std::fwrite(buffer, 1, got, script) != got) return false;
  return std::ferror(from.get()) == 0;
}

/// The script's path in a form no program can read as an option: a relative $TMPDIR such as
/// "-x" would otherwise make "-x/pinforge-....tcl".
std::string unambiguousPath(const std::string& name) {
  if (std::filesystem::path(name).is_absolute()) return name;
  std::error_code error;
  const std::filesystem::path absolute = std::filesystem::absolute(name, error);
  if (!error && absolute.is_absolute()) return absolute.string();
  return "./" + name;
}

/// Removes the script and stops watching it.
void discardScript(const std::string& name) {
  Host::File::remove(name.c_str());
  Host::Interrupt::forget(name);
}

}  // namespace

std::string tclDriverScriptHead(const RunContext& context) {
  std::string script =
      "# This file drives input variables to the tcl template file\n"
      "#   given below in the \"source\" command.\n";
  appendSetLine(script, "ModuleName", context.m_ModuleName.view());
  appendSetLine(script, "ProjectName", context.m_ProjectName.view());
  appendSetLine(script, "ProjectFile", context.m_ProjectFileName.view());
  appendSetLine(script, "ProjectName", context.m_ProjectName.view());
  appendSetLine(script, "OutputFileName", context.m_OutputFileName.view());
  appendSetLine(script, "InputFileName", context.m_InputFileName.view());
  appendSetLine(script, "TemplateFileName", context.m_TemplateFileName.view());
  appendSetLine(script, "ErrorFileName", context.m_ErrorFileName.view());
  appendSetLine(script, "LibLocation", context.m_LibLocation.view());
  script += "\n# Port Definitions\n";

  std::string names;
  std::string lefts;
  std::string rights;
  std::string dirs;
  int32_t count = 0;
  StbDataList& ports = *context.m_DesignData;
  for (PortRecord* port = ports.first(); ports.hasCurrent(); port = ports.next()) {
    names += quotedItem(port->m_Name);
    lefts += boundItem(*port, port->m_Left);
    rights += boundItem(*port, port->m_Right);
    dirs += " \"";
    dirs += port->m_Dir;
    dirs += '"';
    ++count;
  }
  script += listLine("PortName", names);
  script += listLine("LeftRange", lefts);
  script += listLine("RightRange", rights);
  script += listLine("PortDir", dirs);
  script += "set TotalPorts " + std::to_string(count) + '\n';
  return script + designDetails(ports);
}

bool RunContext::runTclGenerator() {
  // A signal from here on removes the script and stops the script shell.
  Host::Interrupt::install();
  std::string scriptName;
  OwnedStream script(Host::File::createTemporary(".tcl", scriptName));
  if (!script) {
    const int error = errno;
    reportMessage("ERROR: ProjectMgmt(pinforge) - Unable to create the temporary tcl script in " +
                      Host::File::temporaryDirectory() + ": " + std::strerror(error),
                  Severity::Error);
    return false;
  }
  scriptName = unambiguousPath(scriptName);
  Host::Interrupt::removeOnSignal(scriptName);
  if (!writeAll(script.get(), tclDriverScriptHead(*this))) {
    const int error = errno;
    script.reset();
    discardScript(scriptName);
    reportMessage("ERROR: ProjectMgmt(pinforge) - Unable to write the temporary tcl script " +
                      scriptName + ": " + std::strerror(error),
                  Severity::Error);
    return false;
  }

  const bool copied = appendTemplate(m_TemplateFileName.c_str(), script.get());
  if (std::fclose(script.release()) != 0 || !copied) {
    discardScript(scriptName);
    reportMessage("ERROR: ProjectMgmt(pinforge) - Unable to open/read tcl template file\n",
                  Severity::Error);
    return false;
  }

  const std::string shell = Host::Process::findProgram(kScriptShell);
  Host_MsgManData::debugStub(("Command line is: " + shell + ' ' + scriptName + '\n').c_str());
  std::string tail;
  OutputTail receiver(tail);
  const int status = shell.empty() ? -1 : Host::Process::run({shell, scriptName}, &receiver);
  if (status != 0) {
    // The script stays for inspection.
    Host::Interrupt::forget(scriptName);
    if (shell.empty())
      reportMessage(
          "ERROR: ProjectMgmt(pinforge) - The script shell runscr is neither beside "
          "pinforge nor in a folder on PATH",
          Severity::Error);
    if (receiver.dropped() != 0)
      writeLine(stderr, "[... " + std::to_string(receiver.dropped()) +
                            " earlier bytes of the script's output not shown ...]");
    writeText(stderr, tail);
    reportMessage("ERROR: ProjectMgmt(pinforge)  Unable to invoke tcl file generator\n",
                  Severity::Error);
    return false;
  }

  if (m_Debug)
    Host::Interrupt::forget(scriptName);
  else
    discardScript(scriptName);
  return !hasErrors();
}
