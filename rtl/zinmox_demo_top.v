// The demo design on a pin-level model: the full TAP with one hub on USER1 serving the four
// demo cores: three MOX cores, one of each status layout, and a status-only core of type 3.
module zinmox_demo_top (
  input  wire clk_i,
  input  wire rst_ni,
  input  wire tck_i,
  input  wire tms_i,
  input  wire tdi_i,
  input  wire trst_ni,
  output wire tdo_o
);
  localparam integer LEN_W = 9;  // the longest scan: 16 + 169 + 16 bits
  localparam integer CORES = 4;

  /* verilator lint_off UNUSEDSIGNAL */
  wire [3:0] user_sel;  // only USER1 carries a hub
  /* verilator lint_on UNUSEDSIGNAL */
  wire       user_capture, user_shift, user_update, user_reset;
  wire       hub_tdo;

  zinmox_tap u_tap (
    .tck_i         (tck_i),
    .tms_i         (tms_i),
    .tdi_i         (tdi_i),
    .trst_ni       (trst_ni),
    .tdo_o         (tdo_o),
    .user_sel_o    (user_sel),
    .user_capture_o(user_capture),
    .user_shift_o  (user_shift),
    .user_update_o (user_update),
    .user_reset_o  (user_reset),
    .user_tdo_i    ({3'b000, hub_tdo})
  );

  // The status-only core 3 takes no stage data and no requests.
  /* verilator lint_off UNUSEDSIGNAL */
  wire [CORES-1:0]       stage_shift, stage_invalidate, stage_validate, req;
  /* verilator lint_on UNUSEDSIGNAL */
  wire [CORES-1:0]       stage_valid, ack, rd_bit;
  wire                   rd_status;
  wire [1:0]             op;
  wire [LEN_W-1:0]       rd_idx;
  wire [CORES*LEN_W-1:0] stage_len, cap_len;

  zinmox_hub #(
    .CORES(CORES),
    .LEN_W(LEN_W)
  ) u_hub (
    .tck_i             (tck_i),
    .tdi_i             (tdi_i),
    .capture_i         (user_capture),
    .shift_i           (user_shift),
    .update_i          (user_update),
    .sel_i             (user_sel[0]),
    .reset_i           (user_reset),
    .tdo_o             (hub_tdo),
    .stage_shift_o     (stage_shift),
    .stage_invalidate_o(stage_invalidate),
    .stage_validate_o  (stage_validate),
    .stage_valid_i     (stage_valid),
    .req_o             (req),
    .op_o              (op),
    .ack_i             (ack),
    .rd_idx_o          (rd_idx),
    .rd_status_o       (rd_status),
    .rd_bit_i          (rd_bit),
    .stage_len_i       (stage_len),
    .cap_len_i         (cap_len)
  );

  // The design clock's cycle count, low four bits.
  reg [3:0] cycle_q;
  always @(posedge clk_i or negedge rst_ni) begin
    if (!rst_ni) cycle_q <= 4'd0;
    else cycle_q <= cycle_q + 4'd1;
  end

  wire [15:0] core0_async_out;
  wire [7:0] core0_sync_out;
  wire [15:0] core0_async_in;
  wire [11:0] core0_sync_in;
  wire [7:0] core1_async_out;
  wire [3:0] core1_sync_out;
  wire [7:0] core1_async_in;
  wire [3:0] core1_sync_in;
  /* verilator lint_off UNUSEDSIGNAL */
  wire [3:0] core2_async_out;  // bit 3 is not looped back: a square wave drives input 3
  /* verilator lint_on UNUSEDSIGNAL */
  wire [1:0] core2_sync_out;
  wire [3:0] core2_async_in;
  wire [1:0] core2_sync_in;

  // Core 0: loopback, with design-clock counter bits 0..3 on sync inputs 8..11.
  assign core0_async_in = core0_async_out;
  assign core0_sync_in  = {cycle_q, core0_sync_out};
  // Core 1: default loopback.
  assign core1_async_in = core1_async_out;
  assign core1_sync_in  = core1_sync_out;
  // Core 2: loopback, but async input 3 is a square wave of period 8 (low for cycles 0..3).
  assign core2_async_in = {cycle_q[2], core2_async_out[2:0]};
  assign core2_sync_in  = core2_sync_out;

  zinmox_core #(
    .ASYNC_OUT_W    (16),
    .SYNC_OUT_W     (8),
    .ASYNC_IN_W     (16),
    .SYNC_IN_W      (12),
    .MANUFACTURER_ID(165),
    .MAJOR_VERSION  (10),
    .MINOR_VERSION  (2),
    .REVISION       (1),
    .QX_MAJOR       (1),
    .QX_MINOR       (4),
    .QX_ALPHA       (0),
    .LEN_W          (LEN_W)
  ) u_core0 (
    .tck_i             (tck_i),
    .tck_rst_i         (user_reset),
    .stage_shift_i     (stage_shift[0]),
    .stage_tdi_i       (tdi_i),
    .stage_invalidate_i(stage_invalidate[0]),
    .stage_validate_i  (stage_validate[0]),
    .stage_valid_o     (stage_valid[0]),
    .req_i             (req[0]),
    .op_i              (op),
    .ack_o             (ack[0]),
    .rd_idx_i          (rd_idx),
    .rd_status_i       (rd_status),
    .rd_bit_o          (rd_bit[0]),
    .stage_len_o       (stage_len[0*LEN_W+:LEN_W]),
    .cap_len_o         (cap_len[0*LEN_W+:LEN_W]),
    .clk_i             (clk_i),
    .rst_ni            (rst_ni),
    .async_in_i        (core0_async_in),
    .sync_in_i         (core0_sync_in),
    .async_out_o       (core0_async_out),
    .sync_out_o        (core0_sync_out)
  );

  zinmox_core #(
    .ASYNC_OUT_W    (8),
    .SYNC_OUT_W     (4),
    .ASYNC_IN_W     (8),
    .SYNC_IN_W      (4),
    .MANUFACTURER_ID(165),
    .MAJOR_VERSION  (6),
    .MINOR_VERSION  (5),
    .REVISION       (3),
    .QX_MAJOR       (0),
    .QX_MINOR       (0),
    .QX_ALPHA       (0),
    .LEN_W          (LEN_W)
  ) u_core1 (
    .tck_i             (tck_i),
    .tck_rst_i         (user_reset),
    .stage_shift_i     (stage_shift[1]),
    .stage_tdi_i       (tdi_i),
    .stage_invalidate_i(stage_invalidate[1]),
    .stage_validate_i  (stage_validate[1]),
    .stage_valid_o     (stage_valid[1]),
    .req_i             (req[1]),
    .op_i              (op),
    .ack_o             (ack[1]),
    .rd_idx_i          (rd_idx),
    .rd_status_i       (rd_status),
    .rd_bit_o          (rd_bit[1]),
    .stage_len_o       (stage_len[1*LEN_W+:LEN_W]),
    .cap_len_o         (cap_len[1*LEN_W+:LEN_W]),
    .clk_i             (clk_i),
    .rst_ni            (rst_ni),
    .async_in_i        (core1_async_in),
    .sync_in_i         (core1_sync_in),
    .async_out_o       (core1_async_out),
    .sync_out_o        (core1_sync_out)
  );

  zinmox_core #(
    .ASYNC_OUT_W    (4),
    .SYNC_OUT_W     (2),
    .ASYNC_IN_W     (4),
    .SYNC_IN_W      (2),
    .MANUFACTURER_ID(165),
    .MAJOR_VERSION  (5),
    .MINOR_VERSION  (1),
    .REVISION       (0),
    .QX_MAJOR       (0),
    .QX_MINOR       (0),
    .QX_ALPHA       (0),
    .LEN_W          (LEN_W)
  ) u_core2 (
    .tck_i             (tck_i),
    .tck_rst_i         (user_reset),
    .stage_shift_i     (stage_shift[2]),
    .stage_tdi_i       (tdi_i),
    .stage_invalidate_i(stage_invalidate[2]),
    .stage_validate_i  (stage_validate[2]),
    .stage_valid_o     (stage_valid[2]),
    .req_i             (req[2]),
    .op_i              (op),
    .ack_o             (ack[2]),
    .rd_idx_i          (rd_idx),
    .rd_status_i       (rd_status),
    .rd_bit_o          (rd_bit[2]),
    .stage_len_o       (stage_len[2*LEN_W+:LEN_W]),
    .cap_len_o         (cap_len[2*LEN_W+:LEN_W]),
    .clk_i             (clk_i),
    .rst_ni            (rst_ni),
    .async_in_i        (core2_async_in),
    .sync_in_i         (core2_sync_in),
    .async_out_o       (core2_async_out),
    .sync_out_o        (core2_sync_out)
  );

  // Core 3: a core of another type with a fixed status word.
  zinmox_status_core #(
    .MANUFACTURER_ID(165),
    .CORE_TYPE      (3),
    .MAJOR_VERSION  (2),
    .MINOR_VERSION  (1),
    .REVISION       (0),
    .STATUS         (88'h00C0FFEE),
    .LEN_W          (LEN_W)
  ) u_core3 (
    .rd_idx_i   (rd_idx),
    .rd_status_i(rd_status),
    .rd_bit_o   (rd_bit[3]),
    .stage_len_o(stage_len[3*LEN_W+:LEN_W]),
    .cap_len_o  (cap_len[3*LEN_W+:LEN_W])
  );
  assign stage_valid[3] = 1'b0;
  assign ack[3]         = 1'b0;
endmodule
