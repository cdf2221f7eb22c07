// Two-flop synchroniser: brings a level from another clock domain into the domain of clk_i.
// The source must be a flop output (no combinational logic before this module), so that only
// clean levels cross.
module zinmox_sync2 (
  input  wire clk_i,
  input  wire d_i,
  output wire q_o
);
  (* async_reg = "true" *) reg meta_q;
  (* async_reg = "true" *) reg sync_q;

  always @(posedge clk_i) begin
    meta_q <= d_i;
    sync_q <= meta_q;
  end

  assign q_o = sync_q;
endmodule
