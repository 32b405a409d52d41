module top (input clk, output [3:0] q);
endmodule
