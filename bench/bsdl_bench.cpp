// SPDX-License-Identifier: MIT
// BSDL reader throughput: the largest vendor file of the tests and a
// generated file with a 10,000-cell boundary register, each parsed from the
// file (read included), from memory, and merely read into memory.  The
// "vs_read" counter is the parse time over the plain read time of the same
// file, both in processor time (the machine may be shared).

#include <benchmark/benchmark.h>

#include <cstdio>
#include <ctime>
#include <fstream>
#include <sstream>
#include <cstdlib>
#include <string>
#include <vector>

#include "bsdl/BsdlReader.hpp"
#include "jexjtag/jexjtag.h"
#include "hostlayer/Port_MsgDispatcher.hpp"
#include "hostlayer/Port_MsgMan.hpp"

namespace {

const std::string kLargestVendorFile = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/bsdl/data/intel_BroadwellDE_CPU.bsd";

class QuietMsgMan : public Port_MsgMan {
public:
    void outputMsg(MsgType, const wchar_t*) override {}
};

void silenceWarnings()
{
    static QuietMsgMan quiet;
    static const bool done = [] {
        Port_MsgMan* printer = Port_MsgDispatcher::getDefaultMsgMan();
        Port_MsgDispatcher::addMsgMan(&quiet);
        Port_MsgDispatcher::removeMsgMan(printer);
        return true;
    }();
    (void)done;
}

// A device with 3,333 bidirectional pins: 10,000 boundary cells (per pin an
// input, an output3 and its control cell, and one internal cell at the end).
std::string generatedFile()
{
    static const std::string path = [] {
        const unsigned pins = 3333, cells = 10000;
        std::ostringstream s;
        s << "-- Generated: " << cells << " boundary cells\n"
          << "entity BIG_DEVICE is\n"
          << "  generic (PHYSICAL_PIN_MAP : string := \"BGA\");\n"
          << "  port (TCK, TMS, TDI : in bit; TDO : out bit;\n"
          << "        IO : inout bit_vector (0 to " << pins - 1 << "));\n"
          << "  use STD_1149_1_2001.all;\n"
          << "  attribute COMPONENT_CONFORMANCE of BIG_DEVICE : entity is \"STD_1149_1_2001\";\n"
          << "  attribute PIN_MAP of BIG_DEVICE : entity is PHYSICAL_PIN_MAP;\n"
          << "  constant BGA : PIN_MAP_STRING :=\n"
          << "    \"TCK : A1, TMS : A2, TDI : A3, TDO : A4, \" &\n"
          << "    \"IO : (";
        for (unsigned i = 0; i < pins; ++i) {
            s << "P" << i << (i + 1 < pins ? ", " : ")\";\n");
            if (i % 12 == 11 && i + 1 < pins) s << "\" &\n    \"";
        }
        s << "  attribute TAP_SCAN_IN of TDI : signal is true;\n"
          << "  attribute TAP_SCAN_MODE of TMS : signal is true;\n"
          << "  attribute TAP_SCAN_OUT of TDO : signal is true;\n"
          << "  attribute TAP_SCAN_CLOCK of TCK : signal is (50.0e6, BOTH);\n"
          << "  attribute INSTRUCTION_LENGTH of BIG_DEVICE : entity is 10;\n"
          << "  attribute INSTRUCTION_OPCODE of BIG_DEVICE : entity is\n"
          << "    \"BYPASS (1111111111), EXTEST (0000001111), SAMPLE (0000000101), \" &\n"
          << "    \"PRELOAD (0000000101), IDCODE (0000000110), HIGHZ (0000001011)\";\n"
          << "  attribute INSTRUCTION_CAPTURE of BIG_DEVICE : entity is \"0000000001\";\n"
          << "  attribute IDCODE_REGISTER of BIG_DEVICE : entity is\n"
          << "    \"0001\" & \"0010001101000101\" & \"00000110111\" & \"1\";\n"
          << "  attribute BOUNDARY_LENGTH of BIG_DEVICE : entity is " << cells << ";\n"
          << "  attribute BOUNDARY_REGISTER of BIG_DEVICE : entity is\n";
        for (unsigned c = 0; c + 1 < cells; ++c) {
            const unsigned pin = c / 3;
            if (c % 3 == 0)
                s << "    \"" << c << " (BC_1, IO(" << pin << "), input, X), \" &\n";
            else if (c % 3 == 1)
                s << "    \"" << c << " (BC_1, IO(" << pin << "), output3, X, " << c + 1 << ", 0, Z), \" &\n";
            else
                s << "    \"" << c << " (BC_1, *, control, 0), \" &\n";
        }
        s << "    \"" << cells - 1 << " (BC_1, *, internal, X)\";\n";
        s << "end BIG_DEVICE;\n";
        const std::string file = std::string(JEXJTAG_TEST_BUILD_DIR) + "/bench/bsdl_10000_cells.bsd";
        std::ofstream(file, std::ios::binary) << s.str();
        return file;
    }();
    return path;
}

// What any reader has to do at least: one buffer of the file's size, one read.
std::string readFile(const std::string& path)
{
    std::string content;
    std::FILE* f = std::fopen(path.c_str(), "rb");
    if (!f) return content;
    std::fseek(f, 0, SEEK_END);
    content.resize(static_cast<size_t>(std::ftell(f)));
    std::fseek(f, 0, SEEK_SET);
    content.resize(std::fread(&content[0], 1, content.size(), f));
    std::fclose(f);
    return content;
}

std::string pathOf(int which) { return which == 0 ? kLargestVendorFile : generatedFile(); }

double secondsPerRead(const std::string& path)
{
    const int rounds = 200;
    const std::clock_t start = std::clock();
    for (int i = 0; i < rounds; ++i) benchmark::DoNotOptimize(readFile(path));
    return static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC / rounds;
}

double secondsPerParse(const std::string& path)
{
    const int rounds = 50;
    const std::clock_t start = std::clock();
    for (int i = 0; i < rounds; ++i) {
        BsdlReader* reader = BsdlReader::CreateBsdlReader(path.c_str());
        if (reader) reader->removeReader();
    }
    return static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC / rounds;
}

void labelFor(benchmark::State& state, const std::string& path, size_t size)
{
    state.SetLabel((state.range(0) == 0 ? "vendor " : "generated ") + path.substr(path.rfind('/') + 1) + " (" +
                   std::to_string(size / 1024) + " KiB)");
}

void BM_ReadFileOnly(benchmark::State& state)
{
    const std::string path = pathOf(static_cast<int>(state.range(0)));
    size_t size = 0;
    for (auto _ : state) {
        std::string content = readFile(path);
        size = content.size();
        benchmark::DoNotOptimize(content);
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * size));
    labelFor(state, path, size);
}

