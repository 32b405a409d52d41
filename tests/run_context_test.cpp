// The run context's file opens, design-file registration, message reporting, diagnostic dump
// and the registration of every "-lib" occurrence.
#include "run_context.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "front_end.h"
#include "support/scratch_dir.h"

namespace {

using pinforge_test::ScratchDir;

/// Runs the test body inside a scratch directory so relative names land there.
class InScratchDir : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_FALSE(m_Dir.path().empty());
    char* previous = getcwd(nullptr, 0);
    ASSERT_NE(previous, nullptr);
    m_Previous = previous;
    free(previous);
    ASSERT_EQ(chdir(m_Dir.path().c_str()), 0);
  }
  void TearDown() override {
    if (!m_Previous.empty()) {
      ASSERT_EQ(chdir(m_Previous.c_str()), 0);
    }
  }

  ScratchDir m_Dir;
  std::string m_Previous;
};

std::string captured(void (*body)(RunContext&), RunContext& context) {
  testing::internal::CaptureStdout();
  body(context);
  std::fflush(stdout);
  return testing::internal::GetCapturedStdout();
}

using RunContextFiles = InScratchDir;

TEST_F(RunContextFiles, OutputExtensionIsEverythingAfterTheFirstDotOfTheWholeName) {
  ASSERT_TRUE(m_Dir.write("build.d", ""));
  ASSERT_EQ(mkdir("dir.x", 0700), 0);
  struct Case {
    const char* name;
    const char* extension;
    bool opens;
  };
  const std::vector<Case> cases = {
      {"out.vhd", "vhd", true},
      {"out", "", true},
      {"top.vhd.bak", "vhd.bak", true},
      {".hidden", "hidden", true},
      {"out.", "", true},
      {"dir.x/out", "x/out", true},
      {"dir.x/out.v", "x/out.v", true},
      {"build.d/out", "d/out", false},
      {"missing.dir/out", "dir/out", false},
  };
  for (const Case& test : cases) {
    SCOPED_TRACE(test.name);
    RunContext context;
    EXPECT_EQ(context.openOutput(test.name), test.opens);
    EXPECT_EQ(context.m_OutputExt.str(), test.extension);
    EXPECT_EQ(context.m_OutputFileName.str(), test.name);
    EXPECT_EQ(context.m_OutputStream != nullptr, test.opens);
  }
}

TEST_F(RunContextFiles, OpensRecordTheNameWhetherOrNotTheFileOpens) {
  ASSERT_TRUE(m_Dir.write("t.tpl", "text"));
  RunContext context;
  EXPECT_TRUE(context.openTemplateFile("t.tpl"));
  EXPECT_NE(context.m_TemplateStream, nullptr);
  EXPECT_EQ(context.m_TemplateFileName.str(), "t.tpl");

  RunContext missing;
  EXPECT_FALSE(missing.openTemplateFile("none.tpl"));
  EXPECT_EQ(missing.m_TemplateStream, nullptr);
  EXPECT_EQ(missing.m_TemplateFileName.str(), "none.tpl");
  EXPECT_FALSE(missing.openTemplateFile("."));
  EXPECT_EQ(missing.m_TemplateStream, nullptr);

  std::FILE* log = context.openErrorFile("run.log");
  EXPECT_NE(log, nullptr);
  EXPECT_EQ(log, context.m_ErrorStream);
  EXPECT_EQ(context.m_ErrorFileName.str(), "run.log");
  EXPECT_TRUE(m_Dir.exists("run.log"));

  EXPECT_EQ(missing.openErrorFile("no/such/dir.log"), nullptr);
  EXPECT_EQ(missing.m_ErrorFileName.str(), "no/such/dir.log");
}

TEST_F(RunContextFiles, RegisteredFilesKeepTheirLibraryAndOrder) {
  ASSERT_TRUE(m_Dir.write("a.vhd", ""));
  RunContext context;
  EXPECT_TRUE(context.registerDesignFile("a.vhd"));
  context.m_LibraryName = std::string_view("lib2");
  EXPECT_FALSE(context.registerDesignFile("absent.vhd"));
  const auto& files = context.m_Extractor.files();
  ASSERT_EQ(files.size(), 2u);
  EXPECT_EQ(files[0].library, "work");
  EXPECT_EQ(files[0].path, "a.vhd");
  EXPECT_EQ(files[1].library, "lib2");
  EXPECT_EQ(files[1].path, "absent.vhd");
  EXPECT_EQ(context.m_InputFileName.str(), "absent.vhd");
}

