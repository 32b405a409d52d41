// Ports of the fixture entities, compared field by field: names, types, modes, lines and
// evaluated ranges across files, libraries, packages, attributes and functions.
#include <gtest/gtest.h>

#include "vhdl_test_support.h"

namespace {

using vhdl_test::extract;
using vhdl_test::Port;
using vhdl_test::ranged;
using vhdl_test::scalar;

struct UnitCase {
  const char* label;
  std::vector<std::pair<std::string, std::string>> files;
  const char* unit;
  std::vector<Port> ports;
};

const std::vector<std::pair<std::string, std::string>> kPackageFiles = {
    {"work", "cfg_pkg.vhd"}, {"mylib", "lib_pkg.vhd"}, {"work", "pkg_user.vhd"}};

// The ports of entity basic in basic.vhd, wherever that file is registered.
const std::vector<Port> kBasicPorts = {scalar("clk", "std_logic", 1, 12),
                                       scalar("RST_n", "std_logic", 1, 12),
                                       ranged("data_in", "std_logic_vector", 1, 13, 7, "downto", 0),
                                       ranged("data_out", "std_logic_vector", 2, 14, 0, "to", 7),
                                       ranged("bidir", "std_logic_vector", 3, 15, 7, "downto", 0),
                                       ranged("buf", "unsigned", 4, 16, 16, "downto", -2),
                                       scalar("lnk", "bit", 5, 17),
                                       scalar("nomode", "std_logic", 1, 18),
                                       ranged("cnt", "integer", 2, 19, 0, "to", 255),
                                       ranged("nat", "natural", 1, 20, 0, "to", 31),
                                       ranged("sel", "std_logic_vector", 1, 21, 3, "downto", 0),
                                       scalar("flag", "boolean", 2, 22),
                                       ranged("ops", "bit_vector", 1, 23, 3, "downto", 5)};

const UnitCase kCases[] = {
    {"modes_generics_and_operators", {{"work", "basic.vhd"}}, "BASIC", kBasicPorts},
    {"entity_without_ports", {{"work", "basic.vhd"}}, "empty_ports", {}},
    {"packages_subtypes_attributes_and_functions",
     kPackageFiles,
     "pkg_user",
     {ranged("w", "word_t", 1, 10, 15, "downto", 0),
      ranged("w2", "alias_t", 2, 11, 15, "downto", 0),
      ranged("mem", "mem_t", 1, 12, 0, "to", 3),
      ranged("arr", "vec_array", 1, 13, 1, "to", 3),
      scalar("unc", "vec_array", 1, 14),
      scalar("r", "rec_t", 1, 15),
      scalar("idx", "idx_t", 1, 16),
      scalar("sm", "small_t", 1, 17),
      scalar("st", "state_t", 1, 18),
      ranged("a1", "std_logic_vector", 1, 19, 6, "downto", 0),
      ranged("a2", "std_logic_vector", 1, 20, 7, "downto", 0),
      ranged("a3", "std_logic_vector", 1, 21, 6, "downto", 0),
      ranged("d", "std_logic_vector", 1, 22, 31, "downto", 0),
      ranged("s1", "std_logic_vector", 1, 23, 16, "downto", 1),
      ranged("s2", "std_logic_vector", 1, 24, 3, "downto", 0),
      ranged("s3", "std_logic_vector", 1, 25, 11, "downto", 0),
      ranged("at1", "std_logic_vector", 1, 26, 15, "downto", 0),
      ranged("at2", "std_logic_vector", 1, 27, 0, "to", 15),
      ranged("at3", "std_logic_vector", 1, 28, 15, "downto", 0),
      ranged("at4", "std_logic_vector", 1, 29, 3, "downto", 0),
      ranged("at5", "std_logic_vector", 1, 30, 6, "downto", 0),
      ranged("g", "grid_t", 1, 31, 0, "to", 2),
      ranged("m2", "std_logic_vector", 1, 32, 5, "downto", 0),
      ranged("p0", "std_logic_vector", 1, 33, 10, "downto", 0),
      ranged("p3", "std_logic_vector", 1, 34, 20, "downto", 0),
      ranged("p9", "std_logic_vector", 1, 35, 30, "downto", 0),
      ranged("en", "bit_vector", 1, 36, 2, "to", 2),
      scalar("bad", "std_logic_vector", 1, 37),
      scalar("spin", "std_logic_vector", 1, 38),
      scalar("ext", "t_unknown", 1, 39)}},
    {"lexical_corners",
     {{"work", "lexis.vhd"}},
     "lexis",
     {ranged("t", "std_logic_vector", 1, 14, 5, "downto", 0),
      ranged("u", "std_logic_vector", 1, 15, 19, "downto", 0),
      ranged("v", "std_logic_vector", 1, 16, 40, "downto", 0),
      ranged("w", "std_logic_vector", 1, 17, 2, "downto", 0),
      scalar("x", "std_logic_vector", 1, 18),
      ranged("y", "std_logic_vector", 1, 19, 25, "downto", 0)}},
    {"extended_identifiers_and_based_literals",
     {{"work", "lexis.vhd"}},
     "\\Odd Name\\",
     {ranged("\\my port\\", "bit_vector", 1, 6, 1, "downto", 0),
      ranged("q", "std_logic_vector", 2, 7, 8, "downto", 0)}},
    {"crlf_line_ends",
     {{"work", "crlf.vhd"}},
     "Crlf_Ent",
     {scalar("a", "bit", 1, 3), ranged("b", "bit_vector", 2, 5, 3, "downto", 0)}},
    {"recovery_after_syntax_errors",
     {{"work", "errors.vhd"}},
     "after_error",
     {ranged("x", "bit_vector", 2, 8, 3, "downto", 0)}},
    {"first_definition_wins", {{"work", "errors.vhd"}}, "dup", {scalar("first", "bit", 1, 11)}},
    {"ports_read_before_a_syntax_error",
     {{"work", "errors.vhd"}},
     "broken",
     {scalar("a", "bit", 1, 2)}},
    {"context_declarations_and_generic_packages",
     {{"mylib", "lib_pkg.vhd"}, {"work", "generic_pkg.vhd"}},
     "ctx_user",
     {ranged("v", "bit_vector", 1, 17, 11, "downto", 0),
      ranged("q", "bit_vector", 2, 18, 1, "downto", 0)}},
    {"library_other_than_work_is_searched", {{"mylib", "basic.vhd"}}, "basic", kBasicPorts},
};

class FixturePorts : public testing::TestWithParam<UnitCase> {};

TEST_P(FixturePorts, MatchDeclarations) {
  const UnitCase& c = GetParam();
  vhdl_test::Run run = extract(c.files, c.unit);
  ASSERT_TRUE(run.found) << run.messages;
  ASSERT_EQ(run.ports.size(), c.ports.size()) << run.messages;
  for (size_t i = 0; i < c.ports.size(); ++i) EXPECT_EQ(run.ports[i], c.ports[i]) << "port " << i;
}

INSTANTIATE_TEST_SUITE_P(Vhdl, FixturePorts, testing::ValuesIn(kCases),
                         [](const testing::TestParamInfo<UnitCase>& info) {
                           return std::string(info.param.label);
                         });

}  // namespace
