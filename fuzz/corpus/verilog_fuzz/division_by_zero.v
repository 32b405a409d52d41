module top #(parameter Z = 0)(input [8/Z:0] a, input [8%Z:0] b);
endmodule
