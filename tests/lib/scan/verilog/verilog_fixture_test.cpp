// Ports read from the fixture files, every port as "direction type name[bounds] @line", and
// the extractor's unit lookup over libraries.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "platform/scan.h"
#include "verilog_read.h"

namespace {

using verilog_test::fixture;

struct FixtureCase {
  const char* label;
  std::vector<std::string> files;
  const char* unit;
  std::string ports;  ///< "direction type name[bounds] @line", joined by "; "
};

const std::vector<FixtureCase>& cases() {
  static const std::vector<FixtureCase> all = {
      {"AnsiInheritanceKindsAndDimensions",
       {"ansi_basic.v"},
       "ansi_basic",
       "in clk @3; in rst_n @3; in wire data_in[7:0] @4; out reg data_out[0:15] asc @5; inout tri "
       "pad[3:3] @6; out logic packed2[31:0] @7; in integer count @8; in int word[31:0] @9; in "
       "logic mem[7:0] @10; out a[8:0] @11; out b[8:0] @11"},
      {"NonAnsiFollowsHeaderOrder",
       {"nonansi_basic.v"},
       "nonansi_basic",
       "out reg q @7; in d[3:0] @6; in clk @5; inout bus[0:4] asc @9; in wire en @10"},
      {"NonAnsiNamedSelectsAndConcatenations",
       {"nonansi_named.v"},
       "nonansi_named",
       "in a @3; in b[5:2] @4; out c[5:0] @5; inout r @7; inout s @7; in t @8; in w[2:1] @4"},
      {"PreprocessorDirectivesAndIncludes",
       {"preproc.v"},
       "preproc",
       "in wire data[15:0] @37; in addr[11:0] @38; out sel[3:0] @39; out at_line[40:0] @40; out "
       "pasted[10:0] @41; out defaulted[7:4] @42; out from_env[5:0] @43"},
      {"MacrosPersistAcrossFiles",
       {"persist_a.v", "persist_b.v"},
       "persist_b",
       "in wide[23:0] @1; out late[3:0] @1"},
      {"PackagesTypedefsAndImports",
       {"packages.sv"},
       "pkg_user",
       "in word_t word[11:0] @27; in packet_t pkt[16:0] @28; out state_t state[2:0] @29; out "
       "color_t color[31:0] @30; out pair_t pair[23:0] @31; out logic scoped[12:0] @32; out logic "
       "doubled[7:0] @33; out logic narrow[3:0] @34; in word_t scoped_type[11:0] @35"},
      {"ConstantFunctionsAndSystemFunctions",
       {"functions.v"},
       "functions",
       "out addr[9:0] @7; out count[9:0] @8; in data[11:0] @9; out flags[4:0] @10; out "
       "packed_bits[11:0] @11; out mixed[9:2] @12"},
      {"InterfaceRefAndTypeParameterPorts",
       {"interfaces.sv"},
       "uses_if",
       "interface axi_if m @12; interface axi_if s @13; interface interface generic @14; in T "
       "typed[9:0] @15; ref logic shared[3:0] @16; in unit_t from_unit[5:0] @17; out logic v[2:0] "
       "@18"},
      {"ProgramUnit", {"interfaces.sv"}, "test_prog", "in clk @21; out st[1:0] @21"},
      {"MacromoduleUnit", {"interfaces.sv"}, "old_style", "in a @24"},
      {"SkippedBlocksAndLexis",
       {"skipped.sv"},
       "skipped",
       "in \\bus[0] @24; in \\a+b @25; out data[1:0] @26; out ok @27"},
      {"UnitAfterErrorsStillRead", {"errors.v"}, "after_error", "in x[3:0] @9; out y @9"},
      {"UnevaluableBoundGivesNoRange",
       {"errors.v"},
       "first_bad",
       "in a ? port 'a': cannot evaluate [W-1:0]: unknown name 'W' @1; out b @1"},
  };
  return all;
}

class VerilogFixtureTest : public testing::TestWithParam<FixtureCase> {};

TEST_P(VerilogFixtureTest, ReportsEveryPort) {
  const FixtureCase& c = GetParam();
  setenv("PINFORGE_INCLUDE", (fixture("missing") + ":" + fixture("extra")).c_str(), 1);
  verilog_test::Input input{{}, c.unit};
  for (const std::string& file : c.files) input.files.push_back(fixture(file));
  const verilog_test::Read result = verilog_test::read(input);
  unsetenv("PINFORGE_INCLUDE");
  ASSERT_TRUE(result.found);
  std::string ports;
  for (const ScanPort& port : result.unit.ports)
    ports += (ports.empty() ? "" : "; ") + verilog_test::portText(port) + " @" +
             std::to_string(port.sourceLine());
  EXPECT_EQ(ports, c.ports);
}

INSTANTIATE_TEST_SUITE_P(Fixtures, VerilogFixtureTest, testing::ValuesIn(cases()),
                         verilog_test::Label());

TEST(VerilogLookupTest, UnknownUnitsAndPackagesAreNotFound) {
  ScanExtractor extractor;
  extractor.addDesignFile("work", fixture("packages.sv").c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  EXPECT_FALSE(extractor.selectDesignUnit("work", "bus_pkg", ScanExtractor::SearchAllLibraries));
  EXPECT_FALSE(extractor.selectDesignUnit("work", "PKG_USER", ScanExtractor::SearchAllLibraries));
  EXPECT_EQ(extractor.getPorts()->size(), 0u);
}

TEST(VerilogLookupTest, LibrariesAreSearchedInOrder) {
  ScanExtractor extractor;
  extractor.addDesignFile("lib_a", fixture("nonansi_basic.v").c_str(), ScanExtractor::Verilog);
  extractor.addDesignFile("work", fixture("ansi_basic.v").c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  EXPECT_FALSE(
      extractor.selectDesignUnit("work", "nonansi_basic", ScanExtractor::SearchNamedLibraryOnly));
  EXPECT_TRUE(
      extractor.selectDesignUnit("work", "nonansi_basic", ScanExtractor::SearchAllLibraries));
  EXPECT_EQ(extractor.getPorts()->size(), 5u);
}

}  // namespace
