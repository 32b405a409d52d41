// The description of the selected entity: generics (kinds, texts, values after -g), the
// declared type and kind of each port, unknown ranges and their fixes, the context clause
// and the listing of every unit read.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "vhdl_test_support.h"

namespace {

using vhdl_test::Overrides;
using vhdl_test::rangeOf;
using vhdl_test::read;
using Kind = ScanPort::Kind;

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

const vhdl_test::Files kTopFiles = {{"work", "describe_pkg.vhd"}, {"work", "describe_top.vhd"}};

// "name | kind | type | default | value | line" per generic; "-" for no value.
std::vector<std::string> genericsOf(const vhdl_test::Read& d) {
  static const char* const kKinds[] = {"constant", "type", "package", "subprogram"};
  std::vector<std::string> out;
  for (const ScanGeneric& g : d.unit.generics)
    out.push_back(g.name + " | " + kKinds[static_cast<int>(g.kind)] + " | " + g.typeText + " | " +
                  g.defaultText + " | " + g.value.value_or("-") + " | " +
                  std::to_string(g.sourceLine));
  return out;
}

TEST(VhdlDescription, GenericsOfEveryLiteralKindInDeclarationOrder) {
  vhdl_test::Read d = read(kTopFiles, "describe_top");
  ASSERT_TRUE(d.found);
  EXPECT_EQ(
      genericsOf(d),
      (std::vector<std::string>{
          "XLEN | constant | positive | 32 | 32 | 10", "HALF | constant | natural | 16 | 16 | 11",
          "NAME | constant | string | \"ab\"\"c\" | \"ab\"\"c\" | 12",
          "RATIO | constant | real | 3.5 | 3.5 | 13",
          "SCALE | constant | real | 2.0e3 | 2000.0 | 14",
          "ENABLE | constant | boolean | true | true | 15",
          "INIT | constant | std_ulogic | '1' | '1' | 16",
          "MODE | constant | state_t | RUN | RUN | 17", "LEVEL | constant | level_t | 5 | 5 | 18",
          "VREF | constant | volts_t | 1.5 | 1.5 | 19",
          "MASK | constant | std_logic_vector(3 downto 0) | \"1010\" | - | 20"}));
}

TEST(VhdlDescription, Vhdl2008GenericTypesSubprogramsAndPackages) {
  vhdl_test::Read d = read({{"work", "describe_2008.vhd"}}, "describe_2008");
  ASSERT_TRUE(d.found);
  EXPECT_EQ(genericsOf(d),
            (std::vector<std::string>{
                "data_t | type |  |  | - | 7",
                "combine | subprogram | function combine (a, b : data_t) return data_t |  | - | 8",
                "fixed | package | new ieee.fixed_generic_pkg generic map (<>) |  | - | 9",
                "WIDTH | constant | natural | 8 | 8 | 10"}));
  EXPECT_EQ(d.unit.context, "library ieee;\ncontext ieee.ieee_std_context;");
  ASSERT_EQ(d.unit.ports.size(), 2u);
  EXPECT_EQ(d.unit.ports[0].declaredType(), "data_t");
  EXPECT_EQ(d.unit.ports[0].kind(), Kind::Other);
  EXPECT_EQ(rangeOf(d.unit.ports[1]), "7 downto 0");
}

TEST(VhdlDescription, DeclaredTypesAndKindsOfPorts) {
  static const char* const kKinds[] = {"Bit",   "BitVector", "Integer",   "Record",
                                       "Array", "Enum",      "Interface", "Other"};
  const vhdl_test::Read d = read(kTopFiles, "describe_top");
  std::vector<std::string> ports;
  for (const ScanPort& p : d.unit.ports)
    ports.push_back(p.name() + (" | " + p.declaredType()) + " | " +
                    kKinds[static_cast<int>(p.kind())] + " | " + rangeOf(p));
  EXPECT_EQ(
      ports,
      (std::vector<std::string>{
          "clk | std_ulogic | Bit | -", "rst_n | std_logic | Bit | -",
          "data | std_ulogic_vector(XLEN-1 downto 0) | BitVector | 31 downto 0",
          "wide | std_ulogic_vector( XLEN - 1 downto 0) | BitVector | 31 downto 0",
          "lower | unsigned(HALF - 1 downto 0) | BitVector | 15 downto 0",
          "trace | trace_port_t | Record | -", "traces | trace_array_t(0 to 1) | Array | 0 to 1",
          "state | state_t | Enum | -", "count | integer range 0 to 15 | Integer | 0 to 15",
          "lvl | level_t | Integer | -", "word | word_t | BitVector | 15 downto 0",
          "nib | nibble_t | BitVector | 3 downto 0", "sbit | my_bit_t | Bit | -",
          "flag | boolean | Enum | -",
          "bus_d | std_logic_vector(BUS_W-1 downto 0) | BitVector | 11 downto 0"}));
  EXPECT_EQ(d.unit.context,
            "library ieee;\nuse ieee.std_logic_1164.all;\nuse ieee.numeric_std.all;\n"
            "library work;\nuse work.describe_pkg.all;");
}

TEST(VhdlDescription, OverridesChangeValuesAndEveryWidthUsingThem) {
  struct Case {
    const char* label;
    const char* unit;
    Overrides overrides;
    std::vector<std::string> expected;  ///< "GENERIC=value" or "port: range"
  };
  const Case cases[] = {
      {"integer",
       "describe_top",
       {{"XLEN", "64"}},
       {"XLEN=64", "data: 63 downto 0", "wide: 63 downto 0"}},
      {"names_ignore_case_and_values_are_expressions",
       "describe_top",
       {{"xlen", "BUS_W * 2"}, {"half", "4"}},
       {"XLEN=24", "HALF=4", "data: 23 downto 0", "lower: 3 downto 0"}},
      {"last_one_wins",
       "describe_top",
       {{"XLEN", "8"}, {"XLEN", "9"}},
       {"XLEN=9", "data: 8 downto 0"}},
      {"other_literal_kinds",
       "describe_top",
       {{"NAME", "\"xyz\""},
        {"MODE", "done"},
        {"ENABLE", "false"},
        {"INIT", "'0'"},
        {"RATIO", "1.25"}},
       {"NAME=\"xyz\"", "MODE=DONE", "ENABLE=false", "INIT='0'", "RATIO=1.25"}},
      {"generic_without_default",
       "describe_open",
       {{"WIDTH", "3"}},
       {"WIDTH=3", "d: 2 downto 0", "q: 6 downto 0"}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.label);
    const vhdl_test::Read d = read(kTopFiles, c.unit, c.overrides);
    ASSERT_TRUE(d.found);
    std::vector<std::string> actual;
    for (const std::string& expected : c.expected) {
      const size_t colon = expected.find(": ");
      const std::string name = expected.substr(0, std::min(colon, expected.find('=')));
      if (colon != std::string::npos) {
        const ScanPort* p = portNamed(d.unit, name);
        actual.push_back(name + ": " + (p ? rangeOf(*p) : "missing"));
      } else {
        const ScanGeneric* g = genericNamed(d.unit, name);
        actual.push_back(name + "=" + (g ? g->value.value_or("<none>") : "missing"));
      }
    }
    EXPECT_EQ(actual, c.expected);
  }
}

TEST(VhdlDescription, UnevaluableRangesAreUnknownWithTheFix) {
  const std::string kEntity =
      "library ieee; use ieee.std_logic_1164.all;\n"
      "entity e is generic (WIDTH : natural; N : natural := 2);\n"
      "  port (d : in std_logic_vector(WIDTH-1 downto 0); u : in std_logic_vector;\n"
      "        b : in std_logic);\n"
      "end;\n";
  struct Case {
    const char* label;
    std::string text;
    const char* port;
    const char* range;
    Overrides overrides = {};
  };
  const Case cases[] = {
      {"generic_without_default", kEntity, "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: generic 'WIDTH' has no value; "
       "give one with -g WIDTH=VALUE"},
      {"unconstrained_and_scalar_ports_are_not_unknown", kEntity, "u", "-"},
      {"bad_override_never_falls_back_to_the_default",
       kEntity,
       "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: -g WIDTH=nope cannot be "
       "evaluated: 'nope' is not declared",
       {{"WIDTH", "nope"}}},
      {"text_after_the_value",
       kEntity,
       "d",
       "unknown: port 'd': cannot evaluate WIDTH-1 downto 0: -g WIDTH=3 4 cannot be "
       "evaluated: unexpected '4' after the value",
       {{"WIDTH", "3 4"}}},
      {"missing_package_of_a_use_clause",
       "use work.absent_pkg.all;\n"
       "entity e is port (d : in bit_vector(C_W - 1 downto 0)); end;\n",
       "d",
       "unknown: port 'd': cannot evaluate C_W - 1 downto 0: package 'absent_pkg' is not in "
       "any design file; add the file that declares it"},
      {"missing_package_of_a_selected_name",
       "entity e is port (d : in bit_vector(other_pkg.W downto 0)); end;\n", "d",
       "unknown: port 'd': cannot evaluate other_pkg.W downto 0: package 'other_pkg' is not "
       "in any design file; add the file that declares it"},
      {"type_of_a_missing_package",
       "library mylib; use mylib.types_pkg.all;\n"
       "entity e is port (t : in bus_t); end;\n",
       "t",
       "unknown: port 't': type 'bus_t' is not declared: package 'types_pkg' is not in any "
       "design file; add the file that declares it"},
      {"undeclared_type", "entity e is port (t : in bus_t); end;\n", "t",
       "unknown: port 't': type 'bus_t' is not declared: add the design file of the package "
       "that declares it"},
      {"unsupported_construct_keeps_the_reason",
       "entity e is generic (S : string := \"ab\");\n"
       "  port (d : in bit_vector(S'foo downto 0)); end;\n",
       "d",
       "unknown: port 'd': cannot evaluate S'foo downto 0: attribute 'S'foo' is not supported "
       "in bounds"},
      {"range_of_a_package_subtype",
       "package p is constant C : natural := 8; subtype w_t is bit_vector(C/0 downto 0);\n"
       "end;\nuse work.p.all; entity e is port (w : in w_t); end;\n",
       "w",
       "unknown: port 'w': cannot evaluate C/0 downto 0: arithmetic overflow or division by "
       "zero in 'C/0'"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.label);
    const vhdl_test::Read d = read({{"work", c.text}}, "e", c.overrides);
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
    vhdl_test::Read d = read({{"work", kEntity}}, "e", c.overrides);
    EXPECT_NE(d.messages.find(c.message), std::string::npos) << d.messages;
  }
  EXPECT_EQ(read({{"work", kEntity}}, "e", {{"WIDTH", "2"}, {"OTHER", "1"}}).messages, "");
}

TEST(VhdlDescription, InterfaceTextsAsWrittenWithBlanksNormalised) {
  vhdl_test::Read d =
      read({{"work",
             "entity e is\n"
             "  generic (constant A, B : integer\n"
             "             range 0 to 7 := 3 + -- two\n"
             "             4;\n"
             "           function \"+\" (l, r : bit) return bit is <>;\n"
             "           pure function f return natural is g);\n"
             "  port (signal x, y : inout (resolved) std_ulogic_vector(1 downto 0) bus := \"00\";\n"
             "        z : resolved std_ulogic; \\Odd  Name\\ : out bit;\n"
             "        t : in bit"}},  // cut off before its ';': never a port
           "e");
  ASSERT_TRUE(d.found);
  EXPECT_EQ(genericsOf(d),
            (std::vector<std::string>{
                "A | constant | integer range 0 to 7 | 3 + 4 | 7 | 2",
                "B | constant | integer range 0 to 7 | 3 + 4 | 7 | 2",
                "\"+\" | subprogram | function \"+\" (l, r : bit) return bit | <> | - | 5",
                "f | subprogram | pure function f return natural | g | - | 6"}));
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
    vhdl_test::Read d = read({{"work", c.text}}, "e");
    ASSERT_TRUE(d.found);
    EXPECT_EQ(d.unit.context, c.context);
  }
}

TEST(VhdlDescription, ListsEveryUnitInFileOrder) {
  vhdl_test::Read d = read({{"work",
                             "context Ctx is library ieee; end context;\n"
                             "package Pkg is end package;\n"
                             "package body Pkg is end package body;\n"
                             "package Inst is new work.gen generic map (N => 1);\n"
                             "entity Top is end;\n"
                             "architecture RTL of Top is begin end;\n"
                             "configuration Cfg of Top is for RTL end for; end;\n"},
                            {"work", "entity top is end;\n"}},
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
