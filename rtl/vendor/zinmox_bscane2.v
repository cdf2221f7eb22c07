// Xilinx 7-series user chain: a BSCANE2 primitive presented as the generic user-chain
// interface of the hub. JTAG_CHAIN 1..4 selects USER1..USER4.
module zinmox_bscane2 #(
  parameter integer JTAG_CHAIN = 1
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
  wire drck, runtest, tms;  // the hub needs none of these
  /* verilator lint_on UNUSEDSIGNAL */

  BSCANE2 #(
    .JTAG_CHAIN(JTAG_CHAIN)
  ) u_bscan (
    .CAPTURE(capture_o),
    .DRCK   (drck),
    .RESET  (reset_o),
    .RUNTEST(runtest),
    .SEL    (sel_o),
    .SHIFT  (shift_o),
    .TCK    (tck_o),
    .TDI    (tdi_o),
    .TMS    (tms),
    .UPDATE (update_o),
    .TDO    (tdo_i)
  );
endmodule