void BM_ParseFile(benchmark::State& state)
{
    silenceWarnings();
    const std::string path = pathOf(static_cast<int>(state.range(0)));
    const size_t size = readFile(path).size();
    for (auto _ : state) {
        BsdlReader* reader = BsdlReader::CreateBsdlReader(path.c_str());
        if (!reader) {
            state.SkipWithError("not read");
            return;
        }
        benchmark::DoNotOptimize(reader->getInstructionOpcode("BYPASS"));
        reader->removeReader();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * size));
    state.counters["vs_read"] = secondsPerParse(path) / secondsPerRead(path);
    labelFor(state, path, size);
}

void BM_ParseBuffer(benchmark::State& state)
{
    silenceWarnings();
    const std::string path = pathOf(static_cast<int>(state.range(0)));
    const std::string content = readFile(path);
    for (auto _ : state) {
        BsdlReader* reader = BsdlReader::CreateBsdlReaderFromBuffer(path.c_str(), content.data(), content.size());
        if (!reader) {
            state.SkipWithError("not read");
            return;
        }
        benchmark::DoNotOptimize(reader->getIdcode());
        reader->removeReader();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * content.size()));
    labelFor(state, path, content.size());
}

void quiet(unsigned, unsigned, const char*) {}

// A BSDL library of all the test files, as "scan --bsdl-dir" reads it once
// per run: a fresh session, every file read and indexed, one lookup.
void BM_LibraryDirectory(benchmark::State& state)
{
    const std::string dir = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/bsdl/data";
    unsigned added = 0;
    for (auto _ : state) {
        unsigned handle = 0;
        JexJtag_session_create(quiet, 0, nullptr, &handle);
        if (JEX_FAILED(JexJtag_bsdl_addDirectory(handle, dir.c_str(), &added))) {
            state.SkipWithError("directory not read");
            return;
        }
        char entity[128];
        unsigned ir = 0;
        JexJtag_bsdl_findByIdcode(handle, "00000010100000100000000011001011", entity, sizeof entity, &ir, nullptr, 0);
        JexJtag_session_destroy(handle);
    }
    state.counters["files"] = added;
    state.SetLabel("tests/bsdl/data");
}

// SAMPLE of the generated 10,000-cell part on jtag_sim, between two other
// devices: IR scan, 10,002-bit DR scan, decoding 3,333 pins.
void BM_SampleOnJtagSim(benchmark::State& state)
{
    setenv("JEXJTAG_PLUGIN_DIR", (std::string(JEXJTAG_TEST_BUILD_DIR) + "/lib/plugins").c_str(), 1);
    setenv("JEXJTAG_LOCK_DIR", (std::string(JEXJTAG_TEST_BUILD_DIR) + "/bench").c_str(), 1);
    unsigned handle = 0;
    JexJtag_session_create(quiet, 0, nullptr, &handle);
    const std::string chain = "chain=0x4BA00477:4,bsdl=" + generatedFile() + ",0x0362D093:6";
    const char* argv[] = {chain.c_str(), "port=bsdl-bench"};
    unsigned part = 0;
    if (JEX_FAILED(JexJtag_target_open(handle, "jtag_sim", nullptr, 2, argv, nullptr)) ||
        JEX_FAILED(JexJtag_tap_autodetectChain(handle, 0)) ||
        JEX_FAILED(JexJtag_bsdl_open(handle, generatedFile().c_str(), &part))) {
        state.SkipWithError("jtag_sim with the generated part cannot be opened");
        JexJtag_session_destroy(handle);
        return;
    }
    std::vector<signed char> levels(4000);
    std::vector<unsigned char> cells(10000 / 8 + 1);
    for (auto _ : state) {
        if (JEX_FAILED(JexJtag_bsdl_sample(handle, 1, part, levels.data(), static_cast<unsigned>(levels.size()),
                                           cells.data(), static_cast<unsigned>(cells.size())))) {
            state.SkipWithError("sample failed");
            break;
        }
    }
    state.counters["cells"] = 10000;
    JexJtag_target_close(handle);
    JexJtag_session_destroy(handle);
}

} // namespace

BENCHMARK(BM_LibraryDirectory)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SampleOnJtagSim)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_ReadFileOnly)->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_ParseFile)->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_ParseBuffer)->Arg(0)->Arg(1)->Unit(benchmark::kMicrosecond);
