entity top is port (a : in bit; /* b : out bit);
end;
