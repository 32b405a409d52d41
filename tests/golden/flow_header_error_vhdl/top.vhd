entity top is
  port (a : in bit; "c : in bit);
end entity;
