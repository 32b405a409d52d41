// The Tcl path: writes a temporary driver script that defines the run's names and the port
// lists as Tcl variables, appends the Tcl template's text, and runs the script shell `runscr`
// on it.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>

#include "run_context.h"

namespace {

constexpr const char* kScriptShell = "runscr";

/// Collects what the script shell prints, so a failure can show the Tcl error to the user.
class DerivedOutput : public Host::ChildOutput {
 public:
  DerivedOutput(std::string* collected, const int32_t* stopFlag)
      : m_Collected(collected), m_StopFlag(stopFlag) {}

  bool OnOutput(const char* text) override {
    if (!m_Stopped && text != nullptr) {
      if (*m_StopFlag == 0)
        m_Collected->append(text);
      else
        m_Stopped = true;
    }
    return true;
  }
  void OnEnd() override {}

 private:
  std::string* m_Collected;
  const int32_t* m_StopFlag;
  bool m_Stopped = false;
};

/// Backslash before every character Tcl would interpret inside a double-quoted word, so any
/// name or path arrives verbatim and none can run a command.
std::string tclEscaped(std::string_view text) {
  std::string result;
  result.reserve(text.size());
  for (char c : text) {
    if (c == '\\' || c == '"' || c == '$' || c == '[' || c == ']') result += '\\';
    result += c;
  }
  return result;
}

void appendSetLine(std::string& script, std::string_view variable, const Host::StringBase& value) {
  script += "set ";
  script += variable;
  script += " \"";
  script += tclEscaped(value.view());
  script += "\"\n";
}

std::string scriptHead(const RunContext& context) {
  std::string script =
      "# This file drives input variables to the tcl template file\n"
      "#   given below in the \"source\" command.\n";
  appendSetLine(script, "ModuleName", context.m_ModuleName);
  appendSetLine(script, "ProjectName", context.m_ProjectName);
  appendSetLine(script, "ProjectFile", context.m_ProjectFileName);
  appendSetLine(script, "ProjectName", context.m_ProjectName);
  appendSetLine(script, "OutputFileName", context.m_OutputFileName);
  appendSetLine(script, "InputFileName", context.m_InputFileName);
  appendSetLine(script, "TemplateFileName", context.m_TemplateFileName);
  appendSetLine(script, "ErrorFileName", context.m_ErrorFileName);
  appendSetLine(script, "LibLocation", context.m_LibLocation);
  script += "\n# Port Definitions\n";

  std::string names = "set PortName [ list ";
  std::string lefts = "set LeftRange [ list ";
  std::string rights = "set RightRange [ list ";
  std::string dirs = "set PortDir [ list ";
  int32_t count = 0;
  StbDataList& ports = *context.m_DesignData;
  for (PortRecord* port = ports.first(); ports.hasCurrent(); port = ports.next()) {
    names += " \"" + tclEscaped(port->m_Name) + '"';
    lefts += ' ' + std::to_string(port->m_Left);
    rights += ' ' + std::to_string(port->m_Right);
    dirs += " \"";
    dirs += port->m_Dir;
    dirs += '"';
    ++count;
  }
  for (const std::string* list : {&names, &lefts, &rights, &dirs}) script += *list + " ]\n";
  script += "set TotalPorts " + std::to_string(count) + '\n';
  return script;
}

bool writeAll(std::FILE* stream, std::string_view text) {
  return std::fwrite(text.data(), 1, text.size(), stream) == text.size();
}

/// Copies the whole template, byte for byte, behind the head.
bool copyStream(std::FILE* from, std::FILE* to) {
  char buffer[8192];
  size_t got;
  while ((got = std::fread(buffer, 1, sizeof buffer, from)) > 0)
    if (std::fwrite(buffer, 1, got, to) != got) return false;
  return std::ferror(from) == 0;
}

bool isExecutableFile(const std::filesystem::path& path) {
  std::error_code error;
  const std::filesystem::file_status status = std::filesystem::status(path, error);
  using std::filesystem::perms;
  return !error && std::filesystem::is_regular_file(status) &&
         (status.permissions() & (perms::owner_exec | perms::group_exec | perms::others_exec)) !=
             perms::none;
}

bool onSearchPath(std::string_view program) {
  const char* path = std::getenv("PATH");
  if (path == nullptr) return false;
  std::string_view rest = path;
  while (true) {
    const size_t colon = rest.find(':');
    const std::string_view dir = rest.substr(0, colon);
    if (isExecutableFile(std::filesystem::path(dir.empty() ? "." : dir) / program)) return true;
    if (colon == std::string_view::npos) return false;
    rest.remove_prefix(colon + 1);
  }
}

/// A word of the command line, quoted when a blank or tab would split it.
std::string commandWord(std::string_view word) {
  if (word.find_first_of(" \t") == std::string_view::npos) return std::string(word);
  return '"' + std::string(word) + '"';
}

/// The script shell as the command line names it: from PATH when it is there, else the one
/// installed next to this program, so a fresh build runs Tcl templates without setup.
std::string scriptShellCommand() {
  if (onSearchPath(kScriptShell)) return kScriptShell;
  const std::string exeDir = Host::File::executableDirectory();
  if (exeDir.empty()) return kScriptShell;
  const std::string besideUs = exeDir + '/' + kScriptShell;
  return isExecutableFile(besideUs) ? commandWord(besideUs) : kScriptShell;
}

void reportCannotCreateScript(const std::string& scriptName) {
  std::printf("Template file = %s\n", scriptName.c_str());
  std::fflush(stdout);
  std::unique_ptr<Host_MsgManData> messages =
      Host_MsgManData::createObject("ProjectMgmt", "../src/stbparse", 330, "$Revision: 1.5 $");
  messages->issueError(
      "ERROR: ProjectMgmt(pinforge) - Unable to open temporary tcl template file\n");
}

}  // namespace

