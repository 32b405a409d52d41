entity top is
  port (a : in bit);
end entity top;
