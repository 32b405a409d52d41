// The command line seen from outside: every way a run can end early or with errors, how the
// switches and a response file shape a run, what the program prints on each stream, its exit
// status and the files it leaves behind.
#include <gtest/gtest.h>

#include <filesystem>
#include <optional>
#include <set>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

using namespace pinforge_test;
using Args = std::vector<std::string>;

const std::string kUsage =
    "Usage: pinforge {-lib <libname> {<vhdfile>}} \t[-lang vhdl|verilog] \t[-module "
    "<module_name>] [-prj <project>] [-template <template_file>] \t[-o <stbfile>] [-err "
    "<errfile>] [-deleteonerror] [--nodelist] [--a] [--inc] {-g <name>=<value>} {-D <macro>} "
    "{-I <incdir>} [--list]\n";
const std::string kNotFound = "pinforge:Declaration (Module top) not found.\n";
const std::string kFailed = "forge(vhdl) completed with errors.\n";
/// The templates a name can be given for, as the program lists them: `names` and those of the
/// source tree, since the binary under test runs from its build folder.
std::string templateNames(std::set<std::string> names = {}) {
  std::error_code error;
  for (const auto& entry : std::filesystem::directory_iterator(sourceDir() + "/templates", error)) {
    std::string name = entry.path().filename().string();
    if (!entry.is_regular_file(error) || name.starts_with(".")) continue;
    for (const std::string suffix : {".tmpl", ".tcl"})
      if (name.ends_with(suffix)) name.resize(name.size() - suffix.size());
    names.insert(name);
  }
  std::string text;
  for (const std::string& name : names) text += (text.empty() ? "" : ", ") + name;
  return text;
}
const std::string kMissingTemplate =
    "FATAL ERROR: Unable to open template file missing.tpl: No such file or directory\n"
    "pinforge: no template is named missing.tpl; the templates are: " +
    templateNames() + ".\n";
const std::string kMissingOutput =
    "FATAL ERROR: Unable to open output file no/dir/out.txt: No such file or directory\n";
const std::string kMissingRsp = "FATAL ERROR: Unable to open response file missing.rsp...\n";
const std::string kTooMany =
    "FATAL ERROR: The number of command line arguments exceeds the max allowed (997).\n";
const std::string kMissing = "<missing>";
const std::string kOther = "entity other is\nend entity other;\n";

/// A complete command line whose only problem is that the design has no unit "top".
const Args kComplete = {"-lib", "work",      "other.vhd", "-module", "top",    "-prj",
                        "demo", "-template", "tpl.txt",   "-o",      "out.txt"};

Args plus(Args base, const Args& extra) {
  base.insert(base.end(), extra.begin(), extra.end());
  return base;
}

/// `base` without the switch `name` and its `arity` arguments.
Args without(Args base, const std::string& name, long arity) {
  for (auto it = base.begin(); it != base.end(); ++it) {
    if (*it == name) {
      base.erase(it, it + 1 + arity);
      break;
    }
  }
  return base;
}

/// The context dump debug mode prints when a required input is missing.
std::string dump(const std::string& module, const std::string& project, const std::string& library,
                 const std::string& input) {
  return "FpErr         Not Open\nFpStb         Open\nFpTemplate    Open\n"
         "FpInput       Not Open\nFpDebug       Not Open\n"
         "Module        " +
         module + "\nProject       " + project +
         "\nOutput Ext    txt\nOutput File   out.txt\nLibrary       " + library +
         "\nInput File    " + input +
         "\nTemplate File tpl.txt\nError File    __UNDEFINED__\nDate          \n";
}

struct Row {
  std::string what;
  Args args;
  std::string out;
  std::string err;
  int status;
  std::vector<std::pair<std::string, std::string>> files = {};   ///< name -> content or kMissing
  std::optional<std::string> rsp = {};                           ///< written to run.rsp
  std::vector<std::pair<std::string, std::string>> before = {};  ///< written before the run
};

/// A run of the unit "top", which the design holds, writing to `output`.
Args topRun(const std::string& output) {
  return {"-lib", "work",      "top.vhd", "-module", "top", "-prj",
          "demo", "-template", "tpl.txt", "-o",      output};
}

