module m(input wire a,
  outpu