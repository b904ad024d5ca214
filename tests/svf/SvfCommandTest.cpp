// SPDX-License-Identifier: MIT
// `jexjtag svf` as a process on jtag_sim's default chain: exit statuses,
// the summary line, the mismatch and error texts on stderr, --json.

#include <gtest/gtest.h>

#include <string>

#include "ProgramRunner.hpp"

namespace {

const std::string kData = JEXJTAG_SVF_DATA_DIR;

class SvfCommandTest : public ::testing::Test {
protected:
    SvfCommandTest()
    {
        m_runner.setEnv("JEXJTAG_LOCK_DIR", (m_runner.dir() / "locks").string());
        std::filesystem::create_directories(m_runner.dir() / "locks");
    }
    clitest::RunResult svf(std::vector<std::string> args)
    {
        args.insert(args.begin(), "svf");
        args.push_back("--arg");
        args.push_back("port=svf-cli-" + std::to_string(getpid()));
        return m_runner.run(args);
    }
    clitest::ProgramRunner m_runner;
};

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

} // namespace

TEST_F(SvfCommandTest, ExitStatusesAndTexts)
{
    auto r = svf({kData + "/good-one-device.svf"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_TRUE(contains(r.out, "good-one-device.svf: passed: 19 statements, 3 checks, 0 mismatches, ")) << r.out;
    EXPECT_EQ("", r.err) << "no progress bar when stderr is not a terminal";

    r = svf({kData + "/mismatch-idcode.svf"});
    EXPECT_EQ(1, r.exitCode);
    EXPECT_TRUE(contains(r.out, "mismatch-idcode.svf: FAILED: 6 statements, 2 checks, 1 mismatches")) << r.out;
    EXPECT_TRUE(contains(r.err, "mismatch-idcode.svf:10: TDO mismatch: expected 3BA00477 got 4BA00477 mask "
                                "FFFFFFFF (first at bit 28)"))
        << r.err;

    r = svf({kData + "/mismatch-idcode.svf", "--keep-going"});
    EXPECT_EQ(1, r.exitCode);
    EXPECT_TRUE(contains(r.out, "8 statements, 4 checks, 1 mismatches")) << r.out;

    r = svf({kData + "/wrong-length-changed.svf", "--dry-run"});
    EXPECT_EQ(1, r.exitCode);
    EXPECT_TRUE(contains(r.err, "wrong-length-changed.svf:5: TDI is required: SDR length changed from 16 to 32"))
        << r.err;

    EXPECT_EQ(2, svf({}).exitCode);
    EXPECT_EQ(2, svf({kData + "/good-sticky.svf", "--frequency", "fast"}).exitCode);
}

TEST_F(SvfCommandTest, JsonRecord)
{
    const auto r = svf({kData + "/mismatch-idcode.svf", "--json", "--frequency", "1M"});
    EXPECT_EQ(1, r.exitCode);
    for (const char* part : {"\"outcome\": \"mismatch\"", "\"dry_run\": false", "\"checks\": 2", "\"error\": null",
                             "\"line\": 10", "\"bit\": 28", "\"expected\": \"3BA00477\"", "\"actual\": \"4BA00477\"",
                             "\"mask\": \"FFFFFFFF\""})
        EXPECT_TRUE(contains(r.out, part)) << part << " in " << r.out;
}
