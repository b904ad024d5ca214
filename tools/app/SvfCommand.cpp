// SPDX-License-Identifier: MIT
// The "svf" command: plays an SVF file on the target through the library's
// player, with a progress bar on a terminal, a summary line and --json.

#include <unistd.h>

#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "CliError.hpp"
#include "JsonWriter.hpp"
#include "LibrarySession.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "TargetConnection.hpp"
#include "UsageError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag svf FILE [OPTIONS]

Plays the Serial Vector Format file FILE on the target: opens it, takes
the cable lock, resets the TAP and runs the file statement by statement.
Each statement is read whole and checked before it reaches the cable;
play stops at the first error in the file (naming its line) and, unless
--keep-going, at the first TDO mismatch (printing the line and the
expected, actual and mask vectors).  HIR/HDR/TIR/TDR are played as one
whole-chain scan with the SIR/SDR.  PIO, PIOMAP and RUNTEST ... SCK are
refused.

On a terminal, stderr shows a progress bar (percent, bytes/s, time left);
stdout gets a summary line.  Exit status: 0 every check passed; 1 a check
failed, the file has an error or the cable failed; 2 usage error.

Options:
      --keep-going     count TDO mismatches and play on to the end
      --dry-run        check the whole file without touching the cable
      --frequency HZ   never clock TCK faster than HZ (k, M suffixes allowed;
                       the file's FREQUENCY may lower it further)
      --json           {"file", "dry_run", "outcome", "statements", "checks",
                       "mismatches", "milliseconds", "error": {"line",
                       "message"}, "first_mismatch": {"line", "bit",
                       "expected", "actual", "mask"}} (null when none)
  -t, --target TYPE, -a, --arg KEY=VALUE, --chain CHAIN, --lock-wait MS:
                       see jexjtag --help

Examples:
  jexjtag svf idcodes.svf
  jexjtag svf bitstream.svf --frequency 10M
  jexjtag svf test.svf --dry-run --json
  jexjtag svf flash.svf --target remote_bitbang --arg host=127.0.0.1 --arg port=3335
)HELP";

// "1E6", "250k", "10M": Hz above 0; throws UsageError.
double parseHz(const std::string& text)
{
    char* end = nullptr;
    double hz = std::strtod(text.c_str(), &end);
    const std::string rest = end ? end : "";
    if (rest == "k" || rest == "K") hz *= 1e3;
    else if (rest == "M") hz *= 1e6;
    else if (rest == "G") hz *= 1e9;
    else if (!rest.empty() || end == text.c_str()) hz = -1;
    if (!(hz > 0) || !std::isfinite(hz)) throw UsageError("--frequency needs a frequency in Hz, not '" + text + "'");
    return hz;
}

std::string rateText(double perSecond)
{
    char text[32];
    if (perSecond >= 1e6) std::snprintf(text, sizeof text, "%.1f MB/s", perSecond / 1e6);
    else std::snprintf(text, sizeof text, "%.0f kB/s", perSecond / 1e3);
    return text;
}

// The bar on stderr, redrawn at most ten times a second.
struct ProgressBar {
    std::chrono::steady_clock::time_point start = std::chrono::steady_clock::now();
    std::chrono::steady_clock::time_point last{};
    bool drawn = false;

    static int draw(void* user, uint64_t done, uint64_t total, uint64_t statements)
    {
        auto* bar = static_cast<ProgressBar*>(user);
        const auto now = std::chrono::steady_clock::now();
        if (now - bar->last < std::chrono::milliseconds(100) && done != total) return 0;
        bar->last = now;
        const double seconds = std::chrono::duration<double>(now - bar->start).count();
        const double rate = seconds > 0 ? static_cast<double>(done) / seconds : 0;
        char line[160];
        if (total > 0) {
            const double share = static_cast<double>(done) / static_cast<double>(total);
            const int filled = static_cast<int>(share * 30);
            const double left = rate > 0 ? static_cast<double>(total - done) / rate : 0;
            std::snprintf(line, sizeof line, "\r[%.*s%.*s] %3.0f%%  %s  %llu statements  %d:%02d left ", filled,
                          "##############################", 30 - filled, "..............................",
                          share * 100, rateText(rate).c_str(), static_cast<unsigned long long>(statements),
                          static_cast<int>(left) / 60, static_cast<int>(left) % 60);
        } else {
            std::snprintf(line, sizeof line, "\r%llu bytes  %s  %llu statements ", static_cast<unsigned long long>(done),
                          rateText(rate).c_str(), static_cast<unsigned long long>(statements));
        }
        std::fputs(line, stderr);
        std::fflush(stderr);
        bar->drawn = true;
        return 0;
    }
    void clear() const
    {
        if (drawn) std::fputs("\r\033[K", stderr);
    }
};

