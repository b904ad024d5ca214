// SPDX-License-Identifier: MIT
// The host layer's dispatcher and its default manager.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "hostlayer/Port_MsgDispatcher.hpp"

namespace {

class Collector : public Port_MsgMan {
public:
    void outputMsg(MsgType type, const wchar_t* text) override { received.emplace_back(type, text); }
    std::vector<std::pair<int, std::wstring>> received;
};

TEST(HostLayer, EveryManagerInTheSetReceivesEachMessage)
{
    Collector a, b;
    EXPECT_TRUE(Port_MsgDispatcher::addMsgMan(&a));
    EXPECT_FALSE(Port_MsgDispatcher::addMsgMan(&a));
    EXPECT_TRUE(Port_MsgDispatcher::addMsgMan(&b));
    Port_MsgDispatcher::post(Port_MsgMan::MSG_WARNING, L"line %d of %ls", 7, L"x.bsd");
    ASSERT_EQ(1u, a.received.size());
    EXPECT_EQ(Port_MsgMan::MSG_WARNING, a.received[0].first);
    EXPECT_EQ(L"line 7 of x.bsd", a.received[0].second);
    EXPECT_EQ(a.received, b.received);
    EXPECT_TRUE(Port_MsgDispatcher::removeMsgMan(&a));
    EXPECT_FALSE(Port_MsgDispatcher::removeMsgMan(&a));
    Port_MsgDispatcher::dispatch(Port_MsgMan::MSG_INFO, L"only b");
    EXPECT_EQ(1u, a.received.size());
    EXPECT_EQ(2u, b.received.size());
    Port_MsgDispatcher::removeMsgMan(&b);
}

} // namespace
