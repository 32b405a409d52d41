`define W 4
`undef W
`define W(a) a
module top(input [`W(3):0] a, input [`W:0] b);
endmodule
