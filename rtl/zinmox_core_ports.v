// Design-clock side of a MOX core: the four ports, the activity latches and the capture
// snapshot. Commit, capture and clear arrive as one-cycle strobes; the staged image comes from
// the TCK domain and is stable whenever a commit strobe can occur.
module zinmox_core_ports #(
  parameter integer ASYNC_OUT_W = 1,
  parameter integer SYNC_OUT_W  = 1,
  parameter integer ASYNC_IN_W  = 1,
  parameter integer SYNC_IN_W   = 1,
  parameter integer IMAGE_W     = 2 * ASYNC_OUT_W + 17 * SYNC_OUT_W,
  parameter integer CAP_W       = 4 * ASYNC_IN_W + 6 * SYNC_IN_W
) (
  input  wire                   clk_i,
  input  wire                   rst_ni,
  input  wire                   commit_i,
  input  wire                   capture_i,
  input  wire                   clear_i,
  input  wire [IMAGE_W-1:0]     image_i,
  input  wire [ASYNC_IN_W-1:0]  async_in_i,
  input  wire [SYNC_IN_W-1:0]   sync_in_i,
  output wire [ASYNC_OUT_W-1:0] async_out_o,
  output wire [SYNC_OUT_W-1:0]  sync_out_o,
  // Capture snapshot as the read line's number: bit k is bit k of the number.
  output wire [CAP_W-1:0]       cap_o
);
  localparam integer AO = ASYNC_OUT_W;
  localparam integer SO = SYNC_OUT_W;
  localparam integer AI = ASYNC_IN_W;
  localparam integer SI = SYNC_IN_W;

  // Latches start to record one cycle after reset, once the input levels are known.
  reg armed_q;
  always @(posedge clk_i or negedge rst_ni) begin
    if (!rst_ni) armed_q <= 1'b0;
    else armed_q <= 1'b1;
  end

  wire [CAP_W-1:0] cap_b;  // the capture bits in read-out order B (B[0] first)

  genvar i;
  genvar t;
  generate
    // Asynchronous outputs change at the commit edge.
    for (i = 0; i < AO; i = i + 1) begin : g_async_out
      reg level_q;
      always @(posedge clk_i or negedge rst_ni) begin
        if (!rst_ni) level_q <= 1'b0;
        else if (commit_i && image_i[IMAGE_W-1-AO-16*SO-i]) level_q <= image_i[IMAGE_W-1-i];
      end
      assign async_out_o[i] = level_q;
    end

    // Synchronous outputs: a commit loads the 16-step train; each later edge drives the next
    // step, and step 15 stays once the train is through.
    for (i = 0; i < SO; i = i + 1) begin : g_sync_out
      wire [15:0] steps;
      for (t = 0; t < 16; t = t + 1) begin : g_step
        assign steps[t] = image_i[IMAGE_W-1-AO-16*i-t];
      end
      reg [15:0] play_q;
      reg        level_q;
      always @(posedge clk_i or negedge rst_ni) begin
        if (!rst_ni) begin
          play_q  <= 16'h0000;
          level_q <= 1'b0;
        end else begin
          level_q <= play_q[0];
          if (commit_i && image_i[SO-1-i]) play_q <= steps;
          else play_q <= {play_q[15], play_q[15:1]};
        end
      end
      assign sync_out_o[i] = level_q;
    end

    // Asynchronous inputs: synchronised, then edges of the synchronised level set the latches.
    for (i = 0; i < AI; i = i + 1) begin : g_async_in
      wire in_sync;
      zinmox_sync2 u_sync (
        .clk_i(clk_i),
        .d_i  (async_in_i[i]),
        .q_o  (in_sync)
      );
      reg level_q;
      always @(posedge clk_i) level_q <= in_sync;
      wire rise = armed_q & in_sync & ~level_q;
      wire fall = armed_q & ~in_sync & level_q;
      reg up_q, down_q, snap_level_q, snap_up_q, snap_down_q;
      always @(posedge clk_i or negedge rst_ni) begin
        if (!rst_ni) begin
          {up_q, down_q, snap_level_q, snap_up_q, snap_down_q} <= 5'b00000;
        end else begin
          up_q   <= (up_q & ~clear_i) | rise;
          down_q <= (down_q & ~clear_i) | fall;
          if (capture_i) {snap_level_q, snap_up_q, snap_down_q} <= {level_q, up_q, down_q};
        end
      end
      assign cap_b[4*i+0] = snap_level_q;
      assign cap_b[4*i+1] = snap_up_q;
      assign cap_b[4*i+2] = snap_down_q;
      assign cap_b[4*i+3] = 1'b0;
    end

    // Synchronous inputs: sampled on the clock; a change between consecutive samples sets both
    // the activity and the sync activity, which are therefore one pair of latches.
    for (i = 0; i < SI; i = i + 1) begin : g_sync_in
      reg sample_q;
      always @(posedge clk_i) sample_q <= sync_in_i[i];
      wire rise = armed_q & sync_in_i[i] & ~sample_q;
      wire fall = armed_q & ~sync_in_i[i] & sample_q;
      reg up_q, down_q, snap_level_q, snap_up_q, snap_down_q;
      always @(posedge clk_i or negedge rst_ni) begin
        if (!rst_ni) begin
          {up_q, down_q, snap_level_q, snap_up_q, snap_down_q} <= 5'b00000;
        end else begin
          up_q   <= (up_q & ~clear_i) | rise;
          down_q <= (down_q & ~clear_i) | fall;
          if (capture_i) {snap_level_q, snap_up_q, snap_down_q} <= {sample_q, up_q, down_q};
        end
      end
      assign cap_b[4*AI+6*i+0] = snap_level_q;
      assign cap_b[4*AI+6*i+1] = snap_up_q;
      assign cap_b[4*AI+6*i+2] = snap_down_q;
      assign cap_b[4*AI+6*i+3] = snap_up_q;
      assign cap_b[4*AI+6*i+4] = snap_down_q;
      assign cap_b[4*AI+6*i+5] = 1'b0;
    end

    for (i = 0; i < CAP_W; i = i + 1) begin : g_cap_order
      assign cap_o[i] = cap_b[CAP_W-1-i];
    end
  endgenerate
endmodule
