package p; typedef struct packed { logic [3:0] x; } s_t; localparam int W = $bits(s_t); endpackage
module top import p::*; (input s_t a, output logic [W-1:0] b, bus_if.slave s);
endmodule
