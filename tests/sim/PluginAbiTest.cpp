// SPDX-License-Identifier: MIT
// The built jtag_sim module, loaded as the library loads it and driven only
// through its entry points and operation table.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "jexjtag/plugin.h"
#include "platform/DynamicLibrary.hpp"
#include "support/TestSupport.hpp"

namespace {

const std::string kModule = std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins/jexjtag/jtag_sim/jtag_sim.so";
constexpr uint32_t kSession = 0x00010000;

using testsupport::messages;
using testsupport::sawMessage;

class PluginAbi : public ::testing::Test {
protected:
    static void SetUpTestSuite()
    {
        module = new jexplatform::DynamicLibrary(jexplatform::DynamicLibrary::load(kModule));
        ASSERT_TRUE(module->isLoaded()) << module->error();
        create = module->symbol<JexPlugin_create_fn>("JexPlugin_create");
        destroy = module->symbol<JexPlugin_destroy_fn>("JexPlugin_destroy");
        auto loaded = module->symbol<JexPlugin_loaded_fn>("JexPlugin_loaded");
        auto setCallbacks = module->symbol<JexPlugin_setCallbacks_fn>("JexPlugin_setCallbacks");
        ASSERT_TRUE(create && destroy && loaded && setCallbacks && module->rawSymbol("JexPlugin_unloaded"));
        loaded();
        JexPluginCallbacks callbacks{};
        callbacks.sendMessage = &testsupport::keepMessage;
        setCallbacks(&callbacks); // the table lives only for this call
    }
    static void TearDownTestSuite()
    {
        if (module && module->isLoaded()) module->symbol<JexPlugin_unloaded_fn>("JexPlugin_unloaded")();
        delete module;
        module = nullptr;
    }

    void SetUp() override { messages().clear(); }
    void TearDown() override
    {
        for (JexPluginInstance* i : instances) destroy(i);
    }

    JexPluginInstance* make()
    {
        JexPluginInstance* i = create();
        EXPECT_NE(i, nullptr);
        instances.push_back(i);
        i->ops->setSessionHandle(i, kSession);
        return i;
    }
    JexPluginInstance* open(std::vector<std::string> args = {})
    {
        JexPluginInstance* i = make();
        args.push_back("type=jtag_sim");
        std::vector<const char*> argv;
        for (const auto& a : args) argv.push_back(a.c_str());
        JexJtagCallContext context{kSession, 0, nullptr};
        EXPECT_EQ(i->ops->openTarget(i, static_cast<uint32_t>(argv.size()), argv.data(), &context), JEX_SUCCESS);
        return i;
    }
    std::string get(JexPluginInstance* i, const std::string& key)
    {
        std::vector<uint8_t> out(257, 0xEE);
        uint32_t length = 256;
        const uint32_t status = i->ops->sendCommand(i, "get", reinterpret_cast<const uint8_t*>(key.c_str()),
                                                    static_cast<uint32_t>(key.size() + 1), out.data(), &length, nullptr);
        if (JEX_FAILED(status)) return "<failed>";
        return reinterpret_cast<const char*>(out.data());
    }
    uint32_t set(JexPluginInstance* i, const std::string& keyValue)
    {
        return i->ops->sendCommand(i, "set", reinterpret_cast<const uint8_t*>(keyValue.c_str()),
                                   static_cast<uint32_t>(keyValue.size() + 1), nullptr, nullptr, nullptr);
    }

    static jexplatform::DynamicLibrary* module;
    static JexPlugin_create_fn create;
    static JexPlugin_destroy_fn destroy;
    std::vector<JexPluginInstance*> instances;
    testsupport::TempDir dir;
    testsupport::ScopedEnv lockDir{"JEXJTAG_LOCK_DIR", dir.str()};
};

jexplatform::DynamicLibrary* PluginAbi::module = nullptr;
JexPlugin_create_fn PluginAbi::create = nullptr;
JexPlugin_destroy_fn PluginAbi::destroy = nullptr;

} // namespace

