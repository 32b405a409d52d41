// The Tcl path seen from outside: a stand-in runscr placed first on PATH captures the driver
// script, so the whole script, the messages and the fate of the temporary file can be checked.
#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>
#include <string>
#include <vector>

#include "flow_support.h"

namespace {


constexpr const char* kFakeRunscr =
    "#!/bin/sh\n"
    "cp \"$1\" \"$FAKE_CAPTURE\"\n"
    "printf '%s' \"$1\" > \"$FAKE_CAPTURE.name\"\n"
    "if [ -n \"$FAKE_SAY\" ]; then printf '%s\\n' \"$FAKE_SAY\"; fi\n"
    "exit \"${FAKE_STATUS:-0}\"\n";

constexpr const char* kTwoPorts =
    "library ieee;\nuse ieee.std_logic_1164.all;\n"
    "entity top is\n"
    "  port (In0 : in std_logic;\n"
    "        InBus : in std_logic_vector(2 downto 0));\n"
    "end entity top;\n";

constexpr const char* kNoPorts = "entity top is\nend entity top;\n";

constexpr const char* kMixed =
    "library ieee;\nuse ieee.std_logic_1164.all;\n"
    "entity top is\n"
    "  port (a : in std_logic;\n"
    "        b : out std_logic_vector(0 to 3);\n"
    "        c : inout std_logic;\n"
    "        d : buffer std_logic;\n"
    "        n : in integer range 1000 downto 0);\n"
    "end entity top;\n";

constexpr const char* kTwoPortLists =
    "set PortName [ list  \"In0\" \"InBus\" ]\n"
    "set LeftRange [ list  -1 2 ]\n"
    "set RightRange [ list  -1 0 ]\n"
    "set PortDir [ list  \"I\" \"I\" ]\n"
    "set TotalPorts 2\n";

constexpr const char* kSuccess = "forge(vhdl) completed successfully.\n";
constexpr const char* kInvokeFailed =
    "pinforge:ERROR: ProjectMgmt(pinforge)  Unable to invoke tcl file generator\n\n"
    "forge(vhdl) completed with errors.\n";

struct TclCase {
  const char* name;
  const char* design;
  std::string templateText;
  std::vector<std::string> extraArgs;
  std::string project;      // -prj value
  std::string fakeSay;      // what the stand-in prints
  int fakeStatus;           // the stand-in's exit status
  std::string portLines;    // the five port-definition lines of the script
  std::string projectLine;  // the value as it must appear between the quotes
  std::string expectedStdout;
  std::string expectedStderr;
  int expectedStatus;
  bool scriptKept;
  bool tmpMissing;  // $TMPDIR names no directory, so no script can be created
};

std::string expectedScript(const TclCase& c) {
  return "# This file drives input variables to the tcl template file\n"
         "#   given below in the \"source\" command.\n"
         "set ModuleName \"top\"\n"
         "set ProjectName \"" + c.projectLine + "\"\n"
         "set ProjectFile \"\"\n"
         "set ProjectName \"" + c.projectLine + "\"\n"
         "set OutputFileName \"out.txt\"\n"
         "set InputFileName \"design.vhd\"\n"
         "set TemplateFileName \"t.tcl\"\n"
         "set ErrorFileName \"__UNDEFINED__\"\n"
         "set LibLocation \"\"\n"
         "\n"
         "# Port Definitions\n" +
         c.portLines + c.templateText;
}

const std::string kLongLine = std::string(250, 'x') + " end";

const TclCase kCases[] = {
    {"TwoPorts", kTwoPorts, "puts done\n", {}, "demo", "", 0, kTwoPortLists, "demo", kSuccess,
     "", 0, false, false},
    {"NoPorts", kNoPorts, "puts done\n", {}, "demo", "", 0,
     "set PortName [ list  ]\nset LeftRange [ list  ]\nset RightRange [ list  ]\n"
     "set PortDir [ list  ]\nset TotalPorts 0\n",
     "demo", kSuccess, "", 0, false, false},
    {"DirectionsAndIntegerRule", kMixed, "", {}, "demo", "", 0,
     "set PortName [ list  \"a\" \"b\" \"c\" \"d\" \"n\" ]\n"
     "set LeftRange [ list  -1 0 -1 -1 9 ]\n"
     "set RightRange [ list  -1 3 -1 -1 0 ]\n"
     "set PortDir [ list  \"I\" \"O\" \"B\" \"O\" \"I\" ]\n"
     "set TotalPorts 5\n",
     "demo",
     "pinforge:WARNING: Module top(Line 8): INTEGER RANGE is only supported for schematic "
     "symbol generation.\n" +
         std::string(kSuccess),
     "", 0, false, false},
    {"TclSpecialsEscaped", kTwoPorts, "", {}, "p\"$[x]\\q", "", 0, kTwoPortLists,
     "p\\\"\\$\\[x\\]\\\\q", kSuccess, "", 0, false, false},
    {"LongTemplateLineCopiedWhole", kTwoPorts, "# " + kLongLine + "\nputs [string length x]",
     {}, "demo", "", 0, kTwoPortLists, "demo", kSuccess, "", 0, false, false},
    {"TemplateBytesKept", kTwoPorts, std::string("a\tb\r\n\x01\xff end\n"), {}, "demo", "", 0,
     kTwoPortLists, "demo", kSuccess, "", 0, false, false},
    {"ShellOutputHiddenOnSuccess", kTwoPorts, "", {}, "demo", "chatter", 0, kTwoPortLists,
     "demo", kSuccess, "", 0, false, false},
    {"FailureShowsShellOutput", kTwoPorts, "error x\n", {}, "demo", "invalid command name", 4,
     kTwoPortLists, "demo", kInvokeFailed, "invalid command name\n", 1, true, false},
    {"DebugKeepsScript", kTwoPorts, "", {"--a"}, "demo", "", 0, kTwoPortLists, "demo",
     "In0: ? std_logic;\nInBus: ? std_logic_vector (2 DOWNTO 0);\n" + std::string(kSuccess),
     "", 0, true, false},
    {"ScriptCannotBeCreated", kTwoPorts, "", {}, "demo", "", 0, "", "",
     "Template file = \n" + std::string(kSuccess),
     "ERROR: ProjectMgmt(pinforge) - Unable to open temporary tcl template file\n", 0, false,
     true},
};

void PrintTo(const TclCase& c, std::ostream* os) { *os << c.name; }

class TclDriverTest : public testing::TestWithParam<TclCase> {};

TEST_P(TclDriverTest, WritesScriptAndJudgesShell) {
  const TclCase& c = GetParam();
  flowtest::TempDir dir;
  ASSERT_FALSE(dir.path().empty());
  const std::string bin = dir.file("bin");
  const std::string work = dir.file("work");
  const std::string tmp = dir.file("tmp");
  for (const std::string& sub : {bin, work, tmp}) ASSERT_TRUE(flowtest::makeDirectory(sub));
  ASSERT_TRUE(flowtest::writeFile(bin + "/runscr", kFakeRunscr, true));
  ASSERT_TRUE(flowtest::writeFile(work + "/design.vhd", c.design));
  ASSERT_TRUE(flowtest::writeFile(work + "/t.tcl", c.templateText));

  std::vector<std::string> args = {"-lib",     "work",   "design.vhd", "-module", "top",
                                   "-prj",     c.project, "-template", "t.tcl",   "-o",
                                   "out.txt"};
  args.insert(args.end(), c.extraArgs.begin(), c.extraArgs.end());
  const std::string capture = dir.file("captured.tcl");
  const char* path = std::getenv("PATH");
  const flowtest::RunResult run = flowtest::runProgram(
      flowtest::pinforgeBinary(), args, work,
      {{"PATH", bin + ":" + (path != nullptr ? path : "/usr/bin:/bin")},
       {"TMPDIR", c.tmpMissing ? tmp + "/missing" : tmp},
       {"FAKE_CAPTURE", capture},
       {"FAKE_SAY", c.fakeSay},
       {"FAKE_STATUS", std::to_string(c.fakeStatus)}});
  ASSERT_TRUE(run.started);

  EXPECT_EQ(run.status, c.expectedStatus);
  flowtest::expectSameText("stdout", c.expectedStdout, run.out);
  flowtest::expectSameText("stderr", c.expectedStderr, run.err);
  bool captured = false;
  const std::string script = flowtest::readFile(capture, &captured);
  ASSERT_EQ(captured, !c.tmpMissing) << "whether the stand-in runscr ran";
  if (c.tmpMissing) return;
  flowtest::expectSameText("driver script", expectedScript(c), script);

  const std::string scriptName = flowtest::readFile(capture + ".name");
  EXPECT_TRUE(scriptName.starts_with(tmp + "/")) << scriptName;
  EXPECT_TRUE(scriptName.ends_with(".tcl")) << scriptName;
  bool kept = false;
  flowtest::readFile(scriptName, &kept);
  EXPECT_EQ(kept, c.scriptKept);
}

INSTANTIATE_TEST_SUITE_P(Cases, TclDriverTest, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<TclCase>& info) {
                           return std::string(info.param.name);
                         });

}  // namespace
