// Whole runs of the binary where the golden format cannot say enough: the trace file exists
// only in debug mode once the unit is found, an unwritable trace file does not break the run,
// the script shell is found beside tclsh, and the shipped demo keeps its reviewed outputs.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <string>
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
  return {"-lib", "work", "design.vhd", "-module", module,   "-prj",
          "demo", "-template", templateName, "-o", "out.txt"};
}

TEST(FlowRun, TraceFileOnlyWhenDebuggingAFoundUnit) {
  if (binaryPath().empty()) GTEST_SKIP() << "PINFORGE_BIN is not set";
  const struct {
    const char* what;
    const char* module;
    const char* templateName;  // ".tcl" takes the Tcl path (a stand-in runscr that succeeds)
    bool debug;
    bool traceIsDirectory;  // "forge.deb" already exists as a directory
    int status;
    const char* output;
    bool traced;
  } cases[] = {
      {"no debug", "top", "t.txt", false, false, 0, "top\n", false},
      {"debug", "top", "t.txt", true, false, 0, "top\n", true},
      {"debug, unit missing", "other", "t.txt", true, false, 1, "", false},
      {"debug, Tcl path", "top", "t.tcl", true, false, 0, "", true},
      {"unwritable trace", "top", "t.txt", true, true, 0, "top\n", true},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    ScratchDir dir;
    ASSERT_TRUE(dir.makeDir("bin") && dir.makeDir("work"));
    ASSERT_TRUE(dir.write("bin/runscr", "#!/bin/sh\nexit 0\n", true));
    ASSERT_TRUE(dir.write("work/design.vhd", kDesign));
    ASSERT_TRUE(dir.write(std::string("work/") + c.templateName, "%module%\n"));
    if (c.traceIsDirectory) {
      ASSERT_TRUE(dir.makeDir("work/forge.deb"));
    }
    std::vector<std::string> args = argsFor(c.module, c.templateName);
    if (c.debug) args.push_back("--a");
    // runscr is taken from beside the program first, so the program runs from bin/ too.
    std::error_code error;
    ASSERT_TRUE(std::filesystem::copy_file(binaryPath(), dir.file("bin/pinforge"), error));
    args.insert(args.begin(), dir.file("bin/pinforge"));
    const RunResult run = runProgram(args, dir.file("work"));
    ASSERT_TRUE(run.started);
    EXPECT_EQ(run.status, c.status) << run.out << run.err;
    EXPECT_EQ(dir.read("work/out.txt"), c.output);
    EXPECT_EQ(dir.exists("work/forge.deb"), c.traced);
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
