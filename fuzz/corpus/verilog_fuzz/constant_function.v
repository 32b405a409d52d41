module top #(parameter W = f(3))(input [W:0] a);
function integer f(input integer n); begin if (n > 0) f = f(n-1) + 1; else f = 0; end endfunction
endmodule