/// The project version the build gives the program: the VERSION of CMakeLists.txt's project().
std::string projectVersion() {
  const std::string cmake = readFile(sourceDir() + "/CMakeLists.txt");
  const size_t project = cmake.find("project(pinforge VERSION ");
  if (project == std::string::npos) return "<no project version>";
  const size_t begin = project + std::string("project(pinforge VERSION ").size();
  return cmake.substr(begin, cmake.find(' ', begin) - begin);
}

/// The usage line after a "missing" line for each of `switches`.
std::string missing(const std::vector<std::string>& switches) {
  std::string text;
  for (const std::string& declared : switches) text += "pinforge: missing " + declared + "\n";
  return text + kUsage;
}
const std::string kNoLib = "-lib <libname> {<vhdfile>}";
const std::string kNoModule = "-module <module_name>";
const std::string kNoPrj = "-prj <project>";
const std::string kNoTemplate = "-template <template_file>";
const std::string kNoOutput = "-o <stbfile>";

std::string sameFile(const std::string& what) {
  return "FATAL ERROR: The " + what + "; nothing was written.\n";
}

/// The line a run adds after "not found" for a design whose only unit is "other".
const std::string kOtherHint = "pinforge:1 design unit was read; the closest name is: other.\n";

std::vector<Row> rows() {
  const std::string notFound = kNotFound + kOtherHint + kFailed;
  std::vector<Row> rows = {
      {"no arguments", {}, "", kUsage, 0},
      {"unreadable response file", {"@missing.rsp", "-lib", "work"}, "", kMissingRsp + kUsage, 1},
      {"error file opens after the response file",
       {"@missing.rsp", "-err", "run.log"},
       "",
       kMissingRsp + kUsage,
       1,
       {{"run.log", kMissing}}},
      {"unknown switch", {"-bogus"}, "", "pinforge: unknown switch -bogus\n" + kUsage, 1},
      {"help alone", {"-h"}, kUsage, "", 0},
      {"help after a complete line",
       plus(kComplete, {"-help"}),
       kUsage,
       "",
       0,
       {{"out.txt", kMissing}}},
      {"unwritable error file",
       plus(kComplete, {"-err", "no/such/dir/run.log"}),
       "FATAL ERROR: Unable to open log file no/such/dir/run.log in write mode: No such file or "
       "directory\n",
       "",
       1,
       {{"out.txt", kMissing}}},
      // The first occurrence of a switch wins, so these come before the complete line.
      {"missing template keeps the previous output",
       plus({"-template", "missing.tpl"}, kComplete),
       kFailed,
       kMissingTemplate + kUsage,
       1,
       {{"out.txt", "previous"}},
       {},
       {{"out.txt", "previous"}}},
      {"missing template, delete on error, keeps the previous output",
       plus({"-template", "missing.tpl", "-deleteonerror"}, kComplete),
       kFailed,
       kMissingTemplate + kUsage,
       1,
       {{"out.txt", "previous"}},
       {},
       {{"out.txt", "previous"}}},
      {"missing -prj keeps the previous output",
       without(kComplete, "-prj", 1),
       kFailed,
       missing({kNoPrj}),
       1,
       {{"out.txt", "previous"}},
       {},
       {{"out.txt", "previous"}}},
      {"a failed flow leaves its partial output",
       kComplete,
       notFound,
       "",
       1,
       {{"out.txt", ""}},
       {},
       {{"out.txt", "previous"}}},
      {"a failed flow with delete on error leaves the previous output",
       plus(kComplete, {"-deleteonerror"}),
       notFound,
       "",
       1,
       {{"out.txt", "previous"}},
       {},
       {{"out.txt", "previous"}}},
      {"successful run replaces the previous output",
       topRun("out.txt"),
       "forge(vhdl) completed successfully.\n",
       "",
       0,
       {{"out.txt", "top\n"}},
       {},
       {{"out.txt", "previous"}}},
      {"device output", plus(topRun("/dev/null"), {"-deleteonerror"}),
       "forge(vhdl) completed successfully.\n", "", 0},
      {"full output device", topRun("/dev/full"),
       "pinforge:Unable to write output file /dev/full: No space left on device\n" + kFailed, "",
       1},
      {"full error file", plus({"-err", "/dev/full", "-template", "missing.tpl"}, kComplete),
       "pinforge:Unable to write error file /dev/full: No space left on device\n" + kFailed, "", 1},
      {"missing design file beside the unit's",
       plus(topRun("out.txt"), {"-lib", "work", "gone.vhd"}),
       "pinforge:Unable to read design file gone.vhd; see the messages above.\n" + kFailed,
       "gone.vhd: error: No such file or directory\n",
       1,
       {{"out.txt", ""}}},
      {"directory as a design file", plus(topRun("out.txt"), {"-lib", "work", "/"}),
       "pinforge:Unable to read design file /; see the messages above.\n" + kFailed,
       "/: error: is a directory\n", 1},
      {"error file is a design file",
       plus(kComplete, {"-err", "other.vhd"}),
       "",
       sameFile("error file other.vhd is the same file as the design file other.vhd"),
       1,
       {{"other.vhd", kOther}, {"out.txt", kMissing}}},
      {"error file is the output",
       plus(kComplete, {"-err", "./out.txt"}),
       "",
       sameFile("error file ./out.txt is the same file as the output file out.txt"),
       1,
       {{"out.txt", kMissing}}},
      {"one device for output and errors", plus(topRun("/dev/null"), {"-err", "/dev/null"}),
       "forge(vhdl) completed successfully.\n", "", 0},
      {"debug lines name the direction",
       {"-lang", "verilog", "-lib", "work", "top.v", "-module", "top", "-prj", "demo", "-template",
        "tpl.txt", "-o", "out.txt", "--a"},
       "a: input ;\nforge(verilog) completed successfully.\n",
       "",
       0},
      {"template is a directory",
       plus({"-template", "/"}, kComplete),
       kFailed,
       "FATAL ERROR: Unable to open template file /: Is a directory\n" + kUsage,
       1,
       {{"out.txt", kMissing}}},
      {"unopenable output", plus({"-o", "no/dir/out.txt"}, kComplete), kFailed,
       kMissingOutput + kUsage, 1},
      {"template and output both unopenable",
       plus({"-o", "no/dir/out.txt", "-template", "missing.tpl"}, kComplete),
       kFailed,
       kMissingTemplate + kMissingOutput + kUsage,
       1,
       {{"out.txt", kMissing}}},
      {"error file takes usage and fatal lines",
       plus({"-err", "run.log", "-template", "missing.tpl"}, kComplete),
       kFailed,
       "",
       1,
       {{"run.log", kMissingTemplate + kUsage}}},
      {"error file takes no reports",
       plus({"-err", "run.log"}, kComplete),
       notFound,
       "",
       1,
       {{"run.log", ""}}},
      {"unit not found", kComplete, notFound, "", 1, {{"out.txt", ""}, {"forge.deb", kMissing}}},
      {"delete on error",
       plus(kComplete, {"-deleteonerror"}),
       notFound,
       "",
       1,
       {{"out.txt", kMissing}}},
      {"delete on error without output",
       plus(without(kComplete, "-o", 1), {"-deleteonerror"}),
       kFailed,
       missing({kNoOutput}),
       1,
       {{"tpl.txt", "%module%\n"}, {"other.vhd", kOther}}},
      {"library without files", plus({"-lib", "work"}, without(kComplete, "-lib", 2)), kFailed,
       missing({kNoLib}), 1},
      {"module named like the undefined marker",
       plus({"-module", "__UNDEFINED__"}, without(kComplete, "-module", 1)), kFailed, kUsage, 1},
      {"debug dump for a missing input", plus(without(kComplete, "-prj", 1), {"--a"}),
       dump("top", "__UNDEFINED__", "work", "other.vhd") + kFailed, missing({kNoPrj}), 1},
      {"debug mode with complete inputs prints no dump", plus(kComplete, {"--a"}), notFound, "", 1},
      {"ignored switches", plus(kComplete, {"--inc", "-nodelist", "-inc", "--nodelist"}), notFound,
       "", 1},
      {"first occurrence wins",
       plus(kComplete, {"-module", "other", "-prj", "x", "-o", "2.txt"}),
       notFound,
       "",
       1,
       {{"out.txt", ""}, {"2.txt", kMissing}}},
      {"response file, words after it ignored",
       {"@run.rsp", "-module", "other", "-deleteonerror"},
       notFound,
       "",
       1,
       {{"out.txt", ""}},
       "-lib\twork\r\nother.vhd \t\n-module top -prj demo -template tpl.txt -o out.txt"},
      {"empty response file",
       {"@run.rsp"},
       kFailed,
       missing({kNoLib, kNoModule, kNoPrj, kNoTemplate, kNoOutput}),
       1,
       {},
       ""},
      {"response file words are literal",
       {"@run.rsp"},
       "pinforge:Declaration (Module @top) not found.\n" + kOtherHint + kFailed,
       "",
       1,
       {},
       "-lib work other.vhd -module @top -prj demo -template tpl.txt -o out.txt\n"},
      {"verilog design",
       {"-lang", "verilog", "-lib", "work", "other.v", "-module", "top", "-prj", "demo",
        "-template", "tpl.txt", "-o", "out.txt"},
       kNotFound + kOtherHint + "forge(verilog) completed with errors.\n",
       "",
       1},
  };
  const auto unknownLanguage = [](const std::string& value) {
    return "pinforge:WARNING: -lang " + value +
           " is not a language pinforge reads (vhdl, verilog, systemverilog, sv); the design "
           "files are read as VHDL.\n";
  };
  const std::string notFoundHinted = kNotFound + "pinforge:";
  const Args topRest = {"-module", "top", "-prj", "demo", "-template", "tpl.txt", "-o", "out.txt"};
  const std::string verilogFailed = "forge(verilog) completed with errors.\n";
  const std::string vhdlDone = "forge(vhdl) completed successfully.\n";
  const std::string verilogDone = "forge(verilog) completed successfully.\n";
  const std::vector<Row> newSwitches = {
      {"mixed extensions without -lang are read as VHDL",
       plus({"-lib", "work", "top.vhd", "other.v"}, topRest), vhdlDone, "", 0},
      {".v read as VHDL", plus({"-lang", "vhdl", "-lib", "work", "top.v"}, topRest),
       notFoundHinted + "top.v looks like Verilog; read it with -lang verilog.\n" + kFailed, "", 1},
      {"entity read as Verilog", plus({"-lang", "sv", "-lib", "work", "top.hdl"}, topRest),
       notFoundHinted +
           "top.hdl looks like VHDL (it declares entity top); read it with -lang vhdl.\n" +
           verilogFailed,
       "", 1},
      {"unknown -lang is read as VHDL",
       plus(topRun("out.txt"), {"-lang", "systemc"}),
       unknownLanguage("systemc") + vhdlDone,
       "",
       0,
       {{"out.txt", "top\n"}}},
      {"-g without a value or name",
       plus(topRun("out.txt"), {"-g", "WIDTH", "-g", "DEPTH=", "-g", "=8"}),
       "pinforge:-g WIDTH: a generic is set as NAME=VALUE, for example -g WIDTH=8.\n"
       "pinforge:-g DEPTH=: a generic is set as NAME=VALUE, for example -g WIDTH=8.\n"
       "pinforge:-g =8: a generic is set as NAME=VALUE, for example -g WIDTH=8.\n" +
           kFailed,
       "",
       1,
       {{"out.txt", kMissing}}},
      {"-D without a name",
       plus(topRun("out.txt"), {"-D", "=1"}),
       "pinforge:-D =1: a macro is defined as NAME or NAME=TEXT, for example -D SYNTHESIS.\n" +
           kFailed,
       "",
       1,
       {{"out.txt", kMissing}}},
      {"-g for a unit without generics",
       plus(topRun("out.txt"), {"-g", "WIDTH=8"}),
       "pinforge:-g WIDTH: top has no generics.\n" + kFailed,
       "",
       1,
       {{"out.txt", ""}}},
      {"-g for a module without parameters",
       plus({"-lib", "work", "top.v", "-g", "W=1", "-g", "X=2"}, topRest),
       "pinforge:-g W: top has no parameters.\npinforge:-g X: top has no parameters.\n" +
           verilogFailed,
       "", 1},
      {"-D and -I",
       plus({"-lib", "work", "top.v", "-D", "SYNTH", "-D", "W=8", "-I", "inc"}, topRest),
       verilogDone,
       "",
       0,
       {{"out.txt", "top\n"}}},
      {"--list without design files",
       {"--list", "-module", "top"},
       "",
       "pinforge: missing " + kNoLib + "\n" + kUsage,
       1},
      {"--list of a missing file",
       {"--list", "-lib", "work", "gone.vhd", "-o", "out.txt"},
       "",
       "gone.vhd: error: No such file or directory\n",
       1,
       {{"out.txt", kMissing}}},
      {"--version wins over everything else",
       {"-bogus", "--version", "--help"},
       "pinforge " + projectVersion() + "\n",
       "",
       0},
  };
  rows.insert(rows.end(), newSwitches.begin(), newSwitches.end());
  for (const auto& [name, declared] :
       std::vector<std::pair<std::string, std::string>>{{"-module", kNoModule},
                                                        {"-prj", kNoPrj},
                                                        {"-template", kNoTemplate},
                                                        {"-o", kNoOutput},
                                                        {"-lib", kNoLib}})
    rows.push_back({"without " + name,
                    without(kComplete, name, name == "-lib" ? 2 : 1),
                    kFailed,
                    missing({declared}),
                    1,
                    {{"forge.deb", kMissing}}});
  // verilog, systemverilog and sv in any case select Verilog, vhdl VHDL; anything else is
  // read as VHDL with a warning. The first -lang wins.
  for (const auto& [lang, name, warning] : std::vector<std::tuple<Args, std::string, std::string>>{
           {{"-lang", "VHDL"}, "vhdl", ""},
           {{"-lang", "VeriLog"}, "verilog", ""},
           {{"-lang", "SystemVerilog"}, "verilog", ""},
           {{"-lang", "sv"}, "verilog", ""},
           {{"-lang", "verilog2"}, "vhdl", unknownLanguage("verilog2")},
           {{"-lang", "verilog", "-lang", "vhdl"}, "verilog", ""}})
    rows.push_back({"language " + lang.back(), plus(without(kComplete, "-module", 1), lang),
                    warning + "forge(" + name + ") completed with errors.\n", missing({kNoModule}),
                    1});
  // Without -module the run stops before any design file is read, so the files need not exist.
  // 2 + 995 words are the most a run takes; one more is refused.
  const std::string allButLib = missing({kNoModule, kNoPrj, kNoTemplate, kNoOutput});
  for (const auto& [files, out, err] :
       {std::tuple{995u, kFailed, allButLib}, std::tuple{996u, std::string(), kTooMany + kUsage}}) {
    Args args = {"-lib", "work"};
    args.resize(2 + files, "f.vhd");
    std::string words;
    for (const std::string& arg : args) words += arg + "\n";
    rows.push_back({std::to_string(files) + " files", args, out, err, 1});
    rows.push_back({std::to_string(files) + " files in a response file",
                    {"@run.rsp"},
                    out,
                    err,
                    1,
                    {},
                    words});
  }
  return rows;
}

