// The run context's file opens, design-file registration, message reporting, diagnostic dump
// and the registration of every "-lib" occurrence.
#include "run_context.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <string>
#include <vector>

#include "front_end.h"
#include "support/scratch_dir.h"

namespace {

using pinforge_test::ScratchDir;

/// Runs the test body inside a scratch directory so relative names land there.
class RunContextFiles : public ::testing::Test {
 protected:
  void SetUp() override {
    m_Previous = std::filesystem::current_path();
    ASSERT_EQ(chdir(m_Dir.path().c_str()), 0);
  }
  void TearDown() override { std::filesystem::current_path(m_Previous); }

  ScratchDir m_Dir;
  std::filesystem::path m_Previous;
};

TEST_F(RunContextFiles, OutputExtensionIsEverythingAfterTheFirstDotOfTheWholeName) {
  ASSERT_TRUE(m_Dir.write("build.d", ""));
  ASSERT_EQ(mkdir("dir.x", 0700), 0);
  const struct {
    const char* name;
    const char* extension;
    bool opens;
  } cases[] = {
      {"out.vhd", "vhd", true},        {"out", "", true},
      {"top.vhd.bak", "vhd.bak", true}, {".hidden", "hidden", true},
      {"out.", "", true},              {"dir.x/out.v", "x/out.v", true},
      {"build.d/out", "d/out", false}, {"missing.dir/out", "dir/out", false},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.name);
    RunContext context;
    std::string why;
    EXPECT_EQ(context.openOutput(test.name, why), test.opens);
    EXPECT_EQ(why.empty(), test.opens);
    EXPECT_EQ(context.m_OutputExt.str(), test.extension);
    EXPECT_EQ(context.m_OutputFileName.str(), test.name);
    EXPECT_EQ(context.m_OutputStream != nullptr, test.opens);
  }
}

TEST_F(RunContextFiles, OpensAndRegistrationsRecordTheNameWhetherOrNotTheFileOpens) {
  ASSERT_TRUE(m_Dir.write("t.tpl", "text"));
  ASSERT_TRUE(m_Dir.write("a.vhd", ""));
  RunContext context;
  std::string why;
  EXPECT_TRUE(context.openTemplateFile("t.tpl", why));
  EXPECT_NE(context.m_TemplateStream, nullptr);
  std::FILE* log = context.openErrorFile("run.log", why);
  EXPECT_NE(log, nullptr);
  EXPECT_EQ(log, context.m_ErrorStream);
  EXPECT_EQ(context.m_ErrorFileName.str(), "run.log");
  EXPECT_TRUE(context.registerDesignFile("a.vhd"));

  RunContext missing;
  EXPECT_FALSE(missing.openTemplateFile(".", why));
  EXPECT_EQ(why, "Is a directory");
  EXPECT_FALSE(missing.openTemplateFile("none.tpl", why));
  EXPECT_EQ(why, "No such file or directory");
  EXPECT_EQ(missing.m_TemplateStream, nullptr);
  EXPECT_EQ(missing.m_TemplateFileName.str(), "none.tpl");
  EXPECT_EQ(missing.openErrorFile("no/such/dir.log", why), nullptr);
  EXPECT_EQ(missing.m_ErrorFileName.str(), "no/such/dir.log");
  // A design file that cannot be read stays registered so the lookup can tell about it.
  missing.m_LibraryName = std::string_view("lib2");
  EXPECT_FALSE(missing.registerDesignFile("absent.vhd"));
  ASSERT_EQ(missing.m_Extractor.files().size(), 1u);
  EXPECT_EQ(missing.m_Extractor.files()[0].library, "lib2");
  EXPECT_EQ(missing.m_Extractor.files()[0].path, "absent.vhd");
  EXPECT_EQ(missing.m_InputFileName.str(), "absent.vhd");
}

TEST(RunContextReport, EveryMessageIsPrintedCountedAndKept) {
  using Severity = RunContext::Severity;
  const struct {
    std::string text;
    Severity severity;
    std::string line;
  } steps[] = {
      {"warnings alone are no errors", Severity::Warning,
       "pinforge:warnings alone are no errors\n"},
      {"width 100% of %s", Severity::Error, "pinforge:width 100% of %s\n"},
      {"FATAL: bad\n", Severity::Error, "pinforge:FATAL: bad\n\n"},
      {std::string("nul\0byte", 8), Severity::Warning, std::string("pinforge:nul\0byte\n", 18)},
  };
  RunContext context;
  std::string allLines;
  uint32_t counts[2] = {0, 0};
  for (const auto& step : steps) {
    SCOPED_TRACE(step.line);
    testing::internal::CaptureStdout();
    context.reportMessage(step.text, step.severity);
    std::fflush(stdout);
    EXPECT_EQ(testing::internal::GetCapturedStdout(), step.line);
    allLines += step.line;
    ++counts[step.severity == Severity::Error];
    EXPECT_EQ(context.m_WarningCount, counts[0]);
    EXPECT_EQ(context.m_ErrorCount, counts[1]);
    EXPECT_EQ(context.m_ErrorText.str(), allLines);
    EXPECT_EQ(context.hasErrors(), counts[1] != 0);
  }
}

TEST_F(RunContextFiles, DumpShowsStreamsAndNames) {
  RunContext context;
  std::string why;
  ASSERT_TRUE(context.openOutput("top.vhd", why));
  ASSERT_NE(context.openErrorFile("run.log", why), nullptr);
  ASSERT_TRUE(context.openTraceFile(why));
  context.m_ModuleName = std::string_view("top");
  context.m_LibraryName = std::string_view("lib2");
  context.m_Date = std::string_view("10:11:12 01/02/2026");
  testing::internal::CaptureStdout();
  context.dumpContext();
  std::fflush(stdout);
  EXPECT_EQ(testing::internal::GetCapturedStdout(),
            "FpErr         Open\nFpStb         Open\nFpTemplate    Not Open\n"
            "FpInput       Not Open\nFpDebug       Open\nModule        top\n"
            "Project       __UNDEFINED__\nOutput Ext    vhd\nOutput File   top.vhd\n"
            "Library       lib2\nInput File    __UNDEFINED__\nTemplate File __UNDEFINED__\n"
            "Error File    run.log\nDate          10:11:12 01/02/2026\n");
}

TEST(RegisterLibraries, EachFileGoesToTheLibraryOfItsOwnOccurrence) {
  const struct {
    std::vector<std::string> args;
    std::vector<std::pair<std::string, std::string>> files;
    const char* library;
    const char* input;
  } cases[] = {
      {{"-lib", "work", "a.vhd", "b.vhd", "-lib", "lib2", "c.vhd"},
       {{"work", "a.vhd"}, {"work", "b.vhd"}, {"lib2", "c.vhd"}},
       "lib2",
       "c.vhd"},
      {{"-lib", "mine", "x.v", "-module", "top", "-lib", "empty"},
       {{"mine", "x.v"}},
       "empty",
       "x.v"},
      {{"-module", "top"}, {}, "work", kUndefinedName},
  };
  for (const auto& test : cases) {
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
