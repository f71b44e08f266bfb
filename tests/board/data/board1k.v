// A small board's design for the 1k device in its tq144 package: a clock, an active-low
// reset and button, a serial port, four LEDs, one LCD data line and one port the board
// has no net for.
module top (
    input clk,
    input rst_n,
    input btn_n,
    input uart_rx,
    output uart_tx,
    output [3:0] led,
    output lcd_d0,
    output spare
);
  reg [23:0] count;
  always @(posedge clk)
    if (!rst_n) count <= 0;
    else count <= count + 1;
  assign led = count[23:20];
  assign uart_tx = uart_rx ^ btn_n;
  assign lcd_d0 = count[19];
  assign spare = count[18] & btn_n;
endmodule
