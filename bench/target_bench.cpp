// SPDX-License-Identifier: MIT
// What the library adds to a scan.  Each exported shift and navigate call
// is timed into the idle plug-in (whose operations return at once) beside a
// direct call of the same plug-in operation; a counting operator new shows
// that the exported calls allocate nothing with logging off.  The last
// benchmark shifts 1 Mbit with logging at level 5 (TDI and TDO dumps).
//
// Figures: ns per call ("Library" vs "Direct"); the "allocs" counter is
// heap allocations per call and must read 0.

#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <new>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "jexjtag/plugin.h"
#include "platform/DynamicLibrary.hpp"

// ---- counting allocator --------------------------------------------------------

namespace {
std::atomic<unsigned long long> g_allocations{0};
}

void* operator new(std::size_t size)
{
    g_allocations.fetch_add(1, std::memory_order_relaxed);
    if (void* p = std::malloc(size ? size : 1)) return p;
    throw std::bad_alloc();
}
void* operator new[](std::size_t size) { return operator new(size); }
void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    g_allocations.fetch_add(1, std::memory_order_relaxed);
    return std::malloc(size ? size : 1);
}
void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept { return operator new(size, tag); }
void operator delete(void* p) noexcept { std::free(p); }
void operator delete[](void* p) noexcept { std::free(p); }
void operator delete(void* p, std::size_t) noexcept { std::free(p); }
void operator delete[](void* p, std::size_t) noexcept { std::free(p); }

namespace {

// ---- one session with the idle cable open, and the cable itself ------------

class Bench {
public:
    static Bench& get()
    {
        static Bench bench;
        return bench;
    }

    unsigned handle = 0;
    bool ready = false;
    jexplatform::DynamicLibrary module;
    JexPluginInstance* direct = nullptr;
    std::string logPath;

    void setLogLevel(int level)
    {
        setenv("JEXJTAG_LOG_LEVEL", std::to_string(level).c_str(), 1);
        setenv("JEXJTAG_LOG_FILE", logPath.c_str(), 1);
        unsigned version = 0;
        JexJtag_session_getAPIVersion(&version, nullptr, 128); // rereads the log settings
    }

private:
    Bench()
    {
        logPath = (std::filesystem::temp_directory_path() / "jexjtag-target-bench.log").string();
        setenv("JEXJTAG_PLUGIN_DIR", JEXJTAG_BENCH_PLUGIN_ROOT, 1);
        setLogLevel(0);
        if (JexJtag_session_create(nullptr, 0, nullptr, &handle) != JEX_SUCCESS) return;
        if (JexJtag_target_open(handle, "idle_cable", nullptr, 0, nullptr, nullptr) != JEX_SUCCESS) return;
        module = jexplatform::DynamicLibrary::load(std::string(JEXJTAG_BENCH_PLUGIN_ROOT) +
                                                   "/JexBench/IdleCable/IdleCable.so");
        auto create = module.symbol<JexPlugin_create_fn>("JexPlugin_create");
        direct = create ? create() : nullptr;
        ready = direct != nullptr;
    }
    ~Bench()
    {
        if (direct) module.symbol<JexPlugin_destroy_fn>("JexPlugin_destroy")(direct);
        JexJtag_session_destroy(handle);
        std::remove(logPath.c_str());
    }
};

// Runs `call` per iteration and reports heap allocations per call.
template <typename Call>
void measure(benchmark::State& state, Call&& call)
{
    Bench& bench = Bench::get();
    if (!bench.ready) {
        state.SkipWithError("the idle cable could not be opened");
        return;
    }
    bench.setLogLevel(0);
    const unsigned long long before = g_allocations.load();
    for (auto _ : state) benchmark::DoNotOptimize(call(bench));
    const unsigned long long allocations = g_allocations.load() - before;
    state.counters["allocs"] = benchmark::Counter(static_cast<double>(allocations), benchmark::Counter::kAvgIterations);
}

unsigned char g_tdi[8] = {0x12, 0x34, 0x56, 0x78, 0x9A, 0xBC, 0xDE, 0xF0};
unsigned char g_tdo[8];

void BM_ShiftChainDR_Library(benchmark::State& state)
{
    measure(state, [](Bench& b) {
        return JexJtag_tap_shiftChainDR(b.handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr, 64, g_tdi,
                                        g_tdo, nullptr, nullptr);
    });
}
void BM_ShiftChainDR_Direct(benchmark::State& state)
{
    measure(state, [](Bench& b) {
        JexJtagCallContext context{b.handle, 0, nullptr};
        return b.direct->ops->shiftChainDRReadWrite(b.direct, g_tdi, g_tdo, nullptr, nullptr, 64,
                                                    JEXJTAG_RUN_TEST_IDLE, &context);
    });
}
void BM_ShiftDeviceIR_Library(benchmark::State& state)
{
    measure(state, [](Bench& b) {
        return JexJtag_tap_shiftDeviceIR(b.handle, 0, JEXJTAG_SHIFT_WRITE, JEXJTAG_UPDATE_IR, nullptr, 6, g_tdi,
                                         nullptr, nullptr, nullptr);
    });
}
void BM_ShiftDeviceIR_Direct(benchmark::State& state)
{
    measure(state, [](Bench& b) {
        JexJtagCallContext context{b.handle, 0, nullptr};
        return b.direct->ops->shiftDeviceIRWrite(b.direct, 0, g_tdi, nullptr, 6, JEXJTAG_UPDATE_IR, &context);
    });
}
void BM_Navigate_Library(benchmark::State& state)
{
    measure(state, [](Bench& b) { return JexJtag_tap_navigate(b.handle, JEXJTAG_RUN_TEST_IDLE, 0, 0); });
}
void BM_Navigate_Direct(benchmark::State& state)
{
    measure(state, [](Bench& b) { return b.direct->ops->navigateTAP(b.direct, JEXJTAG_RUN_TEST_IDLE, 0); });
}

// 1 Mbit read-write shift with logging at level 5: both buffers are dumped.
void BM_Shift1Mbit_LogLevel5(benchmark::State& state)
{
    Bench& bench = Bench::get();
    if (!bench.ready) {
        state.SkipWithError("the idle cable could not be opened");
        return;
    }
    constexpr unsigned kBits = 1u << 20;
    std::vector<unsigned char> tdi(kBits / 8, 0xA5);
    std::vector<unsigned char> tdo(kBits / 8);
    bench.setLogLevel(5);
    unsigned status = JEX_SUCCESS;
    for (auto _ : state) {
        status |= JexJtag_tap_shiftChainDR(bench.handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE, nullptr,
                                           kBits, tdi.data(), tdo.data(), nullptr, nullptr);
        state.PauseTiming();
        std::remove(bench.logPath.c_str()); // keep the log from growing between iterations
        bench.setLogLevel(5);
        state.ResumeTiming();
    }
    bench.setLogLevel(0);
    if (status != JEX_SUCCESS) state.SkipWithError("the 1 Mbit shift failed");
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * kBits / 8);
}

BENCHMARK(BM_ShiftChainDR_Library);
BENCHMARK(BM_ShiftChainDR_Direct);
BENCHMARK(BM_ShiftDeviceIR_Library);
BENCHMARK(BM_ShiftDeviceIR_Direct);
BENCHMARK(BM_Navigate_Library);
BENCHMARK(BM_Navigate_Direct);
BENCHMARK(BM_Shift1Mbit_LogLevel5)->Unit(benchmark::kMillisecond)->Iterations(5);

} // namespace
