# Writes a VHDL netlist of about `mb` megabytes: many leaf entities, each followed by an
# architecture full of component declarations, signals and instances with port maps, and the
# entity `top` last, so a reader must go through the whole file to find it.
# Usage: awk -v mb=100 -f bench/vhdl_netlist_gen.awk > netlist.vhd
function leaf(i,    p) {
  printf "library ieee;\nuse ieee.std_logic_1164.all;\nuse ieee.numeric_std.all;\n\n"
  printf "-- leaf cell %d: a register slice with a few status outputs\n", i
  printf "entity cell_%d is\n  generic (WIDTH : natural := %d; DEPTH : positive := 4);\n", i, 8 + i % 24
  printf "  port (\n    clk, rst_n : in std_logic;\n"
  printf "    d_in : in std_logic_vector(WIDTH - 1 downto 0);\n"
  printf "    d_out : out std_logic_vector(WIDTH - 1 downto 0);\n"
  printf "    addr : in unsigned(DEPTH - 1 downto 0);\n    valid, ready : out std_logic\n  );\n"
  printf "end entity cell_%d;\n\n", i
  printf "architecture netlist of cell_%d is\n", i
  printf "  component slice_ff is\n    port (c, r : in std_logic; d : in std_logic; q : out std_logic);\n  end component;\n"
  printf "  signal s : std_logic_vector(WIDTH downto 0);\n  signal t : std_logic_vector(WIDTH downto 0) := (others => '0');\n"
  printf "begin\n"
  for (p = 0; p < 24; p++)
    printf "  u_%d : slice_ff port map (c => clk, r => rst_n, d => s(%d), q => t(%d)); -- bit %d\n", p, p % 8, (p + 1) % 8, p
  printf "  valid <= t(0) and s(1) when addr /= \"0000\" else '0';\n  ready <= '1';\n"
  printf "  d_out <= t(WIDTH - 1 downto 0);\nend architecture netlist;\n\n"
}
BEGIN {
  if (mb == "") mb = 100
  target = mb * 1000000
  # One leaf is about 2.8 kB; the estimate only needs to be close.
  n = int(target / 2800)
  for (i = 0; i < n; i++) leaf(i)
  printf "library ieee;\nuse ieee.std_logic_1164.all;\n\n"
  printf "entity top is\n  generic (N : positive := 16);\n  port (\n"
  printf "    clk : in std_logic;\n    bus_in : in std_logic_vector(N - 1 downto 0);\n"
  printf "    bus_out : out std_logic_vector(0 to N - 1);\n    irq : out std_logic\n  );\nend entity top;\n"
}
