// Black box of the Lattice ECP5 JTAGG primitive, for synthesis and lint checks only.
/* verilator lint_off UNDRIVEN */
/* verilator lint_off UNUSEDPARAM */
/* verilator lint_off UNUSEDSIGNAL */
(* blackbox *)
module JTAGG (
  output wire JTCK,
  output wire JTDI,
  output wire JSHIFT,
  output wire JUPDATE,
  output wire JRSTN,
  output wire JCE1,
  output wire JCE2,
  output wire JRTI1,
  output wire JRTI2,
  input  wire JTDO1,
  input  wire JTDO2
);
endmodule
