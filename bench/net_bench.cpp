// SPDX-License-Identifier: MIT
// The network cable on loopback, against rbb_bench_server (a fast
// remote_bitbang server with its own TAP model), all in one run:
//   Server*   what the server takes: a precomputed request stream written
//             while the replies are read (no client logic at all)
//   Client*   our remote_bitbang client through the C API
//   OpenOcd*  OpenOCD's own remote_bitbang client on the same server, timed
//             inside OpenOCD with its `ms` command
//   ServeOpenOcd  `jexjtag serve` (jtag_sim behind it) with OpenOCD as client
//   ServeClient   the same with our client
// Workloads: one 1 Mbit read-write DR scan, and 1,000 back-to-back 32-bit
// read-write DR scans.  Figures: "bits/s" of scanned bits per second.
#include <benchmark/benchmark.h>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "net/ChildProcess.hpp"

namespace {

constexpr unsigned kLongBits = 1000000;
constexpr unsigned kShortBits = 32;
constexpr unsigned kShortScans = 1000;

using nettest::ChildProcess;

[[noreturn]] void fail(const std::string& what)
{
    std::fprintf(stderr, "net_bench: %s\n", what.c_str());
    std::abort();
}

// The benchmark server, started once for the whole run.
const std::string& serverPort()
{
    static std::unique_ptr<ChildProcess> server;
    static std::string port;
    if (!server) {
        server = std::make_unique<ChildProcess>(
            std::vector<std::string>{JEXJTAG_TEST_BUILD_DIR "/bin/bench/rbb_bench_server"});
        const std::string address = server->listeningAddress();
        port = address.substr(address.rfind(':') + 1);
    }
    return port;
}

// ---- the server alone ----------------------------------------------------------

// Reset, Run-Test/Idle to Shift-DR, `bits` read-write bits (TDI alternating),
// back to Run-Test/Idle: the requests our client sends for such a scan.
std::string scanStream(unsigned bits)
{
    std::string s = "26262626260404260404";
    for (unsigned i = 0; i + 1 < bits; ++i) s += (i & 1) ? "1R5" : "0R4";
    s += "2R6" "2604";
    return s;
}

void BM_ServerAlone_1Mbit(benchmark::State& state)
{
    const std::string stream = scanStream(kLongBits);
    std::vector<char> replies(kLongBits);
    const auto port = static_cast<uint16_t>(std::stoi(serverPort()));
    for (auto _ : state) {
        const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_in addr{};
        addr.sin_family = AF_INET;
        addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        addr.sin_port = htons(port);
        const int one = 1;
        ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        if (::connect(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0) fail("connect");
        size_t sent = 0, got = 0;
        while (got < kLongBits) {
            pollfd p = {fd, static_cast<short>(POLLIN | (sent < stream.size() ? POLLOUT : 0)), 0};
            if (::poll(&p, 1, 5000) <= 0) fail("the server stalled after " + std::to_string(got) + " replies");
            if (p.revents & POLLOUT) {
                const ssize_t n = ::send(fd, stream.data() + sent, stream.size() - sent, MSG_DONTWAIT);
                if (n > 0) sent += static_cast<size_t>(n);
            }
            if (p.revents & POLLIN) {
                const ssize_t n = ::recv(fd, replies.data() + got, replies.size() - got, MSG_DONTWAIT);
                if (n == 0) fail("the server closed");
                if (n > 0) got += static_cast<size_t>(n);
            }
        }
        ::close(fd);
    }
    state.counters["bits/s"] = benchmark::Counter(double(kLongBits) * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_ServerAlone_1Mbit)->Unit(benchmark::kMillisecond)->UseRealTime();

// ---- our client --------------------------------------------------------------------

void printProblem(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR || type == JEX_MSG_WARNING) std::fprintf(stderr, "jexjtag: %s\n", text);
}

class ClientSession {
public:
    explicit ClientSession(const std::string& serverPortNumber = serverPort())
    {
        setenv("JEXJTAG_PLUGIN_DIR", JEXJTAG_TEST_BUILD_DIR "/lib/plugins", 1);
        setenv("JEXJTAG_DATA_DIR", JEXJTAG_TEST_BUILD_DIR "/share/jexjtag", 1);
        const char* sessionArgs[] = {"unloadtargetsondestroy=false"};
        if (JexJtag_session_create(printProblem, 1, sessionArgs, &m_handle) != JEX_SUCCESS) fail("session_create");
        const std::string port = "port=" + serverPortNumber;
        const char* argv[] = {"host=127.0.0.1", port.c_str()};
        if (JexJtag_target_open(m_handle, "remote_bitbang", nullptr, 2, argv, nullptr) != JEX_SUCCESS)
            fail("target_open");
    }
    ~ClientSession() { JexJtag_session_destroy(m_handle); }
    unsigned handle() const { return m_handle; }

private:
    unsigned m_handle = 0;
};

void shiftDR(unsigned handle, unsigned bits, const std::vector<uint8_t>& tdi, std::vector<uint8_t>& tdo)
{
    if (JexJtag_tap_shiftChainDR(handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, bits, tdi.data(),
                                 tdo.data(), nullptr, nullptr) != JEX_SUCCESS)
        fail("shiftChainDR");
}

void BM_Client_1MbitReadWrite(benchmark::State& state)
{
    ClientSession session;
    std::vector<uint8_t> tdi(kLongBits / 8, 0x5A), tdo(kLongBits / 8);
    for (auto _ : state) shiftDR(session.handle(), kLongBits, tdi, tdo);
    state.counters["bits/s"] = benchmark::Counter(double(kLongBits) * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_Client_1MbitReadWrite)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_Client_1000x32(benchmark::State& state)
{
    ClientSession session;
    std::vector<uint8_t> tdi(4, 0x5A), tdo(4);
    for (auto _ : state)
        for (unsigned i = 0; i < kShortScans; ++i) shiftDR(session.handle(), kShortBits, tdi, tdo);
    state.counters["bits/s"] =
        benchmark::Counter(double(kShortBits) * kShortScans * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_Client_1000x32)->Unit(benchmark::kMillisecond)->UseRealTime();

// ---- OpenOCD as the client ---------------------------------------------------------

// Milliseconds OpenOCD takes for `commands` after init (its own `ms` clock),
// connected to port; tapCommands select a non-BYPASS instruction first.
double openOcdMilliseconds(const std::string& port, const std::string& tap, const std::string& irCommand,
                           const std::string& commands)
{
    ChildProcess openocd({"openocd", "-c", "adapter driver remote_bitbang", "-c", "remote_bitbang host 127.0.0.1",
                          "-c", "remote_bitbang port " + port, "-c", "transport select jtag", "-c",
                          "gdb_port disabled", "-c", "tcl_port disabled", "-c", "telnet_port disabled", "-c", "init", "-c", irCommand, "-c", "set t0 [ms]", "-c", commands,
                          "-c", "echo \"elapsed [expr {[ms] - $t0}]\"", "-c", "shutdown"});
    std::string out = openocd.readAll(120000);
    openocd.wait();
    out += openocd.errorText(); // echo writes to OpenOCD's log, stderr
    const size_t at = out.rfind("elapsed ");
    if (at == std::string::npos) fail("no timing from OpenOCD (tap " + tap + ")");
    return std::stod(out.substr(at + 8));
}

void reportOpenOcd(benchmark::State& state, const std::string& port, const std::string& tap,
                   const std::string& irCommand, const std::string& commands, double bits)
{
    if (access("/usr/bin/openocd", X_OK) != 0) {
        state.SkipWithError("openocd is not installed");
        return;
    }
    for (auto _ : state) state.SetIterationTime(openOcdMilliseconds(port, tap, irCommand, commands) / 1000.0);
    state.counters["bits/s"] = benchmark::Counter(bits * state.iterations(), benchmark::Counter::kIsRate);
}

void BM_OpenOcd_1MbitReadWrite(benchmark::State& state)
{
    reportOpenOcd(state, serverPort(), "auto0.tap", "irscan auto0.tap 0xE",
                  "drscan auto0.tap " + std::to_string(kLongBits) + " 0", kLongBits);
}
BENCHMARK(BM_OpenOcd_1MbitReadWrite)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(3);

void BM_OpenOcd_1000x32(benchmark::State& state)
{
    reportOpenOcd(state, serverPort(), "auto0.tap", "irscan auto0.tap 0xE",
                  "for {set i 0} {$i < " + std::to_string(kShortScans) + "} {incr i} {drscan auto0.tap 32 0}",
                  double(kShortBits) * kShortScans);
}
BENCHMARK(BM_OpenOcd_1000x32)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(3);

// ---- jexjtag serve with OpenOCD as the client ----------------------------------------

void BM_ServeOpenOcd_1MbitReadWrite(benchmark::State& state)
{
    ChildProcess serve({JEXJTAG_TEST_BUILD_DIR "/bin/jexjtag", "serve", "--no-lock"});
    const std::string address = serve.listeningAddress();
    reportOpenOcd(state, address.substr(address.rfind(':') + 1), "auto0.tap", "irscan auto0.tap 0xE",
                  "drscan auto0.tap " + std::to_string(kLongBits) + " 0", kLongBits);
}
BENCHMARK(BM_ServeOpenOcd_1MbitReadWrite)->Unit(benchmark::kMillisecond)->UseManualTime()->Iterations(3);

// The same server with our client: what serve and jtag_sim take when the
// client is not the bottleneck.
void BM_ServeClient_1MbitReadWrite(benchmark::State& state)
{
    ChildProcess serve({JEXJTAG_TEST_BUILD_DIR "/bin/jexjtag", "serve", "--no-lock"});
    const std::string address = serve.listeningAddress();
    ClientSession session(address.substr(address.rfind(':') + 1));
    std::vector<uint8_t> tdi(kLongBits / 8, 0x5A), tdo(kLongBits / 8);
    for (auto _ : state) shiftDR(session.handle(), kLongBits, tdi, tdo);
    state.counters["bits/s"] = benchmark::Counter(double(kLongBits) * state.iterations(), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_ServeClient_1MbitReadWrite)->Unit(benchmark::kMillisecond)->UseRealTime();

} // namespace
