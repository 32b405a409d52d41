// Whole runs of the binary where the golden format cannot say enough: the trace file exists
// only in debug mode once the unit is found, an unwritable trace file does not break the run
// and a symlink is never followed to write it, a file-size limit fails the run cleanly,
// links cannot make an input the output, -deleteonerror on the Tcl path, an interrupted run
// leaves the previous output and no temporary file, the script shell is found beside tclsh,
// and the shipped demo keeps its reviewed outputs.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

using namespace pinforge_test;

constexpr const char* kDesign =
    "library ieee;\nuse ieee.std_logic_1164.all;\n"
    "entity top is\n  port (clk : in std_logic; q : out std_logic_vector(3 downto 0));\n"
    "end entity top;\n";

std::vector<std::string> argsFor(const std::string& module, const std::string& templateName) {
  return {"-lib", "work",      "design.vhd", "-module", module,   "-prj",
          "demo", "-template", templateName, "-o",      "out.txt"};
}

// The Tcl rows run a stand-in script shell beside a copy of the program.
TEST(FlowRun, TraceFileAndTclFailures) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  const char* succeeds = "exit 0\n";
  const char* fails = "echo partial > out.txt\nexit 1\n";
  const struct {
    const char* what;
    const char* module;
    const char* templateName;  // ".tcl" takes the Tcl path
    std::vector<std::string> extra;
    const char* runscr;
    bool traceIsFolder;  // "forge.deb" exists as a folder, so it cannot be written
    int status;
    const char* output;
    bool traced;
  } cases[] = {
      {"no debug", "top", "t.txt", {}, succeeds, false, 0, "top\n", false},
      {"debug", "top", "t.txt", {"--a"}, succeeds, false, 0, "top\n", true},
      {"debug, unit missing", "other", "t.txt", {"--a"}, succeeds, false, 1, "", false},
      {"debug, Tcl path", "top", "t.tcl", {"--a"}, succeeds, false, 0, "", true},
      {"unwritable trace", "top", "t.txt", {"--a"}, succeeds, true, 0, "top\n", true},
      {"failed script keeps its output", "top", "t.tcl", {}, fails, false, 1, "partial\n", false},
      {"failed script, delete on error",
       "top",
       "t.tcl",
       {"-deleteonerror"},
       fails,
       false,
       1,
       "<missing>",
       false},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    ScratchDir dir;
    std::vector<std::string> args = argsFor(c.module, c.templateName);
    args.insert(args.end(), c.extra.begin(), c.extra.end());
    Layout files = {{"bin/runscr", std::string("#!/bin/sh\n") + c.runscr},
                    {"work/design.vhd", kDesign},
                    {std::string("work/") + c.templateName, "%module%\n"}};
    if (c.traceIsFolder) files.push_back({"work/forge.deb/", ""});
    args.insert(args.begin(), placeCopy(dir, files));
    ASSERT_FALSE(args.front().empty());
    const RunResult run = runProgram(args, dir.file("work"));
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.status, c.status) << run.out << run.err;
    EXPECT_EQ(dir.read("work/out.txt"), c.output);
    EXPECT_EQ(dir.exists("work/forge.deb"), c.traced);
  }
}

TEST(FlowRun, TraceFileIsNeverWrittenThroughASymlink) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  for (const char* target : {"victim", "absent"}) {
    SCOPED_TRACE(target);
    ScratchDir dir;
    ASSERT_TRUE(dir.write("design.vhd", kDesign) && dir.write("t.txt", "%module%\n") &&
                dir.write("victim", "keep"));
    ASSERT_EQ(symlink(target, dir.file("forge.deb").c_str()), 0);
    std::vector<std::string> args = argsFor("top", "t.txt");
    args.push_back("--a");
    const RunResult run = runPinforge(args, dir.path());
    EXPECT_EQ(run.status, 0);
    EXPECT_EQ(run.out,
              "pinforge:WARNING: Unable to open trace file forge.deb: it is a symbolic link, which "
              "is not followed; the run goes on without it.\n"
              "clk: in std_logic;\nq: out std_logic_vector (3 DOWNTO 0);\n"
              "forge(vhdl) completed successfully.\n");
    EXPECT_EQ(dir.read("victim"), "keep");
    EXPECT_FALSE(dir.exists("absent"));
    EXPECT_EQ(dir.read("out.txt"), "top\n");
  }
}

TEST(FlowRun, FileSizeLimitFailsTheRun) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  std::string templateText, expected;
  for (int line = 0; line < 4000; ++line) {
    templateText += "%module%\n";
    expected += "top\n";
  }
  for (bool deleteOnError : {false, true}) {
    SCOPED_TRACE(deleteOnError);
    ScratchDir dir;
    ASSERT_TRUE(dir.write("design.vhd", kDesign) && dir.write("t.txt", templateText));
    // The shell sets the limit (in blocks of 512 or 1024 bytes) and leaves SIGXFSZ as it is.
    std::vector<std::string> args = {"/bin/sh", "-c", "ulimit -f 1 && exec \"$0\" \"$@\"",
                                     binaryPath()};
    for (const std::string& arg : argsFor("top", "t.txt")) args.push_back(arg);
    if (deleteOnError) args.push_back("-deleteonerror");
    const RunResult run = runProgram(args, dir.path());
    EXPECT_EQ(run.status, 1);
    EXPECT_EQ(run.out,
              "pinforge:Unable to write output file out.txt: File too large\n"
              "forge(vhdl) completed with errors.\n");
    EXPECT_EQ(run.err, "");
    const std::string partial = dir.read("out.txt");
    if (deleteOnError) {
      EXPECT_FALSE(dir.exists("out.txt"));
    } else {
      EXPECT_FALSE(partial.empty());
      EXPECT_LE(partial.size(), 1024u);
      EXPECT_TRUE(expected.starts_with(partial));
    }
    EXPECT_EQ(dir.names().size(), deleteOnError ? 2u : 3u) << "a temporary file was left behind";
  }
}

