// The Tcl path seen from outside: a stand-in runscr placed first on PATH captures the driver
// script, so the whole script, the messages and the fate of the temporary file can be checked.
#include <gtest/gtest.h>

#include <cstdlib>
#include <ostream>
#include <string>
#include <vector>

#include "support/process.h"
#include "support/scratch_dir.h"

namespace {

using namespace pinforge_test;

constexpr const char* kStandInRunscr =
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

constexpr const char* kTwoPortLists =
    "set PortName [ list  \"In0\" \"InBus\" ]\n"
    "set LeftRange [ list  -1 2 ]\n"
    "set RightRange [ list  -1 0 ]\n"
    "set PortDir [ list  \"I\" \"I\" ]\n"
    "set TotalPorts 2\n";

const std::string kSuccess = "forge(vhdl) completed successfully.\n";

struct TclCase {
  const char* name;
  const char* design = kTwoPorts;
  std::string templateText = "";
  std::vector<std::string> extraArgs = {};
  std::string project = "demo";
  std::string projectLine = "demo";  ///< the project as it must appear between the quotes
  std::string fakeSay = "";          ///< what the stand-in prints
  int fakeStatus = 0;
  std::string portLines = kTwoPortLists;
  std::string out = kSuccess;
  std::string err = "";
  int status = 0;
  bool scriptKept = false;
  bool tmpMissing = false;  ///< $TMPDIR names no directory, so no script can be created
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

const TclCase kCases[] = {
    {.name = "TwoPorts", .templateText = "puts done\n"},
    {.name = "NoPorts",
     .design = "entity top is\nend entity top;\n",
     .portLines = "set PortName [ list  ]\nset LeftRange [ list  ]\nset RightRange [ list  ]\n"
                  "set PortDir [ list  ]\nset TotalPorts 0\n"},
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
            "symbol generation.\n" + kSuccess},
    {.name = "TclSpecialsEscaped",
     .project = "p\"$[x]\\q",
     .projectLine = "p\\\"\\$\\[x\\]\\\\q"},
    {.name = "TemplateCopiedWholeWithItsBytes",
     .templateText = "# " + std::string(250, 'x') + " end\na\tb\r\n\x01\xff end"},
    {.name = "ShellOutputHiddenOnSuccess", .fakeSay = "chatter"},
    {.name = "FailureShowsShellOutput",
     .templateText = "error x\n",
     .fakeSay = "invalid command name",
     .fakeStatus = 4,
     .out = "pinforge:ERROR: ProjectMgmt(pinforge)  Unable to invoke tcl file generator\n\n"
            "forge(vhdl) completed with errors.\n",
     .err = "invalid command name\n",
     .status = 1,
     .scriptKept = true},
    {.name = "DebugKeepsScript",
     .extraArgs = {"--a"},
     .out = "In0: in std_logic;\nInBus: in std_logic_vector (2 DOWNTO 0);\n" + kSuccess,
     .scriptKept = true},
    {.name = "ScriptCannotBeCreated",
     .out = "Template file = \n" + kSuccess,
     .err = "ERROR: ProjectMgmt(pinforge) - Unable to open temporary tcl template file\n",
     .tmpMissing = true},
};

void PrintTo(const TclCase& c, std::ostream* os) { *os << c.name; }

class TclDriver : public testing::TestWithParam<TclCase> {};

TEST_P(TclDriver, WritesScriptAndJudgesShell) {
  const TclCase& c = GetParam();
  ScratchDir dir;
  ASSERT_FALSE(dir.path().empty());
  for (const char* sub : {"bin", "work", "tmp"}) ASSERT_TRUE(dir.makeDir(sub));
  ASSERT_TRUE(dir.write("bin/runscr", kStandInRunscr, true));
  ASSERT_TRUE(dir.write("work/design.vhd", c.design));
  ASSERT_TRUE(dir.write("work/t.tcl", c.templateText));

  std::vector<std::string> args = {"-lib",    "work",    "design.vhd", "-module", "top", "-prj",
                                   c.project, "-template", "t.tcl",    "-o",      "out.txt"};
  args.insert(args.end(), c.extraArgs.begin(), c.extraArgs.end());
  const std::string capture = dir.file("captured.tcl");
  const std::string tmp = dir.file("tmp");
  const char* path = std::getenv("PATH");
  const RunResult run =
      runPinforge(args, dir.file("work"),
                  {{"PATH", dir.file("bin") + ":" + (path != nullptr ? path : "/usr/bin:/bin")},
                   {"TMPDIR", c.tmpMissing ? tmp + "/missing" : tmp},
                   {"FAKE_CAPTURE", capture},
                   {"FAKE_SAY", c.fakeSay},
                   {"FAKE_STATUS", std::to_string(c.fakeStatus)}});
  ASSERT_TRUE(run.started);
  EXPECT_EQ(run.status, c.status);
  EXPECT_EQ(run.out, c.out);
  EXPECT_EQ(run.err, c.err);
  std::string script;
  ASSERT_EQ(readFile(capture, script), !c.tmpMissing) << "whether the stand-in runscr ran";
  if (c.tmpMissing) return;
  EXPECT_EQ(script, expectedScript(c));

  const std::string scriptName = readFile(capture + ".name");
  EXPECT_TRUE(scriptName.starts_with(tmp + "/")) << scriptName;
  EXPECT_TRUE(scriptName.ends_with(".tcl")) << scriptName;
  EXPECT_EQ(readFile(scriptName) != "<missing>", c.scriptKept);
}

INSTANTIATE_TEST_SUITE_P(Cases, TclDriver, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<TclCase>& info) {
                           return std::string(info.param.name);
                         });

}  // namespace
