// SPDX-License-Identifier: MIT
// The simulated chain end to end through the C API: the road of a typical
// host, autodetection against the shipped idcode.lst, device-relative and
// whole-chain shifts, the user register and pin-level TAP walking.

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "SimSession.hpp"

using namespace e2e;

namespace {

using E2eChainTest = SimSession;

constexpr unsigned kIdcodeOp[3] = {0xE, 0x9, 0xE0};
constexpr unsigned kUserOp[3] = {0xA, 0x2, 0x32};
constexpr unsigned kUserBits[3] = {35, 32, 32};
constexpr unsigned kIrBits[3] = {4, 6, 8};
constexpr uint32_t kIds[3] = {kDapId, kArtixId, kEcp5Id};

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

} // namespace

TEST_F(E2eChainTest, TypicalUseFromSessionToDestroy)
{
    // The plug-in tree of the build offers jtag_sim with its descriptor.
    unsigned count = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetCount(m_handle, &count));
    int index = -1;
    for (unsigned i = 0; i < count; ++i) {
        unsigned size = 0;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetXMLSizeByIndex(m_handle, i, &size));
        std::vector<char> xml(size);
        char name[64];
        char plugin[64];
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_getTargetByIndex(m_handle, i, xml.data(), size, name, sizeof name,
                                                                plugin, sizeof plugin));
        if (std::string(name) != "jtag_sim") continue;
        index = static_cast<int>(i);
        EXPECT_STREQ("jtag_sim", plugin);
        EXPECT_EQ(size, std::strlen(xml.data()) + 1) << "the whole descriptor fits the size the library gave";
        EXPECT_TRUE(contains(xml.data(), "<targetname>jtag_sim</targetname>"));
        EXPECT_TRUE(contains(xml.data(), "chain=ID:IRLEN")) << "the description text comes along";
        EXPECT_TRUE(contains(xml.data(), "</JexPlugin>"));
    }
    ASSERT_GE(index, 0) << "jtag_sim not found under " << JEXJTAG_TEST_BUILD_DIR << "/lib/plugins";

    JexJtagTargetInfo info{};
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {}, &info));
    EXPECT_STREQ("jtag_sim", info.target_name);

    unsigned lockStatus = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 1000, &lockStatus));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, lockStatus);

    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));
    ASSERT_EQ(3u, deviceCount());
    EXPECT_EQ(6u, irLength(1));

    ASSERT_EQ(JEX_SUCCESS, loadInstruction(1, 0x9, 6));
    EXPECT_EQ(kArtixId, readDeviceDR(1, 32));

    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getLockStatus(m_handle, &lockStatus));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, lockStatus);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(m_handle)) << "the target is gone";
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(m_handle));
    m_handle = 0;

    EXPECT_TRUE(messagesOfType(JEX_MSG_ERROR).empty());
    EXPECT_TRUE(messagesOfType(JEX_MSG_WARNING).empty());
}

TEST_F(E2eChainTest, AutodetectCorrectsGuessedIrLengthsFromTheDeviceDatabase)
{
    // The last device's Capture-IR value (binary 00000101) shows two places
    // where an IR could start; the plug-in's scan guesses 4, 8, 6 and says so.
    ASSERT_EQ(JEX_SUCCESS, open(kDap + "," + kArtix + "," + kEcp5 + ":capture=0x05"));
    const std::vector<std::string> warnings = messagesOfType(JEX_MSG_WARNING);
    ASSERT_EQ(1u, warnings.size());
    EXPECT_TRUE(contains(warnings[0], "assuming 4,8,6")) << warnings[0];
    EXPECT_EQ(8u, irLength(1));
    EXPECT_EQ(6u, irLength(2));

    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_WALKING_ONES));
    ASSERT_EQ(3u, deviceCount());
    for (unsigned d = 0; d < 3; ++d) {
        EXPECT_EQ(idcodeText(kIds[d]), deviceIdcode(d)) << d;
        EXPECT_EQ(kIrBits[d], irLength(d)) << d;
    }
    char bypass[16];
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getBypassCmd(m_handle, 2, bypass, sizeof bypass));
    EXPECT_STREQ("11111111", bypass);

    // With the right lengths the last device answers a device-relative scan.
    ASSERT_EQ(JEX_SUCCESS, loadInstruction(2, 0xE0, 8));
    EXPECT_EQ(kEcp5Id, readDeviceDR(2, 32));
}

