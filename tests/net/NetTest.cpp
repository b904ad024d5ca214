// SPDX-License-Identifier: MIT
// The network cable end to end: the remote_bitbang client (through the C
// API) against an independent server (rbb_server.py) and against `jexjtag
// serve`, OpenOCD as a client of `jexjtag serve`, and the faults of both.

#include <gtest/gtest.h>

#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "ChildProcess.hpp"
#include "cli/ProgramRunner.hpp"
#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

namespace {

using nettest::ChildProcess;

const std::string kPythonServer = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/net/rbb_server.py";
const std::string kProgram = std::string(JEXJTAG_TEST_BUILD_DIR) + "/bin/jexjtag";
// A chain as jtag_sim and the Python server both write it; device 0 nearest TDO.
const std::string kChain = "0x4BA00477:4,0x0362D093:6";

std::vector<std::string>& messages()
{
    static std::vector<std::string> list;
    return list;
}
void keepMessage(unsigned, unsigned, const char* text) { messages().push_back(text ? text : ""); }

// True when some message holds one of the '|'-separated parts.
bool messaged(const std::string& parts)
{
    for (size_t start = 0; start <= parts.size();) {
        const size_t end = std::min(parts.find('|', start), parts.size());
        for (const std::string& m : messages())
            if (m.find(parts.substr(start, end - start)) != std::string::npos) return true;
        start = end + 1;
    }
    return false;
}

std::vector<uint8_t> randomBits(unsigned bits)
{
    std::mt19937 rng(bits);
    std::vector<uint8_t> out((bits + 7) / 8);
    for (uint8_t& b : out) b = static_cast<uint8_t>(rng());
    return out;
}

bool bitAt(const std::vector<uint8_t>& buffer, unsigned i) { return (buffer[i / 8] >> (i % 8)) & 1u; }

class NetTest : public ::testing::Test {
protected:
    NetTest()
        : m_plugins("JEXJTAG_PLUGIN_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins"),
          m_data("JEXJTAG_DATA_DIR", std::string(JEXJTAG_TEST_BUILD_DIR) + "/share/jexjtag"),
          m_home("HOME", m_dir.str()),
          m_locks("JEXJTAG_LOCK_DIR", (m_dir / "locks").string())
    {
    }
    void SetUp() override
    {
        messages().clear();
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &m_handle));
    }
    void TearDown() override { EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(m_handle)); }

    uint32_t open(const std::string& type, const std::vector<std::string>& args)
    {
        std::vector<const char*> argv;
        for (const std::string& a : args) argv.push_back(a.c_str());
        return JexJtag_target_open(m_handle, type.c_str(), nullptr, static_cast<unsigned>(argv.size()), argv.data(),
                                   nullptr);
    }
    // host=/port= for "127.0.0.1:PORT", socket= for a path.
    static std::vector<std::string> addressArgs(const std::string& address)
    {
        if (address.rfind("127.0.0.1:", 0) == 0) return {"host=127.0.0.1", "port=" + address.substr(10)};
        return {"socket=" + address};
    }

    std::string idcode(unsigned device)
    {
        char text[33] = {};
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(m_handle, device, text, sizeof text));
        return text;
    }
    unsigned irLength(unsigned device)
    {
        unsigned length = 0;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_getIRLength(m_handle, device, &length));
        return length;
    }
    uint32_t readDR(unsigned bits, std::vector<uint8_t>& tdo)
    {
        tdo.assign((bits + 7) / 8, 0);
        return JexJtag_tap_shiftChainDR(m_handle, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE, nullptr, bits, nullptr,
                                        tdo.data(), nullptr, nullptr);
    }

    // The open chain of kChain: interrogated IDCODEs and IR lengths, one
    // device's IDCODE register after its IDCODE instruction, and a long
    // read-write scan through both devices in BYPASS.
    void expectChainWorks(unsigned idcodeOpcode)
    {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_interrogateChain(m_handle, 0));
        unsigned count = 0;
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceCount(m_handle, &count));
        ASSERT_EQ(2u, count);
        EXPECT_EQ("01001011101000000000010001110111", idcode(0));
        EXPECT_EQ("00000011011000101101000010010011", idcode(1));
        EXPECT_EQ(4u, irLength(0));
        EXPECT_EQ(6u, irLength(1));

        const std::vector<uint8_t> ir = {static_cast<uint8_t>(idcodeOpcode)};
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceIR(m_handle, 1, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE,
                                                         nullptr, 6, ir.data(), nullptr, nullptr, nullptr));
        std::vector<uint8_t> id(4);
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftDeviceDR(m_handle, 1, JEXJTAG_SHIFT_READ, JEXJTAG_RUN_TEST_IDLE,
                                                         nullptr, 32, nullptr, id.data(), nullptr, nullptr));
        EXPECT_EQ(0x0362D093u, id[0] | id[1] << 8 | id[2] << 16 | static_cast<uint32_t>(id[3]) << 24);

        const std::vector<uint8_t> ones = {0xFF, 0xFF};
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainIR(m_handle, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                                        10, ones.data(), nullptr, nullptr, nullptr));
        const unsigned bits = 5003;
        const std::vector<uint8_t> tdi = randomBits(bits);
        std::vector<uint8_t> tdo(tdi.size());
        ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_shiftChainDR(m_handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_PAUSE_DR, nullptr,
                                                        bits, tdi.data(), tdo.data(), nullptr, nullptr));
        for (unsigned i = 0; i + 2 < bits; ++i) ASSERT_EQ(bitAt(tdi, i), bitAt(tdo, i + 2)) << "bit " << i;
    }

    testsupport::TempDir m_dir;
    testsupport::ScopedEnv m_plugins, m_data, m_home, m_locks;
    unsigned m_handle = 0;
};

