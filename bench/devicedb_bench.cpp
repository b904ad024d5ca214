// SPDX-License-Identifier: MIT
// Device database speed: session creation with the installation's list,
// reading a 100,000-line list, and one lookup.
//
// "Shipped list" is build/share/jexjtag/idcode.lst.  While that file holds
// no entries, a realistic generated list of 700 entries stands in for it
// (the label says which was used).

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include "jexjtag/JexRT.hpp"

namespace fs = std::filesystem;

namespace {

std::string bits(unsigned value, int count)
{
    std::string text;
    for (int i = count - 1; i >= 0; --i) text += ((value >> i) & 1u) ? '1' : '0';
    return text;
}

// A list like a vendor-collected one: manufacturer codes, part numbers, a
// don't-care version field on most lines, some comments and blank lines.
std::string generateList(unsigned lines, unsigned seed)
{
    std::mt19937 rng(seed);
    std::ostringstream out;
    out << "# generated IDCODE list\n";
    for (unsigned i = 1; i < lines; ++i) {
        const unsigned r = rng();
        if (r % 20 == 0) {
            out << (r % 40 == 0 ? "\n" : "# family notes\n");
            continue;
        }
        const unsigned mfg = (rng() % 0x7FFu) << 1 | 1u;
        const unsigned part = rng() & 0xFFFFu;
        const std::string version = (r % 5 < 3) ? "XXXX" : bits(rng() & 0xFu, 4);
        out << version << '_' << bits(part, 16) << '_' << bits(mfg, 12) << ' ' << 4 + rng() % 29 << ' '
            << rng() % 16 << ' ' << rng() % 8 << " DEV" << i << "_" << std::hex << part << std::dec << "\n";
    }
    return out.str();
}

unsigned countEntries(const std::string& text)
{
    JexRT::Jex_DeviceData table;
    std::istringstream in(text);
    try {
        table.addEntriesFromFile("count", in, false);
    } catch (...) {
        return 0;
    }
    return static_cast<unsigned>(table.getEntryCount());
}

std::string readText(const fs::path& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream s;
    s << in.rdbuf();
    return s.str();
}

// A private scratch directory for the run.
const fs::path& scratch()
{
    static const fs::path dir = [] {
        std::string pattern = (fs::temp_directory_path() / "jexjtag-bench-XXXXXX").string();
        if (!mkdtemp(pattern.data())) std::abort();
        return fs::path(pattern);
    }();
    return dir;
}

struct ScratchCleanup {
    ScratchCleanup() { scratch(); } // made first, so it outlives this object
    ~ScratchCleanup()
    {
        std::error_code ec;
        fs::remove_all(scratch(), ec);
    }
};

// The data directory with the list the benchmarks use.
struct ListUnderTest {
    fs::path dir;
    std::string label;
    std::string text;
    unsigned entries = 0;
    std::vector<unsigned> codes; // one concrete code per entry

