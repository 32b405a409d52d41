module top #(parameter WIDTH = 8, parameter DEPTH = 4) (input a);
endmodule
