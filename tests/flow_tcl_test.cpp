// The Tcl path seen from outside: a copy of the program runs beside a stand-in runscr that
// captures the driver script, so the whole script, the messages, the fate of the temporary
// file, where runscr comes from and what happens on a signal can be checked.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
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
    "library ieee;\nuse ieee.std_logic_1164.all;\n"
    "entity top is\n"
    "  port (In0 : in std_logic;\n"
    "        InBus : in std_logic_vector(2 downto 0));\n"
    "end entity top;\n";

constexpr const char* kTwoPortLists =
    "set PortName [ list  \"In0\" \"InBus\" ]\n"
    "set LeftRange [ list  -1 2 ]\n"
    "set RightRange [ list  -1 0 ]\n"
    "set PortDir [ list  \"I\" \"I\" ]\n"
    "set TotalPorts 2\n";

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
  return "# This file drives input variables to the tcl template file\n"
         "#   given below in the \"source\" command.\n"
         "set ModuleName \"top\"\n"
         "set ProjectName \"" +
         c.projectLine +
         "\"\n"
         "set ProjectFile \"\"\n"
         "set ProjectName \"" +
         c.projectLine +
         "\"\n"
         "set OutputFileName \"out.txt\"\n"
         "set InputFileName \"design.vhd\"\n"
         "set TemplateFileName \"t.tcl\"\n"
         "set ErrorFileName \"__UNDEFINED__\"\n"
         "set LibLocation \"\"\n"
         "\n"
         "# Port Definitions\n" +
         c.portLines;
}

/// The lines between the port count and the template, line by line as their names: their
/// values come from the readers and are checked with design data of the test's own making.
bool hasDesignDetails(const std::string& details) {
  const char* kLines[] = {"",
                          "# Generic Definitions",
                          "set GenericName [ list ",
                          "set GenericType [ list ",
                          "set GenericDefault [ list ",
                          "set GenericValue [ list ",
                          "set TotalGenerics ",
                          "",
                          "# Declared Types and Context",
                          "set PortType [ list "};
  size_t at = 0;
  for (const char* line : kLines) {
    const size_t end = details.find('\n', at);
    if (end == std::string::npos || details.compare(at, std::strlen(line), line) != 0) return false;
    at = end + 1;
  }
  // The context is one quoted value that may span lines.
  const std::string_view rest = std::string_view(details).substr(at);
  return rest.starts_with("set Context \"") && rest.ends_with("\"\nset Language \"vhdl\"\n");
}

