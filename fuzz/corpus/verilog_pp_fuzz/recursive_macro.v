`define A `A
module top(input [`A:0] a);
endmodule
