// SPDX-License-Identifier: MIT
// The SVF player: parse speed and memory peak on a 100 MB file of large
// SDRs (a dry run, generated at run time in a temporary directory and
// deleted afterwards), and end-to-end play of one 16 Mbit SDR with TDO
// compare through the C API, on jtag_sim (bit-level simulation) and on the
// idle plug-in (whose shifts return at once: what the player itself costs).
//
// Figures: "MB/s" of SVF text, "peak_MB" (the maximum resident size of a
// child process that parsed the file once, "base_MB" the same child without
// the parse), "bits/s" of scan data played.  Rates are per second of CPU
// time of the playing thread (the plug-ins run on it), so a busy machine
// does not hide what the player costs; the table shows wall time too.
#include <benchmark/benchmark.h>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include "jexjtag/jexjtag.h"

namespace {

void printProblem(unsigned, unsigned type, const char* text)
{
    if (type == JEX_MSG_ERROR) std::fprintf(stderr, "jexjtag: %s\n", text);
}

// A session whose plug-in tree is `root`.  The tree is read when the first
// session is made and dropped with the last one, so each benchmark makes
// and destroys its own.
unsigned newSession(const char* root = JEXJTAG_TEST_BUILD_DIR "/lib/plugins")
{
    setenv("JEXJTAG_PLUGIN_DIR", root, 1);
    setenv("JEXJTAG_DATA_DIR", JEXJTAG_TEST_BUILD_DIR "/share/jexjtag", 1);
    unsetenv("JEXJTAG_LOG_LEVEL");
    unsigned handle = 0;
    if (JexJtag_session_create(printProblem, 0, nullptr, &handle) != JEX_SUCCESS) std::abort();
    return handle;
}

// `digits` pseudo-random hex digits (the first not 0), 64 to a line.
std::string hexDigits(size_t digits, uint32_t seed)
{
    std::string text;
    text.reserve(digits + digits / 64 + 1);
    for (size_t i = 0; i < digits; ++i) {
        seed = seed * 1103515245u + 12345u;
        text += "0123456789ABCDEF"[i == 0 ? 7 : (seed >> 16) & 0xF];
        if (i % 64 == 63) text += '\n';
    }
    return text;
}

// ---- parse: a 100 MB file of 4 Mbit SDRs, played dry ------------------------

class BigFile {
public:
    BigFile()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "jexjtag-svf-bench-XXXXXX").string();
        if (!mkdtemp(pattern.data())) std::abort();
        m_dir = pattern;
        m_path = m_dir + "/big.svf";
        std::ofstream out(m_path, std::ios::binary);
        const std::string tdi = hexDigits(1000000, 1);
        const std::string tdo = hexDigits(1000000, 2);
        out << "! generated: 4 Mbit SDRs\nSTATE RESET;\nENDDR IDLE;\n";
        while (static_cast<uint64_t>(out.tellp()) < 100u * 1000 * 1000)
            out << "SDR 4000000 TDI (" << tdi << ")\n TDO (" << tdo << ")\n MASK (" << tdi << ");\n";
        m_size = static_cast<uint64_t>(out.tellp());
    }
    ~BigFile()
    {
        std::error_code ec;
        std::filesystem::remove_all(m_dir, ec);
    }
    const std::string& path() const { return m_path; }
    uint64_t size() const { return m_size; }

private:
    std::string m_dir, m_path;
    uint64_t m_size = 0;
};

bool dryRun(unsigned handle, const std::string& path)
{
    JexJtagSvfOptions options;
    JexJtag_svf_initOptions(&options);
    options.flags = JEXJTAG_SVF_DRY_RUN;
    return JexJtag_svf_playFile(handle, path.c_str(), &options, nullptr) == JEX_SUCCESS;
}

// The maximum resident size, in MB, of a child that makes a session and
// then parses `path` (nothing when empty).
double childPeakMB(const std::string& path)
{
    const pid_t child = fork();
    if (child == 0) {
        const unsigned handle = newSession();
        _exit(path.empty() || dryRun(handle, path) ? 0 : 1);
    }
    int status = 0;
    struct rusage usage {};
    if (wait4(child, &status, 0, &usage) != child || !WIFEXITED(status) || WEXITSTATUS(status) != 0) return -1;
    return static_cast<double>(usage.ru_maxrss) / 1024.0;
}

void BM_SvfParse100MB(benchmark::State& state)
{
    BigFile file;
    const double base = childPeakMB("");
    const double peak = childPeakMB(file.path());
    const unsigned handle = newSession();
    for (auto _ : state)
        if (!dryRun(handle, file.path())) state.SkipWithError("the dry run failed");
    JexJtag_session_destroy(handle);
    state.counters["MB/s"] = benchmark::Counter(static_cast<double>(file.size()) / 1e6 * state.iterations(),
                                                benchmark::Counter::kIsRate);
    state.counters["base_MB"] = base;
    state.counters["peak_MB"] = peak;
    state.counters["file_MB"] = static_cast<double>(file.size()) / 1e6;
}

// ---- play: one 16 Mbit SDR end to end ---------------------------------------

constexpr size_t kDigits = 4 * 1024 * 1024; // 16 Mbit

void playSdr(benchmark::State& state, unsigned handle, const std::string& text)
{
    JexJtagSvfResult result{};
    for (auto _ : state)
        if (JexJtag_svf_playText(handle, text.data(), text.size(), "bench", nullptr, &result) != JEX_SUCCESS) {
            state.SkipWithError("the play failed");
            break;
        }
    state.counters["bits/s"] =
        benchmark::Counter(static_cast<double>(kDigits * 4) * state.iterations(), benchmark::Counter::kIsRate);
    state.counters["checks"] = static_cast<double>(result.checks);
}

// jtag_sim with four BYPASS devices: TDO is TDI one hex digit late.
void BM_SvfPlay16MbitSim(benchmark::State& state)
{
    const unsigned handle = newSession();
    const char* argv[] = {"chain=none:2,none:2,none:2,none:2", "port=svf-bench"};
    if (JexJtag_target_open(handle, "jtag_sim", nullptr, 2, argv, nullptr) != JEX_SUCCESS) std::abort();
    const std::string p = hexDigits(kDigits - 1, 3);
    const std::string text = "SIR 8 TDI (FF);\nSDR " + std::to_string(kDigits * 4) + " TDI (" + p + ")\n TDO (" + p +
                             "0);\n";
    playSdr(state, handle, text);
    JexJtag_session_destroy(handle);
}

// The idle plug-in leaves TDO untouched, so the expected TDO is all zeros
// (compared in full).
void BM_SvfPlay16MbitIdle(benchmark::State& state)
{
    const unsigned handle = newSession(JEXJTAG_BENCH_PLUGIN_ROOT);
    if (JexJtag_target_open(handle, "idle_cable", nullptr, 0, nullptr, nullptr) != JEX_SUCCESS) {
        state.SkipWithError("the idle cable could not be opened");
        JexJtag_session_destroy(handle);
        return;
    }
    const std::string text = "SIR 8 TDI (FF);\nSDR " + std::to_string(kDigits * 4) + " TDI (" +
                             hexDigits(kDigits, 4) + ")\n TDO (0);\n";
    playSdr(state, handle, text);
    JexJtag_session_destroy(handle);
}

} // namespace

BENCHMARK(BM_SvfParse100MB)->Iterations(3)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SvfPlay16MbitSim)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SvfPlay16MbitIdle)->Unit(benchmark::kMillisecond);