    ListUnderTest()
    {
        const fs::path shipped = fs::path(JEXJTAG_TEST_BUILD_DIR) / "share/jexjtag";
        text = readText(shipped / "idcode.lst");
        entries = countEntries(text);
        if (entries > 0) {
            dir = shipped;
            label = "shipped list";
        } else {
            dir = scratch() / "data";
            fs::create_directories(dir);
            text = generateList(740, 1);
            std::ofstream(dir / "idcode.lst", std::ios::binary) << text;
            entries = countEntries(text);
            label = "generated list";
        }
        JexRT::Jex_DeviceData table;
        std::istringstream in(text);
        table.addEntriesFromFile("codes", in, false);
        for (size_t i = 0; i < table.getEntryCount(); ++i) codes.push_back(table.getEntry(i).getIdcode());
        label += " (" + std::to_string(entries) + " entries)";
    }
};

ListUnderTest& list()
{
    static ScratchCleanup cleanup;
    static ListUnderTest l;
    return l;
}

std::string datadirArg() { return "datadir=" + list().dir.string(); }

void BM_SessionCreateDestroy(benchmark::State& state)
{
    const std::string arg = datadirArg();
    const char* argv[] = {arg.c_str()};
    for (auto _ : state) {
        unsigned handle = 0;
        if (JexJtag_session_create(nullptr, 1, argv, &handle) != JEX_SUCCESS) {
            state.SkipWithError("session creation failed");
            break;
        }
        JexJtag_session_destroy(handle);
    }
    state.SetLabel(list().label);
    state.SetItemsProcessed(state.iterations() * list().entries);
}
BENCHMARK(BM_SessionCreateDestroy)->Unit(benchmark::kMicrosecond);

void BM_Read100kLineList(benchmark::State& state)
{
    static const std::string text = generateList(100000, 2);
    for (auto _ : state) {
        JexRT::Jex_DeviceData table;
        std::istringstream in(text);
        table.addEntriesFromFile("big.lst", in, true);
        benchmark::DoNotOptimize(table.getEntryCount());
    }
    state.SetItemsProcessed(state.iterations() * 100000); // lines per second
    state.SetBytesProcessed(state.iterations() * static_cast<int64_t>(text.size()));
}
BENCHMARK(BM_Read100kLineList)->Unit(benchmark::kMillisecond);

void BM_Read100kLineFile(benchmark::State& state)
{
    list();
    const fs::path path = scratch() / "big.lst";
    std::ofstream(path, std::ios::binary) << generateList(100000, 2);
    for (auto _ : state) {
        JexRT::DeviceDB db;
        db.read(path.string(), false);
        benchmark::DoNotOptimize(db.getDeviceData().getEntryCount());
    }
    fs::remove(path);
    state.SetItemsProcessed(state.iterations() * 100000);
}
BENCHMARK(BM_Read100kLineFile)->Unit(benchmark::kMillisecond);

// One lookup through the C API; the codes walk the whole list, so the mean
// covers early and late entries alike.
void BM_LookupDevice(benchmark::State& state)
{
    const std::string arg = datadirArg();
    const char* argv[] = {arg.c_str()};
    unsigned handle = 0;
    if (JexJtag_session_create(nullptr, 1, argv, &handle) != JEX_SUCCESS) {
        state.SkipWithError("session creation failed");
        return;
    }
    std::vector<std::string> texts;
    for (unsigned code : list().codes) texts.push_back(JexRT::IDCode(code).getIDCode());
    size_t i = 0;
    char name[128];
    char bypass[64];
    unsigned irlen = 0;
    for (auto _ : state) {
        JexJtag_db_lookupDevice(handle, texts[i].c_str(), name, sizeof name, &irlen, bypass, sizeof bypass);
        benchmark::DoNotOptimize(irlen);
        if (++i == texts.size()) i = 0;
    }
    JexJtag_session_destroy(handle);
    state.SetLabel(list().label);
}
BENCHMARK(BM_LookupDevice)->Unit(benchmark::kNanosecond);

// A code no entry matches: the scan goes through the whole list.
void BM_LookupMiss(benchmark::State& state)
{
    const std::string arg = datadirArg();
    const char* argv[] = {arg.c_str()};
    unsigned handle = 0;
    if (JexJtag_session_create(nullptr, 1, argv, &handle) != JEX_SUCCESS) {
        state.SkipWithError("session creation failed");
        return;
    }
    char name[128];
    char bypass[64];
    unsigned irlen = 0;
    for (auto _ : state) {
        JexJtag_db_lookupDevice(handle, "00000000000000000000000000000000", name, sizeof name, &irlen, bypass,
                                sizeof bypass);
        benchmark::DoNotOptimize(irlen);
    }
    JexJtag_session_destroy(handle);
    state.SetLabel(list().label);
}
BENCHMARK(BM_LookupMiss)->Unit(benchmark::kNanosecond);

} // namespace
