// Lattice ECP5 user chain: the JTAGG primitive's ER1 (or ER2) instruction presented as the
// generic user-chain interface of the hub. JTAGG signals the instruction's enable (JCE1/JCE2)
// in Capture-DR and Shift-DR only, so the selection is remembered from Capture-DR to Update-DR.
module zinmox_jtagg #(
  parameter integer ER = 1  // 1: ER1 (0x32), 2: ER2 (0x38)
) (
  output wire tck_o,
  output wire tdi_o,
  output wire capture_o,
  output wire shift_o,
  output wire update_o,
  output wire sel_o,
  output wire reset_o,
  input  wire tdo_i
);
  /* verilator lint_off UNUSEDSIGNAL */
  wire jce1, jce2, jrti1, jrti2;
  /* verilator lint_on UNUSEDSIGNAL */
  wire jtck, jshift, jupdate, jrstn;
  wire jce = (ER == 2) ? jce2 : jce1;
  reg  sel_q;

  JTAGG u_jtagg (
    .JTCK   (jtck),
    .JTDI   (tdi_o),
    .JSHIFT (jshift),
    .JUPDATE(jupdate),
    .JRSTN  (jrstn),
    .JCE1   (jce1),
    .JCE2   (jce2),
    .JRTI1  (jrti1),
    .JRTI2  (jrti2),
    .JTDO1  (ER == 2 ? 1'b0 : tdo_i),
    .JTDO2  (ER == 2 ? tdo_i : 1'b0)
  );

  // Selected from this instruction's Capture-DR until the Update-DR that ends the scan.
  always @(posedge jtck) begin
    if (!jrstn) sel_q <= 1'b0;
    else if (jce && !jshift) sel_q <= 1'b1;
    else if (jupdate) sel_q <= 1'b0;
  end

  assign tck_o     = jtck;
  assign capture_o = jce & ~jshift;
  assign shift_o   = jce & jshift;
  assign update_o  = jupdate;
  assign sel_o     = jce | sel_q;
  assign reset_o   = ~jrstn;
endmodule
