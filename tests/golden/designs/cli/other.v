module other;
endmodule
