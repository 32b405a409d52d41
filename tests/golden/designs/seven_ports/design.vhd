library ieee;
use ieee.std_logic_1164.all;

entity top is
  port (
    clk  : in    std_logic;
    data : in    std_logic_vector(7 downto 0);
    en   : in    std_logic;
    addr : out   std_logic_vector(0 to 3);
    q    : out   std_logic;
    pad  : inout std_logic_vector(1 downto 0);
    sda  : inout std_logic
  );
end entity top;
