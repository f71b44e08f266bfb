// A counter for the 1k device in its tq144 package: a clock, a synchronous reset and an
// 8-bit bus of LEDs showing the top bits.
module top (
    input clk,
    input rst,
    output [7:0] led
);
  reg [23:0] count;
  always @(posedge clk)
    if (rst) count <= 0;
    else count <= count + 1;
  assign led = count[23:16];
endmodule
