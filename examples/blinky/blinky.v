// A small board design: a clock divider drives LEDs, a UART transmitter sends a counter,
// and a debounced button resets the counter.
module debounce (input clk, input btn, output reg clean);
    reg [3:0] shift;
    always @(posedge clk) begin
        shift <= {shift[2:0], btn};
        if (shift == 4'hF) clean <= 1'b1;
        else if (shift == 4'h0) clean <= 1'b0;
    end
endmodule

module uart_tx (input clk, input rst, input [7:0] data, input send, output reg tx, output busy);
    reg [3:0] bitpos;
    reg [9:0] frame;
    assign busy = bitpos != 0;
    always @(posedge clk) begin
        if (rst) begin
            bitpos <= 0;
            tx <= 1'b1;
        end else if (send && !busy) begin
            frame <= {1'b1, data, 1'b0};
            bitpos <= 4'd10;
        end else if (busy) begin
            tx <= frame[0];
            frame <= {1'b1, frame[9:1]};
            bitpos <= bitpos - 1'b1;
        end
    end
endmodule

module blinky (input clk, input rst_n, input btn, output [3:0] led, output uart_txd);
    reg [7:0] count;
    wire rst = !rst_n;
    wire pressed;
    wire busy;
    debounce db (.clk(clk), .btn(btn), .clean(pressed));
    always @(posedge clk) begin
        if (rst || pressed) count <= 0;
        else count <= count + 1'b1;
    end
    assign led = count[7:4];
    uart_tx tx0 (.clk(clk), .rst(rst), .data(count), .send(count[3]), .tx(uart_txd), .busy(busy));
endmodule
