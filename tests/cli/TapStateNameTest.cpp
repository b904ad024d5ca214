// TAP state names accepted by --exit.

#include <gtest/gtest.h>

#include "TapStateName.hpp"
#include "UsageError.hpp"
#include "jexjtag/types.h"

using namespace jexjtag::cli;

TEST(TapStateNameTest, CanonicalNamesRoundTrip)
{
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s) {
        EXPECT_EQ(s, parseTapState(tapStateName(s)));
        EXPECT_EQ(s, parseTapState("JEXJTAG_" + tapStateName(s)));
        EXPECT_EQ(s, parseTapState(std::to_string(s)));
    }
    EXPECT_EQ("STATE_16", tapStateName(16));
}

TEST(TapStateNameTest, FriendlySpellings)
{
    EXPECT_EQ(unsigned{JEXJTAG_RUN_TEST_IDLE}, parseTapState("idle"));
    EXPECT_EQ(unsigned{JEXJTAG_RUN_TEST_IDLE}, parseTapState("run-test-idle"));
    EXPECT_EQ(unsigned{JEXJTAG_RUN_TEST_IDLE}, parseTapState("JEXJTAG_RUN_TEST_IDLE"));
    EXPECT_EQ(unsigned{JEXJTAG_RUN_TEST_IDLE}, parseTapState("jexjtag-run-test-idle"));
    EXPECT_EQ(unsigned{JEXJTAG_TEST_LOGIC_RESET}, parseTapState("reset"));
    EXPECT_EQ(unsigned{JEXJTAG_TEST_LOGIC_RESET}, parseTapState("TLR"));
    EXPECT_EQ(unsigned{JEXJTAG_PAUSE_DR}, parseTapState("pause-dr"));
    EXPECT_EQ(unsigned{JEXJTAG_PAUSE_IR}, parseTapState("Pause_IR"));
}

TEST(TapStateNameTest, OtherNamesAreUsageErrors)
{
    for (const char* name : {"", "16", "pause", "JEXJTAG_", "idle ", "-1", "RUN_TEST_IDLEX"})
        EXPECT_THROW(parseTapState(name), UsageError) << name;
}
