//===-- tests/tool/ArgsTest.cpp - options parse in any order; outside text escaped in SVG -===//
#include "Args.h"
#include "PropertyText.h"
#include "Svg.h"

#include <gtest/gtest.h>

namespace {

using VnTool::CommandSyntax;
using VnTool::ParsedArgs;

CommandSyntax Syntax() {
    return {"demo",
            "IN [OUT]",
            "a demonstration",
            {{"--svg", "OUT", "picture"}, {"--quiet", "", "flag"}},
            1,
            2,
            ""};
}

bool Parse(std::vector<std::string> args, ParsedArgs& out, std::string& error) {
    return VnTool::ParseArgs(Syntax(), args, out, error);
}

TEST(ToolArgs, ValuesFlagsAndOperandsAreTakenInAnyOrder) {
    ParsedArgs out;
    std::string error;
    ASSERT_TRUE(Parse({"in.txt", "--svg", "a.svg", "--quiet", "--verbose"}, out, error)) << error;
    EXPECT_EQ(out.Value("--svg"), "a.svg");
    EXPECT_TRUE(out.Has("--quiet"));
    EXPECT_TRUE(out.verbose);
    EXPECT_EQ(out.operands, std::vector<std::string>{"in.txt"});

    ASSERT_TRUE(Parse({"--svg=b=c.svg", "--", "-odd-name", "x"}, out, error)) << error;
    EXPECT_EQ(out.Value("--svg"), "b=c.svg");
    EXPECT_EQ(out.operands, (std::vector<std::string>{"-odd-name", "x"}));

    // A lone dash is an operand (standard input by convention), not an option.
    ASSERT_TRUE(Parse({"-"}, out, error)) << error;
    EXPECT_EQ(out.operands, std::vector<std::string>{"-"});
}

TEST(ToolSvg, TextFromOutsideIsEscaped) {
    EXPECT_EQ(VnTool::XmlEscape("<a & 'b' \"c\">"), "&lt;a &amp; &apos;b&apos; &quot;c&quot;&gt;");
    EXPECT_EQ(VnTool::XmlEscape(std::string("x\x01y", 3)), "x?y");
    // Text that is UTF-8 passes; every byte that is no character is replaced.
    EXPECT_EQ(VnTool::XmlEscape("\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80"),
              "\xc3\xa9\xe2\x82\xac\xf0\x9f\x98\x80");
    const std::string bad = "\xef\xbf\xbd";
    EXPECT_EQ(VnTool::XmlEscape("A\xe9"), "A" + bad);              // Latin-1
    EXPECT_EQ(VnTool::XmlEscape("\xc0\xaf"), bad + bad);           // overlong
    EXPECT_EQ(VnTool::XmlEscape("\xed\xa0\x80"), bad + bad + bad); // surrogate
    EXPECT_EQ(VnTool::XmlEscape("\xef\xbf\xbe"), bad + bad + bad); // U+FFFE
    EXPECT_EQ(VnTool::XmlEscape("\xe2\x82"), bad + bad);           // cut short
    EXPECT_EQ(VnTool::HexColour(255, 0, 16), "#ff0010");
}

} // namespace
