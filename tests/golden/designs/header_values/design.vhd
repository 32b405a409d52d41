library ieee;
use ieee.std_logic_1164.all;

entity top is
  port (
    clk   : in    std_logic;
    data  : in    std_logic_vector(7 downto 0);
    addr  : out   std_logic_vector(0 to 3);
    pad   : inout std_logic;
    ready : buffer std_logic
  );
end entity top;

architecture rtl of top is
begin
end architecture rtl;