TEST_F(PluginAbi, OperationTableFillsEveryPositionTheLibraryCalls)
{
    JexPluginInstance* i = make();
    const auto* table = reinterpret_cast<const JexPluginReservedOp*>(i->ops);
    for (unsigned pos = 0; pos < 69; ++pos) {
        const bool reserved = pos < 30 || pos == 32 || pos == 34 || pos == 35 || (pos >= 47 && pos <= 49);
        EXPECT_EQ(table[pos] == nullptr, reserved) << "position " << pos;
    }
    // Before open, operations fail instead of touching a cable.
    EXPECT_EQ(i->ops->interrogate(i), JEX_FAILURE);
    EXPECT_EQ(i->ops->getDeviceCount(i), 0u);
    EXPECT_EQ(i->ops->navigateTAP(i, JEXJTAG_RUN_TEST_IDLE, 0), JEX_FAILURE);
    EXPECT_EQ(i->ops->closeTarget(i), JEX_FAILURE);
    EXPECT_EQ(i->ops->cleanLocks(i), JEX_SUCCESS) << "lock cleaning works on an unopened instance";
    // A null instance is refused, not followed.
    EXPECT_EQ(i->ops->closeTarget(nullptr), JEX_FAILURE);
    EXPECT_EQ(i->ops->getDeviceCount(nullptr), 0u);
    EXPECT_EQ(destroy(nullptr), JEX_FAILURE);
}

TEST_F(PluginAbi, DeviceOverridesLastUntilTheNextInterrogation)
{
    JexPluginInstance* i = open();
    EXPECT_EQ(i->ops->getIRLength(i, 3), 0);
    EXPECT_EQ(i->ops->getDeviceIdcode(i, 3), 0u);
    EXPECT_EQ(i->ops->setIRLength(i, 3, 4), JEX_FAILURE);
    EXPECT_EQ(i->ops->setDeviceID(i, 3, 1), JEX_FAILURE);
    EXPECT_TRUE(sawMessage(JEX_MSG_ERROR, "outside the chain"));

    EXPECT_EQ(i->ops->setIRLength(i, 1, 0), JEX_SUCCESS);
    EXPECT_EQ(i->ops->setDeviceID(i, 1, 0x12345679), JEX_SUCCESS);
    EXPECT_EQ(i->ops->setDeviceCount(i, 5), JEX_SUCCESS);
    EXPECT_EQ(i->ops->getDeviceCount(i), 5u);
    EXPECT_EQ(i->ops->getDeviceIdcode(i, 1), 0x12345679u);
    EXPECT_EQ(i->ops->interrogate(i), JEX_SUCCESS);
    EXPECT_EQ(i->ops->getDeviceCount(i), 3u);
    EXPECT_EQ(i->ops->getDeviceIdcode(i, 1), 0x0362D093u);
    EXPECT_EQ(i->ops->getIRLength(i, 1), 6);
}

TEST_F(PluginAbi, AFailedOpenLeavesTheInstanceUsable)
{
    JexPluginInstance* i = make();
    const char* argv[] = {"chain=0x4BA00477:1", "type=jtag_sim"};
    EXPECT_EQ(i->ops->openTarget(i, 2, argv, nullptr), JEX_FAILURE);
    const char* vcd[] = {"vcd=/nonexistent-dir/x.vcd"};
    EXPECT_EQ(i->ops->openTarget(i, 1, vcd, nullptr), JEX_FAILURE);
    const char* good[] = {"chain=none:2"};
    EXPECT_EQ(i->ops->openTarget(i, 1, good, nullptr), JEX_SUCCESS);
    EXPECT_EQ(i->ops->openTarget(i, 1, good, nullptr), JEX_FAILURE) << "already open";
}

