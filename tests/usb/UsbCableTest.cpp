// SPDX-License-Identifier: MIT
// The ormund_usbcable plug-in end to end: the library's C API, the plug-in of
// the build tree, the real libftdi1, and the emulated FTDI adapter behind the
// stand-in libusb-1.0 that this binary links (FtdiEmuControl.h).  Where a
// behaviour is the simulator's too, the two cables must agree bit for bit.

#include <gtest/gtest.h>

#include <errno.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <random>
#include <string>
#include <utility>
#include <vector>

#include "FtdiEmuControl.h"
#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

namespace {

using testsupport::ScopedEnv;

std::vector<std::string> g_errors;
void keepMessage(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR) g_errors.emplace_back(text ? text : "");
}

class UsbCable : public ::testing::Test {
protected:
    UsbCable()
        : m_plugins("JEXJTAG_PLUGIN_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins"),
          m_data("JEXJTAG_DATA_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/share/jexjtag"),
          m_home("HOME", (m_dir / "home").string()), m_locks("JEXJTAG_LOCK_DIR", (m_dir / "locks").string()),
          m_control("JEXJTAG_FTDI_EMU_CONTROL", (m_dir / "control").string())
    {
        std::filesystem::create_directories(m_dir / "home");
        std::filesystem::create_directories(m_dir / "locks");
    }
    void SetUp() override
    {
        g_errors.clear();
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &m_handle));
        jexjtag_ftdi_emu_reset_counters();
    }
    void TearDown() override { EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(m_handle)); }

    uint32_t open(const std::vector<std::string>& args, const char* type = "ormund_usbcable", unsigned handle = 0)
    {
        std::vector<const char*> argv;
        for (const std::string& a : args) argv.push_back(a.c_str());
        return JexJtag_target_open(handle ? handle : m_handle, type, nullptr, static_cast<unsigned>(argv.size()),
                                   argv.data(), nullptr);
    }
    std::string lastError() const { return g_errors.empty() ? "" : g_errors.back(); }
    std::vector<uint8_t> shiftDR(unsigned handle, const std::vector<uint8_t>& tdi, unsigned bits, unsigned exit)
    {
        std::vector<uint8_t> tdo((bits + 7) / 8, 0);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainDR(handle, JEXJTAG_SHIFT_READWRITE, exit, nullptr, bits,
                                                        tdi.data(), tdo.data(), nullptr, nullptr));
        return tdo;
    }
    std::string option(const std::string& key)
    {
        char value[256] = "";
        unsigned size = sizeof value;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_getOption(m_handle, key.c_str(), value, &size));
        return value;
    }
    FtdiEmuChannel channel(unsigned adapter = 0, unsigned which = 0)
    {
        FtdiEmuChannel state{};
        EXPECT_EQ(0, jexjtag_ftdi_emu_channel(adapter, which, &state));
        return state;
    }

    testsupport::TempDir m_dir;
    ScopedEnv m_plugins, m_data, m_home, m_locks, m_control;
    unsigned m_handle = 0;
};

uint64_t bitsValue(const std::vector<uint8_t>& b, unsigned first, unsigned n)
{
    uint64_t v = 0;
    for (unsigned i = 0; i < n; ++i) v |= uint64_t{(b[(first + i) / 8] >> ((first + i) % 8)) & 1u} << i;
    return v;
}

} // namespace

TEST_F(UsbCable, TypicalUseRunsThroughTheEmulatedAdapter)
{
    ASSERT_EQ(JEX_SUCCESS, open({}));
    JexJtagTargetInfo info{};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getInfo(m_handle, &info));
    EXPECT_STREQ("FT2232H", info.fw_ver);
    EXPECT_STREQ("bus 1 port 2.1", info.port);
    EXPECT_STREQ("1000000", info.frequency);
    EXPECT_NE(std::string::npos, std::string(info.driver_ver).find("libftdi1 1.")) << info.driver_ver;
    EXPECT_NE(std::string::npos, std::string(info.rawinfo).find("profile=ft2232h;chip=FT2232H;serial=JEX0001"))
        << info.rawinfo;

    unsigned status = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 1000, &status));
    EXPECT_TRUE(std::filesystem::exists(m_dir / "locks" / "ftdi-JEX0001.lock"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, 0));
    unsigned count = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceCount(m_handle, &count));
    EXPECT_EQ(3u, count);
    char id[40] = "";
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(m_handle, 1, id, sizeof id));
    EXPECT_STREQ("00000011011000101101000010010011", id); // 0x0362D093

    // Device 0's 35-bit scratch register (USER 0xA) through device shifts.
    const uint8_t user[] = {0x0A};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceIR(m_handle, 0, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                     4, user, nullptr, nullptr, nullptr));
    const uint64_t value = 0x5A5A5A5A5ull;
    std::vector<uint8_t> in(5);
    for (unsigned i = 0; i < 5; ++i) in[i] = static_cast<uint8_t>(value >> (8 * i));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(m_handle, 0, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                     35, in.data(), nullptr, nullptr, nullptr));
    std::vector<uint8_t> out(5, 0);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(m_handle, 0, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                     35, nullptr, out.data(), nullptr, nullptr));
    EXPECT_EQ(value, bitsValue(out, 0, 35));

    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    EXPECT_FALSE(channel().mpsse) << "closing returns the channel to its reset mode";
}

