entity top is generic (S : string := "abc); port (a : in bit); end;
