// TCK side of a MOX core: the staged output image and whether it passed its check. A stage scan
// shifts the line's number in least significant bit first, so after IMAGE_W bits image bit k is
// bit k of the number. The image changes only during a stage scan, which the hub never runs
// while a commit is pending, so the design domain reads it as stable data.
module zinmox_core_stage #(
  parameter integer IMAGE_W = 19
) (
  input  wire               tck_i,
  input  wire               tck_rst_i,
  input  wire               shift_i,
  input  wire               tdi_i,
  input  wire               invalidate_i,
  input  wire               validate_i,
  output wire [IMAGE_W-1:0] image_o,
  output wire               valid_o
);
  reg [IMAGE_W-1:0] image_q;
  reg               valid_q;

  // IMAGE_W = 2 * A_out + 17 * S_out is at least 19, as every port has at least one bit.
  always @(posedge tck_i) begin
    if (shift_i) image_q <= {tdi_i, image_q[IMAGE_W-1:1]};
  end

  always @(posedge tck_i) begin
    if (tck_rst_i || invalidate_i) begin
      valid_q <= 1'b0;
    end else if (validate_i) begin
      valid_q <= 1'b1;
    end
  end

  assign image_o = image_q;
  assign valid_o = valid_q;
endmodule
