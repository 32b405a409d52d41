module top #(parameter S = "abc)(input a);
endmodule
