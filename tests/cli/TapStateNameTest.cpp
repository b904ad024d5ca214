// SPDX-License-Identifier: MIT
// TAP state names accepted by --exit.

#include <gtest/gtest.h>

#include <utility>

#include "TapStateName.hpp"
#include "UsageError.hpp"
#include "jexjtag/types.h"

using namespace jexjtag::cli;

TEST(TapStateNameTest, CanonicalNamesNumbersAndFriendlySpellings)
{
    for (unsigned s = 0; s < JEXJTAG_STATE_SIZE; ++s) {
        EXPECT_EQ(s, parseTapState(tapStateName(s)));
        EXPECT_EQ(s, parseTapState("JEXJTAG_" + tapStateName(s)));
        EXPECT_EQ(s, parseTapState(std::to_string(s)));
    }
    EXPECT_EQ("STATE_16", tapStateName(16));
    const std::pair<const char*, unsigned> friendly[] = {
        {"idle", JEXJTAG_RUN_TEST_IDLE}, {"run-test-idle", JEXJTAG_RUN_TEST_IDLE},
        {"jexjtag-run-test-idle", JEXJTAG_RUN_TEST_IDLE}, {"reset", JEXJTAG_TEST_LOGIC_RESET},
        {"TLR", JEXJTAG_TEST_LOGIC_RESET}, {"pause-dr", JEXJTAG_PAUSE_DR}, {"Pause_IR", JEXJTAG_PAUSE_IR}};
    for (const auto& [name, state] : friendly) EXPECT_EQ(state, parseTapState(name)) << name;
}

TEST(TapStateNameTest, OtherNamesAreUsageErrors)
{
    for (const char* name : {"", "16", "pause", "JEXJTAG_", "idle ", "-1", "RUN_TEST_IDLEX"})
        EXPECT_THROW(parseTapState(name), UsageError) << name;
}
