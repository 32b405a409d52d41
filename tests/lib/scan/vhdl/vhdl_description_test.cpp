// The description of the selected entity: generics (kinds, texts, values after -g), the
// declared type and kind of each port, unknown ranges and their fixes, the context clause
// and the listing of every unit read.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "vhdl_test_support.h"

namespace {

using vhdl_test::describe;
using vhdl_test::Described;
using vhdl_test::Overrides;
using Kind = ScanPort::Kind;

// The fixture files, read as a run reads them.
Described describeFixtures(const std::vector<std::string>& files, const char* unit,
                           const Overrides& overrides = {}) {
  std::vector<std::string> texts;
  for (const std::string& file : files) {
    std::string error;
    std::unique_ptr<scan::SourceBuffer> source =
        scan::SourceBuffer::open(vhdl_test::fixture(file), error);
    texts.push_back(source ? std::string(source->text()) : "");
  }
  return describe(texts, unit, overrides);
}

// "left dir right", "unknown: problem" or "-".
std::string rangeOf(const ScanPort& port) {
  if (port.rangeUnknown()) return "unknown: " + port.rangeProblem();
  if (!port.hasRange()) return "-";
  int32_t left = 0;
  int32_t right = 0;
  port.getBounds(left, right);
  return std::to_string(left) + (port.isAscending() ? " to " : " downto ") + std::to_string(right);
}

const ScanPort* portNamed(const scan::UnitDescription& unit, const std::string& name) {
  for (const ScanPort& p : unit.ports)
    if (name == p.name()) return &p;
  return nullptr;
}

const ScanGeneric* genericNamed(const scan::UnitDescription& unit, const std::string& name) {
  for (const ScanGeneric& g : unit.generics)
    if (g.name == name) return &g;
  return nullptr;
}

const std::vector<std::string> kTopFiles = {"describe_pkg.vhd", "describe_top.vhd"};

struct GenericRow {
  const char* name;
  ScanGeneric::Kind kind;
  const char* type;
  const char* defaultText;
  const char* value;  ///< null when there is none
  int line;
};

void expectGenerics(const std::vector<ScanGeneric>& actual, const std::vector<GenericRow>& rows) {
  ASSERT_EQ(actual.size(), rows.size());
  for (size_t i = 0; i < rows.size(); ++i) {
    SCOPED_TRACE(rows[i].name);
    EXPECT_EQ(actual[i].name, rows[i].name);
    EXPECT_EQ(actual[i].kind, rows[i].kind);
    EXPECT_EQ(actual[i].typeText, rows[i].type);
    EXPECT_EQ(actual[i].defaultText, rows[i].defaultText);
    EXPECT_EQ(actual[i].value.value_or("<none>"), rows[i].value ? rows[i].value : "<none>");
    EXPECT_EQ(actual[i].sourceLine, rows[i].line);
  }
}

TEST(VhdlDescription, GenericsOfEveryLiteralKindInDeclarationOrder) {
  using K = ScanGeneric::Kind;
  Described d = describeFixtures(kTopFiles, "describe_top");
  ASSERT_TRUE(d.found);
  expectGenerics(d.unit.generics,
                 {{"XLEN", K::Constant, "positive", "32", "32", 10},
                  {"HALF", K::Constant, "natural", "16", "16", 11},
                  {"NAME", K::Constant, "string", "\"ab\"\"c\"", "\"ab\"\"c\"", 12},
                  {"RATIO", K::Constant, "real", "3.5", "3.5", 13},
                  {"SCALE", K::Constant, "real", "2.0e3", "2000.0", 14},
                  {"ENABLE", K::Constant, "boolean", "true", "true", 15},
                  {"INIT", K::Constant, "std_ulogic", "'1'", "'1'", 16},
                  {"MODE", K::Constant, "state_t", "RUN", "RUN", 17},
                  {"LEVEL", K::Constant, "level_t", "5", "5", 18},
                  {"VREF", K::Constant, "volts_t", "1.5", "1.5", 19},
                  {"MASK", K::Constant, "std_logic_vector(3 downto 0)", "\"1010\"", nullptr, 20}});
}

TEST(VhdlDescription, Vhdl2008GenericTypesSubprogramsAndPackages) {
  using K = ScanGeneric::Kind;
  Described d = describeFixtures({"describe_2008.vhd"}, "describe_2008");
  ASSERT_TRUE(d.found);
  expectGenerics(
      d.unit.generics,
      {{"data_t", K::Type, "", "", nullptr, 7},
       {"combine", K::Subprogram, "function combine (a, b : data_t) return data_t", "", nullptr, 8},
       {"fixed", K::Package, "new ieee.fixed_generic_pkg generic map (<>)", "", nullptr, 9},
       {"WIDTH", K::Constant, "natural", "8", "8", 10}});
  EXPECT_EQ(d.unit.context, "library ieee;\ncontext ieee.ieee_std_context;");
  ASSERT_EQ(d.unit.ports.size(), 2u);
  EXPECT_EQ(d.unit.ports[0].declaredType(), "data_t");
  EXPECT_EQ(d.unit.ports[0].kind(), Kind::Other);
  EXPECT_EQ(rangeOf(d.unit.ports[1]), "7 downto 0");
}

TEST(VhdlDescription, DeclaredTypesAndKindsOfPorts) {
  struct Row {
    const char* name;
    const char* type;
    Kind kind;
    const char* range;
  };
  const Row rows[] = {
      {"clk", "std_ulogic", Kind::Bit, "-"},
      {"rst_n", "std_logic", Kind::Bit, "-"},
      {"data", "std_ulogic_vector(XLEN-1 downto 0)", Kind::BitVector, "31 downto 0"},
      {"wide", "std_ulogic_vector( XLEN - 1 downto 0)", Kind::BitVector, "31 downto 0"},
      {"lower", "unsigned(HALF - 1 downto 0)", Kind::BitVector, "15 downto 0"},
      {"trace", "trace_port_t", Kind::Record, "-"},
      {"traces", "trace_array_t(0 to 1)", Kind::Array, "0 to 1"},
      {"state", "state_t", Kind::Enum, "-"},
      {"count", "integer range 0 to 15", Kind::Integer, "0 to 15"},
      {"lvl", "level_t", Kind::Integer, "-"},
      {"word", "word_t", Kind::BitVector, "15 downto 0"},
      {"nib", "nibble_t", Kind::BitVector, "3 downto 0"},
      {"sbit", "my_bit_t", Kind::Bit, "-"},
      {"flag", "boolean", Kind::Enum, "-"},
      {"bus_d", "std_logic_vector(BUS_W-1 downto 0)", Kind::BitVector, "11 downto 0"},
  };
  Described d = describeFixtures(kTopFiles, "describe_top");
  ASSERT_EQ(d.unit.ports.size(), std::size(rows));
  for (size_t i = 0; i < std::size(rows); ++i) {
    const ScanPort& p = d.unit.ports[i];
    SCOPED_TRACE(rows[i].name);
    EXPECT_STREQ(p.name(), rows[i].name);
    EXPECT_EQ(p.declaredType(), rows[i].type);
    EXPECT_EQ(p.kind(), rows[i].kind);
    EXPECT_EQ(rangeOf(p), rows[i].range);
  }
  EXPECT_EQ(d.unit.context,
            "library ieee;\nuse ieee.std_logic_1164.all;\nuse ieee.numeric_std.all;\n"
            "library work;\nuse work.describe_pkg.all;");
}

TEST(VhdlDescription, OverridesChangeValuesAndEveryWidthUsingThem) {
  struct Case {
    const char* label;
    const char* unit;
    Overrides overrides;
    std::vector<std::pair<const char*, const char*>> values;  ///< generic, value
    std::vector<std::pair<const char*, const char*>> ranges;  ///< port, range
  };
  const Case cases[] = {
      {"integer",
       "describe_top",
       {{"XLEN", "64"}},
       {{"XLEN", "64"}},
       {{"data", "63 downto 0"}, {"wide", "63 downto 0"}}},
      {"names_ignore_case_and_values_are_expressions",
       "describe_top",
       {{"xlen", "BUS_W * 2"}, {"half", "4"}},
       {{"XLEN", "24"}, {"HALF", "4"}},
       {{"data", "23 downto 0"}, {"lower", "3 downto 0"}}},
      {"last_one_wins",
       "describe_top",
       {{"XLEN", "8"}, {"XLEN", "9"}},
       {{"XLEN", "9"}},
       {{"data", "8 downto 0"}}},
      {"other_literal_kinds",
       "describe_top",
       {{"NAME", "\"xyz\""},
        {"MODE", "done"},
        {"ENABLE", "false"},
        {"INIT", "'0'"},
        {"RATIO", "1.25"}},
       {{"NAME", "\"xyz\""},
        {"MODE", "DONE"},
        {"ENABLE", "false"},
        {"INIT", "'0'"},
        {"RATIO", "1.25"}},
       {}},
      {"generic_without_default",
       "describe_open",
       {{"WIDTH", "3"}},
       {{"WIDTH", "3"}},
       {{"d", "2 downto 0"}, {"q", "6 downto 0"}}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.label);
    Described d = describeFixtures(kTopFiles, c.unit, c.overrides);
    ASSERT_TRUE(d.found);
    for (const auto& [name, value] : c.values) {
      const ScanGeneric* g = genericNamed(d.unit, name);
      ASSERT_NE(g, nullptr) << name;
      EXPECT_EQ(g->value.value_or("<none>"), value) << name;
    }
    for (const auto& [name, range] : c.ranges) {
      const ScanPort* p = portNamed(d.unit, name);
      ASSERT_NE(p, nullptr) << name;
      EXPECT_EQ(rangeOf(*p), range) << name;
    }
  }
}

TEST(VhdlDescription, UnevaluableRangesAreUnknownWithTheFix) {
  const char* kEntity =
      "library ieee; use ieee.std_logic_1164.all;\n"
      "entity e is generic (WIDTH : natural; N : natural := 2);\n"
      "  port (d : in std_logic_vector(WIDTH-1 downto 0); u : in std_logic_vector;\n"
      "        b : in std_logic);\n"
      "end;\n";
  struct Case {
    const char* label;
    std::vector<std::string> texts;
    Overrides overrides;
    const char* port;
    const char* range;
  };
  const Case cases[] = {
      {"generic_without_default",
       {kEntity},
       {},
       "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: generic 'WIDTH' has no value; "
       "give one with -g WIDTH=VALUE"},
      {"unconstrained_and_scalar_ports_are_not_unknown", {kEntity}, {}, "u", "-"},
      {"bad_override_never_falls_back_to_the_default",
       {kEntity},
       {{"WIDTH", "nope"}},
       "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: -g WIDTH=nope cannot be "
       "evaluated: 'nope' is not declared"},
      {"text_after_the_value",
       {kEntity},
       {{"WIDTH", "3 4"}},
       "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: -g WIDTH=3 4 cannot be "
       "evaluated: unexpected '4' after the value"},
      {"missing_package_of_a_use_clause",
       {"use work.absent_pkg.all;\n"
        "entity e is port (d : in bit_vector(C_W - 1 downto 0)); end;\n"},
       {},
       "d",
       "unknown: port 'd': cannot evaluate C_W - 1 downto 0: package 'absent_pkg' is not in "
       "any design file; add the file that declares it"},
      {"missing_package_of_a_selected_name",
       {"entity e is port (d : in bit_vector(other_pkg.W downto 0)); end;\n"},
       {},
       "d",
       "unknown: port 'd': cannot evaluate other_pkg.W downto 0: package 'other_pkg' is not "
       "in any design file; add the file that declares it"},
      {"type_of_a_missing_package",
       {"library mylib; use mylib.types_pkg.all;\n"
        "entity e is port (t : in bus_t); end;\n"},
       {},
       "t",
       "unknown: port 't': type 'bus_t' is not declared: package 'types_pkg' is not in any "
       "design file; add the file that declares it"},
      {"undeclared_type",
       {"entity e is port (t : in bus_t); end;\n"},
       {},
       "t",
       "unknown: port 't': type 'bus_t' is not declared: add the design file of the package "
       "that declares it"},
      {"unsupported_construct_keeps_the_reason",
       {"entity e is generic (S : string := \"ab\");\n"
        "  port (d : in bit_vector(S'foo downto 0)); end;\n"},
       {},
       "d",
       "unknown: port 'd': cannot evaluate S'foo downto 0: attribute 'S'foo' is not supported "
       "in bounds"},
      {"range_of_a_package_subtype",
       {"package p is constant C : natural := 8; subtype w_t is bit_vector(C/0 downto 0);\n"
        "end;\n",
        "use work.p.all; entity e is port (w : in w_t); end;\n"},
       {},
       "w",
       "unknown: port 'w': cannot evaluate C/0 downto 0: arithmetic overflow or division by "
       "zero in 'C/0'"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.label);
    Described d = describe(c.texts, "e", c.overrides);
    ASSERT_TRUE(d.found);
    const ScanPort* p = portNamed(d.unit, c.port);
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(rangeOf(*p), c.range);
    EXPECT_FALSE(p->hasRange());
  }
}

TEST(VhdlDescription, OverrideMistakesAreErrors) {
  const char* kEntity =
      "entity e is generic (type T; WIDTH : natural := 4);\n"
      "  port (d : in bit_vector(WIDTH-1 downto 0)); end;\n";
  struct Case {
    Overrides overrides;
    const char* message;
  };
  const Case cases[] = {
      {{{"WIDTH", "nope"}},
       "-g WIDTH:1:1: error: -g WIDTH: cannot evaluate the value: 'nope' is not declared"},
      {{{"width", "3 4"}}, "-g width:1:3: error: -g width: unexpected '4' after the value"},
      {{{"WIDTH", ")"}}, "-g WIDTH:1:1: error: "},
      {{{"t", "integer"}},
       "-g t:1:1: error: -g t: generic 'T' is not a constant; -g gives values to constant "
       "generics only"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.message);
    Described d = describe({kEntity}, "e", c.overrides);
    EXPECT_NE(d.messages.find(c.message), std::string::npos) << d.messages;
  }
  EXPECT_EQ(describe({kEntity}, "e", {{"WIDTH", "2"}, {"OTHER", "1"}}).messages, "");
}

TEST(VhdlDescription, InterfaceTextsAsWrittenWithBlanksNormalised) {
  Described d = describe(
      {"entity e is\n"
       "  generic (constant A, B : integer\n"
       "             range 0 to 7 := 3 + -- two\n"
       "             4;\n"
       "           function \"+\" (l, r : bit) return bit is <>;\n"
       "           pure function f return natural is g);\n"
       "  port (signal x, y : inout (resolved) std_ulogic_vector(1 downto 0) bus := \"00\";\n"
       "        z : resolved std_ulogic; \\Odd  Name\\ : out bit;\n"
       "        t : in bit"},  // cut off before its ';': never a port
      "e");
  ASSERT_TRUE(d.found);
  using K = ScanGeneric::Kind;
  expectGenerics(
      d.unit.generics,
      {{"A", K::Constant, "integer range 0 to 7", "3 + 4", "7", 2},
       {"B", K::Constant, "integer range 0 to 7", "3 + 4", "7", 2},
       {"\"+\"", K::Subprogram, "function \"+\" (l, r : bit) return bit", "<>", nullptr, 5},
       {"f", K::Subprogram, "pure function f return natural", "g", nullptr, 6}});
  std::vector<std::string> types;
  for (const ScanPort& p : d.unit.ports) types.push_back(p.name() + (": " + p.declaredType()));
  EXPECT_EQ(types, (std::vector<std::string>{"x: (resolved) std_ulogic_vector(1 downto 0)",
                                             "y: (resolved) std_ulogic_vector(1 downto 0)",
                                             "z: resolved std_ulogic", "\\Odd  Name\\: bit"}));
}

TEST(VhdlDescription, ContextClauseOfTheUnitOnly) {
  struct Case {
    const char* label;
    const char* text;
    const char* context;
  };
  const Case cases[] = {
      {"none", "entity e is end;", ""},
      {"blanks_and_comments",
       "-- head\nLibrary  IEEE ;\n  use   ieee . std_logic_1164.all ; -- x\n/* c */ use "
       "ieee.numeric_std.all,\n"
       "  ieee.math_real.all;\nentity e is end;",
       "Library IEEE ;\nuse ieee . std_logic_1164.all ;\nuse ieee.numeric_std.all, "
       "ieee.math_real.all;"},
      {"after_other_units",
       "library ieee; use ieee.std_logic_1164.all;\n"
       "package p is end package;\n"
       "architecture a of x is begin process begin wait; end process; end;\n"
       "use work.p.all;\nentity e is end;",
       "use work.p.all;"},
      {"context_reference", "library ieee; context ieee.ieee_std_context;\nentity e is end;",
       "library ieee;\ncontext ieee.ieee_std_context;"},
      {"after_a_context_declaration",
       "context c is library ieee; use ieee.std_logic_1164.all; end context c;\n"
       "context work.c;\nentity e is end;",
       "context work.c;"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.label);
    Described d = describe({c.text}, "e");
    ASSERT_TRUE(d.found);
    EXPECT_EQ(d.unit.context, c.context);
  }
}

TEST(VhdlDescription, ListsEveryUnitInFileOrder) {
  Described d = describe({"context Ctx is library ieee; end context;\n"
                          "package Pkg is end package;\n"
                          "package body Pkg is end package body;\n"
                          "package Inst is new work.gen generic map (N => 1);\n"
                          "entity Top is end;\n"
                          "architecture RTL of Top is begin end;\n"
                          "configuration Cfg of Top is for RTL end for; end;\n",
                          "entity top is end;\n"},
                         "top");
  std::vector<std::string> lines;
  for (const ScanUnitInfo& u : d.units)
    lines.push_back(u.library + " " + u.kind + " " + u.name + " " + u.file + ":" +
                    std::to_string(u.line));
  EXPECT_EQ(lines, (std::vector<std::string>{
                       "work context Ctx f0.vhd:1", "work package Pkg f0.vhd:2",
                       "work package body Pkg f0.vhd:3", "work package Inst f0.vhd:4",
                       "work entity Top f0.vhd:5", "work architecture RTL f0.vhd:6",
                       "work configuration Cfg f0.vhd:7", "work entity top f1.vhd:1"}));
}

TEST(VhdlDescription, ReachesTheExtractorWithItsSettings) {
  ScanExtractor extractor;
  ScanSettings settings;
  settings.genericOverrides = {{"width", "5"}, {"NOPE", "1"}, {"Depth", "1"}};
  extractor.configure(settings);
  extractor.addDesignFile("work", vhdl_test::fixture("describe_top.vhd").c_str(),
                          ScanExtractor::Vhdl);
  testing::internal::CaptureStderr();
  extractor.Parse(ScanExtractor::Vhdl);
  ASSERT_TRUE(
      extractor.selectDesignUnit("work", "DESCRIBE_OPEN", ScanExtractor::SearchAllLibraries));
  ScanPortList* ports = extractor.getPorts();
  testing::internal::GetCapturedStderr();
  ASSERT_EQ(ports->size(), 3u);
  EXPECT_EQ(rangeOf(*ports->firstPort()), "4 downto 0");
  EXPECT_EQ(extractor.getContext(), "library ieee;\nuse ieee.std_logic_1164.all;");
  ASSERT_EQ(extractor.getGenerics().size(), 2u);
  EXPECT_EQ(extractor.getGenerics()[1].value.value_or("<none>"), "1");
  EXPECT_EQ(extractor.unknownOverrides(), std::vector<std::string>{"NOPE"});
  EXPECT_EQ(extractor.listUnits().size(), 3u);
}

}  // namespace
