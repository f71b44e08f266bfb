//===-- tests/board/PinCsvTest.cpp - the plan as RFC 4180 CSV, and tables read back ---===//
#include "PinCsv.h"
#include "BoardTestSupport.h"

#include <gtest/gtest.h>

namespace {

using BoardTest::DesignOf;
using BoardTest::OneK;

TEST(Csv, QuotesWhatNeedsQuotingAndReadsItBack) {
    std::vector<std::string> fields = {"plain", "a,b", "say \"hi\"", "two\r\nlines", "", "x"};
    std::string record = VnTool::CsvRecord(fields);
    EXPECT_EQ(record, "plain,\"a,b\",\"say \"\"hi\"\"\",\"two\r\nlines\",,x\r\n");
    std::vector<std::vector<std::string>> records;
    std::string error;
    ASSERT_TRUE(VnTool::ParseCsv(record + record, "t.csv", records, error)) << error;
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[1], fields);
    // A record of one empty field is not a blank line.
    ASSERT_TRUE(VnTool::ParseCsv(VnTool::CsvRecord({""}), "t.csv", records, error));
    EXPECT_EQ(records, std::vector<std::vector<std::string>>{{""}});

    // LF line ends, a byte-order mark, blank lines, a last line without an end.
    ASSERT_TRUE(
        VnTool::ParseCsv("\xEF\xBB\xBFpin,net\n\n12,/LED0\n\"13\",\"\"", "t.csv", records, error));
    std::vector<std::vector<std::string>> expected = {{"pin", "net"}, {"12", "/LED0"}, {"13", ""}};
    EXPECT_EQ(records, expected);
}

TEST(Csv, MalformedQuotingIsRefusedWithItsLine) {
    std::vector<std::vector<std::string>> records;
    std::string error;
    EXPECT_FALSE(VnTool::ParseCsv("a,b\n\"open,c\nd\n", "t.csv", records, error));
    EXPECT_EQ(error, "t.csv:2: the quoted field opened here never closes");
    EXPECT_FALSE(VnTool::ParseCsv("a,b\nc,d\"e\n", "t.csv", records, error));
    EXPECT_EQ(error, "t.csv:2: a quote inside a field that is not quoted as a whole");
    EXPECT_FALSE(VnTool::ParseCsv("\"a\"b,c\n", "t.csv", records, error));
    EXPECT_EQ(error, "t.csv:1: text after a quoted field's closing quote");
}

class PlanTable : public ::testing::Test {
protected:
    VnTool::Design design = DesignOf({"clk", "led[0]", "led[1]", "spare"});
    VnTool::PcfFile Pcf(const std::string& text) {
        VnTool::PcfFile pcf;
        std::string error;
        EXPECT_TRUE(pcf.Parse(text, "top.pcf", error)) << error;
        return pcf;
    }
    std::vector<std::vector<std::string>> Rows(const std::string& csv) {
        std::vector<std::vector<std::string>> rows;
        std::string error;
        EXPECT_TRUE(VnTool::ParseCsv(csv, "out.csv", rows, error)) << error;
        return rows;
    }
};

TEST_F(PlanTable, OneRowPerPortWithWhatThePinIs) {
    // 21 drives a global buffer; 1 and 2 are the two blocks of one bank-3 tile, an LVDS
    // pair; 99 is on the right edge.
    auto pcf = Pcf("set_io -pullup yes clk 21\nset_io led[0] 1\n"
                   "set_io led[1] 99\n");
    auto rows = Rows(VnTool::PlanCsv(OneK(), design, "top.json", pcf));
    ASSERT_EQ(rows.size(), 5u);
    EXPECT_EQ(rows[0], VnTool::PlanCsvColumns());
    std::vector<std::string> clk = {"clk", "output", "21",  "3",         "0",  "8",
                                    "1",   "yes",    "yes", "SB_LVCMOS", "22", ""};
    EXPECT_EQ(rows[1], clk);
    std::vector<std::string> led0 = {"led[0]", "output", "1", "3",         "0", "14",
                                     "1",      "no",     "",  "SB_LVCMOS", "2", ""};
    EXPECT_EQ(rows[2], led0);
    std::vector<std::string> led1 = {"led[1]", "output", "99", "1",         "13", "12",
                                     "1",      "no",     "",   "SB_LVCMOS", "",   ""};
    EXPECT_EQ(rows[3], led1);
    EXPECT_EQ(rows[4][0], "spare");
    EXPECT_EQ(rows[4][2], "");
    EXPECT_NE(rows[4][11].find("spare"), std::string::npos) << rows[4][11];
}

TEST_F(PlanTable, RoundTripThroughThePlan) {
    auto pcf = Pcf("# by hand\nset_io clk 21\nset_io led[0] 1\nset_io led[1] 99\n");
    std::string csv = VnTool::PlanCsv(OneK(), design, "top.json", pcf);
    VnTool::CsvTable table;
    std::string error;
    ASSERT_TRUE(VnTool::ReadPinCsv(csv, "plan.csv", table, error)) << error;
    EXPECT_FALSE(table.netList);
    VnTool::PcfFile rebuilt;
    for (const auto& [port, pin] : table.assignments) {
        if (!pin.empty()) {
            rebuilt.Assign(port, pin);
        }
    }
    EXPECT_EQ(VnTool::PlanCsv(OneK(), design, "top.json", rebuilt), csv);
}

TEST(PinList, TwoColumnsWithOrWithoutAHeader) {
    VnTool::CsvTable table;
    std::string error;
    ASSERT_TRUE(VnTool::ReadPinCsv("Net,Pin\n/LED0,99\n\"/a,b\",98\n", "l.csv", table, error))
        << error;
    EXPECT_TRUE(table.netList);
    ASSERT_EQ(table.nets.size(), 2u);
    EXPECT_EQ(table.nets[1].pin, "98");
    EXPECT_EQ(table.nets[1].net, "/a,b");
    ASSERT_TRUE(VnTool::ReadPinCsv("99,/LED0\r\n98,/LED1\r\n", "l.csv", table, error)) << error;
    ASSERT_EQ(table.nets.size(), 2u);
    EXPECT_EQ(table.nets[0].pin, "99");
    EXPECT_FALSE(VnTool::ReadPinCsv("a,b,c\n1,2,3\n", "l.csv", table, error));
    EXPECT_NE(error.find("neither a plan table"), std::string::npos);
    EXPECT_FALSE(VnTool::ReadPinCsv("", "l.csv", table, error));
}

} // namespace
