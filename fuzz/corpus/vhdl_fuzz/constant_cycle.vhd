package p is constant A : integer := B; constant B : integer := A; end;
use work.p.all;
entity top is port (o : out bit_vector(A downto 0)); end;
