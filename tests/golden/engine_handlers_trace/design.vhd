entity top is
  port (
    clk : in bit;
    d : out bit_vector(1 downto 0)
  );
end entity top;
