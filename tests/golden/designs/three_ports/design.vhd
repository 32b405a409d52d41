library ieee;
use ieee.std_logic_1164.all;

entity Top_Level2 is
  port (
    clk  : in  std_logic;
    data : in  std_logic_vector(7 downto 0);
    q    : out std_logic
  );
end entity Top_Level2;
