// A run from the registered design files to the finished output: parse, look the unit up,
// prepare the header values, build the port list, then hand over to the template processor or
// to the Tcl path depending on the template's extension.
#include "design_flow.h"

#include <cstdio>
#include <new>
#include <string>
#include <string_view>

#include "engine/forge.h"
#include "run_context.h"

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
  context.m_Extractor.Parse(context.m_Language);
  if (context.m_Extractor.findDesignUnit("work", context.m_ModuleName.c_str(),
                                         ScanExtractor::SearchAllLibraries) != 0) {
    std::string text = "Declaration (Module ";
    text += context.m_ModuleName.view();
    text += ") not found.";
    context.reportMessage(text, RunContext::Severity::Error);
    return false;
  }
  if (!prepareRun(context)) return false;
  if (!buildPortList(context)) return false;
  if (Host::FileName(context.m_TemplateFileName.view()).GetExtension().Compare(".tcl", 0) == 0)
    return context.runTclGenerator();
  return runTemplateEngine(context);
}

bool prepareRun(RunContext& context) {
  // A trace file that cannot be created only means the expansion runs without a trace.
  if (context.m_Debug) context.m_DebugStream = std::fopen("forge.deb", "w");

  const std::string title = titleOf(context.m_OutputFileName);
  context.m_Date = Host::StringBase(currentDate());

  context.m_DesignData.reset(new (std::nothrow) StbDataList(
      context.m_ProjectName.c_str(), context.m_ModuleName.c_str(),
      context.m_OutputFileName.c_str(), context.m_OutputExt.c_str(), "pinforge", "",
      title.c_str(), context.m_Date.c_str()));
  if (!context.m_DesignData)
    context.reportMessage("FATAL: Unable to allocate enough memory for Forge.\n",
                          RunContext::Severity::Error);
  return !context.hasErrors();
}

bool runTemplateEngine(RunContext& context) {
  {
    Forge forge(context.m_OutputStream, context.m_TemplateStream, context.m_DebugStream,
                context.m_DesignData.get());
    forge.processTemplate();
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
