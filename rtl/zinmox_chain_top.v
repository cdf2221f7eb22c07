// A hub with one MOX core behind the generic user-chain interface, with the user-chain signals
// and the four ports on pins: the unit that the synthesis and timing report measures.
module zinmox_chain_top #(
  parameter integer ASYNC_OUT_W = 8,
  parameter integer SYNC_OUT_W  = 8,
  parameter integer ASYNC_IN_W  = 8,
  parameter integer SYNC_IN_W   = 8
) (
  input  wire                   tck_i,
  input  wire                   tdi_i,
  input  wire                   capture_i,
  input  wire                   shift_i,
  input  wire                   update_i,
  input  wire                   sel_i,
  input  wire                   reset_i,
  output wire                   tdo_o,
  input  wire                   clk_i,
  input  wire                   rst_ni,
  input  wire [ASYNC_IN_W-1:0]  async_in_i,
  input  wire [SYNC_IN_W-1:0]   sync_in_i,
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
    .capture_i         (capture_i),
    .shift_i           (shift_i),
    .update_i          (update_i),
    .sel_i             (sel_i),
    .reset_i           (reset_i),
    .tdo_o             (tdo_o),
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

  zinmox_core #(
    .ASYNC_OUT_W(ASYNC_OUT_W),
    .SYNC_OUT_W (SYNC_OUT_W),
    .ASYNC_IN_W (ASYNC_IN_W),
    .SYNC_IN_W  (SYNC_IN_W),
    .LEN_W      (LEN_W)
  ) u_core (
    .tck_i             (tck_i),
    .tck_rst_i         (reset_i),
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
    .async_in_i        (async_in_i),
    .sync_in_i         (sync_in_i),
    .async_out_o       (async_out_o),
    .sync_out_o        (sync_out_o)
  );
endmodule
