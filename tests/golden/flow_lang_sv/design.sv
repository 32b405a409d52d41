module top (
  input  logic clk,
  output logic [3:0] q
);
endmodule
