// Serial CRC-16 (polynomial 0x1021, initial value 0xFFFF, no reflection, no final XOR), one
// bit per clock. A transmitter feeds its data bits and then the register's own top bit, which
// shifts the CRC out most significant bit first; a receiver feeds data and CRC and ends at 0.
module zinmox_crc16 (
  input  wire        clk_i,
  input  wire        init_i,
  input  wire        en_i,
  input  wire        bit_i,
  output wire [15:0] crc_o
);
  reg [15:0] crc_q;
  wire       feedback = crc_q[15] ^ bit_i;

  always @(posedge clk_i) begin
    if (init_i) begin
      crc_q <= 16'hFFFF;
    end else if (en_i) begin
      crc_q <= {crc_q[14:0], 1'b0} ^ (feedback ? 16'h1021 : 16'h0000);
    end
  end

  assign crc_o = crc_q;
endmodule