TEST(CommandLine, OutputStatusAndFiles) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  for (const Row& row : rows()) {
    SCOPED_TRACE(row.what);
    ScratchDir dir;
    ASSERT_FALSE(dir.path().empty());
    // The main design holds a unit named "other" only, so asking for "top" ends at the lookup.
    for (const auto& [name, text] : std::vector<std::pair<std::string, std::string>>{
             {"other.vhd", kOther},
             {"other.v", "module other;\nendmodule\n"},
             {"top.vhd", "entity top is\n  port (a : in bit);\nend entity top;\n"},
             {"top.v", "module top(input a);\nendmodule\n"},
             {"top.hdl", "entity top is\n  port (a : in bit);\nend entity top;\n"},
             {"tpl.txt", "%module%\n"}})
      ASSERT_TRUE(dir.write(name, text));
    if (row.rsp) {
      ASSERT_TRUE(dir.write("run.rsp", *row.rsp));
    }
    for (const auto& [name, text] : row.before) ASSERT_TRUE(dir.write(name, text));
    const RunResult run = runPinforge(row.args, dir.path(), {{"PINFORGE_TEMPLATE_PATH", ""}});
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.out, row.out);
    EXPECT_EQ(run.err, row.err);
    EXPECT_EQ(run.status, row.status);
    for (const auto& [name, content] : row.files) EXPECT_EQ(dir.read(name), content) << name;
  }
}

