-- Transmit half of a small UART: a FIFO in front of a shift register that sends a start bit,
-- DATA_BITS data bits (least significant first) and STOP_BITS stop bits. Sending pauses while
-- the receiver holds cts_n high.
library ieee;
use ieee.std_logic_1164.all;
use ieee.numeric_std.all;
use work.uart_pkg.all;

entity uart_tx is
  generic (
    CLK_FREQ_HZ : positive := 50_000_000;
    BAUD_RATE   : positive := 115_200;
    DATA_BITS   : positive range 5 to 9 := 8;
    STOP_BITS   : positive range 1 to 2 := 1
  );
  port (
    clk        : in  std_logic;
    rst_n      : in  std_logic;
    -- write side of the FIFO
    wr_data    : in  std_logic_vector(DATA_BITS - 1 downto 0);
    wr_en      : in  std_logic;
    fifo_full  : out std_logic;
    fifo_level : out std_logic_vector(FIFO_ADDR_BITS downto 0);
    -- serial side
    cts_n      : in  std_logic;
    txd        : out std_logic;
    busy       : out std_logic
  );
end entity uart_tx;

architecture rtl of uart_tx is
  constant DEPTH       : positive := 2 ** FIFO_ADDR_BITS;
  constant BIT_TICKS   : positive := CLK_FREQ_HZ / BAUD_RATE;
  constant FRAME_BITS  : positive := 1 + DATA_BITS + STOP_BITS;

  type fifo_t is array (0 to DEPTH - 1) of std_logic_vector(DATA_BITS - 1 downto 0);
  signal fifo      : fifo_t;
  signal rd_ptr    : unsigned(FIFO_ADDR_BITS - 1 downto 0) := (others => '0');
  signal wr_ptr    : unsigned(FIFO_ADDR_BITS - 1 downto 0) := (others => '0');
  signal count     : unsigned(FIFO_ADDR_BITS downto 0) := (others => '0');
  signal shifter   : std_logic_vector(FRAME_BITS - 1 downto 0) := (others => '1');
  signal bits_left : natural range 0 to FRAME_BITS := 0;
  signal tick      : natural range 0 to BIT_TICKS - 1 := 0;
begin
  fifo_full  <= '1' when count = DEPTH else '0';
  fifo_level <= std_logic_vector(count);
  txd        <= shifter(0);
  busy       <= '1' when bits_left /= 0 or count /= 0 else '0';

  process (clk)
    variable push, pop : boolean;
  begin
    if rising_edge(clk) then
      if rst_n = '0' then
        rd_ptr    <= (others => '0');
        wr_ptr    <= (others => '0');
        count     <= (others => '0');
        shifter   <= (others => '1');
        bits_left <= 0;
        tick      <= 0;
      else
        push := wr_en = '1' and count /= DEPTH;
        pop  := bits_left = 0 and count /= 0 and cts_n = '0';
        if push then
          fifo(to_integer(wr_ptr)) <= wr_data;
          wr_ptr <= wr_ptr + 1;
        end if;
        if pop then
          -- Stop bits, data, start bit: shifted out from the right.
          shifter   <= (FRAME_BITS - 1 downto DATA_BITS + 1 => '1')
                       & fifo(to_integer(rd_ptr)) & '0';
          rd_ptr    <= rd_ptr + 1;
          bits_left <= FRAME_BITS;
          tick      <= 0;
        elsif bits_left /= 0 then
          if tick = BIT_TICKS - 1 then
            tick      <= 0;
            shifter   <= '1' & shifter(FRAME_BITS - 1 downto 1);
            bits_left <= bits_left - 1;
          else
            tick <= tick + 1;
          end if;
        end if;
        if push and not pop then
          count <= count + 1;
        elsif pop and not push then
          count <= count - 1;
        end if;
      end if;
    end if;
  end process;
end architecture rtl;
