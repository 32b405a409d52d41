`define M(x) `M(x)
`define N(x, y) (x + `N(y, x))
module top(input [`M(1):0] a, input [`N(1,2):0] b);
endmodule
