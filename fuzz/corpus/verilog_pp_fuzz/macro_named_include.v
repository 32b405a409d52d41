`define F "defs.vh"
`include `F
module top(input [`W:0] a);
endmodule
//--- defs.vh
`define W 3
