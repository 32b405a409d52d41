// The command line seen from outside: every way a run can end early or with errors, how the
// switches and a response file shape a run, what the program prints on each stream, its exit
// status and the files it leaves behind.
#include <gtest/gtest.h>

#include <optional>
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
    "<errfile>] [-deleteonerror] [--nodelist] [--a] [--inc]\n";
const std::string kNotFound = "pinforge:Declaration (Module top) not found.\n";
const std::string kFailed = "forge(vhdl) completed with errors.\n";
const std::string kMissingTemplate =
    "FATAL ERROR: Unable to open template file missing.tpl: No such file or directory\n";
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
         "Module        " + module + "\nProject       " + project +
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
  std::vector<std::pair<std::string, std::string>> files = {};  ///< name -> content or kMissing
  std::optional<std::string> rsp = {};                          ///< written to run.rsp
  std::vector<std::pair<std::string, std::string>> before = {};  ///< written before the run
};

/// A run of the unit "top", which the design holds, writing to `output`.
Args topRun(const std::string& output) {
  return {"-lib", "work", "top.vhd", "-module", "top", "-prj", "demo", "-template", "tpl.txt",
          "-o", output};
}

std::string sameFile(const std::string& what) {
  return "FATAL ERROR: The " + what + "; nothing was written.\n";
}