TEST(CommandLine, HelpNamesEverySwitchExamplesAndTemplates) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  const RunResult run = runPinforge({"-lib", "work", "--help", "-bogus"}, dir.path(),
                                    {{"PINFORGE_TEMPLATE_PATH", ""}});
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, 0);
  EXPECT_EQ(run.err, "");
  ASSERT_TRUE(run.out.starts_with(kUsage)) << run.out;
  const std::string help = run.out.substr(kUsage.size());
  // Every switch of the usage text, and those the parser does not declare, has its own line.
  std::vector<std::string> switches = {"--help", "--version", "-h, -help, -?", "@<file>"};
  for (size_t at = kUsage.find(" -"); at != std::string::npos; at = kUsage.find(" -", at + 1))
    switches.push_back(kUsage.substr(at + 1, kUsage.find_first_of(" ]}", at + 1) - at - 1));
  for (size_t at = kUsage.find("[-"); at != std::string::npos; at = kUsage.find("[-", at + 1))
    switches.push_back(kUsage.substr(at + 1, kUsage.find_first_of(" ]", at + 1) - at - 1));
  for (size_t at = kUsage.find("{-"); at != std::string::npos; at = kUsage.find("{-", at + 1))
    switches.push_back(kUsage.substr(at + 1, kUsage.find(' ', at + 1) - at - 1));
  EXPECT_GE(switches.size(), 19u);
  for (const std::string& name : switches)
    EXPECT_NE(help.find("\n  " + name + " "), std::string::npos) << name;
  size_t examples = 0;
  for (size_t at = help.find("\n  pinforge "); at != std::string::npos;
       at = help.find("\n  pinforge ", at + 1))
    ++examples;
  EXPECT_EQ(examples, 2u);
  EXPECT_NE(help.find("\n  " + sourceDir() + "/templates\n"), std::string::npos) << help;
  std::string listed;
  for (size_t at = help.find("\nTemplates:\n") + 12; at < help.size(); at = help.find('\n', at) + 1)
    listed += (listed.empty() ? "" : ", ") + help.substr(at + 2, help.find('\n', at) - at - 2);
  EXPECT_EQ(listed, templateNames());
}

