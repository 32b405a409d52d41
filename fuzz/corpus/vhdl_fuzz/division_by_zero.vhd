entity top is generic (Z : integer := 0); port (a : in bit_vector(8 / Z downto 0); b : in bit_vector(2 ** 40 downto 0)); end;