TEST_F(NetTest, ClientReadsTheChainOfAnIndependentServerOverTcpAndUnixSockets)
{
    for (const bool unixSocket : {false, true}) {
        SCOPED_TRACE(unixSocket ? "unix" : "tcp");
        std::vector<std::string> args = {"python3", kPythonServer, "--chain", kChain};
        if (unixSocket) args.insert(args.end(), {"--socket", (m_dir / "rbb.sock").string()});
        ChildProcess server(args);
        const std::string address = server.listeningAddress();
        ASSERT_EQ(JEX_SUCCESS, open("remote_bitbang", addressArgs(address)));
        expectChainWorks(1);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, "trst", "1")); // 't' resets the TAPs
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, "trst", "0"));
        EXPECT_EQ(JEX_SUCCESS, JexJtag_tap_interrogateChain(m_handle, 0));
        EXPECT_EQ("01001011101000000000010001110111", idcode(0));
        EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
        EXPECT_EQ("", server.errorText()); // only letters of the original protocol were sent
        if (unixSocket) continue;

        clitest::ProgramRunner runner;
        runner.setEnv("JEXJTAG_LOCK_DIR", (m_dir / "locks").string());
        const clitest::RunResult scan = runner.run(
            {"scan", "--target", "remote_bitbang", "--arg", "host=127.0.0.1", "--arg", "port=" + address.substr(10)});
        EXPECT_EQ(0, scan.exitCode) << scan.err;
        EXPECT_NE(std::string::npos, scan.out.find("0  0x4BA00477   4")) << scan.out;
        EXPECT_NE(std::string::npos, scan.out.find("1  0x0362D093   6")) << scan.out;
    }
}

TEST_F(NetTest, ClientThroughServeReachesTheSimulatedChain)
{
    ChildProcess serve({kProgram, "serve", "--chain", kChain, "--arg", "port=net-serve"});
    ASSERT_EQ(JEX_SUCCESS, open("remote_bitbang", addressArgs(serve.listeningAddress())));
    expectChainWorks(1);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    EXPECT_EQ(0, serve.stop(SIGTERM)) << serve.errorText();
}

TEST_F(NetTest, OpenOcdListsTheServedChainAndReadsAnIdcode)
{
    if (access("/usr/bin/openocd", X_OK) != 0) GTEST_SKIP() << "openocd is not installed";
    ChildProcess serve({kProgram, "serve", "--chain", kChain + ",0x41111043:8:idcode=0xE0", "--arg", "port=net-ocd"});
    const std::string address = serve.listeningAddress();
    ChildProcess openocd({"openocd", "-c", "adapter driver remote_bitbang", "-c", "remote_bitbang host 127.0.0.1",
                          "-c", "remote_bitbang port " + address.substr(10), "-c", "transport select jtag", "-c",
                          "gdb_port disabled", "-c", "tcl_port disabled", "-c", "telnet_port disabled", "-c", "init",
                          "-c", "scan_chain", "-c", "irscan auto2.tap 0xE0", "-c", "drscan auto2.tap 32 0", "-c",
                          "shutdown"});
    const std::string out = openocd.readAll();
    EXPECT_EQ(0, openocd.wait()) << openocd.errorText();
    const std::string log = out + openocd.errorText();
    for (const char* row : {"auto0.tap              Y     0x4ba00477 0x00000000     4",
                            "auto1.tap              Y     0x0362d093 0x00000000     6",
                            "auto2.tap              Y     0x41111043 0x00000000     8"})
        EXPECT_NE(std::string::npos, log.find(row)) << log;
    EXPECT_NE(std::string::npos, log.find("\n41111043\n")) << log;
}

struct Fault {
    const char* mode;
    const char* timeout; // ms; long where a busy machine must not make it fire
    const char* message;
};

