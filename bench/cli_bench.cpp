// SPDX-License-Identifier: MIT
// The jexjtag program as a whole process: start, load the library and its
// plug-ins, read the device list, do the job, exit.  Each iteration spawns
// the built program and waits for it; output goes to /dev/null.

#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>
#include <vector>

extern char** environ;

namespace {

const std::string kProgram = std::string(JEXJTAG_TEST_BUILD_DIR) + "/bin/jexjtag";

// Runs the program with args; false when it could not start or failed.
bool runProgram(const std::vector<std::string>& args)
{
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);
    std::vector<std::string> store{kProgram};
    store.insert(store.end(), args.begin(), args.end());
    std::vector<char*> argv;
    for (std::string& a : store) argv.push_back(a.data());
    argv.push_back(nullptr);
    pid_t pid = 0;
    const int rc = posix_spawn(&pid, kProgram.c_str(), &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (rc != 0) return false;
    int status = 0;
    while (waitpid(pid, &status, 0) < 0)
        if (errno != EINTR) return false;
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

void runEach(benchmark::State& state, const std::vector<std::string>& args)
{
    // A port of the benchmark's own, so no other user of sim0 makes it wait.
    std::vector<std::string> withPort = args;
    if (!args.empty() && args[0] != "--help" && args[0] != "lookup") {
        withPort.push_back("--arg");
        withPort.push_back("port=cli-bench-" + std::to_string(getpid()));
    }
    for (auto _ : state) {
        if (!runProgram(withPort)) {
            state.SkipWithError(("jexjtag failed: " + kProgram).c_str());
            break;
        }
    }
}

// Process start and exit alone: the program prints its help, no library call.
void BM_JexjtagHelp(benchmark::State& state) { runEach(state, {"--help"}); }
// One session and a database lookup: library and plug-in loading, idcode.lst.
void BM_JexjtagLookup(benchmark::State& state) { runEach(state, {"lookup", "0x0362D093"}); }
// The whole scan: open the simulated cable, lock, autodetect, names, close.
void BM_JexjtagScan(benchmark::State& state) { runEach(state, {"scan"}); }
void BM_JexjtagScanJson(benchmark::State& state) { runEach(state, {"scan", "--json"}); }

} // namespace

BENCHMARK(BM_JexjtagHelp)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_JexjtagLookup)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_JexjtagScan)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_JexjtagScanJson)->Unit(benchmark::kMillisecond)->UseRealTime();
