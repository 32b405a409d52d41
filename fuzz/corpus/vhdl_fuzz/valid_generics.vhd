library ieee;
use ieee.std_logic_1164.all;
entity top is
  generic (W : natural := 8; N : natural := W * 2);
  port (clk : in std_logic; d : in std_logic_vector(W-1 downto 0);
        q : out std_logic_vector(0 to N-1); io : inout bit);
end entity top;
