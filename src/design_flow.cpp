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

}  // namespace

bool runDesignFlow(RunContext& context) {
  const bool done = runStages(context);
  context.closeTraceFile();
  return done && !context.hasErrors();
}

bool runStages(RunContext& context) {
  context.m_Extractor.configure(context.m_ScanSettings);
  context.m_Extractor.Parse(context.m_Language);
  if (!reportUnreadableFiles(context)) return false;
  if (context.m_Extractor.findDesignUnit("work", context.m_ModuleName.c_str(),
                                         ScanExtractor::SearchAllLibraries) != 0) {
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
  if (!checkUnitHeader(context)) {
    reportLanguageHint(context);
    return false;
  }
  if (!checkGenericOverrides(context)) return false;
  if (!prepareRun(context)) return false;
  if (!buildPortList(context)) return false;
  buildUnitData(context);
  if (Host::FileName(context.m_TemplateFileName.view()).GetExtension().Compare(".tcl", 0) == 0)
    return handOverOutput(context) && context.runTclGenerator();
  return runTemplateEngine(context);
}

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

void reportLanguageHint(RunContext& context) {
  const std::string hint =
      languageHint(context.m_Extractor.files(), context.m_Language == ScanExtractor::Verilog);
  if (!hint.empty()) context.reportMessage(hint, RunContext::Severity::Warning);
}

bool checkGenericOverrides(RunContext& context) {
  for (const std::string& name : context.m_Extractor.unknownOverrides())
    context.reportMessage(
        unknownGenericMessage(context.m_ModuleName.view(), name, context.m_Extractor.getGenerics(),
                              context.m_Verilog != 0),
        RunContext::Severity::Error);
  return !context.hasErrors();
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

bool handOverOutput(RunContext& context) {
  std::string error;
  if (!context.closeOutput(error)) {
    reportOutputFailure(context, "write", error);
    return false;
  }
  if (!context.m_Output.commit(error)) {
    reportOutputFailure(context, "replace", error);
    return false;
  }
  return true;
}

void reportOutputFailure(RunContext& context, std::string_view action, std::string_view why) {
  std::string text = "Unable to ";
  text += action;
  text += " output file ";
  text += context.m_OutputFileName.view();
  text += ": ";
  text += why;
  context.reportMessage(text, RunContext::Severity::Error);
}

bool prepareRun(RunContext& context) {
  // A trace file that cannot be created only means the expansion runs without a trace.
  if (std::string error; context.m_Debug && !context.openTraceFile(error)) {
    std::string text = "WARNING: Unable to open trace file ";
    text += kTraceFileName;
    text += ": ";
    text += error;
    text += "; the run goes on without it.";
    context.reportMessage(text, RunContext::Severity::Warning);
  }

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

bool runTemplateEngine(RunContext& context) {
  {
    Forge forge(context.m_OutputStream, context.m_TemplateStream, context.m_DebugStream,
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
    // The processor only borrows the design data; it is released before the processor goes.
    context.m_DesignData.reset();
  }
  return !context.hasErrors();
}
