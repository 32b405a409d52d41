`include "a.vh"
module top(input a);
endmodule
//--- a.vh
`include "b.vh"
//--- b.vh
`include "a.vh"
