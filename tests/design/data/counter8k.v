// A counter for the 8k device in its ct256 package: a clock, a reset, a step bus whose
// bits are numbered upwards, and a 12-bit bus of LEDs.
module top (
    input clk,
    input rst,
    input [0:3] step,
    output [11:0] led
);
  reg [27:0] count;
  always @(posedge clk)
    if (rst) count <= 0;
    else count <= count + {24'b0, step};
  assign led = count[27:16];
endmodule
