// How the switches and the response file shape a run, seen from outside: language choice,
// where messages go, libraries, repeated and ignored switches.
#include <string>
#include <vector>

#include "support/cli_fixture.h"

namespace {

using namespace pinforge_test;

using CliOptions = CliTest;

std::string joined(const std::vector<std::string>& words, const std::string& separator) {
  std::string text;
  for (const std::string& word : words) text += (text.empty() ? "" : separator) + word;
  return text;
}

TEST_F(CliOptions, ResponseFileActsLikeTheSameWordsOnTheCommandLine) {
  const Expected expected = {notFoundLine("top") + completedWithErrors(), "", 1};
  expectRun(run(completeArgs()), expected);
  struct Case {
    const char* what;
    std::string separator;
  };
  for (const Case& test : {Case{"one line", " "}, Case{"one word per line", "\n"},
                           Case{"tabs and CRLF", "\t\r\n \t"}}) {
    SCOPED_TRACE(test.what);
    ASSERT_TRUE(m_Dir.write("run.rsp", joined(completeArgs(), test.separator) + "\n"));
    expectRun(run({"@run.rsp"}), expected);
    // Anything after the response file is ignored, even a switch that would win otherwise.
    expectRun(run({"@run.rsp", "-module", "other", "-deleteonerror"}), expected);
    EXPECT_TRUE(m_Dir.exists("out.txt"));
  }
}

TEST_F(CliOptions, EmptyResponseFileIsACommandLineWithoutSwitches) {
  ASSERT_TRUE(m_Dir.write("empty.rsp", ""));
  expectRun(run({"@empty.rsp"}), {completedWithErrors(), kUsageLine, 1});
}

TEST_F(CliOptions, ResponseFileWordsAreTakenLiterally) {
  const std::string longName(12000, 'm');
  for (const std::string& module : {std::string("@top"), longName}) {
    SCOPED_TRACE(module.size());
    ASSERT_TRUE(m_Dir.write("run.rsp", joined(without(completeArgs(), "-module", 1), " ") +
                                           " -module " + module + "\n"));
    expectRun(run({"@run.rsp"}), {notFoundLine(module) + completedWithErrors(), "", 1});
  }
}

TEST_F(CliOptions, OnlyVerilogInAnyCaseSelectsVerilog) {
  struct Case {
    std::vector<std::string> lang;
    const char* name;
  };
  const std::vector<Case> cases = {
      {{}, "vhdl"},
      {{"-lang", "vhdl"}, "vhdl"},
      {{"-lang", "VHDL"}, "vhdl"},
      {{"-lang", "systemc"}, "vhdl"},
      {{"-lang", "verilog"}, "verilog"},
      {{"-lang", "VERILOG"}, "verilog"},
      {{"-lang", "VeriLog"}, "verilog"},
      {{"-lang", "verilog2"}, "vhdl"},
      {{"-lang", "verilog", "-lang", "vhdl"}, "verilog"},
  };
  for (const Case& test : cases) {
    SCOPED_TRACE(testing::PrintToString(test.lang));
    // Missing "-module" stops the run before any design file is read.
    expectRun(run(plus(without(completeArgs(), "-module", 1), test.lang)),
              {completedWithErrors(test.name), kUsageLine, 1});
  }
}

TEST_F(CliOptions, VerilogDesignRunNamesVerilogInTheCompletionLine) {
  const std::vector<std::string> args = {"-lang",   "verilog", "-lib",   "work", "other.v",
                                         "-module", "top",     "-prj",   "demo", "-template",
                                         "tpl.txt", "-o",      "out.txt"};
  expectRun(run(args), {notFoundLine("top") + completedWithErrors("verilog"), "", 1});
}

TEST_F(CliOptions, ErrorFileTakesUsageAndFatalLinesButNotReportsOrCompletion) {
  const std::string missingTemplate = "FATAL ERROR: Unable to open template file missing.tpl...\n";
  expectRun(run(plus({"-err", "run.log", "-template", "missing.tpl"}, completeArgs())),
            {completedWithErrors(), "", 1});
  EXPECT_EQ(m_Dir.read("run.log"), missingTemplate + kUsageLine);

  expectRun(run(plus({"-err", "run.log"}, completeArgs())),
            {notFoundLine("top") + completedWithErrors(), "", 1});
  EXPECT_EQ(m_Dir.read("run.log"), "");
}

TEST_F(CliOptions, ErrorFileDoesNotCatchWhatComesBeforeItIsOpened) {
  // Response-file and parser problems are told before the switches are read.
  expectRun(run({"@missing.rsp", "-err", "run.log"}),
            {"", "FATAL ERROR: Unable to open response file missing.rsp...\n" + kUsageLine, 0});
  EXPECT_FALSE(m_Dir.exists("run.log"));
}

TEST_F(CliOptions, EachLibraryOccurrenceNamesItsOwnFiles) {
  ASSERT_TRUE(m_Dir.write("a.vhd", "entity a is\nend entity a;\n"));
  ASSERT_TRUE(m_Dir.write("b.vhd", "entity b is\nend entity b;\n"));
  ASSERT_TRUE(m_Dir.write("c.vhd", "entity c is\nend entity c;\n"));
  const std::vector<std::string> libs = {"-lib", "work", "a.vhd", "b.vhd", "-lib", "lib2", "c.vhd"};
  const std::string dump =
      "FpErr         Not Open\n"
      "FpStb         Open\n"
      "FpTemplate    Open\n"
      "FpInput       Not Open\n"
      "FpDebug       Not Open\n"
      "Module        __UNDEFINED__\n"
      "Project       demo\n"
      "Output Ext    txt\n"
      "Output File   out.txt\n"
      "Library       lib2\n"
      "Input File    c.vhd\n"
      "Template File tpl.txt\n"
      "Error File    __UNDEFINED__\n"
      "Date          \n";
  expectRun(run(plus(libs, {"-prj", "demo", "-template", "tpl.txt", "-o", "out.txt", "--a"})),
            {dump + completedWithErrors(), kUsageLine, 1});
}

TEST_F(CliOptions, AcceptedSwitchesThatChangeNothing) {
  const Expected expected = {notFoundLine("top") + completedWithErrors(), "", 1};
  for (const auto& extra : std::vector<std::vector<std::string>>{
           {"--inc"}, {"-inc"}, {"--nodelist"}, {"-nodelist"}, {"--inc", "--nodelist", "--inc"}}) {
    SCOPED_TRACE(extra.front());
    expectRun(run(plus(completeArgs(), extra)), expected);
    expectRun(run(plus(extra, completeArgs())), expected);
  }
}

TEST_F(CliOptions, FirstOccurrenceOfARepeatedSwitchWins) {
  // The design holds "other": taking the second "-module" would find it.
  expectRun(run(plus(completeArgs(), {"-module", "other", "-prj", "x", "-o", "second.txt"})),
            {notFoundLine("top") + completedWithErrors(), "", 1});
  EXPECT_TRUE(m_Dir.exists("out.txt"));
  EXPECT_FALSE(m_Dir.exists("second.txt"));
}

TEST_F(CliOptions, DebugModeWithCompleteInputsPrintsNoDump) {
  expectRun(run(plus(completeArgs(), {"--a"})),
            {notFoundLine("top") + completedWithErrors(), "", 1});
}

TEST_F(CliOptions, SuccessfulRunKeepsItsOutputAndNamesItsLanguage) {
  ASSERT_TRUE(m_Dir.write("top.vhd", "entity top is\n  port (a : in bit);\nend entity top;\n"));
  ASSERT_TRUE(m_Dir.write("top.v", "module top(input a);\nendmodule\n"));
  struct Case {
    std::vector<std::string> design;
    const char* language;
  };
  for (const Case& test : {Case{{"-lib", "work", "top.vhd"}, "vhdl"},
                           Case{{"-lang", "Verilog", "-lib", "work", "top.v"}, "verilog"}}) {
    SCOPED_TRACE(test.language);
    const std::vector<std::string> args = {"-module",       "top", "-prj",    "demo", "-template",
                                           "tpl.txt",       "-o",  "out.txt", "-err", "run.log",
                                           "-deleteonerror"};
    expectRun(run(plus(test.design, args)),
              {std::string("forge(") + test.language + ") completed successfully.\n", "", 0});
    EXPECT_EQ(m_Dir.read("out.txt"), "top\n");
    EXPECT_EQ(m_Dir.read("run.log"), "");
  }
}

}  // namespace