TEST_F(E2eChainTest, AutodetectGivesDevicesTheDatabaseDoesNotKnowIrLengthZero)
{
    const char* unknown = "00010010001101000101011001111111"; // 0x1234567F
    unsigned dbLength = 99;
    char name[64];
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_getIRLengthForIdcode(m_handle, unknown, &dbLength));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_getDeviceNameForIdcode(m_handle, unknown, name, sizeof name));
    ASSERT_EQ(0u, dbLength) << "0x1234567F is in idcode.lst as " << name;

    ASSERT_EQ(JEX_SUCCESS, open("0x1234567F:5," + kArtix + ",none:3"));
    // The plug-in's own scan found the real lengths ...
    EXPECT_EQ(5u, irLength(0));
    EXPECT_EQ(3u, irLength(2));
    // ... and autodetect replaces them with the database's answer.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));
    ASSERT_EQ(3u, deviceCount());
    EXPECT_EQ(unknown, deviceIdcode(0));
    EXPECT_EQ(idcodeText(kArtixId), deviceIdcode(1));
    EXPECT_EQ(idcodeText(0), deviceIdcode(2)) << "a device without IDCODE";
    EXPECT_EQ(0u, irLength(0));
    EXPECT_EQ(6u, irLength(1));
    EXPECT_EQ(0u, irLength(2));
    EXPECT_TRUE(messagesOfType(JEX_MSG_ERROR).empty());
}

TEST_F(E2eChainTest, DeviceShiftsAddressOnlyTheirDevice)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));

    for (unsigned d = 0; d < 3; ++d) {
        SCOPED_TRACE("device " + std::to_string(d));
        // IDCODE into device d; the plug-in fills the other IRs with BYPASS.
        ASSERT_EQ(JEX_SUCCESS, loadInstruction(d, kIdcodeOp[d], kIrBits[d]));
        EXPECT_EQ(kIds[d], readDeviceDR(d, 32));

        // The whole DR path: one BYPASS bit (captured 0) for every other
        // device, the IDCODE at device d's place, then what TDI drove (1).
        const std::vector<uint8_t> path = readChain(false, 34 + 6, true);
        EXPECT_EQ(0u, valueOf(path, 0, d));
        EXPECT_EQ(kIds[d], valueOf(path, d, 32));
        EXPECT_EQ(0u, valueOf(path, d + 32, 2 - d));
        EXPECT_EQ(0x3Fu, valueOf(path, 34, 6));
    }

    // A device outside the chain is refused by the plug-in, and the host hears why.
    std::vector<uint8_t> tdo(4);
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_shiftDeviceDR(m_handle, 3, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                     32, nullptr, tdo.data(), nullptr, nullptr));
    const std::vector<std::string> errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(1u, errors.size());
    EXPECT_EQ("jtag_sim: device 3 is outside the chain of 3 devices", errors[0]);
}

TEST_F(E2eChainTest, UserRegistersKeepWhatWasWritten)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));

    const uint64_t values[3] = {0x5A5A5A5A5ull | (uint64_t{1} << 34), 0x12345678u, 0xCAFEF00Du};
    for (unsigned d = 0; d < 3; ++d) {
        ASSERT_EQ(JEX_SUCCESS, loadInstruction(d, kUserOp[d], kIrBits[d]));
        ASSERT_EQ(JEX_SUCCESS, writeDeviceDR(d, values[d], kUserBits[d]));
    }
    // Each register still holds its own value after the others were written
    // (read back while shifting the same value in again).
    for (unsigned d = 0; d < 3; ++d) {
        ASSERT_EQ(JEX_SUCCESS, loadInstruction(d, kUserOp[d], kIrBits[d]));
        const std::vector<uint8_t> same = bitsOf(values[d], kUserBits[d]);
        std::vector<uint8_t> back(same.size(), 0);
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(m_handle, d, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE,
                                                         nullptr, kUserBits[d], same.data(), back.data(), nullptr,
                                                         nullptr));
        EXPECT_EQ(values[d], valueOf(back, 0, kUserBits[d])) << "device " << d;
    }
}

