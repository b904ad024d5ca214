// SPDX-License-Identifier: MIT
// The simulated cable as a target end to end: options and target
// information, the firmware-update guard, failures reaching the host, and
// the VCD waveform the cable records.

#include <gtest/gtest.h>

#include <cstring>
#include <set>
#include <string>
#include <vector>

#include "SimSession.hpp"
#include "VcdFile.hpp"

using namespace e2e;

namespace {

using E2eTargetTest = SimSession;

bool startsWith(const std::string& text, const std::string& head) { return text.compare(0, head.size(), head) == 0; }

} // namespace

TEST_F(E2eTargetTest, OptionsAndTargetInformationComeFromTheCable)
{
    JexJtagTargetInfo info{};
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {"frequency=2M"}, &info));
    EXPECT_STREQ("jtag_sim", info.target_name);
    EXPECT_STREQ("jtag_sim", info.plugin_name);
    EXPECT_STREQ("1.0.0", info.fw_ver);
    EXPECT_STREQ("JexJtag", info.vendor);
    EXPECT_STREQ("2000000", info.frequency);
    EXPECT_EQ(m_port, info.port);
    EXPECT_EQ("JexJtag simulated JTAG cable on " + m_port + " (3 devices)", std::string(info.full_name));
    EXPECT_EQ("jtag_sim:" + m_port, std::string(info.target_uid));
    EXPECT_TRUE(startsWith(info.rawinfo, "port=" + m_port + ";frequency=2000000;chain=")) << info.rawinfo;
    EXPECT_EQ(0u, info.target_flags);
    EXPECT_GT(std::strlen(info.driver_ver) * std::strlen(info.plugin_ver), 0u);

    // Options round-trip, and the information follows them.
    EXPECT_EQ("2000000", option("frequency"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, "frequency", "125k"));
    EXPECT_EQ("125000", option("FREQUENCY"));
    JexJtagTargetInfo later{};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getInfo(m_handle, &later));
    EXPECT_STREQ("125000", later.frequency);
    EXPECT_EQ(m_port, option("port"));

    // A value too long for the buffer is cut, with its full length reported.
    char small[4] = "xyz";
    unsigned size = sizeof small;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getOption(m_handle, "frequency", small, &size));
    EXPECT_STREQ("125", small);
    EXPECT_EQ(6u, size);

    // A bad value is refused with a reason and the old value stays.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "frequency", "fast"));
    EXPECT_EQ("125000", option("frequency"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "colour", "blue"));
    const std::vector<std::string> errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(2u, errors.size());
    EXPECT_EQ("jtag_sim: frequency: \"fast\" is not a frequency of 1 Hz to 1000M", errors[0]);
    EXPECT_TRUE(startsWith(errors[1], "jtag_sim: unknown option \"colour\"")) << errors[1];

    // Another simulated board on the same cable is interrogated at once.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, "chain", kArtix.c_str()));
    EXPECT_EQ(1u, deviceCount());
    EXPECT_EQ(idcodeText(kArtixId), deviceIdcode(0));
}

TEST_F(E2eTargetTest, AvoidFirmwareUpdateClosesACableWithNewFirmware)
{
    JexJtagTargetInfo info{};
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {"new_firmware=1", "AVOID_FIRMWARE_UPDATE=True"}, &info));
    EXPECT_STREQ("jtag_sim", info.target_name) << "the record still comes back";
    EXPECT_EQ(unsigned{JEXJTAG_FLAG_NEW_FIRMWARE}, info.target_flags & JEXJTAG_FLAG_NEW_FIRMWARE);
    unsigned status = 77;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_getLockStatus(m_handle, &status)) << "no target is left";
    EXPECT_EQ(77u, status);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(m_handle));

    // Without new firmware, or without the guard, the cable stays open.
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {"new_firmware=0", "AVOID_FIRMWARE_UPDATE=true"}, &info));
    EXPECT_EQ(0u, info.target_flags);
    EXPECT_EQ(3u, deviceCount());
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {"new_firmware=yes", "AVOID_FIRMWARE_UPDATE=no"}, &info));
    EXPECT_EQ(1u, info.target_flags);
    EXPECT_EQ("1", option("new_firmware")) << "the target is open";
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
}

