// SPDX-License-Identifier: MIT
// The SVF player through the C API on jtag_sim's default chain: every data
// file plays (and checks dry) as its "! expect:" comment says, mismatch
// details and cut texts, a generated multi-megabit SDR with progress and
// cancelling, cable warnings, and calls without a target or file.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <numeric>
#include <sstream>
#include <string>
#include <vector>

#include "SimSession.hpp"
#include "jexjtag/svf.h"

using namespace e2e;

namespace {

// "! expect: pass checks=3" / "mismatch line=10 checks=2" /
// "error line=4 statements=1 text=\"...\"".
struct Expectation {
    std::string kind;
    std::map<std::string, std::string> values;
    uint64_t number(const std::string& key) const { return values.count(key) ? std::stoull(values.at(key)) : 0; }
};

Expectation expectationOf(const std::filesystem::path& file)
{
    std::ifstream in(file);
    std::string line;
    Expectation e;
    while (std::getline(in, line)) {
        const auto at = line.find("! expect: ");
        if (at != 0) continue;
        std::istringstream words(line.substr(10));
        words >> e.kind;
        std::string word;
        while (words >> word) {
            const auto eq = word.find('=');
            std::string value = word.substr(eq + 1);
            if (!value.empty() && value[0] == '"') {
                while (value.size() < 2 || value.back() != '"') {
                    std::string more;
                    if (!(words >> more)) break;
                    value += " " + more;
                }
                value = value.substr(1, value.size() - 2);
            }
            e.values[word.substr(0, eq)] = value;
        }
        break;
    }
    return e;
}

struct Texts {
    char expected[64] = "";
    char actual[64] = "";
    char mask[64] = "";
    char message[512] = "";
};

JexJtagSvfResult resultFor(Texts& t)
{
    JexJtagSvfResult r{};
    r.expected = t.expected;
    r.expectedSize = sizeof t.expected;
    r.actual = t.actual;
    r.actualSize = sizeof t.actual;
    r.mask = t.mask;
    r.maskSize = sizeof t.mask;
    r.message = t.message;
    r.messageSize = sizeof t.message;
    return r;
}

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

class SvfPlayTest : public SimSession {
protected:
    uint32_t play(const std::string& path, uint32_t flags, JexJtagSvfResult& result)
    {
        JexJtagSvfOptions options;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_svf_initOptions(&options));
        options.flags = flags;
        return JexJtag_svf_playFile(m_handle, path.c_str(), &options, &result);
    }
};

} // namespace

TEST_F(SvfPlayTest, DataFilesPlayAsTheirCommentsSay)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    std::vector<std::filesystem::path> files;
    for (const auto& entry : std::filesystem::directory_iterator(JEXJTAG_SVF_DATA_DIR))
        if (entry.path().extension() == ".svf") files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    ASSERT_GE(files.size(), 20u);
    for (const auto& file : files) {
        SCOPED_TRACE(file.filename().string());
        const Expectation want = expectationOf(file);
        for (uint32_t flags : {0u, unsigned{JEXJTAG_SVF_DRY_RUN}}) {
            SCOPED_TRACE(flags ? "dry run" : "play");
            Texts texts;
            JexJtagSvfResult r = resultFor(texts);
            const uint32_t status = play(file.string(), flags, r);
            if (want.kind == "pass" || (want.kind == "mismatch" && flags)) {
                EXPECT_EQ(JEX_SUCCESS, status) << texts.message;
                EXPECT_EQ(unsigned{JEXJTAG_SVF_PASSED}, r.outcome);
                EXPECT_EQ(flags ? 0u : want.number("checks"), r.checks);
                EXPECT_EQ(0u, r.errorLine);
            } else if (want.kind == "mismatch") {
                EXPECT_EQ(JEX_FAILURE, status);
                EXPECT_EQ(unsigned{JEXJTAG_SVF_MISMATCH}, r.outcome);
                EXPECT_EQ(want.number("line"), r.firstMismatchLine);
                EXPECT_EQ(want.number("checks"), r.checks);
            } else {
                ASSERT_EQ("error", want.kind);
                EXPECT_EQ(JEX_FAILURE, status);
                EXPECT_EQ(unsigned{JEXJTAG_SVF_BAD_FILE}, r.outcome);
                EXPECT_EQ(want.number("line"), r.errorLine);
                EXPECT_EQ(want.number("statements"), r.statements) << "nothing runs past the error";
                const std::string where = file.string() + ":" + want.values.at("line") + ": ";
                EXPECT_TRUE(contains(texts.message, where + want.values.at("text"))) << texts.message;
            }
        }
    }
}

