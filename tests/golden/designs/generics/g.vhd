entity top is
  generic (WIDTH : natural := 8; DEPTH : integer);
  port (d : in bit_vector(WIDTH-1 downto 0));
end entity top;
