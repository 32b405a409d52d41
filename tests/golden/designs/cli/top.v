module top(input a);
endmodule
