//===-- tests/MessageTest.cpp - messages carry place and text, never obey outside text -===//
#include "MessageCapture.h"

#include "Port/MsgMan.h"

#include <gtest/gtest.h>

TEST(Messages, CarryTheirPlaceAndFormattedText) {
    VnTest::MessageCapture capture;
    Port_MsgManData::createObject("Venlomer", "../s/Unit", 42, "$Revision: 1.3 $")
        .issueStatus("count = %d\n", 7);
    Port_MsgManData::createObject("Venlomer", "../s/Unit", 43, "$Revision: 1.3 $")
        .issueError("bad %s\n", "thing");
    Port_MsgManData::debugStub("debug %u\n", 5u);

    ASSERT_EQ(capture.Messages().size(), 3u);
    const Port::Message& status = capture.Messages()[0];
    EXPECT_EQ(status.severity, Port::Severity::Status);
    EXPECT_EQ(status.domain, "Venlomer");
    EXPECT_EQ(status.unit, "../s/Unit");
    EXPECT_EQ(status.line, 42);
    EXPECT_EQ(status.revision, "$Revision: 1.3 $");
    EXPECT_EQ(status.text, "count = 7\n");
    EXPECT_EQ(capture.Errors(), std::vector<std::string>{"bad thing\n"});
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{"debug 5\n"});
}

TEST(Messages, OutsideTextPassedAsArgumentIsNeverInterpreted) {
    VnTest::MessageCapture capture;
    const char* fileName = "evil%n%s%x.ngd";
    Port_MsgManData::debugStub("%s", fileName);
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{fileName});
}

TEST(Messages, RestoringTheSinkStopsCapturing) {
    std::vector<std::string> outer;
    auto previous = Port::SetMessageSink([&](const Port::Message& m) { outer.push_back(m.text); });
    {
        VnTest::MessageCapture inner;
        Port_MsgManData::debugStub("inner");
        EXPECT_EQ(inner.Debug().size(), 1u);
    }
    Port_MsgManData::debugStub("outer");
    Port::SetMessageSink(std::move(previous));
    EXPECT_EQ(outer, std::vector<std::string>{"outer"});
}
