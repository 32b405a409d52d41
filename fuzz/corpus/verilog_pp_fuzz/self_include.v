`include "loop.vh"
module top(input a);
endmodule
//--- loop.vh
`include "loop.vh"
