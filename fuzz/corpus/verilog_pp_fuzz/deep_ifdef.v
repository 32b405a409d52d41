`define X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
`ifdef X
module top(input a); endmodule
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
`endif
