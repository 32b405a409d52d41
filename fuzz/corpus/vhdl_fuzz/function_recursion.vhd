package p is function f(n : integer) return integer; end;
package body p is function f(n : integer) return integer is begin return f(n + 1); end; end;
use work.p.all;
entity top is port (o : out bit_vector(f(0) downto 0)); end;