const TclCase kCases[] = {
    {.name = "TwoPorts", .templateText = "puts done\n"},
    {.name = "DirectionsAndIntegerRule",
     .design = "library ieee;\nuse ieee.std_logic_1164.all;\n"
               "entity top is\n"
               "  port (a : in std_logic;\n"
               "        b : out std_logic_vector(0 to 3);\n"
               "        c : inout std_logic;\n"
               "        d : buffer std_logic;\n"
               "        n : in integer range 1000 downto 0);\n"
               "end entity top;\n",
     .portLines = "set PortName [ list  \"a\" \"b\" \"c\" \"d\" \"n\" ]\n"
                  "set LeftRange [ list  -1 0 -1 -1 9 ]\n"
                  "set RightRange [ list  -1 3 -1 -1 0 ]\n"
                  "set PortDir [ list  \"I\" \"O\" \"B\" \"O\" \"I\" ]\n"
                  "set TotalPorts 5\n",
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
  ASSERT_FALSE(dir.path().empty());
  for (const char* sub : {"bin", "pathbin", "work", "tmp"}) ASSERT_TRUE(dir.makeDir(sub));
  ASSERT_TRUE(placeProgram(dir.file("bin/pinforge")));
  ASSERT_TRUE(dir.write("pathbin/runscr", "#!/bin/sh\nexit 9\n", true));
  if (!c.shellBeside.empty()) {
    ASSERT_TRUE(dir.write(c.shellBeside + "/runscr", kStandInRunscr, true));
  }
  ASSERT_TRUE(dir.write("work/design.vhd", c.design));
  ASSERT_TRUE(dir.write("work/t.tcl", c.templateText));

  std::vector<std::string> args = {dir.file("bin/pinforge"),
                                   "-lib",
                                   "work",
                                   "design.vhd",
                                   "-module",
                                   "top",
                                   "-prj",
                                   c.project,
                                   "-template",
                                   "t.tcl",
                                   "-o",
                                   "out.txt"};
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
  const std::string head = expectedHead(c);
  EXPECT_EQ(script.substr(0, head.size()), head);
  ASSERT_TRUE(script.ends_with(c.templateText)) << script;
  const std::string details =
      script.substr(head.size(), script.size() - head.size() - c.templateText.size());
  EXPECT_TRUE(hasDesignDetails(details)) << details;

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
                         [](const testing::TestParamInfo<TclCase>& info) {
                           return std::string(info.param.name);
                         });

TEST(TclShell, RealShellWithTempFolderLikeAnOption) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  if (findOnPath("tclsh").empty()) GTEST_SKIP() << "tclsh is not installed";
  ScratchDir dir;
  for (const char* sub : {"bin", "work", "work/-tmp"}) ASSERT_TRUE(dir.makeDir(sub));
  ASSERT_TRUE(placeProgram(dir.file("bin/pinforge")));
  const std::string runscr = dir.file("bin/runscr");
  std::error_code error;
  ASSERT_TRUE(std::filesystem::copy_file(sourceDir() + "/tools/runscr", runscr, error));
  ASSERT_TRUE(dir.write("work/design.vhd", kTwoPorts));
  ASSERT_TRUE(dir.write("work/t.tcl",
                        "set f [open $OutputFileName w]\n"
                        "puts $f \"$ModuleName [llength $PortName]\"\nclose $f\n"));
  const RunResult run =
      runProgram({dir.file("bin/pinforge"), "-lib", "work", "design.vhd", "-module", "top", "-prj",
                  "p", "-template", "t.tcl", "-o", "out.txt"},
                 dir.file("work"), {{"TMPDIR", "-tmp"}});
  EXPECT_EQ(run.out, kSuccess);
  EXPECT_EQ(run.err, "");
  EXPECT_EQ(run.status, 0);
  EXPECT_EQ(dir.read("work/out.txt"), "top 2\n");

  // runscr itself, given such a name by hand.
  ASSERT_TRUE(dir.write("work/-tmp/direct.tcl", "set f [open direct.txt w]; puts $f ok; close $f"));
  const RunResult direct = runProgram({runscr, "-tmp/direct.tcl"}, dir.file("work"));
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
  for (const char* sub : {"bin", "work", "tmp"}) ASSERT_TRUE(dir.makeDir(sub));
  ASSERT_TRUE(placeProgram(dir.file("bin/pinforge")));
  ASSERT_TRUE(dir.write("bin/runscr", kSlowRunscr, true));
  ASSERT_TRUE(dir.write("work/design.vhd", kTwoPorts));
  ASSERT_TRUE(dir.write("work/t.tcl", "puts done\n"));
  const std::string capture = dir.file("captured");
  const std::string program = dir.file("bin/pinforge");
  const pid_t child = ::fork();
  ASSERT_GE(child, 0);
  if (child == 0) {
    const int quiet = ::open("/dev/null", O_WRONLY);
    if (quiet < 0 || ::dup2(quiet, 1) < 0 || ::dup2(quiet, 2) < 0 ||
        ::chdir(dir.file("work").c_str()) != 0 || ::setenv("TMPDIR", dir.file("tmp").c_str(), 1) ||
        ::setenv("FAKE_CAPTURE", capture.c_str(), 1))
      ::_exit(127);
    ::execl(program.c_str(), program.c_str(), "-lib", "work", "design.vhd", "-module", "top",
            "-prj", "p", "-template", "t.tcl", "-o", "out.txt", static_cast<char*>(nullptr));
    ::_exit(127);
  }
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
                         [](const testing::TestParamInfo<int>& info) {
                           return std::string(sigabbrev_np(info.param));
                         });

}  // namespace
