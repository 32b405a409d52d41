`define M(a, b) a + b
module top(input [`M((1, 2