const char* outcomeName(uint32_t outcome)
{
    switch (outcome) {
    case JEXJTAG_SVF_PASSED: return "passed";
    case JEXJTAG_SVF_MISMATCH: return "mismatch";
    case JEXJTAG_SVF_BAD_FILE: return "bad_file";
    case JEXJTAG_SVF_CABLE: return "cable";
    case JEXJTAG_SVF_CANCELLED: return "cancelled";
    default: return "unknown";
    }
}

struct Texts {
    std::string expected = std::string(4096, '\0');
    std::string actual = std::string(4096, '\0');
    std::string mask = std::string(4096, '\0');
    std::string message = std::string(4096, '\0');
};

void writeJson(std::ostream& out, const std::string& file, bool dry, const JexJtagSvfResult& r, uint64_t ms)
{
    JsonWriter json(out);
    json.beginObject();
    json.key("file").string(file);
    json.key("dry_run").boolean(dry);
    json.key("outcome").string(outcomeName(r.outcome));
    json.key("statements").number(r.statements);
    json.key("checks").number(r.checks);
    json.key("mismatches").number(r.mismatches);
    json.key("milliseconds").number(ms);
    if (r.outcome != JEXJTAG_SVF_PASSED && r.outcome != JEXJTAG_SVF_MISMATCH) {
        json.key("error").beginObject();
        json.key("line").number(r.errorLine);
        json.key("message").string(r.message);
        json.endObject();
    } else {
        json.key("error").null();
    }
    if (r.mismatches) {
        json.key("first_mismatch").beginObject();
        json.key("line").number(r.firstMismatchLine);
        json.key("bit").number(r.firstMismatchBit);
        json.key("expected").string(r.expected);
        json.key("actual").string(r.actual);
        json.key("mask").string(r.mask);
        json.endObject();
    } else {
        json.key("first_mismatch").null();
    }
    json.endObject();
    json.finish();
}

void runSvf(const Options& options, MessageSink& sink, std::ostream& out)
{
    const std::string file = options.operands.at(0);
    const bool dry = options.flag("dry-run");
    JexJtagSvfOptions play;
    JexJtag_svf_initOptions(&play);
    if (options.flag("keep-going")) play.flags |= JEXJTAG_SVF_KEEP_GOING;
    if (dry) play.flags |= JEXJTAG_SVF_DRY_RUN;
    if (const auto hz = options.value("frequency")) play.maxFrequencyHz = parseHz(*hz);
    ProgressBar bar;
    if (!options.json && isatty(STDERR_FILENO)) {
        play.progress = &ProgressBar::draw;
        play.progressUser = &bar;
    }

    Texts texts;
    JexJtagSvfResult result{};
    result.expected = texts.expected.data();
    result.expectedSize = static_cast<uint32_t>(texts.expected.size());
    result.actual = texts.actual.data();
    result.actualSize = static_cast<uint32_t>(texts.actual.size());
    result.mask = texts.mask.data();
    result.maskSize = static_cast<uint32_t>(texts.mask.size());
    result.message = texts.message.data();
    result.messageSize = static_cast<uint32_t>(texts.message.size());
    const auto start = std::chrono::steady_clock::now();
    uint32_t status = JEX_FAILURE;
    {
        LibrarySession session(options, sink);
        if (dry) {
            status = JexJtag_svf_playFile(session.handle(), file.c_str(), &play, &result);
        } else {
            TargetConnection target(session, options);
            if (!options.noLock) target.lock(options.lockWaitMs);
            status = JexJtag_svf_playFile(target.handle(), file.c_str(), &play, &result);
        }
    }
    bar.clear();
    const auto ms = static_cast<uint64_t>(
        std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - start).count());

    if (options.json) {
        writeJson(out, file, dry, result, ms);
    } else {
        char summary[256];
        std::snprintf(summary, sizeof summary, "%llu statements, %llu checks, %llu mismatches, %.2f s",
                      static_cast<unsigned long long>(result.statements), static_cast<unsigned long long>(result.checks),
                      static_cast<unsigned long long>(result.mismatches), static_cast<double>(ms) / 1000);
        out << file << ": " << (status == JEX_SUCCESS ? (dry ? "checked" : "passed") : "FAILED") << ": " << summary
            << '\n';
    }
    if (status != JEX_SUCCESS) {
        out.flush();
        std::string reason = result.message;
        if (result.outcome == JEXJTAG_SVF_MISMATCH && result.mismatches > 1)
            reason += " (" + std::to_string(result.mismatches) + " mismatches in all)";
        throw CliError(reason.empty() ? file + ": play failed" : reason);
    }
}

} // namespace

extern const Command svfCommand = {
    "svf", "svf FILE", "play a Serial Vector Format file on the target",
    {
        {"keep-going", 0, false},
        {"dry-run", 0, false},
        {"frequency", 0, true, [](const std::string&, const std::string& value) { parseHz(value); }},
    },
    1, 1, "needs one SVF file",
    nullptr,
    [] { return std::string(kPage); },
    runSvf,
};

} // namespace jexjtag::cli