TEST_F(PluginAbi, BadArgumentsAreRefused)
{
    JexPluginInstance* i = open();
    std::vector<uint8_t> out(5, 0);
    EXPECT_EQ(i->ops->shiftDeviceDRRead(i, 3, false, out.data(), nullptr, 32, JEXJTAG_RUN_TEST_IDLE, nullptr),
              JEX_FAILURE);
    EXPECT_EQ(i->ops->shiftDeviceDRWrite(i, 1, nullptr, nullptr, 32, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_FAILURE);
    EXPECT_EQ(i->ops->shiftChainIRRead(i, true, nullptr, nullptr, 8, JEXJTAG_RUN_TEST_IDLE, nullptr), JEX_FAILURE);
    EXPECT_EQ(i->ops->shiftChainIRRead(i, true, out.data(), nullptr, 8, 16, nullptr), JEX_FAILURE);

    EXPECT_EQ(i->ops->setPin(i, JEXJTAG_TDO, 1), JEX_FAILURE);
    EXPECT_EQ(i->ops->setPin(i, JEXJTAG_TMS, 2), JEX_FAILURE);
    EXPECT_EQ(i->ops->setPin(i, 9, 1), JEX_FAILURE);
    EXPECT_EQ(i->ops->getPin(i, JEXJTAG_TDO, nullptr), JEX_FAILURE);
    EXPECT_EQ(i->ops->pulsePin(i, JEXJTAG_TDO, 1), JEX_FAILURE);

    // Only stable states can be held for clocks.
    EXPECT_EQ(i->ops->navigateTAP(i, JEXJTAG_RUN_TEST_IDLE, 100), JEX_SUCCESS);
    EXPECT_EQ(i->ops->navigateTAP(i, JEXJTAG_CAPTURE_DR, 1), JEX_FAILURE);
    EXPECT_TRUE(sawMessage(JEX_MSG_ERROR, "Capture-DR"));
    EXPECT_EQ(i->ops->navigateTAP(i, JEXJTAG_CAPTURE_DR, 0), JEX_SUCCESS);
    EXPECT_EQ(i->ops->navigateTAP(i, JEXJTAG_STATE_SIZE, 0), JEX_FAILURE);
    EXPECT_EQ(i->ops->flush(i), JEX_SUCCESS);
}

TEST_F(PluginAbi, ChainIrReadWritesOnlyTheShiftedBits)
{
    JexPluginInstance* i = open({"chain=0x4BA00477:4,none:5:capture=0x1D,0x0362D093:6"});
    std::vector<uint8_t> out(3, 0xFF);
    const std::vector<uint8_t> mask = {0xFF, 0x01, 0x00};
    ASSERT_EQ(i->ops->shiftChainIRRead(i, true, out.data(), mask.data(), 15, JEXJTAG_RUN_TEST_IDLE, nullptr),
              JEX_SUCCESS);
    // 0001 | 11101 | 000001 masked to the first 9 bits.
    EXPECT_EQ(out[0] | ((out[1] & 0x7F) << 8), 0x1 | (0x1D << 4));
    EXPECT_EQ(out[1] & 0x80, 0x80) << "the bit beyond bitCount keeps its value";
    EXPECT_EQ(out[2], 0xFF) << "bytes beyond the shifted bits are untouched";
}

TEST_F(PluginAbi, CommandsGetAndSetOptions)
{
    JexPluginInstance* i = open();
    EXPECT_EQ(get(i, "chain"), "0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,0x0362D093:6:idcode=0x9,"
                               "0x41111043:8:idcode=0xE0:user=0x32");
    EXPECT_EQ(get(i, "colour"), "<failed>");
    EXPECT_EQ(set(i, "noequals"), JEX_FAILURE);

    messages().clear();
    const uint8_t in[] = "x";
    uint32_t len = 0;
    EXPECT_EQ(i->ops->sendCommand(i, "reboot", in, 2, nullptr, &len, nullptr), JEX_FAILURE);
    ASSERT_EQ(messages().size(), 1u);
    EXPECT_EQ(messages()[0].handle, kSession) << "the message names the instance's session";
    EXPECT_EQ(messages()[0].type, unsigned{JEX_MSG_ERROR});
    EXPECT_NE(messages()[0].text.find("reboot"), std::string::npos);
    EXPECT_EQ(i->ops->sendCommand(i, nullptr, in, 2, nullptr, &len, nullptr), JEX_FAILURE);
}

TEST_F(PluginAbi, TheLockHolderKeepsThePort)
{
    JexPluginInstance* a = open();
    JexPluginInstance* b = open();
    ASSERT_EQ(a->ops->lockTarget(a, 0), JEX_SUCCESS);
    EXPECT_EQ(b->ops->lockTarget(b, 20), JEX_FAILURE);
    EXPECT_EQ(set(a, "port=sim2"), JEX_FAILURE) << "the port cannot change under a held lock";
    EXPECT_EQ(b->ops->unlockTarget(b), JEX_FAILURE) << "b holds nothing to unlock";
    EXPECT_EQ(a->ops->unlockTarget(a), JEX_SUCCESS);
    EXPECT_EQ(b->ops->lockTarget(b, 0), JEX_SUCCESS);
}
