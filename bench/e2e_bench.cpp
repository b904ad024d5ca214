// SPDX-License-Identifier: MIT
// Simulated shift throughput end to end: a host's calls through the
// library's C API (JexJtag_tap_shiftChainDR, JexJtag_tap_shiftDeviceDR) into
// the jtag_sim plug-in of the build tree, on chains of 3 and 32 devices.
// sim_bench times the same plug-in through its operation table directly;
// the difference is what the library adds.
//
// Figures: "bits/s" (bits shifted per second of wall time), logging off.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"

namespace {

// The three devices of the plug-in's default chain, all in idcode.lst;
// longer chains repeat them.
std::string chainOf(int devices)
{
    static const char* const kinds[] = {"0x4BA00477:4:idcode=0xE:user=0xA:userbits=35",
                                        "0x0362D093:6:idcode=0x9", "0x41111043:8:idcode=0xE0:user=0x32"};
    std::string text;
    for (int i = 0; i < devices; ++i) text += std::string(i ? "," : "") + kinds[i % 3];
    return text;
}

void printProblem(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR || type == JEX_MSG_WARNING) std::fprintf(stderr, "jexjtag: %s\n", text);
}

[[noreturn]] void fail(const char* what)
{
    std::fprintf(stderr, "e2e_bench: %s failed\n", what);
    std::abort();
}

// A session of the library with jtag_sim open on a chain of `devices`,
// autodetected.  Plug-ins stay loaded between sessions, so set-up between
// benchmark runs does not reload the module.
class Session {
public:
    explicit Session(int devices)
    {
        static const bool environment = [] {
            setenv("JEXJTAG_PLUGIN_DIR", JEXJTAG_TEST_BUILD_DIR "/lib/plugins", 1);
            setenv("JEXJTAG_DATA_DIR", JEXJTAG_TEST_BUILD_DIR "/share/jexjtag", 1);
            unsetenv("JEXJTAG_LOG_LEVEL");
            return true;
        }();
        (void)environment;
        const char* sessionArgs[] = {"unloadtargetsondestroy=false"};
        if (JexJtag_session_create(printProblem, 1, sessionArgs, &m_handle) != JEX_SUCCESS) fail("session_create");
        const std::string chain = "chain=" + chainOf(devices);
        const std::string port = "port=e2e-bench-" + std::to_string(devices);
        const char* argv[] = {chain.c_str(), port.c_str()};
        if (JexJtag_target_open(m_handle, "jtag_sim", nullptr, 2, argv, nullptr) != JEX_SUCCESS) fail("target_open");
        if (JexJtag_tap_autodetectChain(m_handle, JEXJTAG_SCAN_DEFAULT) != JEX_SUCCESS) fail("autodetectChain");
        unsigned count = 0;
        if (JexJtag_tap_getDeviceCount(m_handle, &count) != JEX_SUCCESS || count != static_cast<unsigned>(devices))
            fail("getDeviceCount");
    }
    ~Session() { JexJtag_session_destroy(m_handle); }
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    unsigned handle() const { return m_handle; }
    unsigned irLength(unsigned device) const
    {
        unsigned irlen = 0;
        JexJtag_tap_getIRLength(m_handle, device, &irlen);
        return irlen;
    }

private:
    unsigned m_handle = 0;
};

void report(benchmark::State& state, uint64_t bitsPerOp)
{
    state.counters["bits/s"] =
        benchmark::Counter(static_cast<double>(bitsPerOp) * static_cast<double>(state.iterations()),
                           benchmark::Counter::kIsRate);
}