TEST_F(SvfPlayTest, MismatchDetailsKeepGoingAndCutTexts)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    const std::string file = std::string(JEXJTAG_SVF_DATA_DIR) + "/mismatch-idcode.svf";
    Texts texts;
    JexJtagSvfResult r = resultFor(texts);
    EXPECT_EQ(JEX_FAILURE, play(file, JEXJTAG_SVF_KEEP_GOING, r));
    EXPECT_EQ(unsigned{JEXJTAG_SVF_MISMATCH}, r.outcome);
    EXPECT_EQ(4u, r.checks);
    EXPECT_EQ(1u, r.mismatches);
    EXPECT_EQ(10u, r.firstMismatchLine);
    EXPECT_EQ(28u, r.firstMismatchBit);
    EXPECT_STREQ("3BA00477", texts.expected);
    EXPECT_STREQ("4BA00477", texts.actual);
    EXPECT_STREQ("FFFFFFFF", texts.mask);
    EXPECT_EQ(file + ":10: TDO mismatch: expected 3BA00477 got 4BA00477 mask FFFFFFFF (first at bit 28)",
              std::string(texts.message));
    const auto warnings = messagesOfType(JEX_MSG_WARNING);
    ASSERT_EQ(1u, warnings.size());
    EXPECT_EQ(file + ":10: TDO mismatch: expected 3BA00477 got 4BA00477 mask FFFFFFFF (first at bit 28)", warnings[0]);

    // Buffers of 4 bytes hold three characters and the NUL.
    char small[3][4];
    JexJtagSvfResult cut{};
    cut.expected = small[0];
    cut.expectedSize = 4;
    cut.actual = small[1];
    cut.actualSize = 4;
    cut.mask = small[2];
    cut.maskSize = 4;
    EXPECT_EQ(JEX_FAILURE, play(file, 0, cut));
    EXPECT_EQ(2u, cut.checks);
    EXPECT_STREQ("3BA", small[0]) << "the digits around the first difference (bit 28)";
    EXPECT_STREQ("4BA", small[1]);
    ASSERT_EQ(1u, messagesOfType(JEX_MSG_ERROR).size()) << "no message buffer: the reason goes to the session";
    EXPECT_TRUE(contains(messagesOfType(JEX_MSG_ERROR)[0], file + ":10: TDO mismatch"));
}

TEST_F(SvfPlayTest, GeneratedMultiMegabitSdrWithProgressAndCancel)
{
    // Four BYPASS-only devices: TDO is TDI four bits (one hex digit) late.
    ASSERT_EQ(JEX_SUCCESS, open("none:2,none:2,none:2,none:2"));
    const size_t digits = 1000000; // 4 Mbit
    std::string p;
    p.reserve(digits + digits / 64);
    uint32_t seed = 12345;
    for (size_t i = 0; i < digits; ++i) {
        seed = seed * 1103515245u + 12345u;
        p += "0123456789ABCDEF"[i == 0 ? 9 : (seed >> 16) & 0xF];
        if (i % 64 == 63) p += '\n';
    }
    const std::string bits = std::to_string(digits * 4 + 4);
    const std::string text = "STATE RESET;\nSIR 8 TDI (FF);\nSDR " + bits + " TDI (" + p + ")\n  TDO (" + p + "0);\n";

    struct Progress {
        int calls = 0;
        uint64_t lastDone = 0, total = 0, statements = 0;
        int cancelAt = 0;
    } progress;
    JexJtagSvfOptions options;
    JexJtag_svf_initOptions(&options);
    options.progressUser = &progress;
    options.progress = [](void* user, uint64_t done, uint64_t total, uint64_t statements) {
        auto* seen = static_cast<Progress*>(user);
        ++seen->calls;
        seen->lastDone = done;
        seen->total = total;
        seen->statements = statements;
        return seen->calls == seen->cancelAt ? 1 : 0;
    };
    JexJtagSvfResult r{};
    EXPECT_EQ(JEX_SUCCESS, JexJtag_svf_playText(m_handle, text.data(), text.size(), "big", &options, &r));
    EXPECT_EQ(1u, r.checks);
    EXPECT_EQ(3u, r.statements);
    EXPECT_GE(progress.calls, 4) << "start, each 256 KiB chunk, end";
    EXPECT_EQ(text.size(), progress.lastDone);
    EXPECT_EQ(text.size(), progress.total);
    EXPECT_EQ(3u, progress.statements);

    // A wrong bit in the middle of the vector is found where it is.
    std::string wrong = text;
    const size_t tdo = wrong.find("TDO (") + 5 + 500000;
    wrong[tdo] = wrong[tdo] == '0' ? '1' : '0';
    Texts texts;
    r = resultFor(texts);
    r.expectedSize = r.actualSize = 20;
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playText(m_handle, wrong.data(), wrong.size(), "big", nullptr, &r));
    EXPECT_EQ(unsigned{JEXJTAG_SVF_MISMATCH}, r.outcome);
    EXPECT_EQ(3u, r.firstMismatchLine);
    // 19 characters: "..." + 13 digits around the differing bit + "..."; they differ in one digit.
    const std::string expected = texts.expected, actual = texts.actual;
    ASSERT_EQ(19u, expected.size()) << expected;
    EXPECT_EQ("...", expected.substr(0, 3));
    EXPECT_EQ("...", expected.substr(16));
    EXPECT_EQ(1, std::inner_product(expected.begin(), expected.end(), actual.begin(), 0, std::plus<>(),
                                    std::not_equal_to<>()));

    // Cancelled on the second report: the SDR being read never runs.
    progress = Progress{};
    progress.cancelAt = 2;
    char message[128];
    r = JexJtagSvfResult{};
    r.message = message;
    r.messageSize = sizeof message;
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playText(m_handle, text.data(), text.size(), "big", &options, &r));
    EXPECT_EQ(unsigned{JEXJTAG_SVF_CANCELLED}, r.outcome);
    EXPECT_EQ(2u, r.statements);
    EXPECT_EQ(0u, r.checks);
    EXPECT_STREQ("big: cancelled by the host", message);
}

