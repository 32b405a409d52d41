-- A bank of general-purpose pins: each pad is driven from out_data where out_enable is set
-- and read back into in_data; a change on an input pin raises irq until it is acknowledged.
-- The control vectors are numbered upwards to match the register map.
library ieee;
use ieee.std_logic_1164.all;

entity gpio_bank is
  generic (
    WIDTH : positive := 8
  );
  port (
    clk        : in    std_logic;
    out_data   : in    std_logic_vector(0 to WIDTH - 1);
    out_enable : in    std_logic_vector(0 to WIDTH - 1);
    in_data    : out   std_logic_vector(0 to WIDTH - 1);
    irq        : out   std_logic;
    irq_ack    : in    std_logic;
    pads       : inout std_logic_vector(WIDTH - 1 downto 0)
  );
end entity gpio_bank;

architecture rtl of gpio_bank is
  signal sampled, previous : std_logic_vector(WIDTH - 1 downto 0) := (others => '0');
begin
  drivers : for i in 0 to WIDTH - 1 generate
    pads(i) <= out_data(i) when out_enable(i) = '1' else 'Z';
    in_data(i) <= sampled(i);
  end generate drivers;

  process (clk)
  begin
    if rising_edge(clk) then
      previous <= sampled;
      sampled  <= to_x01(pads);
      if irq_ack = '1' then
        irq <= '0';
      elsif sampled /= previous then
        irq <= '1';
      end if;
    end if;
  end process;
end architecture rtl;
