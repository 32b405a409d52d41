`define A (`B+1)
`define B (`A+1)
module top(input [`A:0] a);
endmodule