TEST(RunContextReport, EveryMessageIsPrintedCountedAndKept) {
  struct Step {
    std::string text;
    RunContext::Severity severity;
    std::string line;
  };
  const std::vector<Step> steps = {
      {"warnings alone are no errors", RunContext::Severity::Warning,
       "pinforge:warnings alone are no errors\n"},
      {"Declaration (Module top) not found.", RunContext::Severity::Error,
       "pinforge:Declaration (Module top) not found.\n"},
      {"width 100% of %s", RunContext::Severity::Warning, "pinforge:width 100% of %s\n"},
      {"FATAL: bad\n", RunContext::Severity::Error, "pinforge:FATAL: bad\n\n"},
      {std::string("nul\0byte", 8), RunContext::Severity::Warning,
       std::string("pinforge:nul\0byte\n", 18)},
      {"", RunContext::Severity::Error, "pinforge:\n"},
  };
  RunContext context;
  std::string allLines;
  uint32_t errors = 0;
  uint32_t warnings = 0;
  for (const Step& step : steps) {
    SCOPED_TRACE(step.line);
    testing::internal::CaptureStdout();
    context.reportMessage(step.text, step.severity);
    std::fflush(stdout);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), step.line);
    allLines += step.line;
    (step.severity == RunContext::Severity::Error ? errors : warnings) += 1;
    EXPECT_EQ(context.m_ErrorCount, errors);
    EXPECT_EQ(context.m_WarningCount, warnings);
    EXPECT_EQ(context.m_ErrorText.str(), allLines);
    EXPECT_EQ(context.hasErrors(), errors != 0);
  }
}

TEST(RunContextDump, FreshContextShowsItsDefaults) {
  RunContext context;
  EXPECT_EQ(captured([](RunContext& c) { c.dumpContext(); }, context),
            "FpErr         Not Open\n"
            "FpStb         Not Open\n"
            "FpTemplate    Not Open\n"
            "FpInput       Not Open\n"
            "FpDebug       Not Open\n"
            "Module        __UNDEFINED__\n"
            "Project       __UNDEFINED__\n"
            "Output Ext    __UNDEFINED__\n"
            "Output File   __UNDEFINED__\n"
            "Library       work\n"
            "Input File    __UNDEFINED__\n"
            "Template File __UNDEFINED__\n"
            "Error File    __UNDEFINED__\n"
            "Date          \n");
}

TEST_F(RunContextFiles, DumpShowsOpenStreamsAndNames) {
  RunContext context;
  ASSERT_TRUE(context.openOutput("top.vhd"));
  ASSERT_NE(context.openErrorFile("run.log"), nullptr);
  context.m_DebugStream = std::fopen("forge.deb", "w");
  context.m_ModuleName = std::string_view("top");
  context.m_LibraryName = std::string_view("lib2");
  context.m_Date = std::string_view("10:11:12 01/02/2026");
  EXPECT_EQ(captured([](RunContext& c) { c.dumpContext(); }, context),
            "FpErr         Open\n"
            "FpStb         Open\n"
            "FpTemplate    Not Open\n"
            "FpInput       Not Open\n"
            "FpDebug       Open\n"
            "Module        top\n"
            "Project       __UNDEFINED__\n"
            "Output Ext    vhd\n"
            "Output File   top.vhd\n"
            "Library       lib2\n"
            "Input File    __UNDEFINED__\n"
            "Template File __UNDEFINED__\n"
            "Error File    run.log\n"
            "Date          10:11:12 01/02/2026\n");
}

TEST(RegisterLibraries, EachFileGoesToTheLibraryOfItsOwnOccurrence) {
  struct Case {
    std::vector<std::string> args;
    std::vector<std::pair<std::string, std::string>> files;
    const char* library;
    const char* input;
  };
  const std::vector<Case> cases = {
      {{"-lib", "work", "a.vhd", "b.vhd", "-lib", "lib2", "c.vhd"},
       {{"work", "a.vhd"}, {"work", "b.vhd"}, {"lib2", "c.vhd"}},
       "lib2",
       "c.vhd"},
      {{"-lib", "work"}, {}, "work", kUndefinedName},
      {{"-lib", "mine", "x.v", "-module", "top", "-lib", "empty"},
       {{"mine", "x.v"}},
       "empty",
       "x.v"},
      {{"-module", "top"}, {}, "work", kUndefinedName},
  };
  for (const Case& test : cases) {
    std::vector<std::string> args = test.args;
    args.insert(args.begin(), "pinforge");
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    const UT_CMDARGS parser(static_cast<int>(args.size()), argv.data(), kUsageText, nullptr, 0);
    ASSERT_FALSE(parser.iserror());

    RunContext context;
    registerLibraries(context, parser);
    std::vector<std::pair<std::string, std::string>> files;
    for (const auto& file : context.m_Extractor.files())
      files.emplace_back(file.library, file.path);
    EXPECT_EQ(files, test.files);
    EXPECT_EQ(context.m_LibraryName.str(), test.library);
    EXPECT_EQ(context.m_InputFileName.str(), test.input);
  }
}

}  // namespace