TEST_F(E2eChainTest, WholeChainReadsShowCapturePatternsAndResumeFromPause)
{
    // Capture-IR values 1101, 111101, 11110001 (binary) for devices 0, 1, 2.
    ASSERT_EQ(JEX_SUCCESS, open("0x4BA00477:4:idcode=0xE:capture=0xD,0x0362D093:6:idcode=0x9:capture=0x3D,"
                                "0x41111043:8:idcode=0xE0:capture=0xF1"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));

    // Device 0's captured IR leaves first; after the 18 IR bits come the
    // bits TDI drove, at the level of the first TDI byte (0x80 counts as high).
    std::vector<uint8_t> ir(3, 0);
    const unsigned char high = 0x80;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(m_handle, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, nullptr, 24,
                                                    &high, ir.data(), nullptr, nullptr));
    EXPECT_EQ(0xDu, valueOf(ir, 0, 4));
    EXPECT_EQ(0x3Du, valueOf(ir, 4, 6));
    EXPECT_EQ(0xF1u, valueOf(ir, 10, 8));
    EXPECT_EQ(0x3Fu, valueOf(ir, 18, 6));
    ir = readChain(true, 24, false);
    EXPECT_EQ(0xDu | (0x3Du << 4) | (0xF1u << 10), valueOf(ir, 0, 24)) << "TDI low shifts zeros in";

    // A TDO mask keeps only the bits it selects: here device 1's capture.
    const std::vector<uint8_t> mask = bitsOf(0x3F << 4, 24);
    std::vector<uint8_t> masked(3, 0xFF);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(m_handle, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, nullptr, 24,
                                                    nullptr, masked.data(), nullptr, mask.data()));
    EXPECT_EQ(0x3Du << 4, valueOf(masked, 0, 24));

    // After a reset every device shows its IDCODE. A scan that stops in
    // Pause-DR continues where it stopped: the two parts make up the chain.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(m_handle, JEXJTAG_TEST_LOGIC_RESET, 0, 0));
    std::vector<uint8_t> first = readChain(false, 20, true, JEXJTAG_PAUSE_DR);
    std::vector<uint8_t> rest = readChain(false, 76, true, JEXJTAG_RUN_TEST_IDLE);
    const uint64_t joined = valueOf(first, 0, 20) | (valueOf(rest, 0, 12) << 20);
    EXPECT_EQ(kDapId, joined);
    EXPECT_EQ(kArtixId, valueOf(rest, 12, 32));
    EXPECT_EQ(kEcp5Id, valueOf(rest, 44, 32));
}

TEST_F(E2eChainTest, PinsWalkTheTapControllerAndReadTheIdcodes)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT));

    // Leave the TAPs somewhere else with BYPASS in every IR.
    const std::vector<uint8_t> ones(3, 0xFF);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(m_handle, JEXJTAG_SHIFT_WRITE, JEXJTAG_PAUSE_DR, nullptr, 18,
                                                    ones.data(), nullptr, nullptr, nullptr));
    EXPECT_EQ(1u, pin(JEXJTAG_TCK)) << "after an operation TCK rests high";

    // Five clocks with TMS high reach Test-Logic-Reset, which selects IDCODE.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setPin(m_handle, JEXJTAG_TMS, 1));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_pulsePin(m_handle, JEXJTAG_TCK, 5));
    EXPECT_EQ(1u, pin(JEXJTAG_TMS));
    EXPECT_EQ(1u, pin(JEXJTAG_TCK));

    // Run-Test/Idle, Select-DR-Scan, Capture-DR, Shift-DR.
    for (unsigned tms : {0u, 1u, 0u, 0u}) {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setPin(m_handle, JEXJTAG_TMS, tms));
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_pulsePin(m_handle, JEXJTAG_TCK, 1));
    }
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setPin(m_handle, JEXJTAG_TDI, 0));
    // In Shift-DR TDO shows the next bit; each TCK pulse moves one on.
    std::vector<uint8_t> bits(12, 0);
    for (unsigned i = 0; i < 96; ++i) {
        if (pin(JEXJTAG_TDO)) bits[i / 8] |= static_cast<uint8_t>(1u << (i % 8));
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_pulsePin(m_handle, JEXJTAG_TCK, 1));
    }
    EXPECT_EQ(kDapId, valueOf(bits, 0, 32));
    EXPECT_EQ(kArtixId, valueOf(bits, 32, 32));
    EXPECT_EQ(kEcp5Id, valueOf(bits, 64, 32));
    EXPECT_EQ(0u, pin(JEXJTAG_TDO)) << "the zeros TDI drove come out after the chain";

    // Exit1-DR: TDO is released and reads high.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setPin(m_handle, JEXJTAG_TMS, 1));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_pulsePin(m_handle, JEXJTAG_TCK, 1));
    EXPECT_EQ(1u, pin(JEXJTAG_TDO));

    // The cable followed the walk: scans from here take the right path.
    ASSERT_EQ(JEX_SUCCESS, loadInstruction(2, 0xE0, 8));
    EXPECT_EQ(kEcp5Id, readDeviceDR(2, 32));

    // TDO is an input: setting it fails, and the host is told.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setPin(m_handle, JEXJTAG_TDO, 1));
    EXPECT_EQ(1u, messagesOfType(JEX_MSG_ERROR).size());
}