TEST(CommandLine, TemplatesAreFoundByName) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  ASSERT_TRUE(dir.makeDir("a") && dir.makeDir("b"));
  for (const auto& [name, text] : std::vector<std::pair<std::string, std::string>>{
           {"top.vhd", "entity top is\n  port (a : in bit);\nend entity top;\n"},
           {"a/mine.tmpl", "a %module%\n"},
           {"b/mine", "b\n"},
           {"b/other.tmpl", "other %module%\n"},
           {"b/pins.txt.tmpl", "own pins\n"},
           {"b/both", "b both\n"},
           {"both", "here both\n"}})
    ASSERT_TRUE(dir.write(name, text));
  const std::string path = dir.path() + "/a::" + dir.path() + "/b";
  const std::string bundled = sourceDir() + "/templates/port_table.tcl";
  const std::string listing = "pinforge: no template is named nothing; the templates are: " +
                              templateNames({"both", "mine", "other", "pins.txt"}) + ".\n";
  const struct {
    const char* what;
    std::string templateName;
    int status;
    std::string output;  ///< the output file's text; empty: the same as with the bundled table
    std::string err = "";
  } cases[] = {
      {"the first folder wins over a later exact name", "mine", 0, "a top\n"},
      {"a .tmpl name", "other", 0, "other top\n"},
      {"PINFORGE_TEMPLATE_PATH before the bundled templates", "pins.txt", 0, "own pins\n"},
      {"an existing path before the search", "both", 0, "here both\n"},
      {"a .tcl name takes the Tcl path", "port_table", 0, ""},
      {"an unknown name lists the templates", "nothing", 1, kMissing,
       "FATAL ERROR: Unable to open template file nothing: No such file or directory\n" + listing +
           kUsage},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    if (c.output.empty() && findOnPath("tclsh").empty()) continue;
    std::error_code error;
    std::filesystem::remove(dir.file("out.txt"), error);
    const Args args = {"-lib", "work",      "top.vhd",      "-module", "top",    "-prj",
                       "demo", "-template", c.templateName, "-o",      "out.txt"};
    const RunResult run = runPinforge(args, dir.path(), {{"PINFORGE_TEMPLATE_PATH", path}});
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.status, c.status);
    EXPECT_EQ(run.err, c.err);
    std::string expected = c.output;
    if (expected.empty()) {
      const RunResult direct = runPinforge({"-lib", "work", "top.vhd", "-module", "top", "-prj",
                                            "demo", "-template", bundled, "-o", "direct.txt"},
                                           dir.path());
      ASSERT_EQ(direct.status, 0) << direct.out << direct.err;
      expected = dir.read("direct.txt");
      ASSERT_NE(expected.find("Port table of top"), std::string::npos) << expected;
    }
    EXPECT_EQ(dir.read("out.txt"), expected);
  }
}

