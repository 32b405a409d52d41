`ifdef FUZZ
module top(input a);
`ifndef WIDTH
endmodule