TEST_F(NetTest, ServerFaultsFailTheScanClearlyAndTheNextOpenConnectsAfresh)
{
    const Fault faults[] = {{"die", "5000", "closed the connection|Connection reset by peer"},
                            {"mute", "300", "did not answer within 300 ms"},
                            {"garbage", "5000", "instead of '0' or '1'"}};
    for (const Fault& fault : faults) {
        SCOPED_TRACE(fault.mode);
        messages().clear();
        ChildProcess server({"python3", kPythonServer, "--chain", kChain, "--fault", fault.mode, "--after", "40000"});
        std::vector<std::string> args = addressArgs(server.listeningAddress());
        args.push_back(std::string("timeout=") + fault.timeout);
        ASSERT_EQ(JEX_SUCCESS, open("remote_bitbang", args));
        std::vector<uint8_t> tdo;
        EXPECT_EQ(JEX_FAILURE, readDR(40000, tdo));
        EXPECT_TRUE(messaged(fault.message));
        EXPECT_EQ(JEX_FAILURE, readDR(8, tdo)); // the broken connection stays closed
        EXPECT_TRUE(messaged("open the target again"));
        JexJtag_target_close(m_handle);

        messages().clear();
        const uint32_t again = open("remote_bitbang", args);
        if (std::string(fault.mode) == "die") {
            EXPECT_EQ(JEX_FAILURE, again); // nothing listens any more
            EXPECT_TRUE(messaged("Connection refused"));
        } else {
            EXPECT_EQ(JEX_SUCCESS, again);
            EXPECT_EQ(JEX_SUCCESS, readDR(64, tdo));
            JexJtag_target_close(m_handle);
        }
    }
}

// A raw client connection to 127.0.0.1:port.
int rawConnect(const std::string& address)
{
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    addr.sin_port = htons(static_cast<uint16_t>(std::stoi(address.substr(10))));
    EXPECT_EQ(0, ::connect(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr));
    return fd;
}

// Sends requests and waits (bounded) for `replies` reply bytes.
std::string exchange(int fd, const std::string& requests, size_t replies)
{
    EXPECT_EQ(static_cast<ssize_t>(requests.size()), ::send(fd, requests.data(), requests.size(), MSG_NOSIGNAL));
    std::string got;
    while (got.size() < replies) {
        pollfd p = {fd, POLLIN, 0};
        char chunk[256];
        if (::poll(&p, 1, 5000) <= 0) break;
        const ssize_t n = ::recv(fd, chunk, std::min(sizeof chunk, replies - got.size()), 0);
        if (n <= 0) break;
        got.append(chunk, static_cast<size_t>(n));
    }
    return got;
}

TEST_F(NetTest, ServeOutlivesAClientLeavingMidScanAndReleasesTheCableOnSigterm)
{
    ChildProcess serve({kProgram, "serve", "--chain", kChain, "--arg", "port=net-leave"});
    const std::string address = serve.listeningAddress();

    // A client that waits for each read before the rising edge of its bit
    // (TCK low), and reads again after it (TCK high): device 0's IDCODE
    // 0x4BA00477 comes out LSB first either way.
    int fd = rawConnect(address);
    ASSERT_EQ("", exchange(fd, "2626262626" "04" "26" "04" "04", 0)); // reset, to Shift-DR
    for (int bit = 0; bit < 8; ++bit) {
        const std::string expected(2, ((0x77 >> bit) & 1) ? '1' : '0');
        EXPECT_EQ(expected.substr(0, 1), exchange(fd, "0R", 1)) << "bit " << bit;
        EXPECT_EQ(expected.substr(1, 1), exchange(fd, "4R", 1)) << "bit " << bit;
    }
    ::close(fd);

    // A request outside the protocol ends that client's connection.
    fd = rawConnect(address);
    EXPECT_EQ("", exchange(fd, "04X0R4", 1));
    char byte = 0;
    EXPECT_EQ(0, ::recv(fd, &byte, 1, MSG_DONTWAIT)); // closed, not merely silent
    ::close(fd);

    // To Shift-DR again, 40 read bits, and gone before the replies.
    fd = rawConnect(address);
    std::string half = "B262626262604260404";
    for (int i = 0; i < 40; ++i) half += "0R4";
    exchange(fd, half, 0);
    ::close(fd);

    ASSERT_EQ(JEX_SUCCESS, open("remote_bitbang", addressArgs(address)));
    expectChainWorks(1);
    JexJtag_target_close(m_handle);

    EXPECT_EQ(0, serve.stop(SIGTERM)) << serve.errorText();
    unsigned status = 0;
    ASSERT_EQ(JEX_SUCCESS, open("jtag_sim", {"chain=" + kChain, "port=net-leave"}));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 0, &status));
    EXPECT_EQ(static_cast<unsigned>(JEXJTAG_LOCKED_ME), status);
    JexJtag_target_unlock(m_handle);
    JexJtag_target_close(m_handle);
}

} // namespace
