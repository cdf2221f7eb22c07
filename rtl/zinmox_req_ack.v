// Receiving end of a four-phase request/acknowledge handshake from the TCK domain. The request
// level passes a synchroniser; a new request gives one go pulse, and the acknowledge rises two
// cycles later, at the edge where the action that the go pulse started takes effect. The
// acknowledge falls once the request has fallen, so a request is never carried out twice.
module zinmox_req_ack (
  input  wire clk_i,
  input  wire rst_ni,
  input  wire req_i,
  output wire go_o,
  output wire ack_o
);
  wire req_sync;
  reg  go_q;
  reg  act_q;
  reg  ack_q;

  zinmox_sync2 u_req_sync (
    .clk_i(clk_i),
    .d_i  (req_i),
    .q_o  (req_sync)
  );

  always @(posedge clk_i or negedge rst_ni) begin
    if (!rst_ni) begin
      go_q  <= 1'b0;
      act_q <= 1'b0;
      ack_q <= 1'b0;
    end else begin
      go_q  <= req_sync & ~ack_q & ~go_q & ~act_q;
      act_q <= go_q;
      ack_q <= req_sync & (ack_q | act_q);
    end
  end

  assign go_o  = go_q;
  assign ack_o = ack_q;
endmodule
