// The road of one run, from the raw process arguments to the exit status.
#include "front_end.h"

#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "design_flow.h"
#include "help_text.h"
#include "message_lines.h"
#include "response_file.h"
#include "run_context.h"
#include "run_hints.h"
#include "template_search.h"

namespace {

void writeUsage(std::FILE* messageStream) {
  writeLine(messageStream, std::string("Usage: ") + kUsageText);
}

/// Argument 0 of the first occurrence of `name`, or null when the switch was not given. Later
/// occurrences of a switch are ignored.
const char* firstArgument(const UT_CMDARGS& parser, const char* name) {
  const UT_CMDSWINFO* occurrence = parser.getsw(name, 0);
  return occurrence != nullptr ? occurrence->getargtxt(0) : nullptr;
}

/// The -lang value decides the reader; an unknown value is read as VHDL, with a warning.
void selectLanguage(RunContext& context, const UT_CMDARGS& parser) {
  context.m_Language = ScanExtractor::Vhdl;
  const char* language = firstArgument(parser, "-lang");
  if (language == nullptr) return;
  const Host::StringBase value(language);
  for (std::string_view name : {"verilog", "systemverilog", "sv"})
    if (value.Compare(name, 1) == 0) {
      context.m_Language = ScanExtractor::Verilog;
      return;
    }
  if (value.Compare("vhdl", 1) == 0) return;
  std::string text = "WARNING: -lang ";
  text += language;
  text +=
      " is not a language pinforge reads (vhdl, verilog, systemverilog, sv); the design "
      "files are read as VHDL.";
  context.reportMessage(text, RunContext::Severity::Warning);
}

/// Without -lang, design files that all carry a Verilog extension are read as Verilog.
void detectLanguage(RunContext& context, const UT_CMDARGS& parser) {
  const std::vector<ScanExtractor::RegisteredFile>& files = context.m_Extractor.files();
  if (parser.findsw("-lang") || files.empty()) return;
  for (const ScanExtractor::RegisteredFile& file : files)
    if (!hasVerilogExtension(file.path)) return;
  context.m_Language = ScanExtractor::Verilog;
}

/// What -template reads: the file the template search finds, else the name as given so that
/// opening it fails with the system's reason.
std::string templatePath(const char* name) { return findTemplate(name).value_or(name); }

/// A file the run names on its command line, with what it is to the run for messages.
struct NamedFile {
  const char* role;
  const char* name;
  /// The path it is found at when that differs from its name.
  std::string path = {};
  const char* where() const { return path.empty() ? name : path.c_str(); }
};

std::vector<NamedFile> inputFiles(const UT_CMDARGS& parser) {
  std::vector<NamedFile> inputs;
  if (const char* name = firstArgument(parser, "-template"))
    inputs.push_back({"template", nullptr, templatePath(name)});
  for (uint16_t index = 0; const UT_CMDSWINFO* occurrence = parser.getsw("-lib", index); ++index)
    for (uint16_t file = 1; const char* name = occurrence->getargtxt(file); ++file)
      inputs.push_back({"design file", name, {}});
  return inputs;
}

/// The first pair of the run's files that are one and the same file with at least one of them
/// written, as "the <role> <name> is the same file as the <role> <name>"; empty when there is
/// none. Devices such as /dev/null may be named twice: writing one destroys nothing.
std::string overlappingFiles(const UT_CMDARGS& parser) {
  std::vector<std::pair<NamedFile, std::string>> seen;
  for (const NamedFile& input : inputFiles(parser)) {
    bool regular = false;
    std::string identity = Host::File::identity(input.where(), regular);
    // Only existing inputs can be destroyed; a missing one is reported when it is read.
    if (regular) seen.emplace_back(input, std::move(identity));
  }
  for (const NamedFile& output : {NamedFile{"output file", firstArgument(parser, "-o")},
                                  NamedFile{"error file", firstArgument(parser, "-err")}}) {
    if (output.name == nullptr) continue;
    bool regular = false;
    std::string identity = Host::File::identity(output.name, regular);
    if (identity.empty() || (!regular && !identity.starts_with("new "))) continue;
    for (const auto& [earlier, earlierIdentity] : seen) {
      if (earlierIdentity != identity) continue;
      std::string text = "The ";
      text += output.role;
      text += ' ';
      text += output.name;
      text += " is the same file as the ";
      text += earlier.role;
      text += ' ';
      text += earlier.where();
      return text;
    }
    seen.emplace_back(output, std::move(identity));
  }
  return std::string();
}

/// Stops the run before anything is opened for writing when writing would destroy one of its
/// own inputs or write two streams into one file. True when the files are distinct.
bool checkDistinctFiles(const UT_CMDARGS& parser, std::FILE* messageStream) {
  const std::string overlap = overlappingFiles(parser);
  if (overlap.empty()) return true;
  writeFatalError(messageStream, overlap + "; nothing was written.");
  return false;
}

/// "FATAL ERROR: Unable to open <what> <name>: <why>" on the message stream.
void writeOpenFailure(std::FILE* messageStream, std::string_view what, const char* name,
                      std::string_view why) {
  writeFatalError(messageStream, fileFailureText("open", what, name, why));
}

/// The line after a -template that is neither a file nor a template name.
void writeAvailableTemplates(std::FILE* messageStream, std::string_view name) {
  std::string line = "pinforge: no template is named ";
  line += name;
  const std::vector<std::string> names = availableTemplates();
  if (names.empty()) line += ", and no template folder holds any (see --help)";
  for (size_t i = 0; i < names.size(); ++i) {
    line += i == 0 ? "; the templates are: " : ", ";
    line += names[i];
  }
  line += '.';
  writeLine(messageStream, line);
}

/// The declaration of switch `name` in the usage text without its enclosing brackets
/// ("-prj <project>", "-lib <libname> {<vhdfile>}"); empty for an undeclared switch.
std::string_view usageOf(std::string_view name) {
  const std::string_view usage = kUsageText;
  for (size_t at = usage.find(name); at != std::string_view::npos; at = usage.find(name, at + 1)) {
    const size_t after = at + name.size();
    if (at == 0 || (usage[at - 1] != '[' && usage[at - 1] != '{') || after >= usage.size() ||
        (usage[after] != ' ' && usage[after] != ']' && usage[after] != '}'))
      continue;
    int depth = 1;
    for (size_t end = at; end < usage.size(); ++end) {
      if (usage[end] == '[' || usage[end] == '{') ++depth;
      if ((usage[end] == ']' || usage[end] == '}') && --depth == 0)
        return usage.substr(at, end - at);
    }
  }
  return std::string_view();
}

/// Registers the design files of every "-lib" occurrence, each under the library name of its
/// own occurrence, in command-line order; the context's library name ends as the last one.
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

/// True when the module, project and input file names were given and the output and template
/// streams are open.
bool checkRequiredInputs(const RunContext& context) {
  return context.m_ModuleName.Compare(kUndefinedName, 0) != 0 &&
         context.m_ProjectName.Compare(kUndefinedName, 0) != 0 &&
         context.m_InputFileName.Compare(kUndefinedName, 0) != 0 &&
         context.outputStream() != nullptr && context.templateStream() != nullptr;
}

/// Records the names and flags and opens the template and output files. A file that cannot be
/// opened is told on the message stream; the run goes on so that every problem is shown, but
/// the design flow will not run. Returns false in that case.
bool readRunOptions(RunContext& context, const UT_CMDARGS& parser, std::FILE* messageStream) {
  bool opened = true;
  if (const char* module = firstArgument(parser, "-module"))
    context.m_ModuleName = std::string_view(module);
  context.m_Debug = parser.findsw("-a");
  if (const char* project = firstArgument(parser, "-prj"))
    context.m_ProjectName = std::string_view(project);
  std::string why;
  if (const char* name = firstArgument(parser, "-template");
      name && !context.openTemplateFile(templatePath(name).c_str(), why)) {
    writeOpenFailure(messageStream, "template file", name, why);
    if (!findTemplate(name)) writeAvailableTemplates(messageStream, name);
    opened = false;
  }
  if (const char* name = firstArgument(parser, "-o"); name && !context.openOutput(name, why)) {
    writeOpenFailure(messageStream, "output file", name, why);
    opened = false;
  }
  return opened;
}

/// Settles the output once the run is over. A failed write is an error. The output is put in
/// place when the design flow ran, so a failed run still shows how far it got, unless
/// -deleteonerror asks a failed run to leave nothing: then it is dropped, and an output
/// already put in place (the Tcl path's) is removed if it is still the file this run wrote.
/// An early failure never touches a previous output. True when nothing went wrong here.
bool settleOutput(RunContext& context, bool flowRan, bool failed, bool deleteOnError) {
  bool settled = context.closeOutput();
  failed = failed || !settled;
  if (flowRan && !(failed && deleteOnError)) {
    settled = context.commitOutput() && settled;
  } else {
    context.m_Output.discard();
  }
  if (failed && deleteOnError) context.m_Output.removeWritten();
  return settled;
}

/// Settles the run's files and prints the completion line; true when the run failed.
bool finishRun(RunContext& context, const UT_CMDARGS& parser, bool flowRan, bool failed) {
  failed = !settleOutput(context, flowRan, failed, parser.findsw("-deleteonerror")) || failed;
  failed = !context.closeErrorFile() || failed;
  std::string line = "forge(";
  line += context.isVerilog() ? "verilog" : "vhdl";
  line += failed ? ") completed with errors." : ") completed successfully.";
  writeLine(stdout, line);
  return failed;
}

/// Writes "pinforge: missing <switch and its arguments>" for each required switch the command
/// line lacks, in the order of the usage text. A switch given with a value that cannot be
/// used (a template that does not open) was reported already.
void writeMissingSwitches(const RunContext& context, const UT_CMDARGS& parser,
                          std::FILE* messageStream) {
  std::string text;
  auto missing = [&text](std::string_view name) {
    text += "pinforge: missing ";
    text += usageOf(name);
    text += '\n';
  };
  if (context.m_InputFileName.Compare(kUndefinedName, 0) == 0) missing("-lib");
  for (const char* name : {"-module", "-prj", "-template", "-o"})
    if (!parser.findsw(name)) missing(name);
  writeText(messageStream, text);
}

/// `--help` or `--version` anywhere on the (expanded) command line answers at once, whatever
/// else is there; -h and its other spellings stay the parser's. The exit status, or empty
/// when neither was given.
std::optional<int> answerInformationRequest(const ArgumentVector& arguments) {
  for (size_t index = 1; index < arguments.count(); ++index) {
    const std::string& word = arguments[index];
    std::string text;
    if (word == "--help")
      text = std::string("Usage: ") + kUsageText + "\n" + helpText();
    else if (word == "--version")
      text = versionText();
    else
      continue;
    writeText(stdout, text);
    return std::fflush(stdout) == 0 && !std::ferror(stdout) ? 0 : 1;
  }
  return std::nullopt;
}

/// The --list run: the units of the design files on standard output, one line each; 1 when
/// a design file is missing or unreadable or a -g, -D or -I is malformed.
int listDesignUnits(RunContext& context, const UT_CMDARGS& parser) {
  if (context.m_InputFileName.Compare(kUndefinedName, 0) == 0) {
    std::string text = "pinforge: missing ";
    text += usageOf("-lib");
    writeLine(stderr, text);
    writeUsage(stderr);
    return 1;
  }
  if (!readScanSettings(context, parser)) return 1;
  context.m_Extractor.configure(context.m_ScanSettings);
  context.m_Extractor.Parse(context.m_Language);
  std::string listing;
  for (const ScanUnitInfo& unit : context.m_Extractor.listUnits()) {
    listing += unit.library + ' ' + unit.kind + ' ' + unit.name + ' ' + unit.file + ':';
    listing += std::to_string(unit.line);
    listing += '\n';
  }
  writeText(stdout, listing);
  return context.m_Extractor.unreadableFiles().empty() ? 0 : 1;
}

}  // namespace

