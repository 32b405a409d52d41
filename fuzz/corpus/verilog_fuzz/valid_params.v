module top #(parameter W = 8, parameter N = W*2)
  (input wire clk, input [W-1:0] d, output reg [N-1:0] q, inout [3:0] io);
endmodule
