// SPDX-License-Identifier: MIT
// What the cable SDK does when a transport fails: the operation fails with
// the transport's message, and the TAP is reset before the next operation.
// (Everything else CableBase does is covered through jtag_sim end to end.)
#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include "jexjtag/cable/BitBuffer.hpp"
#include "jexjtag/cable/CableBase.hpp"
#include "jexjtag/plugin.hpp"
#include "support/TestSupport.hpp"

namespace {

// Records every TMS move; fails on demand.
class FlakyTransport : public jexcable::JtagTransport {
public:
    void moveTms(const uint8_t* tms, uint32_t count, bool) override
    {
        if (broken) throw std::runtime_error("the adapter went away");
        std::string bits;
        for (uint32_t i = 0; i < count; ++i) bits += jexcable::BitBuffer::get(tms, i) ? '1' : '0';
        moves.push_back(bits);
    }
    void shift(const jexcable::ShiftSource&, const jexcable::ShiftSink& out, uint32_t count, bool) override
    {
        if (broken) throw std::runtime_error("the adapter went away");
        for (uint32_t i = 0; i < count; ++i) out.putBit(i, true); // an open TDO line reads 1
    }
    bool broken = false;
    std::vector<std::string> moves;
};

class FlakyCable : public jexcable::CableBase {
public:
    FlakyCable() : CableBase("flaky") {}
    FlakyTransport wire;

protected:
    uint32_t openCable(const jexcable::PluginArgs&) override
    {
        attachTransport(wire);
        return JEX_SUCCESS;
    }
    void closeCable() override {}
    std::string lockKey() const override { return "flaky0"; }
    void describe(JexJtagTargetInfo&) override {}
};

} // namespace

TEST(CableBase, ATransportFailureFailsTheOperationAndResetsTheTapNextTime)
{
    testsupport::messages().clear();
    JexPluginCallbacks callbacks{};
    callbacks.sendMessage = &testsupport::keepMessage;
    jexjtag::PluginHost::set(&callbacks);
    FlakyCable cable;
    ASSERT_EQ(cable.openTarget(0, nullptr, nullptr), JEX_SUCCESS);
    ASSERT_EQ(cable.navigateTAP(JEXJTAG_RUN_TEST_IDLE, 0), JEX_SUCCESS);

    cable.wire.broken = true;
    EXPECT_EQ(cable.navigateTAP(JEXJTAG_PAUSE_DR, 0), JEX_FAILURE);
    EXPECT_TRUE(testsupport::sawMessage(JEX_MSG_ERROR, "flaky: the adapter went away"));

    cable.wire.broken = false;
    cable.wire.moves.clear();
    ASSERT_EQ(cable.navigateTAP(JEXJTAG_RUN_TEST_IDLE, 0), JEX_SUCCESS);
    ASSERT_EQ(cable.wire.moves.size(), 2u);
    EXPECT_EQ(cable.wire.moves[0], "11111") << "the state was unknown: reset first";
    EXPECT_EQ(cable.wire.moves[1], "0");
    jexjtag::PluginHost::set(nullptr);
}
