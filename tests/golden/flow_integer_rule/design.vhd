library ieee;
use ieee.std_logic_1164.all;

entity counter is
  port (
    a : in  integer range 0 to 255;
    b : in  integer range 1000 downto 0;
    c : in  natural range 0 to 255;
    d : out positive range 1 to 256;
    e : out INTEGER range 0 to 1;
    f : out integer range -8 to 0;
    g : out integer;
    h : out std_logic_vector(255 downto 0);
    i : out Natural range 255 downto 0
  );
end entity counter;
