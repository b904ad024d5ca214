// SPDX-License-Identifier: MIT
#pragma once
// End-to-end fixture: a session of the library reaching the jtag_sim plug-in
// as it lies in the build tree (build/lib/plugins), with the build's
// idcode.lst, a private home and a private lock directory, and a port of the
// test's own, so nothing is shared with other tests or users.

#include <gtest/gtest.h>

#include <unistd.h>

#include <cstdint>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

namespace e2e {

using testsupport::bitsOf;
using testsupport::messages;
using testsupport::messagesOfType;
using testsupport::idcodeText;
using testsupport::keepMessage;
using testsupport::valueOf;

// The default chain of the plug-in, written out (device 0, nearest TDO, first).
constexpr uint32_t kDapId = 0x4BA00477u;   // ARM JTAG-DP, IR 4, IDCODE 0xE, USER 0xA (35 bits)
constexpr uint32_t kArtixId = 0x0362D093u; // Xilinx XC7A35T, IR 6, IDCODE 0x9, USER 0x2 (32 bits)
constexpr uint32_t kEcp5Id = 0x41111043u;  // Lattice LFE5U-25F, IR 8, IDCODE 0xE0, USER 0x32 (32 bits)
inline const std::string kDap = "0x4BA00477:4:idcode=0xE:user=0xA:userbits=35";
inline const std::string kArtix = "0x0362D093:6:idcode=0x9";
inline const std::string kEcp5 = "0x41111043:8:idcode=0xE0:user=0x32";
inline const std::string kThreeDevices = kDap + "," + kArtix + "," + kEcp5;

class SimSession : public ::testing::Test {
protected:
    SimSession()
        : m_plugins("JEXJTAG_PLUGIN_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins"),
          m_data("JEXJTAG_DATA_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/share/jexjtag"),
          m_home("HOME", (m_dir / "home").string()),
          m_locks("JEXJTAG_LOCK_DIR", (m_dir / "locks").string()),
          m_port("e2e-" + std::to_string(getpid()))
    {
        std::filesystem::create_directories(m_dir / "home");
        std::filesystem::create_directories(m_dir / "locks");
    }

    void SetUp() override
    {
        messages().clear();
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &m_handle));
    }

    void TearDown() override
    {
        if (m_handle != 0) {
            EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(m_handle));
        }
        m_handle = 0;
    }

    // Opens jtag_sim on the test's port with `chain` and any further arguments.
    uint32_t open(const std::string& chain, std::vector<std::string> extra = {}, JexJtagTargetInfo* info = nullptr,
                  unsigned handle = 0)
    {
        std::vector<std::string> args = {"chain=" + chain, "port=" + m_port};
        args.insert(args.end(), extra.begin(), extra.end());
        std::vector<const char*> argv;
        for (const std::string& a : args) argv.push_back(a.c_str());
        return JexJtag_target_open(handle ? handle : m_handle, "jtag_sim", nullptr, static_cast<unsigned>(argv.size()),
                                   argv.data(), info);
    }

    // ---- shifts through the C API -----------------------------------------------

    uint32_t loadInstruction(unsigned device, uint64_t opcode, unsigned irBits)
    {
        const std::vector<uint8_t> ir = bitsOf(opcode, irBits);
        return JexJtag_tap_shiftDeviceIR(m_handle, device, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, irBits,
                                         ir.data(), nullptr, nullptr, nullptr);
    }
    // Reads `bits` of the device's selected data register (TDI held low).
    uint64_t readDeviceDR(unsigned device, unsigned bits)
    {
        std::vector<uint8_t> tdo((bits + 7) / 8, 0xEE);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(m_handle, device, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE,
                                                         nullptr, bits, nullptr, tdo.data(), nullptr, nullptr));
        return valueOf(tdo, 0, bits);
    }
    uint32_t writeDeviceDR(unsigned device, uint64_t value, unsigned bits)
    {
        const std::vector<uint8_t> tdi = bitsOf(value, bits);
        return JexJtag_tap_shiftDeviceDR(m_handle, device, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, bits,
                                         tdi.data(), nullptr, nullptr, nullptr);
    }
    // Reads `bits` of the whole chain's IR or DR path with TDI held at `tdiLevel`.
    std::vector<uint8_t> readChain(bool ir, unsigned bits, bool tdiLevel, unsigned exitState = JEXJTAG_RUN_TEST_IDLE)
    {
        std::vector<uint8_t> tdo((bits + 7) / 8, 0);
        const unsigned char level = tdiLevel ? 0x01 : 0x00;
        const auto shift = ir ? JexJtag_tap_shiftChainIR : JexJtag_tap_shiftChainDR;
        EXPECT_EQ(JEX_SUCCESS,
                  shift(m_handle, JEXJTAG_SHIFT_READ, exitState, nullptr, bits, &level, tdo.data(), nullptr, nullptr));
        return tdo;
    }

    unsigned irLength(unsigned device)
    {
        unsigned irlen = 99;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getIRLength(m_handle, device, &irlen));
        return irlen;
    }
    std::string deviceIdcode(unsigned device)
    {
        char text[40] = "";
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(m_handle, device, text, sizeof text));
        return text;
    }
    unsigned deviceCount()
    {
        unsigned count = 99;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceCount(m_handle, &count));
        return count;
    }
    unsigned pin(unsigned which)
    {
        unsigned value = 99;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getPin(m_handle, which, &value));
        return value;
    }
    std::string option(const std::string& key)
    {
        char value[256] = "";
        unsigned size = sizeof value;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getOption(m_handle, key.c_str(), value, &size));
        return value;
    }

    testsupport::TempDir m_dir;
    testsupport::ScopedEnv m_plugins;
    testsupport::ScopedEnv m_data;
    testsupport::ScopedEnv m_home;
    testsupport::ScopedEnv m_locks;
    std::string m_port;
    unsigned m_handle = 0;
};

} // namespace e2e
