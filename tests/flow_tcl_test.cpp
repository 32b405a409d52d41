// The Tcl path seen from outside: a copy of the program runs beside a stand-in runscr that
// captures the driver script, so its head and template, the messages, the fate of the temporary
// file, where runscr comes from and what happens on a signal can be checked.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>

#include <chrono>
#include <filesystem>
#include <ostream>
#include <string>
#include <thread>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

using namespace pinforge_test;

// Also records the files it inherited, prints $FAKE_BULK bytes and then $FAKE_SAY (with
// printf's %b escapes, so a test can ask for a NUL byte), and exits with $FAKE_STATUS.
constexpr const char* kStandInRunscr =
    "#!/bin/sh\n"
    "cp \"$1\" \"$FAKE_CAPTURE\"\n"
    "printf '%s' \"$1\" > \"$FAKE_CAPTURE.name\"\n"
    "ls -l /proc/$$/fd > \"$FAKE_CAPTURE.fds\"\n"
    "if [ -n \"$FAKE_BULK\" ]; then head -c \"$FAKE_BULK\" /dev/zero | tr '\\0' x; fi\n"
    "if [ -n \"$FAKE_SAY\" ]; then printf '%b\\n' \"$FAKE_SAY\"; fi\n"
    "exit \"${FAKE_STATUS:-0}\"\n";

/// `text` with every "@/" replaced by the scratch folder and a slash.
std::string inScratch(std::string text, const ScratchDir& dir) {
  for (size_t at = 0; (at = text.find("@/", at)) != std::string::npos;) {
    text.replace(at, 2, dir.path() + "/");
    at += dir.path().size() + 1;
  }
  return text;
}

constexpr const char* kTwoPorts =
    "library ieee;\nuse ieee.std_logic_1164.all;\nentity top is\n  port (In0 : in std_logic;\n"
    "        InBus : in std_logic_vector(2 downto 0));\nend entity top;\n";
constexpr const char* kTwoPortLists =
    "set PortName [ list  \"In0\" \"InBus\" ]\nset LeftRange [ list  -1 2 ]\n"
    "set RightRange [ list  -1 0 ]\nset PortDir [ list  \"I\" \"I\" ]\nset TotalPorts 2\n";

const std::string kSuccess = "forge(vhdl) completed successfully.\n";
const std::string kFailure = "forge(vhdl) completed with errors.\n";
const std::string kInvokeError =
    "pinforge:ERROR: ProjectMgmt(pinforge)  Unable to invoke tcl file generator\n\n" + kFailure;
const std::string kSystemPath = "/usr/local/bin:/usr/bin:/bin";

struct TclCase {
  const char* name;
  const char* design = kTwoPorts;
  std::string templateText = "";
  std::vector<std::string> extraArgs = {};
  std::string project = "demo";
  std::string projectLine = "demo";  ///< the project as it must appear between the quotes
  std::string fakeSay = "";          ///< what the stand-in prints
  size_t fakeBulk = 0;               ///< how many "x" the stand-in prints before that
  int fakeStatus = 0;
  std::string portLines = kTwoPortLists;
  std::string out = kSuccess;
  std::string err = "";
  int status = 0;
  bool scriptKept = false;
  std::string tmpdir = "@/tmp";        ///< $TMPDIR, "@/" standing for the scratch folder
  std::string scriptFolder = "@/tmp";  ///< where the script must be; empty: nowhere
  std::string shellBeside = "bin";     ///< the folder of the stand-in; no stand-in when empty
  std::string path = "@/bin:" + kSystemPath;  ///< $PATH
};

/// The script up to its port count: the text every earlier version wrote.
std::string expectedHead(const TclCase& c) {
  const std::string project = "set ProjectName \"" + c.projectLine + "\"\n";
  return "# This file drives input variables to the tcl template file\n"
         "#   given below in the \"source\" command.\nset ModuleName \"top\"\n" +
         project + "set ProjectFile \"\"\n" + project +
         "set OutputFileName \"out.txt\"\nset InputFileName \"design.vhd\"\n"
         "set TemplateFileName \"t.tcl\"\nset ErrorFileName \"__UNDEFINED__\"\n"
         "set LibLocation \"\"\n\n# Port Definitions\n" +
         c.portLines;
}

