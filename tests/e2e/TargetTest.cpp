// The simulated cable as a target end to end: options and target
// information, the firmware-update guard, failures reaching the host, and
// the VCD waveform the cable records.

#include <gtest/gtest.h>

#include <cstdlib>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "SimSession.hpp"

using namespace e2e;

namespace {

using E2eTargetTest = SimSession;

bool startsWith(const std::string& text, const std::string& head) { return text.compare(0, head.size(), head) == 0; }

std::vector<std::string> linesOf(const std::string& text)
{
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
}

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
    EXPECT_EQ("1", option("new_firmware"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 0, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));
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

    const std::vector<std::string> lines = linesOf(testsupport::readFile(path));
    ASSERT_FALSE(lines.empty());
    EXPECT_TRUE(startsWith(lines[0], "$date "));

    // Header: the four wires and two signals per device, then the end of
    // the definitions.
    std::map<std::string, std::string> wires;  // id -> name
    std::map<std::string, std::string> states; // id -> name
    std::map<std::string, std::string> taps;   // id -> name
    size_t line = 0;
    bool timescale = false;
    for (; line < lines.size() && lines[line] != "$enddefinitions $end"; ++line) {
        const std::string& l = lines[line];
        timescale = timescale || l == "$timescale 1ps $end";
        if (!startsWith(l, "$var ")) continue;
        std::istringstream fields(l.substr(5));
        std::string kind, width, id, name, end;
        fields >> kind >> width >> id >> name >> end;
        EXPECT_EQ("$end", end) << l;
        if (kind == "wire" && width == "1") wires[id] = name;
        else if (kind == "reg" && width == "4") states[id] = name;
        else if (kind == "string" && width == "1") taps[id] = name;
        else ADD_FAILURE() << "unexpected declaration: " << l;
    }
    ASSERT_LT(line, lines.size()) << "no $enddefinitions";
    EXPECT_TRUE(timescale);
    std::map<std::string, std::string> wireId; // name -> id
    for (const auto& [id, name] : wires) wireId[name] = id;
    ASSERT_EQ(4u, wireId.size());
    for (const char* name : {"tck", "tms", "tdi", "tdo"}) EXPECT_EQ(1u, wireId.count(name)) << name;
    ASSERT_EQ(3u, states.size());
    ASSERT_EQ(3u, taps.size());
    std::map<std::string, std::string> lastState; // device signal name -> last value
    std::set<std::string> deviceSignals;
    for (const auto& [id, name] : states) deviceSignals.insert(name);
    for (const auto& [id, name] : taps) deviceSignals.insert(name);
    EXPECT_EQ((std::set<std::string>{"dev0_state", "dev0_tap", "dev1_state", "dev1_tap", "dev2_state", "dev2_tap"}),
              deviceSignals);

    // Body: time stamps that only grow, and value changes of declared signals.
    ++line;
    ASSERT_LT(line + 1, lines.size());
    EXPECT_EQ("#0", lines[line]);
    EXPECT_EQ("$dumpvars", lines[line + 1]);
    unsigned long long now = 0;
    unsigned long long gapAt = 0;
    unsigned risesAfterGap = 0;
    unsigned changes = 0;
    for (line += 2; line < lines.size(); ++line) {
        const std::string& l = lines[line];
        if (l == "$end") continue;
        if (l[0] == '#') {
            const unsigned long long t = std::strtoull(l.c_str() + 1, nullptr, 10);
            EXPECT_GE(t, now) << l;
            if (t - now >= 1000000000ull && gapAt == 0) gapAt = t;
            now = t;
        } else if (l[0] == '0' || l[0] == '1') {
            ASSERT_EQ(1u, wires.count(l.substr(1))) << l;
            if (gapAt != 0 && l == "1" + wireId["tck"]) ++risesAfterGap;
            ++changes;
        } else if (l[0] == 'b') {
            ASSERT_EQ(5u, l.find(' ')) << l;
            ASSERT_EQ(1u, states.count(l.substr(6))) << l;
            EXPECT_EQ(std::string::npos, l.substr(1, 4).find_first_not_of("01")) << l;
            lastState[states[l.substr(6)]] = l.substr(1, 4);
        } else if (l[0] == 's') {
            const size_t space = l.rfind(' ');
            ASSERT_NE(std::string::npos, space) << l;
            ASSERT_EQ(1u, taps.count(l.substr(space + 1))) << l;
            lastState[taps[l.substr(space + 1)]] = l.substr(1, space - 1);
        } else {
            ADD_FAILURE() << "unexpected line: " << l;
        }
    }
    EXPECT_GT(changes, 100u) << "open's reset and interrogation are recorded";
    EXPECT_NE(0u, gapAt) << "the 1 ms wait is on the time axis";
    EXPECT_EQ(11u, risesAfterGap) << "one clock into Run-Test/Idle and ten held there";
    for (const char* device : {"dev0", "dev1", "dev2"}) {
        EXPECT_EQ("0001", lastState[std::string(device) + "_state"]) << device;
        EXPECT_EQ("Run-Test/Idle", lastState[std::string(device) + "_tap"]) << device;
    }
}