bool RunContext::runTclGenerator() {
  std::string scriptName;
  std::FILE* script = Host::File::createTemporary(".tcl", scriptName);
  if (script == nullptr) {
    reportCannotCreateScript(scriptName);
    return false;
  }
  if (!writeAll(script, scriptHead(*this))) {
    std::fclose(script);
    Host::File::remove(scriptName.c_str());
    reportCannotCreateScript(scriptName);
    return false;
  }

  std::FILE* tclTemplate = std::fopen(m_TemplateFileName.c_str(), "r");
  if (tclTemplate == nullptr) {
    std::fclose(script);
    reportMessage("ERROR: ProjectMgmt(pinforge) - Unable to open/read tcl template file\n",
                  Severity::Error);
    return false;
  }
  const bool copied = copyStream(tclTemplate, script);
  std::fclose(tclTemplate);
  if (std::fclose(script) != 0 || !copied) {
    reportMessage("ERROR: ProjectMgmt(pinforge) - Unable to open/read tcl template file\n",
                  Severity::Error);
    return false;
  }

  const std::string commandLine = scriptShellCommand() + ' ' + commandWord(scriptName);
  Host_MsgManData::debugStub(("Command line is: " + commandLine + '\n').c_str());

  std::string collected;
  int32_t stopFlag = 0;
  Host::Process process;
  const int status = process.RunNoWindow(
      commandLine.c_str(), std::make_unique<DerivedOutput>(&collected, &stopFlag), 0, true, true,
      false);
  if (status != 0) {
    std::fwrite(collected.data(), 1, collected.size(), stderr);
    reportMessage("ERROR: ProjectMgmt(pinforge)  Unable to invoke tcl file generator\n",
                  Severity::Error);
    return false;
  }

  if (!m_Debug) Host::File::remove(scriptName.c_str());
  m_DesignData.reset();
  return !hasErrors();
}
