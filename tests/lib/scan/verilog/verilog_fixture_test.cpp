// Ports read from the fixture files through the extractor, compared field by field.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "platform/scan.h"

namespace {

struct ExpectedPort {
  const char* name;
  const char* type;
  int direction;
  int line;
  const char* range;  ///< "left:right", or nullptr for none
  bool ascending;
};

struct FixtureCase {
  const char* label;
  std::vector<const char*> files;
  const char* unit;
  std::vector<ExpectedPort> ports;
};

constexpr int In = ScanPort::Input;
constexpr int Out = ScanPort::Output;
constexpr int Io = ScanPort::Inout;
constexpr int Ref = ScanPort::Ref;
constexpr int If = ScanPort::InterfacePort;
constexpr const char* kNone = nullptr;

std::string fixture(const char* name) {
  const char* root = std::getenv("PINFORGE_SOURCE_DIR");
  return std::string(root ? root : ".") + "/tests/fixtures/verilog/" + name;
}

const std::vector<FixtureCase>& cases() {
  static const std::vector<FixtureCase> all = {
      {"AnsiInheritanceKindsAndDimensions",
       {"ansi_basic.v"},
       "ansi_basic",
       {{"clk", "", In, 3, kNone, false},
        {"rst_n", "", In, 3, kNone, false},
        {"data_in", "wire", In, 4, "7:0", false},
        {"data_out", "reg", Out, 5, "0:15", true},
        {"pad", "tri", Io, 6, "3:3", false},
        {"packed2", "logic", Out, 7, "31:0", false},
        {"count", "integer", In, 8, kNone, false},
        {"word", "int", In, 9, "31:0", false},
        {"mem", "logic", In, 10, "7:0", false},
        {"a", "", Out, 11, "8:0", false},
        {"b", "", Out, 11, "8:0", false}}},
      {"NonAnsiFollowsHeaderOrder",
       {"nonansi_basic.v"},
       "nonansi_basic",
       {{"q", "reg", Out, 7, kNone, false},
        {"d", "", In, 6, "3:0", false},
        {"clk", "", In, 5, kNone, false},
        {"bus", "", Io, 9, "0:4", true},
        {"en", "wire", In, 10, kNone, false}}},
      {"NonAnsiNamedSelectsAndConcatenations",
       {"nonansi_named.v"},
       "nonansi_named",
       {{"a", "", In, 3, kNone, false},
        {"b", "", In, 4, "5:2", false},
        {"c", "", Out, 5, "5:0", false},
        {"r", "", Io, 7, kNone, false},
        {"s", "", Io, 7, kNone, false},
        {"t", "", In, 8, kNone, false},
        {"w", "", In, 4, "2:1", false}}},
      {"PreprocessorDirectivesAndIncludes",
       {"preproc.v"},
       "preproc",
       {{"data", "wire", In, 37, "15:0", false},
        {"addr", "", In, 38, "11:0", false},
        {"sel", "", Out, 39, "3:0", false},
        {"at_line", "", Out, 40, "40:0", false},
        {"pasted", "", Out, 41, "10:0", false},
        {"defaulted", "", Out, 42, "7:4", false},
        {"from_env", "", Out, 43, "5:0", false}}},
      {"MacrosPersistAcrossFiles",
       {"persist_a.v", "persist_b.v"},
       "persist_b",
       {{"wide", "", In, 1, "23:0", false}, {"late", "", Out, 1, "3:0", false}}},
      {"PackagesTypedefsAndImports",
       {"packages.sv"},
       "pkg_user",
       {{"word", "word_t", In, 27, "11:0", false},
        {"pkt", "packet_t", In, 28, "16:0", false},
        {"state", "state_t", Out, 29, "2:0", false},
        {"color", "color_t", Out, 30, "31:0", false},
        {"pair", "pair_t", Out, 31, "23:0", false},
        {"scoped", "logic", Out, 32, "12:0", false},
        {"doubled", "logic", Out, 33, "7:0", false},
        {"narrow", "logic", Out, 34, "3:0", false},
        {"scoped_type", "word_t", In, 35, "11:0", false}}},
      {"ConstantFunctionsAndSystemFunctions",
       {"functions.v"},
       "functions",
       {{"addr", "", Out, 7, "9:0", false},
        {"count", "", Out, 8, "9:0", false},
        {"data", "", In, 9, "11:0", false},
        {"flags", "", Out, 10, "4:0", false},
        {"packed_bits", "", Out, 11, "11:0", false},
        {"mixed", "", Out, 12, "9:2", false}}},
      {"InterfaceRefAndTypeParameterPorts",
       {"interfaces.sv"},
       "uses_if",
       {{"m", "axi_if", If, 12, kNone, false},
        {"s", "axi_if", If, 13, kNone, false},
        {"generic", "interface", If, 14, kNone, false},
        {"typed", "T", In, 15, "9:0", false},
        {"shared", "logic", Ref, 16, "3:0", false},
        {"from_unit", "unit_t", In, 17, "5:0", false},
        {"v", "logic", Out, 18, "2:0", false}}},
      {"ProgramUnit",
       {"interfaces.sv"},
       "test_prog",
       {{"clk", "", In, 21, kNone, false}, {"st", "", Out, 21, "1:0", false}}},
      {"MacromoduleUnit", {"interfaces.sv"}, "old_style", {{"a", "", In, 24, kNone, false}}},
      {"SkippedBlocksAndLexis",
       {"skipped.sv"},
       "skipped",
       {{"\\bus[0]", "", In, 24, kNone, false},
        {"\\a+b", "", In, 25, kNone, false},
        {"data", "", Out, 26, "1:0", false},
        {"ok", "", Out, 27, kNone, false}}},
      {"UnitAfterErrorsStillRead",
       {"errors.v"},
       "after_error",
       {{"x", "", In, 9, "3:0", false}, {"y", "", Out, 9, kNone, false}}},
      {"UnevaluableBoundGivesNoRange",
       {"errors.v"},
       "first_bad",
       {{"a", "", In, 1, kNone, false}, {"b", "", Out, 1, kNone, false}}},
  };
  return all;
}

class VerilogFixtureTest : public testing::TestWithParam<FixtureCase> {};

TEST_P(VerilogFixtureTest, ReportsEveryPort) {
  const FixtureCase& c = GetParam();
  setenv("PINFORGE_INCLUDE", (fixture("missing") + ":" + fixture("extra")).c_str(), 1);
  ScanExtractor extractor;
  for (const char* file : c.files)
    extractor.addDesignFile("work", fixture(file).c_str(), ScanExtractor::Verilog);
  extractor.Parse(ScanExtractor::Verilog);
  ASSERT_TRUE(extractor.selectDesignUnit("work", c.unit, ScanExtractor::SearchAllLibraries));
  ScanPortList* ports = extractor.getPorts();
  ASSERT_EQ(ports->size(), c.ports.size());
  const ScanPort* port = ports->firstPort();
  for (const ExpectedPort& want : c.ports) {
    ASSERT_NE(port, nullptr);
    SCOPED_TRACE(want.name);
    EXPECT_STREQ(port->name(), want.name);
    EXPECT_STREQ(port->typeName(), want.type);
    EXPECT_EQ(port->direction(), want.direction);
    EXPECT_EQ(port->sourceLine(), want.line);
    EXPECT_EQ(port->hasRange(), want.range != nullptr);
    if (want.range && port->hasRange()) {
      int32_t left = 0, right = 0;
      port->getBounds(left, right);
      EXPECT_EQ(std::to_string(left) + ":" + std::to_string(right), want.range);
      EXPECT_EQ(port->isAscending() != 0, want.ascending);
    }
    port = ports->nextPort(port);
  }
  EXPECT_EQ(port, nullptr);
}

INSTANTIATE_TEST_SUITE_P(Fixtures, VerilogFixtureTest, testing::ValuesIn(cases()),
                         [](const testing::TestParamInfo<FixtureCase>& info) {
                           return std::string(info.param.label);
                         });

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
