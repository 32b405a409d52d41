// Every way a run can end early or with errors, seen from outside: what the program prints on
// standard output and standard error, its exit status, and the files it leaves behind.
#include <string>
#include <vector>

#include "support/cli_fixture.h"

namespace {

using namespace pinforge_test;

using CliFailures = CliTest;

TEST_F(CliFailures, NoArgumentsShowsUsageAndSucceeds) { expectRun(run({}), {"", kUsageLine, 0}); }

TEST_F(CliFailures, UnreadableResponseFileShowsItsNameThenUsage) {
  for (const auto& args : std::vector<std::vector<std::string>>{
           {"@missing.rsp"}, {"@missing.rsp", "-lib", "work", "other.vhd"}}) {
    expectRun(run(args),
              {"", "FATAL ERROR: Unable to open response file missing.rsp...\n" + kUsageLine, 0});
  }
}

TEST_F(CliFailures, MoreThan997ArgumentsAreRefused) {
  // Without "-module" the run is refused at the required-inputs check, before any design file
  // is read, so 995 file names cost nothing.
  struct Case {
    size_t files;
    Expected expected;
  };
  const std::string limit =
      "FATAL ERROR: The number of command line arguments exceeds the max allowed (999).\n";
  for (const Case& test :
       {Case{995, {completedWithErrors(), kUsageLine, 1}}, Case{996, {"", limit + kUsageLine, 0}},
        Case{2000, {"", limit + kUsageLine, 0}}}) {
    SCOPED_TRACE(test.files);
    std::vector<std::string> args = {"-lib", "work"};
    args.resize(2 + test.files, "f.vhd");
    expectRun(run(args), test.expected);

    std::string words;
    for (const std::string& arg : args) words += arg + "\n";
    ASSERT_TRUE(m_Dir.write("many.rsp", words));
    expectRun(run({"@many.rsp"}), test.expected);
  }
}

TEST_F(CliFailures, ParserErrorsAreToldByTheParserAlone) {
  const std::vector<std::vector<std::string>> commandLines = {
      {"-bogus"}, plus(completeArgs(), {"stray"}), {"-lib", "work", "other.vhd", "-module"},
      {"-lib"},   plus(completeArgs(), {"-o"}),
  };
  for (const auto& args : commandLines) {
    SCOPED_TRACE(args.back());
    const RunResult result = run(args);
    ASSERT_TRUE(result.started);
    EXPECT_EQ(result.status, 1) << result;
    EXPECT_EQ(result.out, "") << result;
    // One line with the parser's reason, then the usage: nothing from the program itself.
    const size_t firstLineEnd = result.err.find('\n');
    ASSERT_NE(firstLineEnd, std::string::npos) << result;
    EXPECT_EQ(result.err.rfind("pinforge: ", 0), 0u) << result;
    EXPECT_EQ(result.err.substr(firstLineEnd + 1), kUsageLine) << result;
    EXPECT_FALSE(m_Dir.exists("out.txt"));
  }
}

TEST_F(CliFailures, HelpSwitchesShowUsageOnStandardOutput) {
  for (const char* help : {"-h", "-help", "--help", "-?"}) {
    SCOPED_TRACE(help);
    expectRun(run({help}), {kUsageLine, "", 0});
    expectRun(run(plus(completeArgs(), {help})), {kUsageLine, "", 0});
    EXPECT_FALSE(m_Dir.exists("out.txt"));
  }
}

TEST_F(CliFailures, UnwritableErrorFileEndsTheRunAtOnce) {
  expectRun(run(plus(completeArgs(), {"-err", "no/such/dir/run.log"})),
            {"FATAL ERROR: Unable to open log file no/such/dir/run.log in write mode.\n", "", 1});
  // The output is opened only after the error file.
  EXPECT_FALSE(m_Dir.exists("out.txt"));
}

TEST_F(CliFailures, UnopenableFilesAreAllToldAndTheFlowIsSkipped) {
  struct Case {
    const char* what;
    std::vector<std::string> extra;
    std::string err;
    bool outputLeft;
  };
  const std::string missingTemplate = "FATAL ERROR: Unable to open template file missing.tpl...\n";
  const std::string missingOutput = "FATAL ERROR: Unable to open output file no/dir/out.txt...\n";
  const std::vector<Case> cases = {
      {"template", {"-template", "missing.tpl"}, missingTemplate + kUsageLine, true},
      {"template, delete on error",
       {"-template", "missing.tpl", "-deleteonerror"},
       missingTemplate + kUsageLine,
       false},
      {"template is a directory",
       {"-template", "/"},
       "FATAL ERROR: Unable to open template file /...\n" + kUsageLine,
       true},
      {"output", {"-o", "no/dir/out.txt"}, missingOutput + kUsageLine, false},
      {"both",
       {"-o", "no/dir/out.txt", "-template", "missing.tpl"},
       missingTemplate + missingOutput + kUsageLine,
       false},
  };
  for (const Case& test : cases) {
    SCOPED_TRACE(test.what);
    // The first occurrence of a switch wins, so these come before the complete set.
    expectRun(run(plus(test.extra, completeArgs())), {completedWithErrors(), test.err, 1});
    EXPECT_EQ(m_Dir.exists("out.txt"), test.outputLeft);
    if (test.outputLeft) {
      EXPECT_EQ(m_Dir.read("out.txt"), "");
    }
    std::remove(m_Dir.file("out.txt").c_str());
  }
}

TEST_F(CliFailures, EveryRequiredInputIsChecked) {
  const std::vector<std::vector<std::string>> commandLines = {
      without(completeArgs(), "-module", 1),
      without(completeArgs(), "-prj", 1),
      without(completeArgs(), "-template", 1),
      without(completeArgs(), "-o", 1),
      without(completeArgs(), "-lib", 2),
      plus({"-lib", "work"}, without(completeArgs(), "-lib", 2)),
      {"-lib", "work", "other.vhd"},
      {"-module", "__UNDEFINED__", "-lib", "work", "other.vhd", "-prj", "demo", "-template",
       "tpl.txt", "-o", "out.txt"},
  };
  for (const auto& args : commandLines) {
    SCOPED_TRACE(testing::PrintToString(args));
    expectRun(run(args), {completedWithErrors(), kUsageLine, 1});
    EXPECT_FALSE(m_Dir.exists("forge.deb"));
  }
}

TEST_F(CliFailures, MissingInputInDebugModeDumpsTheContextFirst) {
  const std::string dump =
      "FpErr         Not Open\n"
      "FpStb         Open\n"
      "FpTemplate    Open\n"
      "FpInput       Not Open\n"
      "FpDebug       Not Open\n"
      "Module        top\n"
      "Project       __UNDEFINED__\n"
      "Output Ext    txt\n"
      "Output File   out.txt\n"
      "Library       work\n"
      "Input File    other.vhd\n"
      "Template File tpl.txt\n"
      "Error File    __UNDEFINED__\n"
      "Date          \n";
  for (const char* debug : {"--a", "-a"}) {
    SCOPED_TRACE(debug);
    expectRun(run(plus(without(completeArgs(), "-prj", 1), {debug})),
              {dump + completedWithErrors(), kUsageLine, 1});
  }
}

TEST_F(CliFailures, UnitMissingFromTheDesignIsAReportedError) {
  expectRun(run(completeArgs()), {notFoundLine("top") + completedWithErrors(), "", 1});
  EXPECT_EQ(m_Dir.read("out.txt"), "");
  EXPECT_FALSE(m_Dir.exists("forge.deb"));
}

TEST_F(CliFailures, DeleteOnErrorRemovesTheOutput) {
  expectRun(run(plus(completeArgs(), {"-deleteonerror"})),
            {notFoundLine("top") + completedWithErrors(), "", 1});
  EXPECT_FALSE(m_Dir.exists("out.txt"));
}

TEST_F(CliFailures, DeleteOnErrorLeavesOtherFilesAlone) {
  // Without "-o" there is nothing to remove, whatever else the directory holds.
  expectRun(run(plus(without(completeArgs(), "-o", 1), {"-deleteonerror"})),
            {completedWithErrors(), kUsageLine, 1});
  EXPECT_TRUE(m_Dir.exists("tpl.txt"));
  EXPECT_TRUE(m_Dir.exists("other.vhd"));
}

}  // namespace
