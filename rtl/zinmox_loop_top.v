// One MOX core (index 0, manufacturer 165, revision 0, qx version 0.0.0) on USER1 of the TAP,
// with every input looped back from the output of the same kind and number (0 where there is
// none). Its outputs are brought out for observation.
module zinmox_loop_top #(
  parameter integer ASYNC_OUT_W   = 8,
  parameter integer SYNC_OUT_W    = 8,
  parameter integer ASYNC_IN_W    = 8,
  parameter integer SYNC_IN_W     = 8,
  parameter integer MAJOR_VERSION = 10,
  parameter integer MINOR_VERSION = 0
) (
  input  wire                   clk_i,
  input  wire                   rst_ni,
  input  wire                   tck_i,
  input  wire                   tms_i,
  input  wire                   tdi_i,
  input  wire                   trst_ni,
  output wire                   tdo_o,
  output wire [ASYNC_OUT_W-1:0] async_out_o,
  output wire [SYNC_OUT_W-1:0]  sync_out_o
);
  // Bit counters of the hub: wide enough for the longest stage or capture scan plus its CRC and
  // one more, so that a scan of the wrong length never looks right.
  localparam integer STAGE_LEN = 2 * ASYNC_OUT_W + 17 * SYNC_OUT_W + 1;
  localparam integer CAP_LEN   = 4 * ASYNC_IN_W + 6 * SYNC_IN_W;
  localparam integer MAX_LEN   = STAGE_LEN > CAP_LEN ? STAGE_LEN : CAP_LEN;
  localparam integer LEN_W     = clog2((MAX_LEN > 128 ? MAX_LEN : 128) + 18);

  function integer clog2;
    input integer value;
    integer v;
    begin
      clog2 = 1;
      for (v = 2; v < value; v = v * 2) clog2 = clog2 + 1;
    end
  endfunction

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

  wire             stage_shift, stage_invalidate, stage_validate, stage_valid;
  wire             req, ack, rd_status, rd_bit;
  wire [1:0]       op;
  wire [LEN_W-1:0] rd_idx, stage_len, cap_len;

  zinmox_hub #(
    .CORES(1),
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

  wire [ASYNC_IN_W-1:0] async_in;
  wire [SYNC_IN_W-1:0]  sync_in;

  genvar i;
  generate
    for (i = 0; i < ASYNC_IN_W; i = i + 1) begin : g_async_loop
      if (i < ASYNC_OUT_W) begin : g_wire
        assign async_in[i] = async_out_o[i];
      end else begin : g_zero
        assign async_in[i] = 1'b0;
      end
    end
    for (i = 0; i < SYNC_IN_W; i = i + 1) begin : g_sync_loop
      if (i < SYNC_OUT_W) begin : g_wire
        assign sync_in[i] = sync_out_o[i];
      end else begin : g_zero
        assign sync_in[i] = 1'b0;
      end
    end
  endgenerate

  zinmox_core #(
    .ASYNC_OUT_W    (ASYNC_OUT_W),
    .SYNC_OUT_W     (SYNC_OUT_W),
    .ASYNC_IN_W     (ASYNC_IN_W),
    .SYNC_IN_W      (SYNC_IN_W),
    .MANUFACTURER_ID(165),
    .MAJOR_VERSION  (MAJOR_VERSION),
    .MINOR_VERSION  (MINOR_VERSION),
    .REVISION       (0),
    .LEN_W          (LEN_W)
  ) u_core (
    .tck_i             (tck_i),
    .tck_rst_i         (user_reset),
    .stage_shift_i     (stage_shift),
    .stage_tdi_i       (tdi_i),
    .stage_invalidate_i(stage_invalidate),
    .stage_validate_i  (stage_validate),
    .stage_valid_o     (stage_valid),
    .req_i             (req),
    .op_i              (op),
    .ack_o             (ack),
    .rd_idx_i          (rd_idx),
    .rd_status_i       (rd_status),
    .rd_bit_o          (rd_bit),
    .stage_len_o       (stage_len),
    .cap_len_o         (cap_len),
    .clk_i             (clk_i),
    .rst_ni            (rst_ni),
    .async_in_i        (async_in),
    .sync_in_i         (sync_in),
    .async_out_o       (async_out_o),
    .sync_out_o        (sync_out_o)
  );
endmodule