TEST_F(E2eTargetTest, FailedOpensLeaveNoTargetAndTellTheHostWhy)
{
    EXPECT_EQ(JEX_FAILURE, open("0x12:4")); // an IDCODE needs bit 0 set
    std::vector<std::string> errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(1u, errors.size());
    EXPECT_TRUE(startsWith(errors[0], "jtag_sim: chain: ")) << errors[0];
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_close(m_handle));

    const char* argv[] = {"port=x"};
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_open(m_handle, "no_such_cable", nullptr, 1, argv, nullptr));
    errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(2u, errors.size());
    EXPECT_EQ("Could not open plugin of the type: no_such_cable. Please check to make sure the correct plug-in for "
              "this type is installed.\n",
              errors[1]);

    // The session is still good for a real open.
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    EXPECT_EQ(3u, deviceCount());
}

// An instruction register longer than interrogation reads (65 devices of
// 64 IR bits) is reported as that limit, not as a capture of too few bits.
TEST_F(E2eTargetTest, AnIrBeyondTheInterrogationLimitNamesTheLimit)
{
    std::string chain;
    for (int d = 0; d < 65; ++d) chain += std::string(d ? "," : "") + "none:64";
    ASSERT_EQ(JEX_SUCCESS, open(chain));
    EXPECT_EQ(0u, deviceCount());
    const std::vector<std::string> warnings = messagesOfType(JEX_MSG_WARNING);
    ASSERT_EQ(1u, warnings.size());
    EXPECT_EQ("jtag_sim: the chain cannot be interrogated: the instruction registers are longer than 4096 bits, "
              "the most an interrogation reads",
              warnings[0]);
}

// A waveform that cannot be written (a full disk; /dev/full fails every
// write) is a failing operation with a message, never a silently cut file.
TEST_F(E2eTargetTest, AWaveformThatCannotBeWrittenFails)
{
    EXPECT_EQ(JEX_FAILURE, open(kThreeDevices, {"vcd=/dev/full"}));
    const std::vector<std::string> errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(1u, errors.size());
    EXPECT_EQ("jtag_sim: writing the waveform to /dev/full failed (No space left on device); recording stopped",
              errors[0]);
}

TEST_F(E2eTargetTest, WaveformRecordsPinsAndEveryDeviceState)
{
    const std::string path = (m_dir / "session.vcd").string();
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {"vcd=" + path}));
    EXPECT_EQ(path, option("vcd"));
    // A 1 ms wait marks the end of open's reset and interrogation in the
    // waveform; then one clock to Run-Test/Idle and ten more there.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_waitTime(m_handle, 1000));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(m_handle, JEXJTAG_RUN_TEST_IDLE, 10, 0));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));

    // The file's form is the recorder's own tests' business; here: the four
    // wires and two signals per device, and the session's activity in time.
    const vcdtest::Vcd vcd = vcdtest::parse(path);
    ASSERT_TRUE(vcd.definitionsEnded);
    std::set<std::string> names;
    for (const auto& [id, name] : vcd.names) names.insert(name);
    EXPECT_EQ((std::set<std::string>{"tck", "tms", "tdi", "tdo", "dev0_state", "dev0_tap", "dev1_state", "dev1_tap",
                                     "dev2_state", "dev2_tap"}),
              names);
    size_t changes = 0;
    for (const char* wire : {"tck", "tms", "tdi", "tdo"}) changes += vcd.changes.at(wire).size();
    EXPECT_GT(changes, 100u) << "open's reset and interrogation are recorded";

    uint64_t gapAt = 0;
    for (size_t i = 1; i < vcd.times.size() && gapAt == 0; ++i)
        if (vcd.times[i] - vcd.times[i - 1] >= 1000000000ull) gapAt = vcd.times[i];
    ASSERT_NE(0u, gapAt) << "the 1 ms wait is on the time axis";
    unsigned risesAfterGap = 0;
    for (const auto& [t, v] : vcd.changes.at("tck")) risesAfterGap += t >= gapAt && v == "1";
    EXPECT_EQ(11u, risesAfterGap) << "one clock into Run-Test/Idle and ten held there";
    for (const std::string device : {"dev0", "dev1", "dev2"}) {
        EXPECT_EQ("0001", vcd.changes.at(device + "_state").back().second) << device;
        EXPECT_EQ("Run-Test/Idle", vcd.changes.at(device + "_tap").back().second) << device;
    }
}
