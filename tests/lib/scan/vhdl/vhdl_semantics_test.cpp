// Name resolution and evaluation rules on small in-memory designs: which declarations a
// bound sees, how functions are chosen and run, and how subtypes shape a port.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "vhdl_test_support.h"

namespace {

const char* kPkg =
    "package pkg is constant W : natural := 8; constant DEFERRED : natural;\n"
    "  function f(a : integer) return integer; function f(a, b : integer) return integer;\n"
    "  function g(a : integer; b : integer := 100) return integer;\n"
    "  procedure p(x : inout integer); type prot is protected procedure inc;\n"
    "  end protected prot;\n"
    "end package;\n"
    "package body pkg is constant DEFERRED : natural := W * 2;\n"
    "  function helper(n : natural) return natural is begin return n + 1; end function;\n"
    "  function f(a : integer) return integer is begin return helper(a); end;\n"
    "  function f(a, b : integer) return integer is begin return a - b; end function f;\n"
    "  function g(a : integer; b : integer := 100) return integer is\n"
    "    constant K : integer := 2; variable acc : integer;\n"
    "  begin acc := 0; for i in a downto 1 loop acc := acc + K; end loop; return acc + b; end;\n"
    "  procedure p(x : inout integer) is begin if x > 0 then x := x - 1; end if; end procedure;\n"
    "  type prot is protected body variable n : integer := 0;\n"
    "    procedure inc is begin n := n + 1; end procedure;\n"
    "  end protected body prot;\n"
    "end package body;\n";

struct SemanticsCase {
  const char* label;
  vhdl_test::Files files;
  const char* unit;
  const char* ports;  ///< "name(range)" or "name" per port
};

const SemanticsCase kCases[] = {
    {"deferred_constants_overloads_defaults_and_private_helpers",
     {{"work", kPkg},
      {"work",
       "use work.pkg.all;\n"
       "entity e is port (a : in bit_vector(DEFERRED - 1 downto 0); b : in bit_vector(f(3) downto "
       "f(9, 8));\n"
       "  c : in bit_vector(g(3) downto g(1, 0))); end;"}},
     "e",
     "a(15 downto 0) b(4 downto 1) c(106 downto 2)"},
    {"use_clauses_inside_a_body_do_not_reach_the_next_unit",
     {{"work", kPkg},
      {"work",
       "entity a is end;\narchitecture r of a is use work.pkg.all; begin end;\n"
       "entity e is port (x : in bit_vector(W - 1 downto 0); y : in bit); end;"}},
     "e",
     "x y"},
    {"package_found_in_another_library_than_named",
     {{"lib1", kPkg},
      {"work",
       "library other; use other.pkg.all;\nentity e is port (x : in bit_vector(W downto 1)); "
       "end;"}},
     "e",
     "x(8 downto 1)"},
    {"generics_in_order_and_earlier_ports",
     {{"work",
       "entity e is generic (A : integer := 3; B : integer := A * 2; R : real := 2.5);\n"
       "port (x : in bit_vector(B downto A); y : out bit_vector(x'range);\n"
       "  z : out bit_vector(x'length downto natural(R)); w : in bit_vector(y'reverse_range)); "
       "end;"}},
     "e",
     "x(6 downto 3) y(6 downto 3) z(4 downto 3) w(3 to 6)"},
    {"math_real_and_predefined_functions",
     {{"work",
       "library ieee; use ieee.math_real.all;\n"
       "entity e is generic (N : natural := 1000);\n"
       "port (a : in bit_vector(integer(floor(log2(real(N)))) downto 0);\n"
       "  b : in bit_vector(integer(round(2.5)) downto integer(ceil(0.1)));\n"
       "  c : in bit_vector(maximum(3, 7) downto minimum(3, 7));\n"
       "  d : in bit_vector(integer(sqrt(16.0)) downto integer(log2(1.0)))); end;"}},
     "e",
     "a(9 downto 0) b(3 downto 1) c(7 downto 3) d(4 downto 0)"},
    {"letter_case_resolution_functions_and_selected_type_marks",
     {{"work", kPkg},
      {"work",
       "LIBRARY IEEE; USE IEEE.STD_LOGIC_1164.ALL; USE WORK.PKG.ALL;\n"
       "ENTITY Mixed_Case IS PORT (A : IN resolved std_ulogic; B : IN (resolved) "
       "std_ulogic_vector(w downto 1);\n"
       "  C : OUT ieee.numeric_std.unsigned(Pkg.W - 5 DOWNTO 0); D : INOUT WORK.PKG.prot); END;"}},
     "mixed_case",
     "A B(8 downto 1) C(3 downto 0) D"},
    {"generic_types_and_subprograms",
     {{"work",
       "entity e is generic (type T; N : natural := 2; function f(x : T) return T is <>;\n"
       "  package p is new work.gp generic map (<>));\n"
       "  port (a : in T; b : in bit_vector(N downto 0)); end;"}},
     "e",
     "a b(2 downto 0)"},
    {"integer_overflow_is_not_a_range",
     {{"work",
       "entity e is port (a : in bit_vector(2 ** 40 downto 0); b : in bit_vector(2 ** 63 downto "
       "0)); end;"}},
     "e",
     "a b"},
    {"booleans_enumerations_and_case",
     {{"work",
       "package q is type color is (red, green, blue);\n"
       "function pick(c : color; wide : boolean) return natural; end;\n"
       "package body q is function pick(c : color; wide : boolean) return natural is begin\n"
       "  case c is when red => return 1; when green | blue => if wide and not false then return "
       "8; else return 4; end if; end case;\n"
       "end; end;\n"
       "use work.q.all; entity e is port (a : in bit_vector(pick(green, true) downto pick(red, "
       "false));\n"
       "  b : in bit_vector(color'pos(blue) downto 0); c : in bit_vector(pick(blue, 1 > 2) downto "
       "0)); end;"}},
     "e",
     "a(8 downto 1) b(2 downto 0) c(4 downto 0)"},
    {"while_loops_exit_and_next",
     {{"work",
       "package q is function bits(n : natural) return natural; end;\n"
       "package body q is function bits(n : natural) return natural is variable v : natural := n; "
       "variable r : natural := 0;\n"
       "begin loop exit when v = 0; v := v / 2; r := r + 1; next when r < 100; end loop; return r; "
       "end; end;\n"
       "use work.q.all; entity e is port (a : in bit_vector(bits(255) - 1 downto 0); b : in "
       "bit_vector(bits(256) downto 0)); end;"}},
     "e",
     "a(7 downto 0) b(9 downto 0)"},
    {"array_generics_and_constants",
     {{"work",
       "package t is type T_POSVEC is array (natural range <>) of positive;\n"
       "  type IVEC is array (integer range <>) of integer;\n"
       "  constant K : T_POSVEC(1 to 4) := (2 => 9, others => 1);\n"
       "  constant D : T_POSVEC(3 downto 0) := (4, 3, 2, 1);\n"
       "  constant I : IVEC := (5, 6); constant C : T_POSVEC := (2 | 4 => 3, 3 => 7); end;\n"
       "use work.t.all;\n"
       "entity e is generic (META_BITS : T_POSVEC := (0 => 8); W : T_POSVEC := (3, 5, 7));\n"
       "  port (p_a : in bit_vector(META_BITS'length - 1 downto 0); p_b : in "
       "bit_vector(META_BITS(0) - 1 downto 0);\n"
       "  p_c : in bit_vector(W(2) downto W'left); p_d : in bit_vector(W'high downto W'low);\n"
       "  p_f : in bit_vector(K(2) downto K(4)); p_g : in bit_vector(D(3) downto D(0));\n"
       "  p_h : in bit_vector(K'left to D'left); p_i : in bit_vector(I(-2147483647) downto 0);\n"
       "  p_j : in bit_vector(C'high downto C'low); p_k : in bit_vector(C(3) downto C(4))); end;"}},
     "e",
     "p_a(0 downto 0) p_b(7 downto 0) p_c(7 downto 0) p_d(2 downto 0) p_f(9 downto 1) p_g(4 downto "
     "1) p_h(1 to 3) "
     "p_i(6 downto 0) p_j(4 downto 2) p_k(7 downto 3)"},
    {"record_constants_aggregates_and_fields",
     {{"work",
       "package fix is type FixFormat_t is record S, I : integer; F : integer; end record;\n"
       "  type fmt_arr is array (natural range <>) of FixFormat_t;\n"
       "  constant F : FixFormat_t := (0, 4, 4);\n"
       "  constant G : FixFormat_t := (F => 3, S => 1, I => 2);\n"
       "  constant H : FixFormat_t := (S => 1, others => 5);\n"
       "  constant FA : fmt_arr := ((0, 1, 2), (1, 2, 3));\n"
       "  function size(fmt : FixFormat_t) return natural; end;\n"
       "package body fix is function size(fmt : FixFormat_t) return natural is\n"
       "  begin return fmt.S + fmt.I + fmt.F; end; end;\n"
       "use work.fix.all;\n"
       "entity e is generic (FMT : FixFormat_t := (1, 7, 8));\n"
       "  port (p_a : in bit_vector(F.S + F.I + F.F - 1 downto 0); p_b : in bit_vector(size(G) - 1 "
       "downto 0);\n"
       "  p_c : in bit_vector(size(FMT) - 1 downto 0); p_d : in bit_vector(H.F downto H.S);\n"
       "  p_g : in bit_vector(FA(1).F downto FMT.S); p_h : in bit_vector(size(FixFormat_t'(2, 2, "
       "2)) downto 0)); end;"}},
     "e",
     "p_a(7 downto 0) p_b(5 downto 0) p_c(15 downto 0) p_d(5 downto 1) p_g(3 downto 1) p_h(6 "
     "downto 0)"},
    {"aliases_of_objects_and_types",
     {{"work",
       "package al is type FixFormat_t is record S, I, F : integer; end record;\n"
       "  constant WIDTH : natural := 12; constant FMT : FixFormat_t := (1, 2, 3);\n"
       "  alias W is WIDTH; alias W2 : natural is WIDTH; alias FI is FMT.I;\n"
       "  subtype word_t is bit_vector(W - 1 downto 0); alias word is word_t; alias slv is "
       "bit_vector;\n"
       "  function twice(n : natural) return natural; end;\n"
       "package body al is function twice(n : natural) return natural is alias m is n;\n"
       "  begin return m * 2; end; end;\n"
       "use work.al.all;\n"
       "entity e is port (p_a : in word; p_b : in slv(W2 downto 0); p_c : in "
       "bit_vector(word'length downto 1);\n"
       "  p_d : in slv; p_f : in bit_vector(FI downto 0); p_g : in bit_vector(twice(W) downto 0)); "
       "end;"}},
     "e",
     "p_a(11 downto 0) p_b(12 downto 0) p_c(12 downto 1) p_d p_f(2 downto 0) p_g(24 downto 0)"},
    {"image_attribute",
     {{"work",
       "package im is type state_t is (Idle, RUN_FAST);\n"
       "  constant S : string := integer'image(1234); constant B : string := boolean'image(true);\n"
       "  constant N : string := state_t'image(RUN_FAST); constant M : string := integer'image(-5) "
       "& \"x\"; end;\n"
       "use work.im.all;\n"
       "entity e is port (p_a : in bit_vector(S'length downto 1); p_b : in bit_vector(B'length "
       "downto 1);\n"
       "  p_c : in bit_vector(boolean'pos(N = \"run_fast\") downto 0); p_d : in "
       "bit_vector(M'length downto 0)); end;"}},
     "e",
     "p_a(4 downto 1) p_b(4 downto 1) p_c(1 downto 0) p_d(3 downto 0)"},
};

class Semantics : public testing::TestWithParam<SemanticsCase> {};

TEST_P(Semantics, PortsFollowTheRules) {
  EXPECT_EQ(vhdl_test::read(GetParam().files, GetParam().unit).ranges(), GetParam().ports);
}

INSTANTIATE_TEST_SUITE_P(Vhdl, Semantics, testing::ValuesIn(kCases), vhdl_test::ByLabel());

}  // namespace
