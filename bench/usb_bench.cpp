// SPDX-License-Identifier: MIT
// The USB cable's traffic and host-side cost.
//
// Traffic: a host's calls through the library's C API into the
// ormund_usbcable plug-in of the build tree, on the real libftdi1 and the
// emulated FT2232H (this binary links the stand-in libusb-1.0).  Counters
// per iteration: "usb_writes" and "usb_reads" (bulk OUT and IN transfers),
// "bytes_out" and "bytes_in" (IN bytes include the two status bytes of every
// packet).  The times include the emulator and mean little.
//
// Host side: MpsseQueue generating the commands of a read-write scan and
// unpacking its TDO, against a link that answers at once.  "bits/s": scan
// bits handled per second; it must stay far above a 30 MHz TCK.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "FtdiEmuControl.h"
#include "MpsseQueue.hpp"
#include "jexjtag/jexjtag.h"

namespace {

void printProblem(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR || type == JEX_MSG_WARNING) std::fprintf(stderr, "jexjtag: %s\n", text);
}

[[noreturn]] void fail(const char* what)
{
    std::fprintf(stderr, "usb_bench: %s failed\n", what);
    std::abort();
}

// A session with the emulated adapter open at 30 MHz.
class UsbSession {
public:
    UsbSession()
    {
        static const bool environment = [] {
            setenv("JEXJTAG_PLUGIN_DIR", JEXJTAG_TEST_BUILD_DIR "/lib/plugins", 1);
            setenv("JEXJTAG_DATA_DIR", JEXJTAG_TEST_BUILD_DIR "/share/jexjtag", 1);
            unsetenv("JEXJTAG_LOG_LEVEL");
            return true;
        }();
        (void)environment;
        if (JexJtag_session_create(printProblem, 0, nullptr, &m_handle) != JEX_SUCCESS) fail("session_create");
        const char* argv[] = {"frequency=30M"};
        if (JexJtag_target_open(m_handle, "ormund_usbcable", nullptr, 1, argv, nullptr) != JEX_SUCCESS)
            fail("target_open");
    }
    ~UsbSession() { JexJtag_session_destroy(m_handle); }
    unsigned handle() const { return m_handle; }

private:
    unsigned m_handle = 0;
};

void shiftDR(unsigned handle, unsigned mode, unsigned bits, const uint8_t* tdi, uint8_t* tdo)
{
    const unsigned char low = 0;
    if (JexJtag_tap_shiftChainDR(handle, mode, JEXJTAG_RUN_TEST_IDLE, nullptr, bits, tdi ? tdi : &low, tdo, nullptr,
                                 nullptr) != JEX_SUCCESS)
        fail("shiftChainDR");
}

void reportTraffic(benchmark::State& state, const FtdiEmuCounters& before)
{
    FtdiEmuCounters after{};
    jexjtag_ftdi_emu_counters(&after);
    const auto per = [&](uint64_t a, uint64_t b) {
        return benchmark::Counter(static_cast<double>(a - b), benchmark::Counter::kAvgIterations);
    };
    state.counters["usb_writes"] = per(after.bulkOut, before.bulkOut);
    state.counters["usb_reads"] = per(after.bulkIn, before.bulkIn);
    state.counters["bytes_out"] = per(after.bytesOut, before.bytesOut);
    state.counters["bytes_in"] = per(after.bytesIn, before.bytesIn);
}

void BM_Usb_Read32(benchmark::State& state)
{
    UsbSession s;
    uint8_t tdo[4];
    FtdiEmuCounters before{};
    jexjtag_ftdi_emu_counters(&before);
    for (auto _ : state) shiftDR(s.handle(), JEXJTAG_SHIFT_READ, 32, nullptr, tdo);
    reportTraffic(state, before);
}
BENCHMARK(BM_Usb_Read32);

void BM_Usb_ReadWrite1Mbit(benchmark::State& state)
{
    UsbSession s;
    std::vector<uint8_t> tdi(1u << 17, 0xA5), tdo(1u << 17);
    FtdiEmuCounters before{};
    jexjtag_ftdi_emu_counters(&before);
    for (auto _ : state) shiftDR(s.handle(), JEXJTAG_SHIFT_READWRITE, 1u << 20, tdi.data(), tdo.data());
    reportTraffic(state, before);
}
BENCHMARK(BM_Usb_ReadWrite1Mbit)->Unit(benchmark::kMillisecond);

void BM_Usb_Read32x1000(benchmark::State& state)
{
    UsbSession s;
    uint8_t tdo[4];
    FtdiEmuCounters before{};
    jexjtag_ftdi_emu_counters(&before);
    for (auto _ : state)
        for (int i = 0; i < 1000; ++i) shiftDR(s.handle(), JEXJTAG_SHIFT_READ, 32, nullptr, tdo);
    reportTraffic(state, before);
}
BENCHMARK(BM_Usb_Read32x1000)->Unit(benchmark::kMillisecond);

// Run-Test/Idle to Pause-DR and back, then flush so the moves reach the chip.
void BM_Usb_Navigate(benchmark::State& state)
{
    UsbSession s;
    FtdiEmuCounters before{};
    jexjtag_ftdi_emu_counters(&before);
    for (auto _ : state) {
        if (JexJtag_tap_navigate(s.handle(), JEXJTAG_PAUSE_DR, 0, 0) != JEX_SUCCESS ||
            JexJtag_tap_navigate(s.handle(), JEXJTAG_RUN_TEST_IDLE, 0, 0) != JEX_SUCCESS ||
            JexJtag_target_flush(s.handle()) != JEX_SUCCESS)
            fail("navigate");
    }
    reportTraffic(state, before);
}
BENCHMARK(BM_Usb_Navigate);

// A link that takes every write and answers every read at once (zeros).
class InstantLink : public jexusb::FtdiLink {
public:
    bool write(const uint8_t*, std::size_t, std::string&) override { return true; }
    bool read(uint8_t* data, std::size_t size, unsigned, std::string&) override
    {
        std::memset(data, 0, size);
        return true;
    }
    std::size_t pending() const override { return 0; }
    bool purge(std::string&) override { return true; }
};

// Command generation and TDO unpacking of a read-write scan of N bits.
void BM_Mpsse_HostSide(benchmark::State& state)
{
    const auto bits = static_cast<uint32_t>(state.range(0));
    InstantLink link;
    jexusb::MpsseQueue queue(link, 4096, true);
    std::vector<uint8_t> tdi((bits + 7) / 8, 0x5A), tdo(tdi.size());
    for (auto _ : state) {
        queue.shift(jexcable::ShiftSource::buffer(tdi.data()), jexcable::ShiftSink::buffer(tdo.data()), bits, true);
        if (!queue.flush()) fail("flush");
        benchmark::DoNotOptimize(tdo.data());
    }
    state.counters["bits/s"] =
        benchmark::Counter(static_cast<double>(bits), benchmark::Counter::kIsIterationInvariantRate);
}
BENCHMARK(BM_Mpsse_HostSide)->Arg(32)->Arg(1 << 20);

} // namespace