std::vector<Row> rows() {
  const std::string notFound = kNotFound + kFailed;
  std::vector<Row> rows = {
      {"no arguments", {}, "", kUsage, 0},
      {"unreadable response file", {"@missing.rsp", "-lib", "work"}, "", kMissingRsp + kUsage, 1},
      {"error file opens after the response file",
       {"@missing.rsp", "-err", "run.log"}, "", kMissingRsp + kUsage, 1, {{"run.log", kMissing}}},
      {"unknown switch", {"-bogus"}, "", "pinforge: unknown switch -bogus\n" + kUsage, 1},
      {"stray argument", plus(kComplete, {"stray"}), "",
       "pinforge: argument stray does not belong to any switch\n" + kUsage, 1,
       {{"out.txt", kMissing}}},
      {"switch without its argument", plus(kComplete, {"-o"}), "",
       "pinforge: switch -o needs an argument <stbfile>\n" + kUsage, 1, {{"out.txt", kMissing}}},
      {"help alone", {"-h"}, kUsage, "", 0},
      {"help after a complete line", plus(kComplete, {"-help"}), kUsage, "", 0,
       {{"out.txt", kMissing}}},
      {"unwritable error file", plus(kComplete, {"-err", "no/such/dir/run.log"}),
       "FATAL ERROR: Unable to open log file no/such/dir/run.log in write mode: No such file or "
       "directory\n",
       "", 1,
       {{"out.txt", kMissing}}},
      // The first occurrence of a switch wins, so these come before the complete line.
      {"missing template", plus({"-template", "missing.tpl"}, kComplete), kFailed,
       kMissingTemplate + kUsage, 1, {{"out.txt", kMissing}}},
      {"missing template keeps the previous output", plus({"-template", "missing.tpl"}, kComplete),
       kFailed, kMissingTemplate + kUsage, 1, {{"out.txt", "previous"}}, {},
       {{"out.txt", "previous"}}},
      {"missing template, delete on error, keeps the previous output",
       plus({"-template", "missing.tpl", "-deleteonerror"}, kComplete), kFailed,
       kMissingTemplate + kUsage, 1, {{"out.txt", "previous"}}, {}, {{"out.txt", "previous"}}},
      {"missing -prj keeps the previous output", without(kComplete, "-prj", 1), kFailed, kUsage,
       1, {{"out.txt", "previous"}}, {}, {{"out.txt", "previous"}}},
      {"a failed flow leaves its partial output", kComplete, notFound, "", 1, {{"out.txt", ""}},
       {}, {{"out.txt", "previous"}}},
      {"a failed flow with delete on error leaves the previous output",
       plus(kComplete, {"-deleteonerror"}), notFound, "", 1, {{"out.txt", "previous"}}, {},
       {{"out.txt", "previous"}}},
      {"successful run replaces the previous output", topRun("out.txt"),
       "forge(vhdl) completed successfully.\n", "", 0, {{"out.txt", "top\n"}}, {},
       {{"out.txt", "previous"}}},
      {"device output", plus(topRun("/dev/null"), {"-deleteonerror"}),
       "forge(vhdl) completed successfully.\n", "", 0},
      {"full output device", topRun("/dev/full"),
       "pinforge:Unable to write output file /dev/full: No space left on device\n" + kFailed, "",
       1},
      {"full error file", plus({"-err", "/dev/full", "-template", "missing.tpl"}, kComplete),
       "pinforge:Unable to write error file /dev/full: No space left on device\n" + kFailed, "",
       1},
      {"missing design file beside the unit's", plus(topRun("out.txt"), {"-lib", "work", "gone.vhd"}),
       "pinforge:Unable to read design file gone.vhd; see the messages above.\n" + kFailed,
       "gone.vhd: error: No such file or directory\n", 1, {{"out.txt", ""}}},
      {"directory as a design file", plus(topRun("out.txt"), {"-lib", "work", "/"}),
       "pinforge:Unable to read design file /; see the messages above.\n" + kFailed,
       "/: error: is a directory\n", 1},
      {"output is a design file", topRun("top.vhd"), "",
       sameFile("output file top.vhd is the same file as the design file top.vhd"), 1,
       {{"top.vhd", "entity top is\n  port (a : in bit);\nend entity top;\n"}}},
      {"output is the template", topRun("./tpl.txt"), "",
       sameFile("output file ./tpl.txt is the same file as the template tpl.txt"), 1,
       {{"tpl.txt", "%module%\n"}}},
      {"error file is a design file", plus(kComplete, {"-err", "other.vhd"}), "",
       sameFile("error file other.vhd is the same file as the design file other.vhd"), 1,
       {{"other.vhd", kOther}, {"out.txt", kMissing}}},
      {"error file is the output", plus(kComplete, {"-err", "./out.txt"}), "",
       sameFile("error file ./out.txt is the same file as the output file out.txt"), 1,
       {{"out.txt", kMissing}}},
      {"one device for output and errors", plus(topRun("/dev/null"), {"-err", "/dev/null"}),
       "forge(vhdl) completed successfully.\n", "", 0},
      {"debug lines name the direction",
       {"-lang", "verilog", "-lib", "work", "top.v", "-module", "top", "-prj", "demo",
        "-template", "tpl.txt", "-o", "out.txt", "--a"},
       "a: input ;\nforge(verilog) completed successfully.\n", "", 0},
      {"missing template, delete on error",
       plus({"-template", "missing.tpl", "-deleteonerror"}, kComplete), kFailed,
       kMissingTemplate + kUsage, 1, {{"out.txt", kMissing}}},
      {"template is a directory", plus({"-template", "/"}, kComplete), kFailed,
       "FATAL ERROR: Unable to open template file /: Is a directory\n" + kUsage, 1,
       {{"out.txt", kMissing}}},
      {"unopenable output", plus({"-o", "no/dir/out.txt"}, kComplete), kFailed,
       kMissingOutput + kUsage, 1},
      {"template and output both unopenable",
       plus({"-o", "no/dir/out.txt", "-template", "missing.tpl"}, kComplete), kFailed,
       kMissingTemplate + kMissingOutput + kUsage, 1, {{"out.txt", kMissing}}},
      {"error file takes usage and fatal lines",
       plus({"-err", "run.log", "-template", "missing.tpl"}, kComplete), kFailed, "", 1,
       {{"run.log", kMissingTemplate + kUsage}}},
      {"error file takes no reports", plus({"-err", "run.log"}, kComplete), notFound, "", 1,
       {{"run.log", ""}}},
      {"unit not found", kComplete, notFound, "", 1, {{"out.txt", ""}, {"forge.deb", kMissing}}},
      {"delete on error", plus(kComplete, {"-deleteonerror"}), notFound, "", 1,
       {{"out.txt", kMissing}}},
      {"delete on error without output", plus(without(kComplete, "-o", 1), {"-deleteonerror"}),
       kFailed, kUsage, 1, {{"tpl.txt", "%module%\n"}, {"other.vhd", kOther}}},
      {"library without files", plus({"-lib", "work"}, without(kComplete, "-lib", 2)), kFailed,
       kUsage, 1},
      {"module named like the undefined marker",
       plus({"-module", "__UNDEFINED__"}, without(kComplete, "-module", 1)), kFailed, kUsage, 1},
      {"debug dump for a missing input", plus(without(kComplete, "-prj", 1), {"--a"}),
       dump("top", "__UNDEFINED__", "work", "other.vhd") + kFailed, kUsage, 1},
      {"each -lib names its own files",
       {"-lib", "work", "a.vhd", "b.vhd", "-lib", "lib2", "c.vhd", "-prj", "demo", "-template",
        "tpl.txt", "-o", "out.txt", "--a"},
       dump("__UNDEFINED__", "demo", "lib2", "c.vhd") + kFailed, kUsage, 1},
      {"debug mode with complete inputs prints no dump", plus(kComplete, {"--a"}), notFound, "",
       1},
      {"ignored switches", plus(kComplete, {"--inc", "-nodelist", "-inc", "--nodelist"}),
       notFound, "", 1},
      {"first occurrence wins", plus(kComplete, {"-module", "other", "-prj", "x", "-o", "2.txt"}),
       notFound, "", 1, {{"out.txt", ""}, {"2.txt", kMissing}}},
      {"response file, words after it ignored", {"@run.rsp", "-module", "other", "-deleteonerror"},
       notFound, "", 1, {{"out.txt", ""}},
       "-lib\twork\r\nother.vhd \t\n-module top -prj demo -template tpl.txt -o out.txt"},
      {"empty response file", {"@run.rsp"}, kFailed, kUsage, 1, {}, ""},
      {"response file words are literal", {"@run.rsp"},
       "pinforge:Declaration (Module @top) not found.\n" + kFailed, "", 1, {},
       "-lib work other.vhd -module @top -prj demo -template tpl.txt -o out.txt\n"},
      {"verilog design", {"-lang", "verilog", "-lib", "work", "other.v", "-module", "top", "-prj",
                          "demo", "-template", "tpl.txt", "-o", "out.txt"},
       kNotFound + "forge(verilog) completed with errors.\n", "", 1},
  };
  for (const std::string name : {"-module", "-prj", "-template", "-o", "-lib"})
    rows.push_back({"without " + name, without(kComplete, name, name == "-lib" ? 2 : 1), kFailed,
                    kUsage, 1, {{"forge.deb", kMissing}}});
  // Only "verilog" in any case selects Verilog; the first -lang wins.
  for (const auto& [lang, name] : std::vector<std::pair<Args, std::string>>{
           {{"-lang", "VHDL"}, "vhdl"},
           {{"-lang", "systemc"}, "vhdl"},
           {{"-lang", "VeriLog"}, "verilog"},
           {{"-lang", "verilog2"}, "vhdl"},
           {{"-lang", "verilog", "-lang", "vhdl"}, "verilog"}})
    rows.push_back({"language " + lang.back(), plus(without(kComplete, "-module", 1), lang),
                    "forge(" + name + ") completed with errors.\n", kUsage, 1});
  // Without -module the run stops before any design file is read, so the files need not exist.
  // 2 + 995 words are the most a run takes; one more is refused.
  for (const auto& [files, out, err] : {std::tuple{995u, kFailed, kUsage},
                                        std::tuple{996u, std::string(), kTooMany + kUsage}}) {
    Args args = {"-lib", "work"};
    args.resize(2 + files, "f.vhd");
    std::string words;
    for (const std::string& arg : args) words += arg + "\n";
    rows.push_back({std::to_string(files) + " files", args, out, err, 1});
    rows.push_back({std::to_string(files) + " files in a response file", {"@run.rsp"}, out, err,
                    1, {}, words});
  }
  for (const auto& [design, language] :
       {std::pair<Args, std::string>{{"-lib", "work", "top.vhd"}, "vhdl"},
        std::pair<Args, std::string>{{"-lang", "Verilog", "-lib", "work", "top.v"}, "verilog"}})
    rows.push_back({"successful " + language + " run",
                    plus(design, {"-module", "top", "-prj", "demo", "-template", "tpl.txt", "-o",
                                  "out.txt", "-err", "run.log", "-deleteonerror"}),
                    "forge(" + language + ") completed successfully.\n", "", 0,
                    {{"out.txt", "top\n"}, {"run.log", ""}}});
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
             {"a.vhd", "entity a is\nend entity a;\n"},
             {"b.vhd", "entity b is\nend entity b;\n"},
             {"c.vhd", "entity c is\nend entity c;\n"},
             {"tpl.txt", "%module%\n"}})
      ASSERT_TRUE(dir.write(name, text));
    if (row.rsp) {
      ASSERT_TRUE(dir.write("run.rsp", *row.rsp));
    }
    for (const auto& [name, text] : row.before) ASSERT_TRUE(dir.write(name, text));
    const RunResult run = runPinforge(row.args, dir.path());
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.out, row.out);
    EXPECT_EQ(run.err, row.err);
    EXPECT_EQ(run.status, row.status);
    for (const auto& [name, content] : row.files) EXPECT_EQ(dir.read(name), content) << name;
  }
}

}  // namespace
