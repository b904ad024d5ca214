// SPDX-License-Identifier: MIT
// The cable instance linked directly: states and registers behind the ABI.
#include <gtest/gtest.h>

#include "SimCable.hpp"
#include "SimTestSupport.hpp"
#include "support/TestSupport.hpp"

using jexsim::SimCable;
using jexsim::SimDevice;
using simtest::bitsOf;

namespace {

class SimCableTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        testsupport::messages().clear();
        const JexPluginCallbacks callbacks = simtest::hostCallbacks();
        jexjtag::PluginHost::set(&callbacks);
    }
    void TearDown() override { jexjtag::PluginHost::set(nullptr); }
    void open(std::vector<std::string> args = {})
    {
        std::vector<const char*> argv;
        for (const auto& a : args) argv.push_back(a.c_str());
        cable.setSessionHandle(0x00010000);
        ASSERT_EQ(cable.openTarget(static_cast<uint32_t>(argv.size()), argv.data(), nullptr), JEX_SUCCESS);
    }
    uint32_t set(const std::string& keyValue)
    {
        return cable.sendCommand("set", reinterpret_cast<const uint8_t*>(keyValue.c_str()),
                                 static_cast<uint32_t>(keyValue.size() + 1), nullptr, nullptr, nullptr);
    }
    JexJtagTapState state() const { return cable.engine()->state(); }

    testsupport::TempDir dir;
    testsupport::ScopedEnv lockDir{"JEXJTAG_LOCK_DIR", dir.str()};
    SimCable cable;
};

} // namespace

TEST_F(SimCableTest, ShiftsEndInTheExitState)
{
    open();
    EXPECT_EQ(state(), JEXJTAG_TEST_LOGIC_RESET) << "open leaves the TAPs reset";
    std::vector<uint8_t> out(4, 0);
    const JexJtagTapState exits[] = {JEXJTAG_SHIFT_DR, JEXJTAG_PAUSE_DR, JEXJTAG_UPDATE_IR, JEXJTAG_SHIFT_IR,
                                     JEXJTAG_EXIT1_DR, JEXJTAG_RUN_TEST_IDLE, JEXJTAG_TEST_LOGIC_RESET};
    for (JexJtagTapState exit : exits) {
        ASSERT_EQ(cable.shiftChainDRRead(true, out.data(), nullptr, 3, exit, nullptr), JEX_SUCCESS);
        EXPECT_EQ(state(), exit);
        for (std::size_t d = 0; d < cable.chain()->size(); ++d) EXPECT_EQ(cable.chain()->device(d).state(), exit);
    }
    // A shift of no bits only moves.
    const uint64_t before = cable.chain()->cycles();
    ASSERT_EQ(cable.shiftDeviceIRWrite(1, nullptr, nullptr, 0, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_SUCCESS);
    EXPECT_EQ(cable.chain()->cycles() - before, 1u) << "Test-Logic-Reset to Run-Test/Idle is one clock";
}

TEST_F(SimCableTest, TdiMaskDrivesMaskedBitsLow)
{
    open({"chain=0x0362D093:6:idcode=0x9"});
    const auto user = bitsOf(0x02, 6);
    ASSERT_EQ(cable.shiftDeviceIRWrite(0, user.data(), nullptr, 6, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_SUCCESS);
    const auto data = bitsOf(0xFFFFFFFF, 32);
    const auto mask = bitsOf(0x0000FF0F, 32);
    ASSERT_EQ(cable.shiftDeviceDRWrite(0, data.data(), mask.data(), 32, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_SUCCESS);
    EXPECT_EQ(cable.chain()->device(0).userRegister(), 0x0000FF0Fu);
}

TEST_F(SimCableTest, DeviceShiftsPadWithTheHeldIrLengths)
{
    open();
    // A wrong IR length for device 2 (between device 1 and TDI) misaligns
    // device 1's instruction, as on a real cable.
    ASSERT_EQ(cable.setIRLength(2, 7), JEX_SUCCESS);
    const auto user1 = bitsOf(0x02, 6);
    ASSERT_EQ(cable.shiftDeviceIRWrite(1, user1.data(), nullptr, 6, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_SUCCESS);
    EXPECT_EQ(cable.chain()->device(1).instruction(), 0x05u) << "the data sits one bit nearer TDI";
    ASSERT_EQ(cable.setIRLength(2, 8), JEX_SUCCESS);
    ASSERT_EQ(cable.shiftDeviceIRWrite(1, user1.data(), nullptr, 6, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_SUCCESS);
    EXPECT_EQ(cable.chain()->device(1).instruction(), 0x02u);
    EXPECT_EQ(cable.chain()->device(0).selected(), SimDevice::DataRegister::Bypass);
    EXPECT_EQ(cable.chain()->device(2).selected(), SimDevice::DataRegister::Bypass);
}

TEST_F(SimCableTest, WaveformCanBeStartedAndStoppedByOption)
{
    open();
    const std::string path = (dir.path() / "run.vcd").string();
    ASSERT_EQ(set("vcd=" + path), JEX_SUCCESS);
    ASSERT_EQ(cable.navigateTAP(JEXJTAG_SHIFT_DR, 0), JEX_SUCCESS);
    EXPECT_EQ(set("chain=none:2"), JEX_FAILURE) << "the chain cannot change under a recording";
    EXPECT_TRUE(testsupport::sawMessage(JEX_MSG_ERROR, "waveform"));
    ASSERT_EQ(set("vcd="), JEX_SUCCESS);
    ASSERT_EQ(cable.navigateTAP(JEXJTAG_RUN_TEST_IDLE, 0), JEX_SUCCESS);

    const std::string vcd = testsupport::readFile(path);
    EXPECT_NE(vcd.find("$enddefinitions"), std::string::npos);
    EXPECT_NE(vcd.find("dev2_state"), std::string::npos);
    EXPECT_NE(vcd.find("b0100 "), std::string::npos) << "Shift-DR was recorded";
    EXPECT_EQ(vcd.find("b0101 "), std::string::npos) << "nothing after the recording stopped";
}

TEST_F(SimCableTest, CloseReleasesEverything)
{
    open({"vcd=" + (dir.path() / "x.vcd").string()});
    ASSERT_EQ(cable.lockTarget(0), JEX_SUCCESS);
    ASSERT_EQ(cable.closeTarget(), JEX_SUCCESS);
    EXPECT_FALSE(cable.isOpen());
    EXPECT_EQ(cable.chain(), nullptr);
    EXPECT_EQ(cable.getDeviceCount(), 0u);
    jexcable::CableLock other("sim0", dir.str());
    EXPECT_TRUE(other.acquire(0));
    EXPECT_EQ(cable.flush(), JEX_FAILURE);
    EXPECT_TRUE(testsupport::sawMessage(JEX_MSG_ERROR, "not open"));
}
