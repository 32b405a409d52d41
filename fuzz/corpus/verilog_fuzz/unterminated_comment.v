module top(input a, /* output b);
endmodule
