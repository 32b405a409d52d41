// The run context's output extension and message reporting, the reading of -g, -D and -I, and
// what the design data receives from the readers.
#include "run_context.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "design_flow.h"
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
      {"out.vhd", "vhd", true},
      {"out", "", true},
      {"top.vhd.bak", "vhd.bak", true},
      {".hidden", "hidden", true},
      {"out.", "", true},
      {"dir.x/out.v", "x/out.v", true},
      {"build.d/out", "d/out", false},
      {"missing.dir/out", "dir/out", false},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.name);
    RunContext context;
    std::string why;
    EXPECT_EQ(context.openOutput(test.name, why), test.opens);
    EXPECT_EQ(why.empty(), test.opens);
    EXPECT_EQ(context.m_OutputExt.str(), test.extension);
    EXPECT_EQ(context.m_OutputFileName.str(), test.name);
    EXPECT_EQ(context.outputStream() != nullptr, test.opens);
  }
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

/// A parser over `args` (without the program name) and the usage text of the program.
struct ParsedLine {
  explicit ParsedLine(std::vector<std::string> args) : words(std::move(args)) {
    words.insert(words.begin(), "pinforge");
    for (std::string& word : words) argv.push_back(word.data());
    argv.push_back(nullptr);
    parser = std::make_unique<UT_CMDARGS>(static_cast<int>(words.size()), argv.data(), kUsageText,
                                          nullptr, 0);
  }
  std::vector<std::string> words;
  std::vector<char*> argv;
  std::unique_ptr<UT_CMDARGS> parser;
};

TEST(ReadScanSettings, EveryOccurrenceInOrderAndMalformedOnesReported) {
  using Overrides = std::vector<std::pair<std::string, std::string>>;
  using Macros = std::vector<std::pair<std::string, std::optional<std::string>>>;
  const struct {
    std::vector<std::string> args;
    bool wellFormed;
    Overrides overrides;
    Macros macros;
    std::vector<std::string> includes;
    uint32_t errors;
  } cases[] = {
      {{}, true, {}, {}, {}, 0},
      {{"-g", "WIDTH=8", "-D", "SYNTH", "-g", "name=a=b", "-I", "inc", "-D", "W=", "-I", "x y"},
       true,
       {{"WIDTH", "8"}, {"name", "a=b"}},
       {{"SYNTH", std::nullopt}, {"W", ""}},
       {"inc", "x y"},
       0},
      {{"-g", "W", "-g", "=1", "-g", "X=", "-g", "Y=2", "-D", "=3"},
       false,
       {{"Y", "2"}},
       {},
       {},
       4},
  };
  for (const auto& c : cases) {
    ParsedLine line(c.args);
    ASSERT_FALSE(line.parser->iserror());
    RunContext context;
    testing::internal::CaptureStdout();
    EXPECT_EQ(readScanSettings(context, *line.parser), c.wellFormed);
    testing::internal::GetCapturedStdout();
    EXPECT_EQ(context.m_ScanSettings.genericOverrides, c.overrides);
    EXPECT_EQ(context.m_ScanSettings.macros, c.macros);
    EXPECT_EQ(context.m_ScanSettings.includeDirectories, c.includes);
    EXPECT_EQ(context.m_ErrorCount, c.errors);
  }
}

/// The design data of a run over `design` (one file) up to the port list, or null when a
/// stage failed.
std::unique_ptr<StbDataList> unitData(const ScratchDir& dir, const char* file, const char* design,
                                      bool verilog, ScanSettings settings) {
  if (!dir.write(file, design)) return nullptr;
  RunContext context;
  context.m_Language = verilog ? ScanExtractor::Verilog : ScanExtractor::Vhdl;
  context.m_ModuleName = "top";
  context.m_ProjectName = "demo";
  context.m_ScanSettings = std::move(settings);
  context.registerDesignFile(dir.file(file).c_str());
  context.m_Extractor.configure(context.m_ScanSettings);
  context.m_Extractor.Parse(context.m_Language);
  if (!context.m_Extractor.selectDesignUnit("work", "top", ScanExtractor::SearchAllLibraries) ||
      !checkUnitHeader(context) || !createDesignData(context) || !buildPortList(context))
    return nullptr;
  buildUnitData(context);
  return std::move(context.m_DesignData);
}