// Every TAP state as a start and as an end of a scan, against jtag_sim on the
// same chain: the MPSSE TMS commands, the last bit's TMS move and the bit
// and byte shifts must clock exactly what the simulator clocks.
TEST_F(UsbCable, TmsPathsAndScansAgreeWithTheSimulator)
{
    ASSERT_EQ(JEX_SUCCESS, open({"frequency=30M"}));
    unsigned sim = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &sim));
    ASSERT_EQ(JEX_SUCCESS, open({"port=usb-compare"}, "jtag_sim", sim));
    std::mt19937 random(7);
    for (unsigned from = 0; from < JEXJTAG_STATE_SIZE; ++from) {
        const unsigned to = (from * 7 + 3) % JEXJTAG_STATE_SIZE;
        const unsigned bits = 1 + random() % 150;
        const unsigned hold = random() % 3000;
        std::vector<uint8_t> tdi((bits + 7) / 8);
        for (uint8_t& b : tdi) b = static_cast<uint8_t>(random());
        std::vector<uint8_t> results[2];
        const unsigned handles[2] = {m_handle, sim};
        for (int k = 0; k < 2; ++k) {
            ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(handles[k], JEXJTAG_TEST_LOGIC_RESET, 0, 0));
            // Holding a state that TMS cannot hold fails alike on both.
            const uint32_t moved = JexJtag_tap_navigate(handles[k], from, hold, 0);
            results[k].push_back(static_cast<uint8_t>(moved == JEX_SUCCESS));
            if (moved != JEX_SUCCESS) {
                ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(handles[k], from, 0, 0));
            }
            results[k] = shiftDR(handles[k], tdi, bits, to);
            std::vector<uint8_t> ir(3, 0);
            const unsigned char low = 0;
            ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(handles[k], JEXJTAG_SHIFT_READ, JEXJTAG_PAUSE_IR, nullptr,
                                                            18, &low, ir.data(), nullptr, nullptr));
            results[k].insert(results[k].end(), ir.begin(), ir.end());
            unsigned tms = 9;
            ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getPin(handles[k], JEXJTAG_TDO, &tms));
            results[k].push_back(static_cast<uint8_t>(tms));
        }
        EXPECT_EQ(results[1], results[0]) << "from state " << from << " to " << to << ", " << bits << " bits";
    }
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(sim));
}

// Long scans on each chip: many USB packets (512 bytes, 64 on the
// full-speed FT2232D), each with its status bytes, and many transactions,
// each within the chip's IN FIFO.
TEST_F(UsbCable, LongScansSpanManyPacketsAndComeBackWhole)
{
    const struct {
        const char* adapter;
        unsigned bits;
        uint64_t minWrites, maxWrites;
    } cases[] = {{"0403:6010:2232H:Dual RS232-HS:H", 1u << 20, 32, 40},
                 {"0403:6014:232H:Single RS232-HS:S", 1u << 18, 32, 40},
                 {"0403:6010:2232D:Dual RS232:D", 1u << 16, 22, 30}};
    for (const auto& k : cases) {
        ScopedEnv adapter("JEXJTAG_FTDI_EMU_ADAPTERS", k.adapter);
        ASSERT_EQ(JEX_SUCCESS, open({}));
        std::vector<uint8_t> tdi(k.bits / 8);
        std::mt19937 random(k.bits);
        for (uint8_t& b : tdi) b = static_cast<uint8_t>(random());
        jexjtag_ftdi_emu_reset_counters();
        const std::vector<uint8_t> tdo = shiftDR(m_handle, tdi, k.bits, JEXJTAG_RUN_TEST_IDLE);
        // After reset the DR path is the three 32-bit IDCODE registers.
        EXPECT_EQ(0x4BA00477u, bitsValue(tdo, 0, 32)) << k.adapter;
        EXPECT_EQ(0x41111043u, bitsValue(tdo, 64, 32)) << k.adapter;
        EXPECT_TRUE(std::equal(tdi.begin(), tdi.end() - 12, tdo.begin() + 12)) << k.adapter;
        FtdiEmuCounters c{};
        jexjtag_ftdi_emu_counters(&c);
        EXPECT_GE(c.bulkOut, k.minWrites) << k.adapter;
        EXPECT_LE(c.bulkOut, k.maxWrites) << k.adapter;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    }
}

