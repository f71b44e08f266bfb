// One design for every part: a bus and a clock always; with -DPLL a PLL fed by its pad,
// with -DLVDS a differential input, with -DLED the UltraPlus LED driver.
module top (
    input clk,
    output [5:0] bus
`ifdef PLL
    , input pll_ref
`endif
`ifdef LVDS
    , input lvds_in
`endif
`ifdef LED
    , output led_r, output led_g, output led_b
`endif
);
    reg [5:0] count = 0;
    always @(posedge clk) count <= count + 1;
    wire [5:0] mix;
`ifdef PLL
    // 12 MHz in, 768 MHz in the oscillator, 12 MHz out.
    wire pll_clk;
    reg [5:0] slow = 0;
    SB_PLL40_PAD #(.FEEDBACK_PATH("SIMPLE"), .DIVR(4'd0), .DIVF(7'd63), .DIVQ(3'd6),
                   .FILTER_RANGE(3'd1)) pll (
        .PACKAGEPIN(pll_ref), .PLLOUTGLOBAL(pll_clk), .RESETB(1'b1), .BYPASS(1'b0));
    always @(posedge pll_clk) slow <= slow + 1;
    wire [5:0] from_pll = slow;
`else
    wire [5:0] from_pll = 6'd0;
`endif
`ifdef LVDS
    wire lvds_bit;
    SB_IO #(.PIN_TYPE(6'b000001), .IO_STANDARD("SB_LVDS_INPUT")) lvds (
        .PACKAGE_PIN(lvds_in), .D_IN_0(lvds_bit));
    wire [5:0] from_lvds = {6{lvds_bit}};
`else
    wire [5:0] from_lvds = 6'd0;
`endif
    assign bus = count ^ from_pll ^ from_lvds;
`ifdef LED
    SB_RGBA_DRV #(.CURRENT_MODE("0b1"), .RGB0_CURRENT("0b000001"), .RGB1_CURRENT("0b000001"),
                  .RGB2_CURRENT("0b000001")) rgb (
        .CURREN(1'b1), .RGBLEDEN(1'b1), .RGB0PWM(count[3]), .RGB1PWM(count[4]),
        .RGB2PWM(count[5]), .RGB0(led_r), .RGB1(led_g), .RGB2(led_b));
`endif
endmodule