bool readScanSettings(RunContext& context, const UT_CMDARGS& parser) {
  bool wellFormed = true;
  auto reject = [&](std::string_view text) {
    context.reportMessage(text, RunContext::Severity::Error);
    wellFormed = false;
  };
  ScanSettings& settings = context.m_ScanSettings;
  for (uint16_t index = 0; const UT_CMDSWINFO* occurrence = parser.getsw("-g", index); ++index) {
    const std::string_view word = occurrence->getargtxt(0);
    const size_t equals = word.find('=');
    if (equals == 0 || equals == std::string_view::npos || equals + 1 == word.size()) {
      reject("-g " + std::string(word) +
             ": a generic is set as NAME=VALUE, for example -g WIDTH=8.");
      continue;
    }
    settings.genericOverrides.emplace_back(word.substr(0, equals), word.substr(equals + 1));
  }
  for (uint16_t index = 0; const UT_CMDSWINFO* occurrence = parser.getsw("-D", index); ++index) {
    const std::string_view word = occurrence->getargtxt(0);
    const size_t equals = word.find('=');
    if (equals == 0) {
      reject("-D " + std::string(word) +
             ": a macro is defined as NAME or NAME=TEXT, for example -D SYNTHESIS.");
      continue;
    }
    if (equals == std::string_view::npos)
      settings.macros.emplace_back(std::string(word), std::nullopt);
    else
      settings.macros.emplace_back(word.substr(0, equals), std::string(word.substr(equals + 1)));
  }
  for (uint16_t index = 0; const UT_CMDSWINFO* occurrence = parser.getsw("-I", index); ++index)
    settings.includeDirectories.emplace_back(occurrence->getargtxt(0));
  return wellFormed;
}

