module top(input [64'hFFFFFFFFFFFFFFFF:0] a, input [32'd0-1:0] b);
endmodule
