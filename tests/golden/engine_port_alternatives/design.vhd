library ieee;
use ieee.std_logic_1164.all;

entity dut is
  port (
    sys_clk   : in  std_logic;
    clk       : in  std_logic;
    ref_clk_i : in  std_logic;
    rst_n     : in  std_logic;
    data      : in  std_logic_vector(7 downto 0);
    q         : out std_logic
  );
end entity dut;
