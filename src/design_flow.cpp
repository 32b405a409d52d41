// A run from the registered design files to the finished output: parse, look the unit up,
// prepare the header values, build the port list, then hand over to the template processor or
// to the Tcl path depending on the template's extension.
#include "design_flow.h"

#include <cstdio>
#include <new>
#include <string>
#include <string_view>
#include <vector>

#include "engine/forge.h"
#include "run_context.h"
#include "run_hints.h"

namespace {

/// The output file's last component without a trailing ".v" or ".vhd", so a generated
/// "top.vhd" is titled "top" while "top.vhdl" keeps its name.
std::string titleOf(const Host::StringBase& outputFileName) {
  std::string title = Host::FileName(outputFileName.view()).GetTail().str();
  for (std::string_view suffix : {std::string_view(".v"), std::string_view(".vhd")}) {
    if (title.ends_with(suffix)) {
      title.resize(title.size() - suffix.size());
      break;
    }
  }
  return title;
}

std::string currentDate() {
  char buffer[128];
  const std::tm now = UT_TIME::LocalTime(UT_TIME::Time());
  const size_t length = UT_TIME::StrFTime(buffer, sizeof buffer, "%H:%M:%S %m/%d/%Y", now);
  return std::string(buffer, length);
}

/// Reports each design file that could not be read as an error; true when there was none.
bool reportUnreadableFiles(RunContext& context) {
  const std::vector<std::string>& unreadable = context.m_Extractor.unreadableFiles();
  for (const std::string& file : unreadable) {
    std::string text = "Unable to read design file ";
    text += file;
    text += "; see the messages above.";
    context.reportMessage(text, RunContext::Severity::Error);
  }
  return unreadable.empty();
}

/// Reports, as a warning, the -lang the design files seem to need, if any.
void reportLanguageHint(RunContext& context) {
  const std::string hint = languageHint(context.m_Extractor.files(), context.isVerilog());
  if (!hint.empty()) context.reportMessage(hint, RunContext::Severity::Warning);
}

/// Looks the module up; when it is missing, says so with the closest names and the language
/// hint. True when found.
bool findModule(RunContext& context) {
  if (context.m_Extractor.selectDesignUnit("work", context.m_ModuleName.c_str(),
                                           ScanExtractor::SearchAllLibraries))
    return true;
  std::string text = "Declaration (Module ";
  text += context.m_ModuleName.view();
  text += ") not found.";
  context.reportMessage(text, RunContext::Severity::Error);
  const std::string hint =
      unitNotFoundHint(context.m_ModuleName.view(), context.m_Extractor.listUnits());
  if (!hint.empty()) context.reportMessage(hint, RunContext::Severity::Warning);
  reportLanguageHint(context);
  return false;
}

/// Reports each -g that names no generic of the found unit as an error, listing the unit's
/// generics; true when every -g names one. Valid after checkUnitHeader.
bool checkGenericOverrides(RunContext& context) {
  for (const std::string& name : context.m_Extractor.unknownOverrides())
    context.reportMessage(
        unknownGenericMessage(context.m_ModuleName.view(), name, context.m_Extractor.getGenerics(),
                              context.isVerilog()),
        RunContext::Severity::Error);
  return !context.hasErrors();
}

/// Opens the trace file. One that cannot be created only means the expansion runs without a
/// trace, with a warning.
void startTrace(RunContext& context) {
  std::string error;
  if (context.openTraceFile(error)) return;
  std::string text = "WARNING: Unable to open trace file ";
  text += kTraceFileName;
  text += ": ";
  text += error;
  text += "; the run goes on without it.";
  context.reportMessage(text, RunContext::Severity::Warning);
}

/// Expands a non-Tcl template with the template processor.
bool runTemplateEngine(RunContext& context) {
  Forge forge(context.outputStream(), context.templateStream(), context.debugStream(),
              context.m_DesignData.get());
  forge.setTemplateName(context.m_TemplateFileName.view());
  forge.processTemplate();
  for (const std::string& warning : forge.warnings())
    context.reportMessage("WARNING: " + warning, RunContext::Severity::Warning);
  std::string message;
  if (forge.getResult(message) != 0) {
    std::string text = "FATAL: ";
    text += message;
    text += '\n';
    context.reportMessage(text, RunContext::Severity::Error);
  }
  return !context.hasErrors();
}

/// The flow's stages in order, stopping at the first that fails.
bool runStages(RunContext& context) {
  context.m_Extractor.configure(context.m_ScanSettings);
  context.m_Extractor.Parse(context.m_Language);
  if (!reportUnreadableFiles(context) || !findModule(context)) return false;
  if (!checkUnitHeader(context)) {
    reportLanguageHint(context);
    return false;
  }
  if (!checkGenericOverrides(context)) return false;
  if (context.m_Debug) startTrace(context);
  if (!createDesignData(context) || !buildPortList(context)) return false;
  buildUnitData(context);
  if (Host::FileName(context.m_TemplateFileName.view()).GetExtension().Compare(".tcl", 0) != 0)
    return runTemplateEngine(context);
  // The Tcl script writes the output by name, so the output is put in place first.
  return context.closeOutput() && context.commitOutput() && context.runTclGenerator();
}

}  // namespace

bool runDesignFlow(RunContext& context) {
  const bool done = runStages(context);
  context.closeTraceFile();
  return done && !context.hasErrors();
}

bool checkUnitHeader(RunContext& context) {
  context.m_Extractor.getPorts();
  if (!context.m_Extractor.unitHasErrors()) return true;
  std::string text = "Errors in the declaration of ";
  text += context.m_ModuleName.view();
  text += "; see the messages above.";
  context.reportMessage(text, RunContext::Severity::Error);
  return false;
}

bool createDesignData(RunContext& context) {
  const std::string title = titleOf(context.m_OutputFileName);
  context.m_Date = Host::StringBase(currentDate());

  context.m_DesignData.reset(new (std::nothrow) StbDataList(
      context.m_ProjectName.c_str(), context.m_ModuleName.c_str(), context.m_OutputFileName.c_str(),
      context.m_OutputExt.c_str(), "pinforge", "", title.c_str(), context.m_Date.c_str()));
  if (!context.m_DesignData)
    context.reportMessage("FATAL: Unable to allocate enough memory for Forge.\n",
                          RunContext::Severity::Error);
  return !context.hasErrors();
}
