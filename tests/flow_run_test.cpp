// Whole runs of the binary where the golden format cannot say enough: the trace file must be
// created only in debug mode and only once the unit is found, and an unwritable trace file
// must not break the run.
#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>
#include <string>
#include <vector>

#include "flow_support.h"

namespace {

constexpr const char* kDesign =
    "library ieee;\nuse ieee.std_logic_1164.all;\n"
    "entity top is\n  port (clk : in std_logic; q : out std_logic_vector(3 downto 0));\n"
    "end entity top;\n";

struct TraceCase {
  const char* name;
  const char* module;
  const char* templateName;  // ".tcl" takes the Tcl path (a stand-in runscr that succeeds)
  bool debug;
  bool traceIsDirectory;  // "forge.deb" already exists as a directory
  bool traceExpected;
  int expectedStatus;
  const char* expectedOutput;  // out.txt after the run
};

const TraceCase kCases[] = {
    {"NoDebugNoTrace", "top", "t.txt", false, false, false, 0, "top\n"},
    {"DebugWritesTrace", "top", "t.txt", true, false, true, 0, "top\n"},
    {"DebugUnitMissingNoTrace", "other", "t.txt", true, false, false, 1, ""},
    {"DebugTclPathWritesTrace", "top", "t.tcl", true, false, true, 0, ""},
    {"UnwritableTraceIgnored", "top", "t.txt", true, true, false, 0, "top\n"},
};

void PrintTo(const TraceCase& c, std::ostream* os) { *os << c.name; }

class TraceFileTest : public testing::TestWithParam<TraceCase> {};

TEST_P(TraceFileTest, CreatedOnlyWhenDebugging) {
  const TraceCase& c = GetParam();
  flowtest::TempDir dir;
  ASSERT_FALSE(dir.path().empty());
  const std::string bin = dir.file("bin");
  const std::string work = dir.file("work");
  ASSERT_TRUE(flowtest::makeDirectory(bin));
  ASSERT_TRUE(flowtest::makeDirectory(work));
  ASSERT_TRUE(flowtest::writeFile(bin + "/runscr", "#!/bin/sh\nexit 0\n", true));
  ASSERT_TRUE(flowtest::writeFile(work + "/design.vhd", kDesign));
  ASSERT_TRUE(flowtest::writeFile(work + "/" + c.templateName, "%module%\n"));
  if (c.traceIsDirectory) {
    ASSERT_TRUE(flowtest::makeDirectory(work + "/forge.deb"));
  }

  std::vector<std::string> args = {"-lib", "work", "design.vhd", "-module",    c.module,
                                   "-prj", "demo", "-template",  c.templateName, "-o",
                                   "out.txt"};
  if (c.debug) args.push_back("--a");
  const char* path = std::getenv("PATH");
  const flowtest::RunResult run =
      flowtest::runProgram(flowtest::pinforgeBinary(), args, work,
                           {{"PATH", bin + ":" + (path != nullptr ? path : "/usr/bin:/bin")}});
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, c.expectedStatus) << run.out << run.err;
  EXPECT_EQ(flowtest::readFile(work + "/out.txt"), c.expectedOutput);

  if (!c.traceIsDirectory) {
    EXPECT_EQ(flowtest::exists(work + "/forge.deb"), c.traceExpected);
  }
}

TEST(ScriptShell, FoundBesideTheExecutableWhenNotOnPath) {
  const std::string tclDir = flowtest::directoryOnPath("tclsh");
  if (tclDir.empty()) GTEST_SKIP() << "tclsh is not installed";
  if (flowtest::exists(tclDir + "/runscr")) GTEST_SKIP() << "a runscr is installed beside tclsh";
  flowtest::TempDir work;
  ASSERT_FALSE(work.path().empty());
  ASSERT_TRUE(flowtest::writeFile(work.file("design.vhd"), kDesign));
  ASSERT_TRUE(flowtest::writeFile(work.file("t.tcl"),
                                  "set f [open $OutputFileName w]\n"
                                  "puts $f \"$ModuleName $TotalPorts $PortName\"\n"
                                  "close $f\n"));
  const flowtest::RunResult run = flowtest::runProgram(
      flowtest::pinforgeBinary(),
      {"-lib", "work", "design.vhd", "-module", "top", "-prj", "demo", "-template", "t.tcl",
       "-o", "out.txt"},
      work.path(), {{"PATH", tclDir}});
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, 0) << run.out << run.err;
  EXPECT_EQ(flowtest::readFile(work.file("out.txt")), "top 2 clk q\n");
}

INSTANTIATE_TEST_SUITE_P(Cases, TraceFileTest, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<TraceCase>& info) {
                           return std::string(info.param.name);
                         });

}  // namespace
