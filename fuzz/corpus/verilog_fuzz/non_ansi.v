module top(a, b, c);
input [3:0] a;
output reg b;
inout c
endmodule