int runFrontEnd(int argc, char** argv) {
  Host::Interrupt::install();
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
  if (const std::optional<int> status = answerInformationRequest(arguments)) return *status;
  std::vector<char*> vector = arguments.pointers();
  const UT_CMDARGS parser(static_cast<int>(arguments.count()), vector.data(), kUsageText, nullptr,
                          0);
  // The parser has already told the user what it found.
  if (parser.iserror()) return 1;
  if (parser.gaveusage()) return 0;

  selectLanguage(context, parser);
  registerLibraries(context, parser);
  detectLanguage(context, parser);
  if (parser.findsw("--list")) return listDesignUnits(context, parser);
  if (!checkDistinctFiles(parser, messageStream)) return 1;
  if (const char* name = firstArgument(parser, "-err")) {
    std::string why;
    messageStream = context.openErrorFile(name, why);
    if (messageStream == nullptr) {
      writeFatalError(stdout,
                      "Unable to open log file " + std::string(name) + " in write mode: " + why);
      return 1;
    }
  }
  bool fatal = !readRunOptions(context, parser, messageStream);
  fatal = !readScanSettings(context, parser) || fatal;
  bool flowRan = false;
  if (!checkRequiredInputs(context)) {
    if (context.m_Debug) context.dumpContext();
    writeMissingSwitches(context, parser, messageStream);
    writeUsage(messageStream);
    fatal = true;
  } else if (!fatal) {
    runDesignFlow(context);
    flowRan = true;
  }
  return finishRun(context, parser, flowRan, fatal || context.hasErrors()) ? 1 : 0;
}