TEST_F(UsbCable, FrequencyPicksTheDivisorThatDoesNotExceedTheRequest)
{
    ASSERT_EQ(JEX_SUCCESS, open({}));
    const struct {
        const char* request;
        uint32_t tck;
        uint16_t divisor;
        bool divideBy5;
    } cases[] = {{"30M", 30000000, 0, false}, {"15M", 15000000, 1, false}, {"10M", 10000000, 2, false},
                 {"7M", 6000000, 4, false},   {"1M", 1000000, 29, false},   {"100k", 100000, 299, false},
                 {"400", 400, 14999, true}};
    for (const auto& c : cases) {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, "frequency", c.request)) << c.request;
        EXPECT_EQ(std::to_string(c.tck), option("frequency")) << c.request;
        const FtdiEmuChannel state = channel();
        EXPECT_EQ(c.divisor, state.divisor) << c.request;
        EXPECT_EQ(c.tck, state.tckHz) << c.request;
        EXPECT_EQ(c.divideBy5, state.divideBy5 != 0) << c.request;
        EXPECT_FALSE(state.threePhase);
    }
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "frequency", "fast"));
}

TEST_F(UsbCable, ResetLinesAndPinsFollowTheProfile)
{
    ScopedEnv adapter("JEXJTAG_FTDI_EMU_ADAPTERS", "0403:cff8:2232H:Amontec JTAGkey-2:KEY2");
    ASSERT_EQ(JEX_SUCCESS, open({"cable=jtagkey2"}));
    EXPECT_EQ(0x0F1Bu, channel().directions);
    EXPECT_EQ(0x0900u, channel().pins & 0x0F00u) << "nTRST released through its buffer, nSRST buffer off";
    // nTRST ACBUS0 (buffer enable ACBUS2, active low), nSRST ACBUS1 (enable ACBUS3).
    const struct {
        const char* key;
        const char* value;
        uint16_t pins; // ACBUS0-3
    } steps[] = {{"trst", "1", 0x0800}, {"srst", "1", 0x0000}, {"trst", "0", 0x0100}, {"srst", "0", 0x0900}};
    for (const auto& s : steps) {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, s.key, s.value));
        EXPECT_EQ(s.pins, channel().pins & 0x0F00u) << s.key << "=" << s.value;
    }
    // A free pin (ACBUS5 = 29) becomes an output; one the reset lines use is refused.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setPin(m_handle, 29, 1));
    EXPECT_EQ(0x2000u, channel().pins & channel().directions & 0x2000u);
    unsigned level = 9;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getPin(m_handle, 29, &level));
    EXPECT_EQ(1u, level);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setPin(m_handle, 24, 0));
}

TEST_F(UsbCable, BadCommandAnswersFailClearly)
{
    {
        ScopedEnv reject("JEXJTAG_FTDI_EMU_REJECT", "0x8A");
        ASSERT_EQ(JEX_FAILURE, open({}));
        EXPECT_NE(std::string::npos, lastError().find("\"bad command\" to MPSSE command 0x8A")) << lastError();
    }
    ScopedEnv reject("JEXJTAG_FTDI_EMU_REJECT", "0x96");
    ASSERT_EQ(JEX_SUCCESS, open({}));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "adaptive", "1"));
    EXPECT_NE(std::string::npos, lastError().find("0x96")) << lastError();
    EXPECT_EQ("0", option("adaptive"));
    const std::vector<uint8_t> tdo = shiftDR(m_handle, std::vector<uint8_t>(4, 0), 32, JEXJTAG_RUN_TEST_IDLE);
    EXPECT_EQ(0x4BA00477u, bitsValue(tdo, 0, 32)) << "the cable goes on working";
}

