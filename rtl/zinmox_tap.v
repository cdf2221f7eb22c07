// An IEEE 1149.1 TAP controller with a 4-bit instruction register: IDCODE (0x1, selected after
// reset), BYPASS (0xF and every unassigned opcode) and USER1..USER4 (0x8..0xB). A selected user
// instruction hands its data register to the user chain through the signals a boundary-scan
// primitive gives (sel, capture, shift, update, reset), acted on at the rising TCK edge.
module zinmox_tap #(
  parameter [31:0] IDCODE = 32'h1A5E0A5B
) (
  input  wire       tck_i,
  input  wire       tms_i,
  input  wire       tdi_i,
  input  wire       trst_ni,
  output wire       tdo_o,
  // user chains 1..4 (bit n-1 is USERn)
  output wire [3:0] user_sel_o,
  output wire       user_capture_o,
  output wire       user_shift_o,
  output wire       user_update_o,
  output wire       user_reset_o,
  input  wire [3:0] user_tdo_i
);
  localparam [3:0] TestLogicReset = 4'h0;
  localparam [3:0] RunTestIdle    = 4'h1;
  localparam [3:0] SelectDr       = 4'h2;
  localparam [3:0] CaptureDr      = 4'h3;
  localparam [3:0] ShiftDr        = 4'h4;
  localparam [3:0] Exit1Dr        = 4'h5;
  localparam [3:0] PauseDr        = 4'h6;
  localparam [3:0] Exit2Dr        = 4'h7;
  localparam [3:0] UpdateDr       = 4'h8;
  localparam [3:0] SelectIr       = 4'h9;
  localparam [3:0] CaptureIr      = 4'hA;
  localparam [3:0] ShiftIr        = 4'hB;
  localparam [3:0] Exit1Ir        = 4'hC;
  localparam [3:0] PauseIr        = 4'hD;
  localparam [3:0] Exit2Ir        = 4'hE;
  localparam [3:0] UpdateIr       = 4'hF;

  localparam [3:0] IrIdcode = 4'h1;
  // BYPASS is 0xF and every opcode that is neither IDCODE nor a user instruction.

  reg [3:0]  state_q;
  reg [3:0]  next_state;
  reg [3:0]  ir_q;
  reg [3:0]  ir_sr_q;
  reg [31:0] idcode_sr_q;
  reg        bypass_q;
  reg        tdo_q;

  always @* begin
    case (state_q)
      TestLogicReset: next_state = tms_i ? TestLogicReset : RunTestIdle;
      RunTestIdle:    next_state = tms_i ? SelectDr : RunTestIdle;
      SelectDr:       next_state = tms_i ? SelectIr : CaptureDr;
      CaptureDr:      next_state = tms_i ? Exit1Dr : ShiftDr;
      ShiftDr:        next_state = tms_i ? Exit1Dr : ShiftDr;
      Exit1Dr:        next_state = tms_i ? UpdateDr : PauseDr;
      PauseDr:        next_state = tms_i ? Exit2Dr : PauseDr;
      Exit2Dr:        next_state = tms_i ? UpdateDr : ShiftDr;
      UpdateDr:       next_state = tms_i ? SelectDr : RunTestIdle;
      SelectIr:       next_state = tms_i ? TestLogicReset : CaptureIr;
      CaptureIr:      next_state = tms_i ? Exit1Ir : ShiftIr;
      ShiftIr:        next_state = tms_i ? Exit1Ir : ShiftIr;
      Exit1Ir:        next_state = tms_i ? UpdateIr : PauseIr;
      PauseIr:        next_state = tms_i ? Exit2Ir : PauseIr;
      Exit2Ir:        next_state = tms_i ? UpdateIr : ShiftIr;
      default:        next_state = tms_i ? SelectDr : RunTestIdle;  // UpdateIr
    endcase
  end

  always @(posedge tck_i or negedge trst_ni) begin
    if (!trst_ni) state_q <= TestLogicReset;
    else state_q <= next_state;
  end

  // Instruction register: captures 0001, loads at Update-IR, IDCODE in Test-Logic-Reset.
  always @(posedge tck_i or negedge trst_ni) begin
    if (!trst_ni) begin
      ir_q    <= IrIdcode;
      ir_sr_q <= 4'd0;
    end else begin
      if (state_q == TestLogicReset) ir_q <= IrIdcode;
      else if (state_q == UpdateIr) ir_q <= ir_sr_q;
      if (state_q == CaptureIr) ir_sr_q <= 4'b0001;
      else if (state_q == ShiftIr) ir_sr_q <= {tdi_i, ir_sr_q[3:1]};
    end
  end

  wire is_user   = ir_q[3:2] == 2'b10;
  wire is_idcode = ir_q == IrIdcode;

  always @(posedge tck_i) begin
    if (state_q == CaptureDr) begin
      idcode_sr_q <= IDCODE;
      bypass_q    <= 1'b0;
    end else if (state_q == ShiftDr) begin
      idcode_sr_q <= {tdi_i, idcode_sr_q[31:1]};
      bypass_q    <= tdi_i;
    end
  end

  reg dr_bit;
  always @* begin
    if (is_user) dr_bit = user_tdo_i[ir_q[1:0]];
    else if (is_idcode) dr_bit = idcode_sr_q[0];
    else dr_bit = bypass_q;
  end

  // TDO changes on the falling edge, half a cycle after the rising edge that shifted.
  always @(negedge tck_i or negedge trst_ni) begin
    if (!trst_ni) tdo_q <= 1'b0;
    else if (state_q == ShiftIr) tdo_q <= ir_sr_q[0];
    else if (state_q == ShiftDr) tdo_q <= dr_bit;
    else tdo_q <= 1'b0;
  end

  genvar n;
  generate
    for (n = 0; n < 4; n = n + 1) begin : g_user_sel
      assign user_sel_o[n] = is_user && ir_q[1:0] == n;
    end
  endgenerate

  assign user_capture_o = state_q == CaptureDr;
  assign user_shift_o   = state_q == ShiftDr;
  assign user_update_o  = state_q == UpdateDr;
  assign user_reset_o   = state_q == TestLogicReset;
  assign tdo_o          = tdo_q;
endmodule
