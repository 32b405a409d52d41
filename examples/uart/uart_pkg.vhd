-- Settings shared by the UART blocks.
library ieee;
use ieee.std_logic_1164.all;

package uart_pkg is
  -- The transmit FIFO holds 2**FIFO_ADDR_BITS bytes.
  constant FIFO_ADDR_BITS : natural := 4;
end package uart_pkg;
