// A MOX core: the TCK-side staged image, the handshake into the design clock domain and the
// design-side ports. Towards the hub it offers the staged image's shift input, a request with
// its op, and a bit-index read of its status record or of its held capture snapshot.
module zinmox_core #(
  parameter integer ASYNC_OUT_W     = 8,
  parameter integer SYNC_OUT_W      = 8,
  parameter integer ASYNC_IN_W      = 8,
  parameter integer SYNC_IN_W       = 8,
  parameter integer MANUFACTURER_ID = 165,
  parameter integer MAJOR_VERSION   = 10,
  parameter integer MINOR_VERSION   = 0,
  parameter integer REVISION        = 0,
  parameter integer QX_MAJOR        = 0,
  parameter integer QX_MINOR        = 0,
  parameter integer QX_ALPHA        = 0,
  parameter integer LEN_W           = 24
) (
  // TCK domain, towards the hub
  input  wire                   tck_i,
  input  wire                   tck_rst_i,
  input  wire                   stage_shift_i,
  input  wire                   stage_tdi_i,
  input  wire                   stage_invalidate_i,
  input  wire                   stage_validate_i,
  output wire                   stage_valid_o,
  input  wire                   req_i,
  input  wire [1:0]             op_i,
  output wire                   ack_o,
  input  wire [LEN_W-1:0]       rd_idx_i,
  input  wire                   rd_status_i,
  output wire                   rd_bit_o,
  output wire [LEN_W-1:0]       stage_len_o,
  output wire [LEN_W-1:0]       cap_len_o,
  // design clock domain
  input  wire                   clk_i,
  input  wire                   rst_ni,
  input  wire [ASYNC_IN_W-1:0]  async_in_i,
  input  wire [SYNC_IN_W-1:0]   sync_in_i,
  output wire [ASYNC_OUT_W-1:0] async_out_o,
  output wire [SYNC_OUT_W-1:0]  sync_out_o
);
  localparam integer IMAGE_W = 2 * ASYNC_OUT_W + 17 * SYNC_OUT_W;
  localparam integer CAP_W   = 4 * ASYNC_IN_W + 6 * SYNC_IN_W;
  localparam integer CAP_IW  = clog2(CAP_W);
  localparam integer KEY     = MAJOR_VERSION * 16 + MINOR_VERSION;

  localparam [1:0] OpCommit  = 2'd0;
  localparam [1:0] OpCapture = 2'd1;
  localparam [1:0] OpClear   = 2'd2;

  function integer clog2;
    input integer value;
    integer v;
    begin
      clog2 = 1;
      for (v = 2; v < value; v = v * 2) clog2 = clog2 + 1;
    end
  endfunction

  // The status record: core information in bits 0..39, the MOX status word from bit 40 in the
  // layout that the version key selects.
  function [127:0] status_record;
    input integer key;
    reg [127:0] r;
    begin
      r = 128'd0;
      r[7:0]   = MANUFACTURER_ID[7:0];
      r[15:8]  = 8'd9;
      r[23:16] = MAJOR_VERSION[7:0];
      r[31:24] = MINOR_VERSION[7:0];
      r[39:32] = REVISION[7:0];
      if (key >= 'hA0) begin
        r[43:40]   = QX_MAJOR[3:0];
        r[51:44]   = QX_MINOR[7:0];
        r[59:52]   = QX_ALPHA[7:0];
        r[75:60]   = ASYNC_IN_W[15:0];
        r[91:76]   = SYNC_IN_W[15:0];
        r[107:92]  = ASYNC_OUT_W[15:0];
        r[123:108] = SYNC_OUT_W[15:0];
      end else if (key >= 'h62) begin
        r[55:40] = ASYNC_IN_W[15:0];
        r[71:56] = SYNC_IN_W[15:0];
        r[87:72] = ASYNC_OUT_W[15:0];
        r[103:88] = SYNC_OUT_W[15:0];
      end else begin
        r[47:40] = ASYNC_IN_W[7:0];
        r[55:48] = SYNC_IN_W[7:0];
        r[63:56] = ASYNC_OUT_W[7:0];
        r[71:64] = SYNC_OUT_W[7:0];
      end
      status_record = r;
    end
  endfunction

  localparam [127:0] StatusRecord = status_record(KEY);
  localparam integer     StageLenInt = IMAGE_W + 1;
  localparam [LEN_W-1:0] StageLen    = StageLenInt[LEN_W-1:0];
  localparam [LEN_W-1:0] CapLen      = CAP_W[LEN_W-1:0];

  wire [IMAGE_W-1:0] image;
  wire [CAP_W-1:0]   cap;
  wire               go;
  wire               ack;
  reg                commit_q;
  reg                capture_q;
  reg                clear_q;

  zinmox_core_stage #(
    .IMAGE_W(IMAGE_W)
  ) u_stage (
    .tck_i       (tck_i),
    .tck_rst_i   (tck_rst_i),
    .shift_i     (stage_shift_i),
    .tdi_i       (stage_tdi_i),
    .invalidate_i(stage_invalidate_i),
    .validate_i  (stage_validate_i),
    .image_o     (image),
    .valid_o     (stage_valid_o)
  );

  zinmox_req_ack u_req_ack (
    .clk_i (clk_i),
    .rst_ni(rst_ni),
    .req_i (req_i),
    .go_o  (go),
    .ack_o (ack)
  );

  zinmox_sync2 u_ack_sync (
    .clk_i(tck_i),
    .d_i  (ack),
    .q_o  (ack_o)
  );

  // The op is held stable by the hub while the request is up; decode it into one-cycle
  // strobes the cycle after the go pulse.
  always @(posedge clk_i or negedge rst_ni) begin
    if (!rst_ni) begin
      commit_q  <= 1'b0;
      capture_q <= 1'b0;
      clear_q   <= 1'b0;
    end else begin
      commit_q  <= go && op_i == OpCommit;
      capture_q <= go && op_i == OpCapture;
      clear_q   <= go && op_i == OpClear;
    end
  end

  zinmox_core_ports #(
    .ASYNC_OUT_W(ASYNC_OUT_W),
    .SYNC_OUT_W (SYNC_OUT_W),
    .ASYNC_IN_W (ASYNC_IN_W),
    .SYNC_IN_W  (SYNC_IN_W)
  ) u_ports (
    .clk_i      (clk_i),
    .rst_ni     (rst_ni),
    .commit_i   (commit_q),
    .capture_i  (capture_q),
    .clear_i    (clear_q),
    .image_i    (image),
    .async_in_i (async_in_i),
    .sync_in_i  (sync_in_i),
    .async_out_o(async_out_o),
    .sync_out_o (sync_out_o),
    .cap_o      (cap)
  );

  // The snapshot is read bit by bit where it is held: it changes only at a capture, and the
  // hub reads it only after that capture's acknowledge.
  wire [CAP_IW-1:0] cap_idx = rd_idx_i[CAP_IW-1:0];
  wire [6:0]        status_idx = rd_idx_i[6:0];
  wire              cap_bit = (rd_idx_i < CapLen) ? cap[cap_idx] : 1'b0;
  wire              status_bit = (rd_idx_i < 128) ? StatusRecord[status_idx] : 1'b0;

  assign rd_bit_o    = rd_status_i ? status_bit : cap_bit;
  assign stage_len_o = StageLen;
  assign cap_len_o   = CapLen;
endmodule
