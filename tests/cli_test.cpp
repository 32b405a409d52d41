// The command line seen from outside where a golden case cannot say it: messages that list the
// bundled templates or name the version, devices, directories, same-file refusals, errors the
// system words, and the most words a run takes. The other rows are the tests/golden/cli_* cases.
#include <gtest/gtest.h>

#include <filesystem>
#include <regex>
#include <set>
#include <sstream>
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
const std::string kTopDesign = "entity top is\n  port (a : in bit);\nend entity top;\n";

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
const std::string kComplete =
    " -lib work other.vhd -module top -prj demo -template tpl.txt -o out.txt";
/// A run of the unit "top", which the design holds.
const std::string kTop = "-lib work top.vhd -module top -prj demo -template tpl.txt -o ";

std::string sameFile(const std::string& what) {
  return "FATAL ERROR: The " + what + "; nothing was written.\n";
}

struct Row {
  std::string what;
  std::string args;  ///< words separated by blanks
  std::string out;
  std::string err;
  int status;
  std::string absent = "";  ///< a file the run must not leave
  std::string name = "";    ///< a file that must hold `text` afterwards
  std::string text = "";
  std::string before = "";  ///< out.txt before the run, when not empty
  std::string rsp = "";     ///< run.rsp, when not empty
};

std::vector<Row> rows() {
  const std::string missingDesign = "gone.vhd: error: No such file or directory\n";
  std::vector<Row> rows = {
      {"unwritable error file", kComplete + " -err no/such/dir/run.log",
       "FATAL ERROR: Unable to open log file no/such/dir/run.log in write mode: No such file or "
       "directory\n",
       "", 1, "out.txt"},
      // The first occurrence of a switch wins, so these come before the complete line.
      {"missing template keeps the previous output", "-template missing.tpl" + kComplete, kFailed,
       kMissingTemplate + kUsage, 1, "", "out.txt", "previous", "previous"},
      {"missing template, delete on error, keeps the previous output",
       "-template missing.tpl -deleteonerror" + kComplete, kFailed, kMissingTemplate + kUsage, 1,
       "", "out.txt", "previous", "previous"},
      {"template and output both unopenable", "-o no/dir/out.txt -template missing.tpl" + kComplete,
       kFailed, kMissingTemplate + kMissingOutput + kUsage, 1, "out.txt"},
      {"error file takes usage and fatal lines", "-err run.log -template missing.tpl" + kComplete,
       kFailed, "", 1, "", "run.log", kMissingTemplate + kUsage},
      {"device output", kTop + "/dev/null -deleteonerror", kDone, "", 0},
      {"one device for output and errors", kTop + "/dev/null -err /dev/null", kDone, "", 0},
      {"full output device", kTop + "/dev/full",
       "pinforge:Unable to write output file /dev/full: No space left on device\n" + kFailed, "",
       1},
      {"full error file", "-err /dev/full -template missing.tpl" + kComplete,
       "pinforge:Unable to write error file /dev/full: No space left on device\n" + kFailed, "", 1},
      {"missing design file beside the unit's", kTop + "out.txt -lib work gone.vhd",
       "pinforge:Unable to read design file gone.vhd; see the messages above.\n" + kFailed,
       missingDesign, 1, "", "out.txt", ""},
      {"directory as a design file", kTop + "out.txt -lib work /",
       "pinforge:Unable to read design file /; see the messages above.\n" + kFailed,
       "/: error: is a directory\n", 1},
      {"template is a directory", "-template /" + kComplete, kFailed,
       "FATAL ERROR: Unable to open template file /: Is a directory\n" + kUsage, 1, "out.txt"},
      {"unopenable output", "-o no/dir/out.txt" + kComplete, kFailed, kMissingOutput + kUsage, 1},
      {"--list of a missing file", "--list -lib work gone.vhd -o out.txt", "", missingDesign, 1,
       "out.txt"},
      {"error file is a design file", kComplete + " -err other.vhd", "",
       sameFile("error file other.vhd is the same file as the design file other.vhd"), 1, "out.txt",
       "other.vhd", kOther},
      {"error file is the output", kComplete + " -err ./out.txt", "",
       sameFile("error file ./out.txt is the same file as the output file out.txt"), 1, "out.txt"},
      {"--version wins over everything else", "-bogus --version --help",
       "pinforge " + projectVersion() + "\n", "", 0},
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
       {std::tuple{995, kFailed, allButLib}, std::tuple{996, std::string(), tooMany}}) {
    std::string words = "-lib\nwork\n";
    for (int file = 0; file < files; ++file) words += "f.vhd\n";
    const std::string what = std::to_string(files) + " files";
    rows.push_back({what, words, out, err, 1});
    rows.push_back({what + " in a response file", "@run.rsp", out, err, 1, "", "", "", "", words});
  }
  return rows;
}

Args words(const std::string& text) {
  std::istringstream stream(text);
  Args result;
  for (std::string word; stream >> word;) result.push_back(word);
  return result;
}

TEST(CommandLine, OutputStatusAndFiles) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  for (const Row& row : rows()) {
    SCOPED_TRACE(row.what);
    ScratchDir dir;
    ASSERT_FALSE(dir.path().empty());
    // The main design holds a unit named "other" only, so asking for "top" ends at the lookup.
    ASSERT_TRUE(dir.write("other.vhd", kOther) && dir.write("tpl.txt", "%module%\n") &&
                dir.write("top.vhd", kTopDesign));
    ASSERT_TRUE(row.before.empty() || dir.write("out.txt", row.before));
    ASSERT_TRUE(row.rsp.empty() || dir.write("run.rsp", row.rsp));
    const RunResult run =
        runPinforge(words(row.args), dir.path(), {{"PINFORGE_TEMPLATE_PATH", ""}});
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.out, row.out);
    EXPECT_EQ(run.err, row.err);
    EXPECT_EQ(run.status, row.status);
    EXPECT_TRUE(row.absent.empty() || !dir.exists(row.absent)) << row.absent;
    EXPECT_TRUE(row.name.empty() || dir.read(row.name) == row.text) << dir.read(row.name);
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
  const std::regex declared("[\\[{](--?[A-Za-z]+)");
  for (std::sregex_iterator it(kUsage.begin(), kUsage.end(), declared), end; it != end; ++it)
    switches.push_back((*it)[1]);
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
  for (const auto& [name, text] : Layout{{"top.vhd", kTopDesign},
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
    const RunResult run = runPinforge(
        words("-lib work top.vhd -module top -prj demo -o out.txt -template " + c.templateName),
        dir.path(), {{"PINFORGE_TEMPLATE_PATH", path}});
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
