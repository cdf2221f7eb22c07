// The hub of one user chain: decodes the 16-bit request header of every DR scan, returns the
// capture word, the hub record and the cores' status records, shifts stage data into the
// addressed core, and runs one commit, capture or clear request at a time through the core's
// handshake. All of it runs on TCK. The user-chain signals are those of a boundary-scan
// primitive: capture, shift and update are acted on at the rising TCK edge while sel_i is up.
module zinmox_hub #(
  parameter integer CORES = 1,
  parameter integer LEN_W = 24
) (
  input  wire                   tck_i,
  input  wire                   tdi_i,
  input  wire                   capture_i,
  input  wire                   shift_i,
  input  wire                   update_i,
  input  wire                   sel_i,
  input  wire                   reset_i,
  output wire                   tdo_o,
  // towards the cores (all TCK domain; ack_i already synchronised)
  output wire [CORES-1:0]       stage_shift_o,
  output wire [CORES-1:0]       stage_invalidate_o,
  output wire [CORES-1:0]       stage_validate_o,
  input  wire [CORES-1:0]       stage_valid_i,
  output wire [CORES-1:0]       req_o,
  output wire [1:0]             op_o,
  input  wire [CORES-1:0]       ack_i,
  output wire [LEN_W-1:0]       rd_idx_o,
  output wire                   rd_status_o,
  input  wire [CORES-1:0]       rd_bit_i,
  input  wire [CORES*LEN_W-1:0] stage_len_i,
  input  wire [CORES*LEN_W-1:0] cap_len_i
);
  localparam [3:0] Version = 4'd1;

  localparam [2:0] StZero  = 3'd0;  // shifting zeros out
  localparam [2:0] StData  = 3'd1;  // shifting a record, capture bits or a result out
  localparam [2:0] StCrc   = 3'd2;  // shifting the CRC of the data out
  localparam [2:0] StWait  = 3'd3;  // waiting for a request; TDO shows the start bit when done
  localparam [2:0] StStage = 3'd4;  // shifting stage data and its CRC in

  localparam [1:0] SrcHub    = 2'd0;
  localparam [1:0] SrcStatus = 2'd1;
  localparam [1:0] SrcCap    = 2'd2;
  localparam [1:0] SrcResult = 2'd3;

  localparam [31:0] HubRecord = {19'd0, CORES[4:0], 4'd0, Version};

  wire do_capture = sel_i & capture_i;
  wire do_shift   = sel_i & shift_i;
  wire do_update  = sel_i & update_i;

  reg              hdr_q;       // in the 16 header bits
  reg  [3:0]       hcnt_q;
  reg  [15:0]      capword_q;
  reg  [14:0]      hdr_sr_q;
  reg  [2:0]       state_q;
  reg  [1:0]       src_q;
  reg  [3:0]       core_q;
  reg  [LEN_W-1:0] idx_q;
  reg              busy_cap_q;  // busy as the capture word showed it
  reg              spare_bad_q;
  reg              stage_bad_q;
  wire [CORES-1:0] req_q;
  reg  [1:0]       op_q = 2'd0;  // changes only at a launch, never while a request is up
  reg              done_q;
  reg              refused_q;

  wire [15:0] crc;
  wire        busy = (|req_q) | (|ack_i);

  // The header as it completes with this edge's TDI bit.
  wire [15:0] header   = {tdi_i, hdr_sr_q};
  wire [3:0]  hdr_op   = header[3:0];
  wire [3:0]  hdr_core = header[7:4];
  wire        hdr_end  = do_shift & hdr_q & (hcnt_q == 4'd15);
  wire        key_ok   = header[15:8] == 8'hA5;

  // Per-core facts, selected by the header's core index and by the scan's core index.
  reg             hdr_present, hdr_mox, hdr_valid;
  reg [LEN_W-1:0] cur_stage_len, cur_cap_len;
  reg             cur_rd_bit;
  integer         k;
  always @* begin
    hdr_present   = 1'b0;
    hdr_mox       = 1'b0;
    hdr_valid     = 1'b0;
    cur_stage_len = {LEN_W{1'b0}};
    cur_cap_len   = {LEN_W{1'b0}};
    cur_rd_bit    = 1'b0;
    for (k = 0; k < CORES; k = k + 1) begin
      if (hdr_core == k[3:0]) begin
        hdr_present = 1'b1;
        hdr_mox     = stage_len_i[k*LEN_W+:LEN_W] != {LEN_W{1'b0}};
        hdr_valid   = stage_valid_i[k];
      end
      if (core_q == k[3:0]) begin
        cur_stage_len = stage_len_i[k*LEN_W+:LEN_W];
        cur_cap_len   = cap_len_i[k*LEN_W+:LEN_W];
        cur_rd_bit    = rd_bit_i[k];
      end
    end
  end

  reg [LEN_W-1:0] data_len;
  always @* begin
    case (src_q)
      SrcHub:    data_len = 32;
      SrcStatus: data_len = 128;
      SrcCap:    data_len = cur_cap_len;
      default:   data_len = 8;
    endcase
  end

  reg data_bit;
  always @* begin
    case (src_q)
      SrcHub:    data_bit = idx_q < 32 && HubRecord[idx_q[4:0]];
      SrcResult: data_bit = (idx_q == 0 && !refused_q) || (idx_q == 1 && refused_q);
      default:   data_bit = cur_rd_bit;
    endcase
  end

  reg tdo_bit;
  always @* begin
    if (hdr_q) tdo_bit = capword_q[0];
    else begin
      case (state_q)
        StData:  tdo_bit = data_bit;
        StCrc:   tdo_bit = crc[15];
        StWait:  tdo_bit = done_q;
        default: tdo_bit = 1'b0;
      endcase
    end
  end

  wire            idx_max   = &idx_q;
  wire [LEN_W-1:0] idx_next = idx_max ? idx_q : idx_q + 1'b1;
  wire            in_stage  = state_q == StStage;
  wire            stage_data = in_stage && idx_q < cur_stage_len - 1'b1;
  wire            crc_en    = do_shift && !hdr_q &&
                              ((state_q == StData && src_q != SrcResult) ||
                               state_q == StCrc || in_stage);
  wire            stage_ok  = idx_q == cur_stage_len + 16 && crc == 16'd0 && !spare_bad_q;
  wire            cmd_ok    = hdr_present && hdr_mox && !busy_cap_q;

  zinmox_crc16 u_crc (
    .clk_i (tck_i),
    .init_i(reset_i | do_capture),
    .en_i  (crc_en),
    .bit_i (in_stage ? tdi_i : tdo_bit),
    .crc_o (crc)
  );

  // Scan state.
  always @(posedge tck_i) begin
    if (reset_i) begin
      hdr_q       <= 1'b0;
      hcnt_q      <= 4'd0;
      capword_q   <= 16'd0;
      hdr_sr_q    <= 15'd0;
      state_q     <= StZero;
      src_q       <= SrcHub;
      core_q      <= 4'd0;
      idx_q       <= {LEN_W{1'b0}};
      busy_cap_q  <= 1'b0;
      spare_bad_q <= 1'b0;
      stage_bad_q <= 1'b0;
      refused_q   <= 1'b0;
    end else if (do_capture) begin
      hdr_q      <= 1'b1;
      hcnt_q     <= 4'd0;
      capword_q  <= {2'b00, stage_bad_q, busy, Version, 8'h5A};
      busy_cap_q <= busy;
      state_q    <= StZero;
    end else if (do_shift && hdr_q) begin
      hcnt_q    <= hcnt_q + 4'd1;
      capword_q <= {1'b0, capword_q[15:1]};
      hdr_sr_q  <= header[15:1];
      if (hdr_end) begin
        hdr_q       <= 1'b0;
        core_q      <= hdr_core;
        idx_q       <= {LEN_W{1'b0}};
        spare_bad_q <= 1'b0;
        refused_q   <= 1'b0;
        state_q     <= StZero;
        if (key_ok) begin
          case (hdr_op)
            4'd0: begin
              state_q <= StData;
              src_q   <= SrcHub;
            end
            4'd5: begin
              state_q <= StData;
              src_q   <= SrcStatus;
            end
            4'd1: begin
              if (cmd_ok) begin
                state_q     <= StStage;
                stage_bad_q <= 1'b1;
              end
            end
            4'd2, 4'd3, 4'd4: begin
              if (cmd_ok) begin
                state_q   <= StWait;
                src_q     <= hdr_op == 4'd3 ? SrcCap : SrcResult;
                op_q      <= hdr_op[1:0] - 2'd2;
                refused_q <= hdr_op == 4'd2 && !hdr_valid;
              end
            end
            default: state_q <= StZero;
          endcase
        end
      end
    end else if (do_shift) begin
      case (state_q)
        StData: begin
          idx_q <= idx_next;
          if (idx_q == data_len - 1'b1) begin
            idx_q   <= {LEN_W{1'b0}};
            state_q <= src_q == SrcResult ? StZero : StCrc;
          end
        end
        StCrc: begin
          idx_q <= idx_next;
          if (idx_q == 15) state_q <= StZero;
        end
        StWait: begin
          if (done_q) begin
            idx_q   <= {LEN_W{1'b0}};
            state_q <= StData;
          end
        end
        StStage: begin
          idx_q <= idx_next;
          if (idx_q == cur_stage_len - 1'b1 && tdi_i) spare_bad_q <= 1'b1;
        end
        default: state_q <= StZero;
      endcase
    end else if (do_update) begin
      hdr_q   <= 1'b0;
      state_q <= StZero;
      if (in_stage && stage_ok) stage_bad_q <= 1'b0;
    end
  end

  // Requests: one at a time; the request of core k stays up until its acknowledge arrives, also
  // across a TAP reset, so the op never changes under a design side that may have seen the
  // request. The request flops start at 0 from the device configuration.
  wire launch = hdr_end && key_ok && cmd_ok && (hdr_op == 4'd2 || hdr_op == 4'd3 ||
                hdr_op == 4'd4) && !(hdr_op == 4'd2 && !hdr_valid);
  genvar c;
  generate
    for (c = 0; c < CORES; c = c + 1) begin : g_req
      localparam [3:0] Index = c;
      reg req_c_q = 1'b0;
      always @(posedge tck_i) begin
        if (launch && hdr_core == Index) req_c_q <= 1'b1;
        else if (ack_i[c]) req_c_q <= 1'b0;
      end
      assign req_q[c] = req_c_q;
      assign stage_shift_o[c]      = do_shift && !hdr_q && stage_data && core_q == Index;
      assign stage_invalidate_o[c] = hdr_end && key_ok && cmd_ok && hdr_op == 4'd1 &&
                                     hdr_core == Index;
      assign stage_validate_o[c]   = do_update && in_stage && stage_ok && core_q == Index;
    end
  endgenerate

  // done_q: the request of this scan was answered (or refused at once).
  always @(posedge tck_i) begin
    if (reset_i || do_capture) done_q <= 1'b0;
    else if (hdr_end) done_q <= key_ok && cmd_ok && hdr_op == 4'd2 && !hdr_valid;
    else if (|(req_q & ack_i)) done_q <= 1'b1;
  end

  assign tdo_o       = tdo_bit;
  assign req_o       = req_q;
  assign op_o        = op_q;
  assign rd_idx_o    = idx_q;
  assign rd_status_o = src_q == SrcStatus;
endmodule
