// SPDX-License-Identifier: MIT
// Simulated shift throughput of the jtag_sim plug-in, driven through its
// operation table as the library drives it, on chains of 3 and 32 devices.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "jexjtag/plugin.h"
#include "platform/DynamicLibrary.hpp"

namespace {

const std::string kModule = std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins/jexjtag/jtag_sim/jtag_sim.so";

std::string chainOf(int devices)
{
    static const char* const kinds[] = {"0x4BA00477:4:idcode=0xE:user=0xA:userbits=35",
                                        "0x0362D093:6:idcode=0x9", "0x41111043:8:idcode=0xE0:user=0x32"};
    std::string text;
    for (int i = 0; i < devices; ++i) text += std::string(i ? "," : "") + kinds[i % 3];
    return text;
}

// One loaded module and an open instance for each chain length.
class Cable {
public:
    explicit Cable(int devices)
    {
        static jexplatform::DynamicLibrary module = jexplatform::DynamicLibrary::load(kModule);
        if (!module.isLoaded()) {
            std::fprintf(stderr, "cannot load %s: %s\n", kModule.c_str(), module.error().c_str());
            std::abort();
        }
        m_create = module.symbol<JexPlugin_create_fn>("JexPlugin_create");
        m_destroy = module.symbol<JexPlugin_destroy_fn>("JexPlugin_destroy");
        m_instance = m_create();
        const std::string chain = "chain=" + chainOf(devices);
        const char* argv[] = {chain.c_str(), "type=jtag_sim"};
        if (m_instance->ops->openTarget(m_instance, 2, argv, nullptr) != JEX_SUCCESS) std::abort();
    }
    ~Cable()
    {
        m_instance->ops->closeTarget(m_instance);
        m_destroy(m_instance);
    }
    JexPluginInstance* operator->() const { return m_instance; }
    JexPluginInstance* get() const { return m_instance; }

private:
    JexPlugin_create_fn m_create = nullptr;
    JexPlugin_destroy_fn m_destroy = nullptr;
    JexPluginInstance* m_instance = nullptr;
};

void report(benchmark::State& state, uint64_t bitsPerOp)
{
    state.counters["bits/s"] =
        benchmark::Counter(static_cast<double>(bitsPerOp) * static_cast<double>(state.iterations()),
                           benchmark::Counter::kIsRate);
}

// Whole-chain DR read-write of N bits, staying in Shift-DR between calls.
void BM_ChainDRReadWrite(benchmark::State& state)
{
    Cable cable(static_cast<int>(state.range(0)));
    const auto bits = static_cast<uint32_t>(state.range(1));
    std::vector<uint8_t> tdi((bits + 7) / 8, 0xA5), tdo(tdi.size());
    JexPluginInstance* i = cable.get();
    for (auto _ : state) {
        i->ops->shiftChainDRReadWrite(i, tdi.data(), tdo.data(), nullptr, nullptr, bits, JEXJTAG_SHIFT_DR, nullptr);
        benchmark::DoNotOptimize(tdo.data());
    }
    report(state, bits);
}

// Whole-chain DR write of N bits, from and back to Run-Test/Idle.
void BM_ChainDRWriteIdle(benchmark::State& state)
{
    Cable cable(static_cast<int>(state.range(0)));
    const auto bits = static_cast<uint32_t>(state.range(1));
    std::vector<uint8_t> tdi((bits + 7) / 8, 0x3C);
    JexPluginInstance* i = cable.get();
    for (auto _ : state)
        i->ops->shiftChainDRWrite(i, tdi.data(), nullptr, bits, JEXJTAG_RUN_TEST_IDLE, nullptr);
    report(state, bits);
}

// A 32-bit user-register read-write of the middle device, others in BYPASS,
// from and back to Run-Test/Idle: the per-operation cost.
void BM_DeviceDRReadWrite32(benchmark::State& state)
{
    const int devices = static_cast<int>(state.range(0));
    Cable cable(devices);
    JexPluginInstance* i = cable.get();
    const uint32_t device = static_cast<uint32_t>(devices / 2);
    const int bits = i->ops->getIRLength(i, device);
    const uint64_t user = bits == 4 ? 0xA : bits == 6 ? 0x02 : 0x32;
    std::vector<uint8_t> ir(2, 0);
    ir[0] = static_cast<uint8_t>(user);
    i->ops->shiftDeviceIRWrite(i, device, ir.data(), nullptr, static_cast<uint32_t>(bits), JEXJTAG_RUN_TEST_IDLE,
                               nullptr);
    std::vector<uint8_t> tdi(4, 0x5A), tdo(4);
    for (auto _ : state) {
        i->ops->shiftDeviceDRReadWrite(i, device, tdi.data(), tdo.data(), nullptr, nullptr, 32, JEXJTAG_RUN_TEST_IDLE,
                                       nullptr);
        benchmark::DoNotOptimize(tdo.data());
    }
    report(state, 32);
}

// Whole-chain IR write (all BYPASS), from and back to Run-Test/Idle.
void BM_ChainIRWrite(benchmark::State& state)
{
    const int devices = static_cast<int>(state.range(0));
    Cable cable(devices);
    JexPluginInstance* i = cable.get();
    uint32_t bits = 0;
    for (int d = 0; d < devices; ++d) bits += static_cast<uint32_t>(i->ops->getIRLength(i, static_cast<uint32_t>(d)));
    std::vector<uint8_t> tdi((bits + 7) / 8, 0xFF);
    for (auto _ : state) i->ops->shiftChainIRWrite(i, tdi.data(), nullptr, bits, JEXJTAG_RUN_TEST_IDLE, nullptr);
    report(state, bits);
}

// Interrogation of the whole chain.
void BM_Interrogate(benchmark::State& state)
{
    Cable cable(static_cast<int>(state.range(0)));
    JexPluginInstance* i = cable.get();
    for (auto _ : state) i->ops->interrogate(i);
}

} // namespace

BENCHMARK(BM_ChainDRReadWrite)->ArgsProduct({{3, 32}, {1024, 65536, 1 << 20}});
BENCHMARK(BM_ChainDRWriteIdle)->ArgsProduct({{3, 32}, {64, 4096}});
BENCHMARK(BM_DeviceDRReadWrite32)->Arg(3)->Arg(32);
BENCHMARK(BM_ChainIRWrite)->Arg(3)->Arg(32);
BENCHMARK(BM_Interrogate)->Arg(3)->Arg(32);