const TclCase kCases[] = {
    {.name = "TwoPorts", .templateText = "puts done\n"},
    {.name = "DirectionsAndIntegerRule",
     .design = "library ieee;\nuse ieee.std_logic_1164.all;\nentity top is\n"
               "  port (a : in std_logic;\n        b : out std_logic_vector(0 to 3);\n"
               "        c : inout std_logic;\n        d : buffer std_logic;\n"
               "        n : in integer range 1000 downto 0);\nend entity top;\n",
     .portLines = "set PortName [ list  \"a\" \"b\" \"c\" \"d\" \"n\" ]\n"
                  "set LeftRange [ list  -1 0 -1 -1 9 ]\nset RightRange [ list  -1 3 -1 -1 0 ]\n"
                  "set PortDir [ list  \"I\" \"O\" \"B\" \"O\" \"I\" ]\nset TotalPorts 5\n",
     .out = "pinforge:WARNING: Module top(Line 8): INTEGER RANGE is only supported for schematic "
            "symbol generation.\n" +
            kSuccess},
    {.name = "TclSpecialsEscaped", .project = "p\"$[x]\\q", .projectLine = "p\\\"\\$\\[x\\]\\\\q"},
    {.name = "TemplateCopiedWholeWithItsBytes",
     .templateText = "# " + std::string(250, 'x') + " end\na\tb\r\n\x01\xff end"},
    {.name = "ShellOutputHiddenOnSuccess", .fakeSay = "chatter"},
    {.name = "DebugKeepsScript",
     .extraArgs = {"--a"},
     .out = "In0: in std_logic;\nInBus: in std_logic_vector (2 DOWNTO 0);\n" + kSuccess,
     .scriptKept = true},
    {.name = "ScriptCannotBeCreated",
     .out = "pinforge:ERROR: ProjectMgmt(pinforge) - Unable to create the temporary tcl script "
            "in @/tmp/missing: No such file or directory\n" +
            kFailure,
     .status = 1,
     .tmpdir = "@/tmp/missing",
     .scriptFolder = ""},
    {.name = "FailureShowsTheEndOfLongOutput",
     .fakeSay = "the error",
     .fakeBulk = 200000,
     .fakeStatus = 1,
     .out = kInvokeError,
     .err = "[... 134474 earlier bytes of the script's output not shown ...]\n" +
            std::string(65536 - 10, 'x') + "the error\n",
     .status = 1,
     .scriptKept = true},
    {.name = "FailureOutputKeepsNulBytes",
     .fakeSay = "a\\0b",
     .fakeStatus = 1,
     .out = kInvokeError,
     .err = std::string("a\0b\n", 4),
     .status = 1,
     .scriptKept = true},
    // A runscr beside the program wins over one on PATH, here one that would fail.
    {.name = "ShellBesideProgramFirst", .path = "@/pathbin:" + kSystemPath},
    {.name = "ShellFromPath", .shellBeside = "pathbin", .path = "@/pathbin:" + kSystemPath},
    // Empty and relative PATH entries mean the current folder, where a stranger's runscr waits.
    {.name = "ShellNeverFromCurrentFolder",
     .out = "pinforge:ERROR: ProjectMgmt(pinforge) - The script shell runscr is neither beside "
            "pinforge nor in a folder on PATH\n" +
            kInvokeError,
     .status = 1,
     .scriptKept = true,
     .scriptFolder = "",
     .shellBeside = "work",
     .path = ":.:work:" + kSystemPath},
};

void PrintTo(const TclCase& c, std::ostream* os) { *os << c.name; }

class TclDriver : public testing::TestWithParam<TclCase> {};

TEST_P(TclDriver, WritesScriptAndJudgesShell) {
  const TclCase& c = GetParam();
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  Layout files = {{"pathbin/runscr", "#!/bin/sh\nexit 9\n"},
                  {"work/design.vhd", c.design},
                  {"work/t.tcl", c.templateText},
                  {"tmp/", ""}};
  if (!c.shellBeside.empty()) files.push_back({c.shellBeside + "/runscr", kStandInRunscr});
  const std::string program = placeCopy(dir, files);
  ASSERT_FALSE(program.empty());
  std::vector<std::string> args = {program,     "-lib",  "work", "design.vhd",
                                   "-module",   "top",   "-prj", c.project,
                                   "-template", "t.tcl", "-o",   "out.txt"};
  args.insert(args.end(), c.extraArgs.begin(), c.extraArgs.end());
  const std::string capture = dir.file("captured.tcl");
  const RunResult run = runProgram(args, dir.file("work"),
                                   {{"PATH", inScratch(c.path, dir)},
                                    {"TMPDIR", inScratch(c.tmpdir, dir)},
                                    {"FAKE_CAPTURE", capture},
                                    {"FAKE_SAY", c.fakeSay},
                                    {"FAKE_BULK", c.fakeBulk ? std::to_string(c.fakeBulk) : ""},
                                    {"FAKE_STATUS", std::to_string(c.fakeStatus)}});
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, c.status);
  EXPECT_EQ(run.out, inScratch(c.out, dir));
  EXPECT_EQ(run.err, c.err);
  std::string script;
  ASSERT_EQ(readFile(capture, script), !c.scriptFolder.empty()) << "whether the stand-in ran";
  if (c.scriptFolder.empty()) return;
  // What lies between the port count and the template is pinned by tcl_driver_script_test.
  const std::string head = expectedHead(c);
  EXPECT_EQ(script.substr(0, head.size()), head);
  EXPECT_TRUE(script.ends_with(c.templateText)) << script;

  const std::string scriptName = readFile(capture + ".name");
  EXPECT_TRUE(scriptName.starts_with(inScratch(c.scriptFolder, dir) + "/")) << scriptName;
  EXPECT_TRUE(scriptName.ends_with(".tcl")) << scriptName;
  EXPECT_EQ(readFile(scriptName) != "<missing>", c.scriptKept);
  // The shell holds none of the program's files, the output least of all.
  const std::string inherited = readFile(capture + ".fds");
  for (const char* name : {"/out.txt", "/t.tcl", "/design.vhd"})
    EXPECT_EQ(inherited.find(name), std::string::npos) << inherited;
}

