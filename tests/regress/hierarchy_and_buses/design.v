// A two-level design with buses, a pad-like cell name and a net that crosses the hierarchy.
module lane (input clk, input [3:0] d, output reg [3:0] q);
    always @(posedge clk) q <= d;
endmodule

module top (input CLK_IN, input [7:0] din, output [7:0] dout, output ready);
    wire clk = CLK_IN;
    lane lane0 (.clk(clk), .d(din[3:0]), .q(dout[3:0]));
    lane lane1 (.clk(clk), .d(din[7:4]), .q(dout[7:4]));
    reg r;
    always @(posedge clk) r <= |din;
    assign ready = r;
endmodule
