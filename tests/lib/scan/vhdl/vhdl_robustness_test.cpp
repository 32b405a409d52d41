// Hostile and broken input: the reader must finish, report what it can and never crash,
// recurse without bound or run forever.
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "vhdl_test_support.h"

namespace {

vhdl_test::Read read(const std::string& text, const char* unit) {
  return vhdl_test::read({{"work", text}}, unit);
}

std::string repeat(const std::string& s, size_t n) {
  std::string out;
  out.reserve(s.size() * n);
  for (size_t i = 0; i < n; ++i) out += s;
  return out;
}

const std::string kPackage =
    "package p is constant SELF : integer := SELF + 1;\n"
    "  function forever(n : integer) return integer; function count(n : integer) return integer;\n"
    "end package;\n"
    "package body p is\n"
    "  function forever(n : integer) return integer is begin return forever(n + 1); end function;\n"
    "  function count(n : integer) return integer is variable total : integer := 0;\n"
    "  begin for i in 0 to n loop total := total + 1; end loop; return total; end function;\n"
    "end package body;\nuse work.p.all;\n";

std::string withNul(const std::string& before, const std::string& after) {
  return before + std::string(1, '\0') + after;
}

struct HostileCase {
  const char* label;
  std::string text;             ///< entity e is the unit read
  const char* outcome;          ///< header sound or broken, ports, ranged ports, exact errors
  const char* error = nullptr;  ///< the head of the one error, when the case pins it
};

const HostileCase kCases[] = {
    {"nested_parentheses_in_a_bound",
     "entity e is port (a : in bit_vector(" + repeat("(", 100000) + "1" + repeat(")", 100000) +
         " downto 0)); end;",
     "broken 0 ports 0 ranged 1 errors"},
    {"nested_parentheses_in_a_body",
     "entity e is port (a : in bit); end;\narchitecture a of e is begin x <= " +
         repeat("(", 100000) + "1" + repeat(")", 100000) + "; end;",
     "sound 1 ports 0 ranged 0 errors"},
    {"flat_operator_chain_is_no_nesting",
     "entity e is port (a : in bit_vector(" + repeat("1+", 100000) + "1 downto 0)); end;",
     "sound 1 ports 1 ranged 0 errors"},
    {"huge_identifier",
     "entity " + std::string(4 << 20, 'n') + " is port (" + std::string(1 << 20, 'p') +
         " : in bit_vector(1 downto 0)); end;\nentity e is port (b : in bit); end;",
     "sound 1 ports 0 ranged 0 errors"},
    {"self_recursive_function_and_constant",
     kPackage + "entity e is port (a : in bit_vector(forever(1) downto 0);\n"
                "  b : in bit_vector(SELF downto 0); c : in bit_vector(count(9) downto 0)); end;",
     "sound 3 ports 1 ranged 0 errors"},
    {"loop_over_the_whole_integer_range",
     kPackage + "entity e is port (a : in bit_vector(count(integer'high - 1) downto 0)); end;",
     "sound 1 ports 0 ranged 0 errors"},
    {"unterminated_block_comment_after_the_unit",
     "entity e is port (a : in bit); end;\n/* entity f is end;", "sound 1 ports 0 ranged 1 errors"},
    {"unterminated_string_in_another_unit",
     "entity f is generic (S : string := \"abc\n); port (a : in bit); end;\n"
     "entity e is port (b : out bit); end;",
     "sound 1 ports 0 ranged 1 errors"},
    {"nul_byte_between_ports", withNul("entity e is port (a : in bit;", " b : out bit); end;"),
     "broken 1 ports 0 ranged 1 errors"},
    {"nul_byte_in_another_unit",
     withNul("entity f is port (a : in bit;",
             " b : out bit); end;\nentity e is port (c : in bit); end;"),
     "sound 1 ports 0 ranged 1 errors"},
    {"header_cut_short_in_a_range", "entity e is port (a : in bit_vector(7 downto",
     "broken 0 ports 0 ranged 1 errors"},
    {"header_cut_short_in_a_name", "entity e is port (a : in bit; wi",
     "broken 1 ports 0 ranged 1 errors"},
    {"alias_cycles",
     "package p is alias a1 is a2; alias a2 is a1; alias t1 is t2; alias t2 is t1; end;\n"
     "use work.p.all; entity e is port (a : in bit_vector(a1 downto 0); b : in t1); end;",
     "sound 2 ports 0 ranged 0 errors"},
    {"huge_and_self_referencing_aggregates",
     "package p is type v is array (natural range <>) of integer;\n"
     "constant BIG : v := (0 to 2**30 => 0); constant SELF : v := (0 => SELF(0)); end;\n"
     "use work.p.all; entity e is port (a : in bit_vector(BIG(0) downto 0);\n"
     "b : in bit_vector(SELF(0) downto 0); c : in bit_vector(BIG'length downto 0)); end;",
     "sound 3 ports 0 ranged 0 errors"},
    {"error_after_the_header", "entity e is port (a : in bit); begin $ end;",
     "sound 1 ports 0 ranged 1 errors"},
    // Lexical errors are met by the index pass and again when the selected header is parsed;
    // the user must see each once, and any error in the header breaks it.
    {"stray_character", "entity e is port (a : in bit; $ b : out bit); end;\n",
     "broken 1 ports 0 ranged 1 errors", "f0.vhd:1:31: error: stray character"},
    {"unterminated_string", "entity e is generic (S : string := \"ab\n); port (a : in bit); end;\n",
     "broken 0 ports 0 ranged 1 errors", "f0.vhd:1:36: error: unterminated string literal"},
    {"unterminated_comment", "entity e is port (a : in bit; /* b : out bit); end;\n",
     "broken 1 ports 0 ranged 1 errors", "f0.vhd:1:31: error: unterminated block comment"},
    {"nul_in_a_string", withNul("entity e is generic (S : string := \"a", "b\"); end;\n"),
     "broken 0 ports 0 ranged 1 errors", "f0.vhd:1:36: error: NUL byte in a string literal"},
    {"unterminated_based_literal", "entity e is port (a : in bit_vector(16#F downto 0)); end;\n",
     "broken 0 ports 0 ranged 1 errors", "f0.vhd:1:37: error: unterminated based literal"},
    {"port_cut_short_after_its_name", "entity e is port (a : in bit; b",
     "broken 1 ports 0 ranged 1 errors",
     "f0.vhd:1:32: error: expected ':', found the end of the file"},
};

class Hostile : public testing::TestWithParam<HostileCase> {};

TEST_P(Hostile, FinishesWithDiagnostics) {
  const HostileCase& c = GetParam();
  const vhdl_test::Read o = read(c.text, "e");
  ASSERT_TRUE(o.found);
  size_t ranged = 0;
  for (const ScanPort& p : o.unit.ports) ranged += p.hasRange() ? 1 : 0;
  EXPECT_EQ((o.headerSound ? "sound " : "broken ") + std::to_string(o.unit.ports.size()) +
                " ports " + std::to_string(ranged) + " ranged " + std::to_string(o.errors) +
                " errors",
            c.outcome)
      << o.messages;
  if (c.error != nullptr) {
    EXPECT_NE(o.messages.find(c.error), std::string::npos) << o.messages;
  }
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Hostile, testing::ValuesIn(kCases), vhdl_test::ByLabel());

TEST(VhdlRobustness, FlatSumsOfAnyLengthEvaluate) {
  for (size_t terms : {500u, 1001u, 20000u}) {
    std::string sum = repeat("1 + ", terms - 1) + "1";
    vhdl_test::Read o = read("package p is constant N : natural := " + sum +
                                 "; end package;\nuse work.p.all;\n"
                                 "entity e is port (a : in bit_vector(" +
                                 sum + " downto N - N)); end;",
                             "e");
    ASSERT_EQ(o.unit.ports.size(), 1u) << terms;
    int32_t left = 0;
    int32_t right = 0;
    o.unit.ports[0].getBounds(left, right);
    EXPECT_EQ(left, static_cast<int32_t>(terms)) << terms;
    EXPECT_EQ(o.warnings + o.errors, 0u) << terms;
  }
}

const char* kSample =
    "library ieee; use ieee.std_logic_1164.all;\n"
    "package k is constant W : natural := 4; subtype t is bit_vector(W-1 downto 0);\n"
    "function f(x : natural) return natural;\n"
    "type r is record x, y : natural; end record; constant RC : r := (x => 1, others => 2);\n"
    "alias AL is RC; constant V : integer_vector := (0 => 1, 1 | 2 => 3); end package;\n"
    "package body k is function f(x : natural) return natural is variable r : natural := 0;\n"
    "begin while r < x loop r := r + 1; end loop; return r; end function; end package body;\n"
    "use work.k.all;\n"
    "entity s is generic (G : natural := f(3)); port (a : in t; b : out bit_vector(G downto 0);\n"
    "  c : inout std_logic_vector(a'range); d : buffer integer range 0 to W;\n"
    "  e : out bit_vector(AL.y + V(2) downto integer'image(RC.x)'length)); end entity s;\n";

TEST(VhdlRobustness, EveryPrefixOfAFileIsRead) {
  std::string full = kSample;
  vhdl_test::Read whole = read(full, "s");
  ASSERT_EQ(whole.unit.ports.size(), 5u);
  EXPECT_TRUE(whole.unit.ports[4].hasRange());
  EXPECT_EQ(whole.errors, 0u);
  for (size_t n = 0; n < full.size(); ++n) read(full.substr(0, n), "s");
}

TEST(VhdlRobustness, BinaryJunkIsSurvived) {
  std::mt19937 random(12345);
  for (int round = 0; round < 20; ++round) {
    std::string junk(64 << 10, '\0');
    for (char& c : junk) c = static_cast<char>(random() & 0xff);
    // Splice real text in so the parser gets past the index now and then.
    junk.insert(junk.size() / 2, kSample);
    vhdl_test::Read o = read(junk, "s");
    EXPECT_LE(o.unit.ports.size(), 5u);
  }
}

}  // namespace