INSTANTIATE_TEST_SUITE_P(Cases, TclDriver, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<TclCase>& row) {
                           return std::string(row.param.name);
                         });

TEST(TclShell, RealShellWithTempFolderLikeAnOption) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  if (findOnPath("tclsh").empty()) GTEST_SKIP() << "tclsh is not installed";
  ScratchDir dir;
  const std::string program =
      placeCopy(dir, {{"bin/runscr", readFile(sourceDir() + "/tools/runscr")},
                      {"work/-tmp/", ""},
                      {"work/design.vhd", kTwoPorts},
                      {"work/t.tcl",
                       "set f [open $OutputFileName w]\n"
                       "puts $f \"$ModuleName [llength $PortName]\"\nclose $f\n"}});
  ASSERT_FALSE(program.empty());
  const RunResult run = runProgram({program, "-lib", "work", "design.vhd", "-module", "top", "-prj",
                                    "p", "-template", "t.tcl", "-o", "out.txt"},
                                   dir.file("work"), {{"TMPDIR", "-tmp"}});
  EXPECT_EQ(run.out, kSuccess);
  EXPECT_EQ(run.err, "");
  EXPECT_EQ(run.status, 0);
  EXPECT_EQ(dir.read("work/out.txt"), "top 2\n");

  // runscr itself, given such a name by hand.
  ASSERT_TRUE(dir.write("work/-tmp/direct.tcl", "set f [open direct.txt w]; puts $f ok; close $f"));
  const RunResult direct =
      runProgram({dir.file("bin/runscr"), "-tmp/direct.tcl"}, dir.file("work"));
  EXPECT_EQ(direct.status, 0) << direct.err;
  EXPECT_EQ(dir.read("work/direct.txt"), "ok\n");
}

/// A stand-in shell that says it has started, then, a second later, writes ".late" itself and
/// from a background job of its own: neither may happen once the program has been stopped.
constexpr const char* kSlowRunscr =
    "#!/bin/sh\n"
    "printf '%s' \"$1\" > \"$FAKE_CAPTURE.name\"\n"
    "(sleep 1; echo late > \"$FAKE_CAPTURE.late-job\") &\n"
    "echo $$ > \"$FAKE_CAPTURE.pid\"\n"
    "sleep 1\n"
    "echo late > \"$FAKE_CAPTURE.late\"\n";

class TclInterrupt : public testing::TestWithParam<int> {};

TEST_P(TclInterrupt, StopsShellRemovesScriptAndEndsWithTheSignal) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  const std::string program = placeCopy(dir, {{"bin/runscr", kSlowRunscr},
                                              {"work/design.vhd", kTwoPorts},
                                              {"work/t.tcl", "puts done\n"},
                                              {"tmp/", ""}});
  ASSERT_FALSE(program.empty());
  const std::string capture = dir.file("captured");
  const pid_t child =
      startQuietly({program, "-lib", "work", "design.vhd", "-module", "top", "-prj", "p",
                    "-template", "t.tcl", "-o", "out.txt"},
                   dir.file("work"), {{"TMPDIR", dir.file("tmp")}, {"FAKE_CAPTURE", capture}});
  ASSERT_GE(child, 0);
  bool started = false;
  for (int wait = 0; wait < 200 && !started; ++wait) {
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    started = readFile(capture + ".pid") != "<missing>";
  }
  EXPECT_TRUE(started);
  ::kill(child, GetParam());
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == GetParam()) << status;
  const std::string scriptName = readFile(capture + ".name");
  EXPECT_TRUE(scriptName.starts_with(dir.file("tmp/"))) << scriptName;
  EXPECT_EQ(readFile(scriptName), "<missing>");
  std::this_thread::sleep_for(std::chrono::milliseconds(1500));
  EXPECT_EQ(readFile(capture + ".late"), "<missing>");
  EXPECT_EQ(readFile(capture + ".late-job"), "<missing>");
}

INSTANTIATE_TEST_SUITE_P(Signals, TclInterrupt, testing::Values(SIGINT, SIGTERM, SIGHUP),
                         [](const testing::TestParamInfo<int>& row) {
                           return std::string(sigabbrev_np(row.param));
                         });

}  // namespace