// Whole-chain DR read-write of N bits, staying in Shift-DR between calls
// (the figure sim_bench's BM_ChainDRReadWrite gives without the library).
void BM_LibChainDRReadWrite(benchmark::State& state)
{
    Session session(static_cast<int>(state.range(0)));
    const auto bits = static_cast<unsigned>(state.range(1));
    std::vector<unsigned char> tdi((bits + 7) / 8, 0xA5), tdo(tdi.size());
    const unsigned h = session.handle();
    for (auto _ : state) {
        if (JexJtag_tap_shiftChainDR(h, JEXJTAG_SHIFT_READWRITE, JEXJTAG_SHIFT_DR, nullptr, bits, tdi.data(),
                                     tdo.data(), nullptr, nullptr) != JEX_SUCCESS)
            fail("shiftChainDR");
        benchmark::DoNotOptimize(tdo.data());
    }
    report(state, bits);
}

// Whole-chain DR write of N bits, from and back to Run-Test/Idle.
void BM_LibChainDRWriteIdle(benchmark::State& state)
{
    Session session(static_cast<int>(state.range(0)));
    const auto bits = static_cast<unsigned>(state.range(1));
    std::vector<unsigned char> tdi((bits + 7) / 8, 0x3C);
    const unsigned h = session.handle();
    for (auto _ : state)
        if (JexJtag_tap_shiftChainDR(h, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, bits, tdi.data(), nullptr,
                                     nullptr, nullptr) != JEX_SUCCESS)
            fail("shiftChainDR");
    report(state, bits);
}

// Device-relative DR read-write of N bits into the middle device (the
// others in BYPASS, one padding bit each), from and back to Run-Test/Idle.
void BM_LibDeviceDRReadWrite(benchmark::State& state)
{
    const int devices = static_cast<int>(state.range(0));
    Session session(devices);
    const unsigned h = session.handle();
    const auto device = static_cast<unsigned>(devices / 2);
    const auto bits = static_cast<unsigned>(state.range(1));
    const unsigned char bypass[8] = {0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF};
    if (JexJtag_tap_shiftDeviceIR(h, device, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                  session.irLength(device), bypass, nullptr, nullptr, nullptr) != JEX_SUCCESS)
        fail("shiftDeviceIR");
    std::vector<unsigned char> tdi((bits + 7) / 8, 0x5A), tdo(tdi.size());
    for (auto _ : state) {
        if (JexJtag_tap_shiftDeviceDR(h, device, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, bits,
                                      tdi.data(), tdo.data(), nullptr, nullptr) != JEX_SUCCESS)
            fail("shiftDeviceDR");
        benchmark::DoNotOptimize(tdo.data());
    }
    report(state, bits);
}

// A 32-bit user-register read-write of the middle device: the cost of one
// small scan through the library, TAP moves included.
void BM_LibDeviceUserRegister32(benchmark::State& state)
{
    const int devices = static_cast<int>(state.range(0));
    Session session(devices);
    const unsigned h = session.handle();
    const auto device = static_cast<unsigned>(devices / 2);
    const unsigned irBits = session.irLength(device);
    const unsigned char user = irBits == 4 ? 0xA : irBits == 6 ? 0x02 : 0x32;
    if (JexJtag_tap_shiftDeviceIR(h, device, JEXJTAG_SHIFT_WRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, irBits, &user,
                                  nullptr, nullptr, nullptr) != JEX_SUCCESS)
        fail("shiftDeviceIR");
    unsigned char tdi[4] = {0x5A, 0x5A, 0x5A, 0x5A};
    unsigned char tdo[4] = {};
    for (auto _ : state) {
        if (JexJtag_tap_shiftDeviceDR(h, device, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, 32, tdi, tdo,
                                      nullptr, nullptr) != JEX_SUCCESS)
            fail("shiftDeviceDR");
        benchmark::DoNotOptimize(tdo);
    }
    report(state, 32);
}

} // namespace

BENCHMARK(BM_LibChainDRReadWrite)->ArgsProduct({{3, 32}, {4096, 1 << 20}})->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_LibChainDRWriteIdle)->ArgsProduct({{3, 32}, {4096, 1 << 20}})->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_LibDeviceDRReadWrite)->ArgsProduct({{3, 32}, {4096, 1 << 20}})->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_LibDeviceUserRegister32)->Arg(3)->Arg(32);
