// A core that only reports its status record: core information in bits 0..39 and a fixed
// status word from bit 40. It takes no stage, commit, capture or clear (its stage length reads
// 0, which tells the hub to ignore those ops for it).
module zinmox_status_core #(
  parameter integer MANUFACTURER_ID = 165,
  parameter integer CORE_TYPE       = 1,
  parameter integer MAJOR_VERSION   = 1,
  parameter integer MINOR_VERSION   = 0,
  parameter integer REVISION        = 0,
  parameter [87:0]  STATUS          = 88'd0,
  parameter integer LEN_W           = 24
) (
  input  wire [LEN_W-1:0] rd_idx_i,
  input  wire             rd_status_i,
  output wire             rd_bit_o,
  output wire [LEN_W-1:0] stage_len_o,
  output wire [LEN_W-1:0] cap_len_o
);
  localparam [127:0] StatusRecord = {STATUS, REVISION[7:0], MINOR_VERSION[7:0],
                                     MAJOR_VERSION[7:0], CORE_TYPE[7:0], MANUFACTURER_ID[7:0]};

  wire [6:0] status_idx = rd_idx_i[6:0];

  assign rd_bit_o    = rd_status_i && rd_idx_i < 128 && StatusRecord[status_idx];
  assign stage_len_o = {LEN_W{1'b0}};
  assign cap_len_o   = {LEN_W{1'b0}};
endmodule
