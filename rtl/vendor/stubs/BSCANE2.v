// Black box of the Xilinx 7-series BSCANE2 primitive, for synthesis and lint checks only.
/* verilator lint_off UNDRIVEN */
/* verilator lint_off UNUSEDPARAM */
/* verilator lint_off UNUSEDSIGNAL */
(* blackbox *)
module BSCANE2 #(
  parameter         DISABLE_JTAG = "FALSE",
  parameter integer JTAG_CHAIN   = 1
) (
  output wire CAPTURE,
  output wire DRCK,
  output wire RESET,
  output wire RUNTEST,
  output wire SEL,
  output wire SHIFT,
  output wire TCK,
  output wire TDI,
  output wire TMS,
  output wire UPDATE,
  input  wire TDO
);
endmodule
