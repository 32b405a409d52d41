// The fixture designs as a run reads them: each port's name, type, mode, line and evaluated
// range across files, libraries, packages, attributes and functions, and the messages users
// see for bad or unusual input, with their exact text, file, line and column.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "vhdl_test_support.h"

namespace {

struct FixtureCase {
  const char* label;
  vhdl_test::Files files;
  const char* unit;
  std::vector<std::string> ports;          ///< "name type direction line range"; "not found"
  std::vector<std::string> messages = {};  ///< each must appear in the messages as a whole line
  size_t errors = 0;
};

// The ports of entity basic in basic.vhd, wherever that file is registered.
const std::vector<std::string> kBasicPorts = {"clk std_logic 1 12 -",
                                              "RST_n std_logic 1 12 -",
                                              "data_in std_logic_vector 1 13 7 downto 0",
                                              "data_out std_logic_vector 2 14 0 to 7",
                                              "bidir std_logic_vector 3 15 7 downto 0",
                                              "buf unsigned 4 16 16 downto -2",
                                              "lnk bit 5 17 -",
                                              "nomode std_logic 1 18 -",
                                              "cnt integer 2 19 0 to 255",
                                              "nat natural 1 20 0 to 31",
                                              "sel std_logic_vector 1 21 3 downto 0",
                                              "flag boolean 2 22 -",
                                              "ops bit_vector 1 23 3 downto 5"};

const FixtureCase kCases[] = {
    {"modes_generics_and_operators", {{"work", "basic.vhd"}}, "BASIC", kBasicPorts},
    {"entity_without_ports", {{"work", "basic.vhd"}}, "empty_ports", {}},
    {"packages_subtypes_attributes_and_functions",
     {{"work", "cfg_pkg.vhd"}, {"mylib", "lib_pkg.vhd"}, {"work", "pkg_user.vhd"}},
     "pkg_user",
     {"w word_t 1 10 15 downto 0",
      "w2 alias_t 2 11 15 downto 0",
      "mem mem_t 1 12 0 to 3",
      "arr vec_array 1 13 1 to 3",
      "unc vec_array 1 14 -",
      "r rec_t 1 15 -",
      "idx idx_t 1 16 -",
      "sm small_t 1 17 -",
      "st state_t 1 18 -",
      "a1 std_logic_vector 1 19 6 downto 0",
      "a2 std_logic_vector 1 20 7 downto 0",
      "a3 std_logic_vector 1 21 6 downto 0",
      "d std_logic_vector 1 22 31 downto 0",
      "s1 std_logic_vector 1 23 16 downto 1",
      "s2 std_logic_vector 1 24 3 downto 0",
      "s3 std_logic_vector 1 25 11 downto 0",
      "at1 std_logic_vector 1 26 15 downto 0",
      "at2 std_logic_vector 1 27 0 to 15",
      "at3 std_logic_vector 1 28 15 downto 0",
      "at4 std_logic_vector 1 29 3 downto 0",
      "at5 std_logic_vector 1 30 6 downto 0",
      "g grid_t 1 31 0 to 2",
      "m2 std_logic_vector 1 32 5 downto 0",
      "p0 std_logic_vector 1 33 10 downto 0",
      "p3 std_logic_vector 1 34 20 downto 0",
      "p9 std_logic_vector 1 35 30 downto 0",
      "en bit_vector 1 36 2 to 2",
      "bad std_logic_vector 1 37 -",
      "spin std_logic_vector 1 38 -",
      "ext t_unknown 1 39 -"},
     {"pkg_user.vhd:14:5: warning: port 'unc' has an unconstrained type; no range reported",
      "pkg_user.vhd:37:5: warning: port 'bad': cannot evaluate 'NOPE - 1 downto 0' ('NOPE' is not "
      "declared); no range reported",
      "pkg_user.vhd:38:5: warning: port 'spin': cannot evaluate 'busy_loop downto 0' (a function "
      "did not finish within 1000000 steps); no range reported",
      "pkg_user.vhd:39:14: warning: port 'ext': type 't_unknown' is not declared in any visible "
      "package; no range reported"}},
    {"lexical_corners",
     {{"work", "lexis.vhd"}},
     "lexis",
     {"t std_logic_vector 1 14 5 downto 0", "u std_logic_vector 1 15 19 downto 0",
      "v std_logic_vector 1 16 40 downto 0", "w std_logic_vector 1 17 2 downto 0",
      "x std_logic_vector 1 18 -", "y std_logic_vector 1 19 25 downto 0"},
     {"lexis.vhd:18:9: warning: port 'x': cannot evaluate '2.5E1 downto 0' (the bounds of "
      "'2.5E1 downto 0' are not integers); no range reported"}},
    {"extended_identifiers_and_based_literals",
     {{"work", "lexis.vhd"}},
     "\\Odd Name\\",
     {"\\my port\\ bit_vector 1 6 1 downto 0", "q std_logic_vector 2 7 8 downto 0"}},
    {"crlf_line_ends",
     {{"work", "crlf.vhd"}},
     "Crlf_Ent",
     {"a bit 1 3 -", "b bit_vector 2 5 3 downto 0"}},
    {"recovery_after_syntax_errors",
     {{"work", "errors.vhd"}},
     "after_error",
     {"x bit_vector 2 8 3 downto 0"},
     {"errors.vhd:5:8: error: expected a name after 'entity'"},
     1},
    {"first_definition_wins",
     {{"work", "errors.vhd"}},
     "dup",
     {"first bit 1 11 -"},
     {"errors.vhd:12:8: warning: entity 'dup' is already defined in library 'work' at "},
     1},
    {"ports_read_before_a_syntax_error",
     {{"work", "errors.vhd"}},
     "broken",
     {"a bit 1 2 -"},
     {"errors.vhd:5:8: error: expected a name after 'entity'",
      "errors.vhd:12:8: warning: entity 'dup' is already defined in library 'work' at ",
      "errors.vhd:2:20: error: expected an interface name, found ';'",
      "    port (a : in bit;; b : out bit);", "                     ^"},
     2},
    {"context_declarations_and_generic_packages",
     {{"mylib", "lib_pkg.vhd"}, {"work", "generic_pkg.vhd"}},
     "ctx_user",
     {"v bit_vector 1 17 11 downto 0", "q bit_vector 2 18 1 downto 0"}},
    {"library_other_than_work_is_searched", {{"mylib", "basic.vhd"}}, "basic", kBasicPorts},
    {"unreadable_files_do_not_stop_the_run",
     {{"work", "no_such_file.vhd"}, {"work", "basic.vhd"}},
     "basic",
     kBasicPorts,
     {"no_such_file.vhd: error: No such file or directory"},
     1},
    {"missing_unit", {{"work", "basic.vhd"}}, "nowhere", {"not found"}},
};

class Fixtures : public testing::TestWithParam<FixtureCase> {};

TEST_P(Fixtures, ReadAsDeclared) {
  const FixtureCase& c = GetParam();
  const vhdl_test::Read read = vhdl_test::read(c.files, c.unit);
  std::vector<std::string> ports;
  if (!read.found) ports.push_back("not found");
  for (const ScanPort& p : read.unit.ports)
    ports.push_back(p.name() + (" " + std::string(p.typeName())) + " " +
                    std::to_string(p.direction()) + " " + std::to_string(p.sourceLine()) + " " +
                    (p.hasRange() ? vhdl_test::rangeOf(p) : "-"));
  EXPECT_EQ(ports, c.ports) << read.messages;
  // Paths are printed as registered; compare from the file name on.
  for (const std::string& line : c.messages) {
    const size_t at = read.messages.find(line);
    ASSERT_NE(at, std::string::npos) << "missing: " << line << "\nin:\n" << read.messages;
    const size_t end = at + line.size();
    EXPECT_TRUE(end == read.messages.size() || read.messages[end] == '\n' || line.back() == ' ')
        << line;
  }
  if (c.messages.empty()) {
    EXPECT_EQ(read.warnings + read.errors, 0u) << read.messages;
  }
  EXPECT_EQ(read.errors, c.errors) << read.messages;
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Fixtures, testing::ValuesIn(kCases), vhdl_test::ByLabel());

}  // namespace
