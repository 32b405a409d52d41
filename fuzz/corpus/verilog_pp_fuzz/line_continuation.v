`define LONG(a) a + \
  a + \
  a
module top(input [`LONG(1):0] a);
endmodule
