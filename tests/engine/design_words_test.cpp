// Templates over designs that carry what the declarations say beyond names and bounds: generics,
// context, declared port types and modes, port patterns, and ranges nobody could evaluate. The
// rows are in design_words_cases.txt over the designs named here; those whose input is generated
// are here.
#include <gtest/gtest.h>

#include <string>
#include <tuple>
#include <vector>

#include "engine/handlers_fixture.h"

namespace {

using handlers_test::Design;
using handlers_test::Row;
using handlers_test::rowName;
using handlers_test::TemplateTest;
using K = PortTypeKind;

const Design kVhdl{
    {{"clk", -1, -1, 'I', "std_ulogic", K::Bit},
     {"rst_n", -1, -1, 'I', "std_logic", K::Bit},
     {"data", 15, 0, 'I', "std_ulogic_vector(WIDTH-1 downto 0)", K::BitVector},
     {"q", -1, -1, 'O', "std_logic", K::Bit, PortMode::Buffer},
     {"trace", -1, -1, 'O', "trace_t", K::Record},
     {"st", -1, -1, 'B', "state_t", K::Enum},
     {"cnt", 3, 0, 'O', "integer range 0 to 15", K::Integer},
     {"n", -1, -1, 'N'}},
    {{"WIDTH", "natural", "8", "16"},
     {"MODE", "string", "\"fast\"", "\"fast\""},
     {"INIT", "std_logic_vector(WIDTH-1 downto 0)", "(others => '0')", "(others => '0')"}},
    "library ieee;\nuse ieee.std_logic_1164.all;\n"};

const Design kVerilog{{{"clk", -1, -1, 'I', "wire", K::Bit},
                       {"d", 7, 0, 'I', "logic [W-1:0]", K::BitVector},
                       {"q", -1, -1, 'O', "logic", K::Bit},
                       {"io", -1, -1, 'B', "wire", K::Bit},
                       {"s", -1, -1, 'B', "bus_if.slave", K::Interface},
                       {"r", -1, -1, 'O', "int", K::Integer, PortMode::Ref}},
                      {{"W", "", "8", "8"}, {"T", "int unsigned", "4", "4"}},
                      "import axi_pkg::*;\n",
                      DesignLanguage::Verilog};

const std::string kProblem =
    "std_logic_vector(WIDTH-1 downto 0): generic WIDTH has no default; give it with -g "
    "WIDTH=VALUE";

const Design kUnknown{{{"en", -1, -1, 'I', "std_logic", K::Bit},
                       {"data", -1, -1, 'I', "std_logic_vector(WIDTH-1 downto 0)", K::BitVector,
                        PortMode::FromLetter, kProblem},
                       {"arr", -1, -1, 'O', "rec_array_t(0 to N-1)", K::Array, PortMode::FromLetter,
                        "N has no value"},
                       {"q", 3, 0, 'O', "std_logic_vector(3 downto 0)", K::BitVector}}};

// Generics with and without default and type, ports with and without declared type.
const Design kDeclared{
    {{"clk", -1, -1, 'I', "wire", K::Bit}, {"d", 1, 0, 'I'}, {"q", -1, -1, 'O', "logic", K::Bit}},
    {{"WIDTH", "natural", "8", "8"}, {"DEPTH", "positive", "", "16"}, {"P", "", "4", "4"}},
    "",
    DesignLanguage::Verilog};

const Design kEmptyValue{{}, {{"W", "", "", ""}}, "", DesignLanguage::Verilog};

// `word` as the innermost of `depth` nested blocks inside a generic iteration.
std::string nestedInGenericBody(const std::string& word, int depth) {
  return "@ITERATE@%GENERIC%" + handlers_test::nested(depth, word) + "@ENDITERATE@";
}

INSTANTIATE_TEST_SUITE_P(DesignWords, TemplateTest,
                         ::testing::ValuesIn(handlers_test::rowsFromFile(
                             "design_words_cases.txt", {{"vhdl", kVhdl},
                                                        {"verilog", kVerilog},
                                                        {"unknown-range", kUnknown},
                                                        {"declared", kDeclared},
                                                        {"empty-value", kEmptyValue}})),
                         rowName);

INSTANTIATE_TEST_SUITE_P(
    GeneratedDesignWords, TemplateTest,
    ::testing::ValuesIn(std::vector<Row>{
        {"NineLevels", kDeclared, nestedInGenericBody("@IFDEFAULT@", 9), "x, , x"},
        {"TenthLevel", kDeclared, nestedInGenericBody("@IFNTYPED@", 10), "", handlers_test::kDepth},
        {"LongProblemKeptWhole",
         {{{"w", -1, -1, 'I', "std_logic_vector(N-1 downto 0)", K::BitVector, PortMode::FromLetter,
            std::string(600, 'p')}}},
         "@EXPANDBUS@%port%",
         "",
         "Error - Template file line 1 needs the range of port w, which could not be evaluated:\n" +
             std::string(600, 'p') + "\n"}}),
    rowName);

// Does the port's name match the pattern?
TEST(IfPort, Patterns) {
  const std::tuple<const char*, const char*, bool> rows[] = {{"clk", "clk", true},
                                                             {"clk", "clk*", true},
                                                             {"clk_a", "clk*", true},
                                                             {"sclk", "clk*", false},
                                                             {"sys_clk", "*_clk", true},
                                                             {"clk", "*_clk", false},
                                                             {"rst_n", "*_n", true},
                                                             {"rst_n", "r?t_?", true},
                                                             {"rst", "r?t_?", false},
                                                             {"a", "?", true},
                                                             {"", "*", true},
                                                             {"ab", "?", false},
                                                             {"abcbc", "a*bc", true},
                                                             {"abcbd", "a*bc", false},
                                                             {"aXbXc", "*X*X*", true},
                                                             {"aXb", "*X*X*", false},
                                                             {"a*b", "a\\*b", false},
                                                             {"mississippi", "*ss*ss*i", true},
                                                             {"Data", "data", false},
                                                             {"data", "d**a", true},
                                                             {"sys_clk", "clk*|*clk", true},
                                                             {"x_clk_i", "clk*|*clk|*_clk_i", true},
                                                             {"clkx", "a|*x", true},
                                                             {"b", "a|b", true},
                                                             {"a|b", "a|b", false},
                                                             {"ab", "a|b", false},
                                                             {"a|b", "a?b", true}};
  for (const auto& [name, pattern, matches] : rows) {
    const std::string templateText = std::string("@ITERATE@%PORT%@IFPORT ") + pattern +
                                     "@y@ENDIF@@IFNPORT " + pattern + "@n@ENDIF@@ENDITERATE@";
    EXPECT_EQ(handlers_test::runOn(templateText, Design{{{name, -1, -1, 'I'}}}).output,
              matches ? "y" : "n")
        << name << " vs " << pattern;
  }
}

}  // namespace