TEST(FlowRun, LinksCannotMakeAnInputTheOutput) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  ScratchDir dir;
  ASSERT_TRUE(dir.write("design.vhd", kDesign) && dir.write("t.txt", "%module%\n") &&
              dir.makeDir("sub"));
  ASSERT_EQ(link(dir.file("t.txt").c_str(), dir.file("hard.txt").c_str()), 0);
  ASSERT_EQ(symlink("design.vhd", dir.file("sym.vhd").c_str()), 0);
  for (const auto& [output, message] :
       {std::pair{"hard.txt", "The output file hard.txt is the same file as the template t.txt"},
        std::pair{"sym.vhd",
                  "The output file sym.vhd is the same file as the design file design.vhd"},
        std::pair{"sub/../t.txt",
                  "The output file sub/../t.txt is the same file as the template t.txt"}}) {
    SCOPED_TRACE(output);
    std::vector<std::string> args = argsFor("top", "t.txt");
    args.back() = output;
    const RunResult run = runPinforge(args, dir.path());
    EXPECT_EQ(run.status, 1);
    EXPECT_EQ(run.out, "");
    EXPECT_EQ(run.err, std::string("FATAL ERROR: ") + message + "; nothing was written.\n");
    EXPECT_EQ(dir.read("t.txt"), "%module%\n");
    EXPECT_EQ(dir.read("design.vhd"), kDesign);
  }
}

TEST(FlowRun, InterruptedRunLeavesThePreviousOutput) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  using namespace std::chrono_literals;
  for (int number : {SIGINT, SIGTERM}) {
    SCOPED_TRACE(number);
    ScratchDir dir;
    ASSERT_TRUE(dir.write("design.vhd", kDesign) && dir.write("out.txt", "previous"));
    // A template fed through a FIFO holds the run in the middle of its expansion.
    ASSERT_EQ(mkfifo(dir.file("t.txt").c_str(), 0600), 0);
    const std::set<std::string> before = dir.names();
    std::vector<std::string> args = argsFor("top", "t.txt");
    args.insert(args.begin(), binaryPath());
    const pid_t child = startQuietly(args, dir.path());
    ASSERT_GE(child, 0);
    int writer = -1;
    bool temporarySeen = false;
    for (auto deadline = std::chrono::steady_clock::now() + 20s;
         !temporarySeen && std::chrono::steady_clock::now() < deadline;) {
      if (writer < 0) writer = open(dir.file("t.txt").c_str(), O_WRONLY | O_NONBLOCK);
      if (writer >= 0 && dir.names().size() > before.size()) temporarySeen = true;
      std::this_thread::sleep_for(10ms);
    }
    if (writer >= 0) {
      EXPECT_EQ(write(writer, "%module%\n", 9), 9);
    }
    std::this_thread::sleep_for(50ms);
    kill(child, number);
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    if (writer >= 0) close(writer);
    EXPECT_TRUE(temporarySeen);
    EXPECT_TRUE((WIFSIGNALED(status) && WTERMSIG(status) == number) ||
                (WIFEXITED(status) && WEXITSTATUS(status) == 128 + number))
        << status;
    EXPECT_EQ(dir.names(), before);
    EXPECT_EQ(dir.read("out.txt"), "previous");
  }
}

TEST(FlowRun, ScriptShellFoundBesideTclshWhenNotOnPath) {
  const std::string tclsh = findOnPath("tclsh");
  if (tclsh.empty() || binaryPath().empty()) GTEST_SKIP() << "tclsh or PINFORGE_BIN missing";
  const std::string tclDir = std::filesystem::path(tclsh).parent_path().string();
  if (access((tclDir + "/runscr").c_str(), F_OK) == 0)
    GTEST_SKIP() << "a runscr is installed beside tclsh";
  ScratchDir work;
  ASSERT_TRUE(work.write("design.vhd", kDesign));
  ASSERT_TRUE(work.write("t.tcl",
                         "set f [open $OutputFileName w]\n"
                         "puts $f \"$ModuleName $TotalPorts $PortName\"\n"
                         "close $f\n"));
  const RunResult run = runPinforge(argsFor("top", "t.tcl"), work.path(), {{"PATH", tclDir}});
  EXPECT_EQ(run.status, 0) << run.out << run.err;
  EXPECT_EQ(work.read("out.txt"), "top 2 clk q\n");
}

TEST(FlowRun, DemoProducesTheReviewedOutputs) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  const std::string source = sourceDir();
  ScratchDir out;
  const RunResult run =
      runProgram({"/bin/sh", source + "/examples/demo.sh", binaryPath(), out.path()}, source);
  EXPECT_EQ(run.status, 0) << run.out << run.err;
  EXPECT_NE(run.out.find("Outputs are in "), std::string::npos) << run.out;
  // The port tables come from the Tcl template, which needs tclsh.
  const bool haveTcl = !findOnPath("tclsh").empty();
  std::error_code error;
  int compared = 0;
  for (const auto& entry :
       std::filesystem::directory_iterator(source + "/examples/expected", error)) {
    const std::string name = entry.path().filename().string();
    if (!haveTcl && name.ends_with("_ports.txt")) continue;
    EXPECT_EQ(out.read(name), readFile(entry.path().string())) << name;
    ++compared;
  }
  EXPECT_GE(compared, 6);
}

}  // namespace
