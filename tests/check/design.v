// The board of the check tests: three clock inputs (clk_c through a global buffer, a library
// cell), a reset, a button, a data bus in and out, LEDs and a serial output.
(* blackbox *)
module BUFG (input I, output O);
endmodule

module counter (input clk, input rst, output reg [3:0] q);
    always @(posedge clk)
        if (rst) q <= 0;
        else q <= q + 1'b1;
endmodule

module top (input clk_a, input clk_b, input clk_c, input rst, input btn, input [1:0] din,
            output [3:0] led, output [1:0] dout, output tx);
    wire clk_c_g;
    BUFG bufg_c (.I(clk_c), .O(clk_c_g));
    counter ca (.clk(clk_a), .rst(rst), .q(led));
    reg [1:0] sb;
    always @(posedge clk_b) sb <= din ^ {2{btn}};
    assign dout = sb;
    reg t;
    always @(posedge clk_c_g) t <= ~t ^ btn;
    assign tx = t;
endmodule