TEST_F(UsbCable, UnpluggedMidScanFailsEveryLaterCallQuickly)
{
    ASSERT_EQ(JEX_SUCCESS, open({}));
    unsigned status = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 1000, &status));
    testsupport::writeFile(m_dir / "control", "unplug-after 5");
    std::vector<uint8_t> tdi(1u << 17), tdo(tdi.size());
    EXPECT_EQ(JEX_FAILURE, JexJtag_tap_shiftChainDR(m_handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                    1u << 20, tdi.data(), tdo.data(), nullptr, nullptr));
    EXPECT_NE(std::string::npos, lastError().find("unplugged")) << lastError();
    // A move is queued until something must reach the chip.
    EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_navigate(m_handle, JEXJTAG_RUN_TEST_IDLE, 10, 0));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_flush(m_handle));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    EXPECT_EQ(JEX_FAILURE, open({}));
    EXPECT_NE(std::string::npos, lastError().find("no USB adapter found")) << lastError();
}

TEST_F(UsbCable, OpenFailuresSayWhatIsWrong)
{
    const struct {
        const char* env;
        std::vector<std::string> args;
        const char* text;
    } cases[] = {
        {"0", {"vid=1234", "pid=5678"}, "no USB adapter found (USB ids 1234:5678"},
        {"0", {"cable=olimex-arm-usb-tiny-h"}, "no USB adapter found (USB ids 15ba:002a, cable olimex-arm-usb-tiny-h"},
        {"0", {"serial=NOPE"}, "no USB adapter found"},
        {"0", {"cable=nonesuch"}, "unknown cable \"nonesuch\" (known: olimex-arm-usb-ocd-h,"},
        {"0", {"channel=E"}, "channel=E is not A, B, C or D"},
        {"0", {"frequency=-3"}, "frequency=-3 is not a frequency"},
        {"1", {}, "permission denied: install the udev rule share/jexjtag/udev/60-jexjtag-ftdi.rules"},
    };
    for (const auto& c : cases) {
        ScopedEnv deny("JEXJTAG_FTDI_EMU_DENY", c.env);
        EXPECT_EQ(JEX_FAILURE, open(c.args));
        EXPECT_NE(std::string::npos, lastError().find(c.text)) << lastError();
    }
}

namespace {

// Runs in a forked child: opens the emulated adapter in a session of its
// own, takes the lock and reports 'L' (or 'F') on fd, then waits to be killed.
[[noreturn]] void holdLock(int fd)
{
    char verdict = 'F';
    unsigned handle = 0, status = 0;
    if (JexJtag_session_create(keepMessage, 0, nullptr, &handle) == JEX_SUCCESS &&
        JexJtag_target_open(handle, "ormund_usbcable", nullptr, 0, nullptr, nullptr) == JEX_SUCCESS &&
        JexJtag_target_lock(handle, 1000, &status) == JEX_SUCCESS)
        verdict = 'L';
    if (write(fd, &verdict, 1) != 1 || verdict != 'L') _exit(1);
    for (;;) pause();
}

} // namespace

TEST_F(UsbCable, TwoProcessesContendForOneAdapterAndCleanLocksTidiesUp)
{
    int fds[2];
    ASSERT_EQ(0, pipe(fds));
    const pid_t pid = fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
        close(fds[0]);
        holdLock(fds[1]);
    }
    close(fds[1]);
    pollfd p{fds[0], POLLIN, 0};
    char verdict = '\0';
    if (poll(&p, 1, 30000) == 1 && read(fds[0], &verdict, 1) != 1) verdict = '\0';
    close(fds[0]);
    EXPECT_EQ('L', verdict);

    ASSERT_EQ(JEX_SUCCESS, open({}));
    unsigned status = 0;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(m_handle, 100, &status));
    EXPECT_NE(std::string::npos, lastError().find("pid " + std::to_string(pid))) << lastError();
    kill(pid, SIGKILL);
    int waitStatus = 0;
    while (waitpid(pid, &waitStatus, 0) < 0 && errno == EINTR) {
    }
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 2000, &status));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));

    // A lock file left behind by a dead holder goes with cleanLocks.
    testsupport::writeFile(m_dir / "locks" / "ftdi-GONE.lock", "pid 1 port ftdi-GONE");
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_cleanLocks(m_handle));
    EXPECT_FALSE(std::filesystem::exists(m_dir / "locks" / "ftdi-GONE.lock"));
}
