// The command line seen from outside where a golden case cannot say it: messages that list the
// bundled templates or name the version, devices, directories, same-file refusals, errors the
// system words, and the most words a run takes. The other rows are the tests/golden/cli_* cases.
#include <gtest/gtest.h>

#include <filesystem>
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
const std::string kFailed = "forge(vhdl) completed with errors.\n";
const std::string kDone = "forge(vhdl) completed successfully.\n";
const std::string kMissing = "<missing>";
const std::string kOther = "entity other is\nend entity other;\n";

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

/// The project version the build gives the program: the VERSION of CMakeLists.txt's project().
std::string projectVersion() {
  const std::string cmake = readFile(sourceDir() + "/CMakeLists.txt");
  const std::string key = "project(pinforge VERSION ";
  const size_t begin = cmake.find(key);
  if (begin == std::string::npos) return "<no project version>";
  return cmake.substr(begin + key.size(), cmake.find(' ', begin + key.size()) - begin - key.size());
}

/// A complete command line whose only problem is that the design has no unit "top".
const Args kComplete = {"-lib", "work",      "other.vhd", "-module", "top",    "-prj",
                        "demo", "-template", "tpl.txt",   "-o",      "out.txt"};
Args plus(Args base, const Args& extra) {
  base.insert(base.end(), extra.begin(), extra.end());
  return base;
}

/// A run of the unit "top", which the design holds, writing to `output`.
Args topRun(const std::string& output) {
  return {"-lib", "work",      "top.vhd", "-module", "top", "-prj",
          "demo", "-template", "tpl.txt", "-o",      output};
}

std::string sameFile(const std::string& what) {
  return "FATAL ERROR: The " + what + "; nothing was written.\n";
}

struct Row {
  std::string what;
  Args args;
  std::string out;
  std::string err;
  int status;
  std::vector<std::pair<std::string, std::string>> files = {};  ///< name -> content or kMissing
  std::string before = "";  ///< out.txt before the run, when not empty
  std::string rsp = "";     ///< run.rsp, when not empty
};

std::vector<Row> rows() {
  std::vector<Row> rows = {
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
       "previous"},
      {"missing template, delete on error, keeps the previous output",
       plus({"-template", "missing.tpl", "-deleteonerror"}, kComplete),
       kFailed,
       kMissingTemplate + kUsage,
       1,
       {{"out.txt", "previous"}},
       "previous"},
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
      {"device output", plus(topRun("/dev/null"), {"-deleteonerror"}), kDone, "", 0},
      {"one device for output and errors", plus(topRun("/dev/null"), {"-err", "/dev/null"}), kDone,
       "", 0},
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
      {"template is a directory",
       plus({"-template", "/"}, kComplete),
       kFailed,
       "FATAL ERROR: Unable to open template file /: Is a directory\n" + kUsage,
       1,
       {{"out.txt", kMissing}}},
      {"unopenable output", plus({"-o", "no/dir/out.txt"}, kComplete), kFailed,
       kMissingOutput + kUsage, 1},
      {"--list of a missing file",
       {"--list", "-lib", "work", "gone.vhd", "-o", "out.txt"},
       "",
       "gone.vhd: error: No such file or directory\n",
       1,
       {{"out.txt", kMissing}}},
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
      {"--version wins over everything else",
       {"-bogus", "--version", "--help"},
       "pinforge " + projectVersion() + "\n",
       "",
       0},
  };
  // Without -module the run stops before any design file is read, so the files need not exist.
  // 2 + 995 words are the most a run takes; one more is refused.
  const std::string allButLib =
      "pinforge: missing -module <module_name>\npinforge: missing -prj <project>\n"
      "pinforge: missing -template <template_file>\npinforge: missing -o <stbfile>\n" +
      kUsage;
  const std::string tooMany =
      "FATAL ERROR: The number of command line arguments exceeds the max allowed (997).\n" + kUsage;
  for (const auto& [files, out, err] :
       {std::tuple{995u, kFailed, allButLib}, std::tuple{996u, std::string(), tooMany}}) {
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
                    "",
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
    ASSERT_TRUE(dir.write("other.vhd", kOther) && dir.write("tpl.txt", "%module%\n") &&
                dir.write("top.vhd", "entity top is\n  port (a : in bit);\nend entity top;\n"));
    ASSERT_TRUE(row.before.empty() || dir.write("out.txt", row.before));
    ASSERT_TRUE(row.rsp.empty() || dir.write("run.rsp", row.rsp));
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

}  // namespace