TEST(CommandLine, ListingAndClosestNames) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  ASSERT_TRUE(
      dir.write("a.vhd", "entity alu is\nend entity alu;\n\npackage pkg is\nend package pkg;\n"));
  ASSERT_TRUE(dir.write("b.vhd", "entity top_tb is\nend entity top_tb;\n"));
  ASSERT_TRUE(dir.write("tpl.txt", "%module%\n"));
  const RunResult listing =
      runPinforge({"--list", "-lib", "work", "a.vhd", "-lib", "lib2", "b.vhd"}, dir.path());
  ASSERT_TRUE(listing.started);
  EXPECT_EQ(listing.status, 0);
  EXPECT_EQ(listing.err, "");
  EXPECT_EQ(listing.out,
            "work entity alu a.vhd:1\nwork package pkg a.vhd:4\nlib2 entity top_tb b.vhd:1\n");

  const RunResult run =
      runPinforge({"-lib", "work", "a.vhd", "-lib", "lib2", "b.vhd", "-module", "top", "-prj",
                   "demo", "-template", "tpl.txt", "-o", "out.txt"},
                  dir.path());
  EXPECT_EQ(run.out,
            kNotFound + "pinforge:3 design units were read; the closest names are: alu, top_tb.\n" +
                kFailed);
  EXPECT_EQ(run.err, "");
  EXPECT_EQ(run.status, 1);
}

TEST(CommandLine, UnknownGenericListsTheUnitsGenerics) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  ASSERT_TRUE(dir.write("g.vhd",
                        "entity top is\n  generic (WIDTH : natural := 8; DEPTH : integer);\n"
                        "  port (d : in bit_vector(WIDTH-1 downto 0));\nend entity top;\n"));
  ASSERT_TRUE(dir.write("tpl.txt", "%module%\n"));
  const Args args = {"-lib",      "work",    "g.vhd", "-module", "top", "-prj",   "demo",
                     "-template", "tpl.txt", "-o",    "out.txt", "-g",  "depth=4"};
  const RunResult known = runPinforge(args, dir.path());
  EXPECT_EQ(known.out, "forge(vhdl) completed successfully.\n");
  const RunResult unknown = runPinforge(plus(args, {"-g", "WIDTHX=3"}), dir.path());
  EXPECT_EQ(
      unknown.out,
      "pinforge:-g WIDTHX: top has no generic WIDTHX; its generics are WIDTH, DEPTH.\n" + kFailed);
  EXPECT_EQ(unknown.status, 1);
}

}  // namespace
