entity dut is
  port (
    clk     : in  bit;
    sys_clk : in  bit;
    rst_n   : in  bit;
    data    : in  bit_vector(3 downto 0);
    q       : out bit;
    io      : inout bit
  );
end entity dut;