std::vector<const PortRecord*> portsOf(StbDataList& data) {
  std::vector<const PortRecord*> ports;
  for (const PortRecord* port = data.first(); port != nullptr; port = data.next())
    ports.push_back(port);
  return ports;
}

TEST(UnitData, PortsKeepTheirDeclarationAndGenericsTheirValue) {
  ScratchDir dir;
  ScanSettings settings;
  settings.genericOverrides = {{"depth", "2 + 2"}};
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  const std::unique_ptr<StbDataList> data =
      unitData(dir, "top.vhd",
               "library ieee;\nuse ieee.std_logic_1164.all;\n"
               "entity top is\n  generic (WIDTH : natural := 8; DEPTH : integer);\n"
               "  port (clk : in std_ulogic; d : in std_ulogic_vector(WIDTH-1 downto 0);\n"
               "        q : buffer std_logic_vector(DEPTH-1 downto 0));\nend entity top;\n",
               false, settings);
  testing::internal::GetCapturedStdout();
  testing::internal::GetCapturedStderr();
  ASSERT_NE(data, nullptr);
  const std::vector<const PortRecord*> ports = portsOf(*data);
  ASSERT_EQ(ports.size(), 3u);
  EXPECT_EQ(data->m_Language, DesignLanguage::Vhdl);
  ASSERT_EQ(data->m_Generics.size(), 2u);
  EXPECT_EQ(data->m_Generics[0].m_Name, "WIDTH");
  EXPECT_EQ(data->m_Generics[0].m_Type, "natural");
  EXPECT_EQ(data->m_Generics[0].m_Default, "8");
  EXPECT_EQ(data->m_Generics[0].m_Value, "8");
  EXPECT_EQ(data->m_Generics[1].m_Default, "");
  EXPECT_EQ(data->m_Generics[1].m_Value, "2 + 2");
  EXPECT_NE(data->m_Context.find("use ieee.std_logic_1164.all;"), std::string::npos);
  const PortRecord* clk = ports[0];
  const PortRecord* d = ports[1];
  const PortRecord* q = ports[2];
  EXPECT_EQ(clk->m_DeclaredType, "std_ulogic");
  EXPECT_EQ(clk->m_Kind, PortTypeKind::Bit);
  EXPECT_EQ(d->m_DeclaredType, "std_ulogic_vector(WIDTH-1 downto 0)");
  EXPECT_EQ(d->m_Kind, PortTypeKind::BitVector);
  EXPECT_EQ(std::pair(d->m_Left, d->m_Right), std::pair(7, 0));
  EXPECT_EQ(q->m_Mode, PortMode::Buffer);
  EXPECT_EQ(q->m_Dir, 'O');
  EXPECT_EQ(std::pair(q->m_Left, q->m_Right), std::pair(3, 0));
}

TEST(UnitData, InterfacePortsCarryBothWaysAndUnknownRangesHaveNoBounds) {
  ScratchDir dir;
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  const std::unique_ptr<StbDataList> data =
      unitData(dir, "top.sv",
               "module top #(parameter int W) (bus_if.slave s, input logic [W-1:0] a);\n"
               "endmodule\n",
               true, {});
  testing::internal::GetCapturedStdout();
  testing::internal::GetCapturedStderr();
  ASSERT_NE(data, nullptr);
  EXPECT_EQ(data->m_Language, DesignLanguage::Verilog);
  const std::vector<const PortRecord*> ports = portsOf(*data);
  ASSERT_EQ(ports.size(), 2u);
  const PortRecord* s = ports[0];
  const PortRecord* a = ports[1];
  EXPECT_EQ(s->m_Dir, 'B');
  EXPECT_EQ(s->m_Kind, PortTypeKind::Interface);
  EXPECT_EQ(s->m_DeclaredType, "bus_if.slave");
  EXPECT_TRUE(a->isRangeUnknown());
  EXPECT_NE(a->rangeProblem().find("-g W="), std::string::npos) << a->rangeProblem();
  EXPECT_EQ(std::pair(a->m_Left, a->m_Right), std::pair(-1, -1));
}

}  // namespace
