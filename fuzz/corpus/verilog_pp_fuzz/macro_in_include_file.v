`define G "inc.vh"
module top(
`include `G
);
endmodule
//--- inc.vh
input [`WIDTH-1:0] a, output /* open comment
