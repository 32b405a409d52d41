module top #(parameter A = B, parameter B = A)(output [A:0] o);
endmodule