TEST_F(SvfPlayTest, FrequencyAndTrstWarningsGoToTheSession)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    const std::string text = "FREQUENCY 1E9 HZ;\nFREQUENCY 1.0E6 HZ;\nTRST OFF;\nTRST ON;\nSTATE IDLE;\n";
    JexJtagSvfResult r{};
    EXPECT_EQ(JEX_SUCCESS, JexJtag_svf_playText(m_handle, text.data(), text.size(), "f.svf", nullptr, &r));
    const auto warnings = messagesOfType(JEX_MSG_WARNING);
    ASSERT_EQ(2u, warnings.size());
    EXPECT_EQ("f.svf:1: FREQUENCY 1000000000 Hz is above the cable's 10000000 Hz: TCK runs at 10000000 Hz",
              warnings[0]);
    EXPECT_EQ("f.svf:3: the cable has no TRST line: TRST statements are left out, TRST ON resets the TAP with TMS",
              warnings[1]);
    EXPECT_EQ("10000000", option("frequency")) << "the cable's frequency is put back";
}

TEST_F(SvfPlayTest, CallsWithoutTargetFileOrSession)
{
    const std::string file = std::string(JEXJTAG_SVF_DATA_DIR) + "/good-chain-idcodes.svf";
    Texts texts;
    JexJtagSvfResult r = resultFor(texts);
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playFile(m_handle, file.c_str(), nullptr, &r));
    EXPECT_EQ(unsigned{JEXJTAG_SVF_CABLE}, r.outcome);
    EXPECT_EQ(file + ": no open target to play on", std::string(texts.message));

    JexJtagSvfOptions dry;
    JexJtag_svf_initOptions(&dry);
    dry.flags = JEXJTAG_SVF_DRY_RUN;
    EXPECT_EQ(JEX_SUCCESS, JexJtag_svf_playFile(m_handle, file.c_str(), &dry, &r)) << "a dry run needs no target";
    EXPECT_EQ(7u, r.statements);

    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playFile(m_handle, (m_dir / "missing.svf").c_str(), &dry, &r));
    EXPECT_EQ(unsigned{JEXJTAG_SVF_BAD_FILE}, r.outcome);
    EXPECT_EQ(0u, r.errorLine);
    EXPECT_TRUE(contains(texts.message, "missing.svf: cannot open: No such file or directory")) << texts.message;
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playFile(m_handle, m_dir.str().c_str(), &dry, &r)) << "a directory";

    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playFile(m_handle, nullptr, &dry, &r));
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playText(m_handle, nullptr, 5, nullptr, &dry, &r));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_svf_playText(m_handle, "", 0, nullptr, &dry, nullptr)) << "an empty text";
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_playText(m_handle + JEX_HANDLE_SESSION_STEP * 7, "", 0, nullptr, &dry, &r));
    EXPECT_EQ(JEX_FAILURE, JexJtag_svf_initOptions(nullptr));
}
