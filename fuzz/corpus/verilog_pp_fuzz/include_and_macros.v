`include "defs.vh"
module top #(parameter W = `DOUBLE(`WIDTH))(input [W-1:0] a,
`ifdef FUZZ
  output [`NARROW:0] b
`else
  output c
`endif
);
endmodule
//--- defs.vh
`define DOUBLE(x) ((x) * 2)
`include "more.vh"
//--- more.vh
`define NARROW (`WIDTH / 2)
