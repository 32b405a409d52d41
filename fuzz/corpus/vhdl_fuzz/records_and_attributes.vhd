package p is type r_t is record a : bit; b : bit_vector(3 downto 0); end record;
 constant K : r_t := ('0', x"3"); type arr_t is array (natural range <>) of integer; constant A : arr_t := (0 => 8, 1 => 4); end;
use work.p.all;
entity top is port (r : in r_t; v : out bit_vector(A'length + A(0) - 1 downto integer'image(3)'length)); end;
