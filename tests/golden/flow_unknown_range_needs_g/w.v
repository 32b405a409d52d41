module m #(parameter W) (input [W-1:0] a, output b);
endmodule
