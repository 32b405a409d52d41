`include "nowhere.vh"
module top(input a);
endmodule
