// A synchronous FIFO: WIDTH-bit words, 2**ADDR_BITS deep, with a fill level and the usual
// full and empty flags. Reset is synchronous and active low.
module sync_fifo #(
  parameter int WIDTH = 8,
  parameter int ADDR_BITS = 4,
  parameter bit FALL_THROUGH = 1'b0
) (
  input  logic                 clk,
  input  logic                 rst_n,
  input  logic [WIDTH-1:0]     wr_data,
  input  logic                 wr_en,
  output logic                 full,
  output logic [WIDTH-1:0]     rd_data,
  input  logic                 rd_en,
  output logic                 empty,
  output logic [ADDR_BITS:0]   level
);
  logic [WIDTH-1:0] mem [2**ADDR_BITS];
  logic [ADDR_BITS-1:0] wr_ptr, rd_ptr;

  assign full = level == (ADDR_BITS + 1)'(1) << ADDR_BITS;
  assign empty = level == '0;
  assign rd_data = mem[rd_ptr];

  always_ff @(posedge clk) begin
    if (!rst_n) begin
      wr_ptr <= '0;
      rd_ptr <= '0;
      level <= '0;
    end else begin
      if (wr_en && !full) begin
        mem[wr_ptr] <= wr_data;
        wr_ptr <= wr_ptr + 1'b1;
      end
      if (rd_en && !empty) rd_ptr <= rd_ptr + 1'b1;
      level <= level + (ADDR_BITS+1)'(wr_en && !full) - (ADDR_BITS+1)'(rd_en && !empty);
    end
  end
endmodule
