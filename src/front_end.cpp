// The road of one run, from the raw process arguments to the exit status.
#include "front_end.h"

#include <cstdint>
#include <cstdio>
#include <string_view>
#include <vector>

#include "design_flow.h"
#include "response_file.h"
#include "run_context.h"

namespace {

void writeUsage(std::FILE* messageStream) {
  std::fprintf(messageStream, "Usage: %s\n", kUsageText);
}

/// Argument 0 of the first occurrence of `name`, or null when the switch was not given. Later
/// occurrences of a switch are ignored.
const char* firstArgument(const UT_CMDARGS& parser, const char* name) {
  const UT_CMDSWINFO* occurrence = parser.getsw(name, 0);
  return occurrence != nullptr ? occurrence->getargtxt(0) : nullptr;
}

void selectLanguage(RunContext& context, const UT_CMDARGS& parser) {
  context.m_Verilog = 0;
  context.m_Language = ScanExtractor::Vhdl;
  const char* language = firstArgument(parser, "-lang");
  if (language != nullptr && Host::StringBase(language).Compare("verilog", 1) == 0) {
    context.m_Verilog = 1;
    context.m_Language = ScanExtractor::Verilog;
  }
}

/// Records the names and flags and opens the template and output files. A file that cannot be
/// opened is told on the message stream; the run goes on so that every problem is shown, but
/// the design flow will not run. Returns false in that case.
bool readRunOptions(RunContext& context, const UT_CMDARGS& parser, std::FILE* messageStream) {
  bool opened = true;
  context.m_NoList = parser.findsw("-nodelist");
  if (const char* module = firstArgument(parser, "-module"))
    context.m_ModuleName = std::string_view(module);
  context.m_Debug = parser.findsw("-a");
  if (const char* project = firstArgument(parser, "-prj"))
    context.m_ProjectName = std::string_view(project);
  if (const char* name = firstArgument(parser, "-template");
      name && !context.openTemplateFile(name)) {
    std::fprintf(messageStream, "FATAL ERROR: Unable to open template file %s...\n", name);
    opened = false;
  }
  if (const char* name = firstArgument(parser, "-o"); name && !context.openOutput(name)) {
    std::fprintf(messageStream, "FATAL ERROR: Unable to open output file %s...\n", name);
    opened = false;
  }
  return opened;
}

/// Closes the output, removes it on request when the run failed, and prints the completion line.
void finishRun(RunContext& context, const UT_CMDARGS& parser, bool errors) {
  const char* languageName = context.m_Verilog != 0 ? "verilog" : "vhdl";
  if (context.m_OutputStream != nullptr) {
    std::fclose(context.m_OutputStream);
    context.m_OutputStream = nullptr;
  }
  if (errors) {
    const char* output = firstArgument(parser, "-o");
    if (parser.findsw("-deleteonerror") && output != nullptr) Host::File::remove_f(output);
    std::printf("forge(%s) completed with errors.\n", languageName);
  } else {
    std::printf("forge(%s) completed successfully.\n", languageName);
  }
}

}  // namespace

void registerLibraries(RunContext& context, const UT_CMDARGS& parser) {
  for (uint16_t index = 0;; ++index) {
    const UT_CMDSWINFO* occurrence = parser.getsw("-lib", index);
    if (occurrence == nullptr) return;
    if (const char* library = occurrence->getargtxt(0))
      context.m_LibraryName = std::string_view(library);
    for (uint16_t file = 1; const char* name = occurrence->getargtxt(file); ++file)
      context.registerDesignFile(name);
  }
}

bool checkRequiredInputs(const RunContext& context) {
  return context.m_ModuleName.Compare(kUndefinedName, 0) != 0 &&
         context.m_ProjectName.Compare(kUndefinedName, 0) != 0 &&
         context.m_InputFileName.Compare(kUndefinedName, 0) != 0 &&
         context.m_OutputStream != nullptr && context.m_TemplateStream != nullptr;
}

int runFrontEnd(int argc, char** argv) {
  std::FILE* messageStream = stderr;
  RunContext context;
  if (argc < 2) {
    writeUsage(messageStream);
    return 0;
  }
  ArgumentVector arguments;
  if (expandResponseFile(messageStream, argc, argv, arguments) != Expansion::Ready) {
    writeUsage(messageStream);
    return 1;
  }
  std::vector<char*> vector = arguments.pointers();
  const UT_CMDARGS parser(static_cast<int>(arguments.count()), vector.data(), kUsageText, nullptr,
                          0);
  // The parser has already told the user what it found.
  if (parser.iserror()) return 1;
  if (parser.gaveusage()) return 0;

  selectLanguage(context, parser);
  if (const char* name = firstArgument(parser, "-err")) {
    messageStream = context.openErrorFile(name);
    if (messageStream == nullptr) {
      std::printf("FATAL ERROR: Unable to open log file %s in write mode.\n", name);
      return 1;
    }
  }
  bool fatal = !readRunOptions(context, parser, messageStream);
  registerLibraries(context, parser);
  if (!checkRequiredInputs(context)) {
    if (context.m_Debug) context.dumpContext();
    writeUsage(messageStream);
    fatal = true;
  } else if (!fatal) {
    runDesignFlow(context);
  }

  const bool errors = fatal || context.hasErrors();
  finishRun(context, parser, errors);
  if (messageStream == context.m_ErrorStream) context.m_ErrorStream = nullptr;
  std::fclose(messageStream);
  return errors ? 1 : 0;
}
