// SPDX-License-Identifier: MIT
// The 16-state TAP controller and its shortest TMS paths.
#include <gtest/gtest.h>

#include <array>
#include <queue>

#include "jexjtag/cable/TapController.hpp"

using jexcable::TapController;

namespace {

constexpr JexJtagTapState S(int s) { return static_cast<JexJtagTapState>(s); }

// IEEE 1149.1 figure 6-1, written out independently: {state, next on TMS 0, next on TMS 1}.
struct Edge {
    JexJtagTapState from, on0, on1;
};
constexpr Edge kDiagram[] = {
    {JEXJTAG_TEST_LOGIC_RESET, JEXJTAG_RUN_TEST_IDLE, JEXJTAG_TEST_LOGIC_RESET},
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
    {JEXJTAG_SELECT_DR_SCAN, JEXJTAG_CAPTURE_DR, JEXJTAG_SELECT_IR_SCAN},
    {JEXJTAG_CAPTURE_DR, JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},
    {JEXJTAG_SHIFT_DR, JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},
    {JEXJTAG_EXIT1_DR, JEXJTAG_PAUSE_DR, JEXJTAG_UPDATE_DR},
    {JEXJTAG_PAUSE_DR, JEXJTAG_PAUSE_DR, JEXJTAG_EXIT2_DR},
    {JEXJTAG_EXIT2_DR, JEXJTAG_SHIFT_DR, JEXJTAG_UPDATE_DR},
    {JEXJTAG_UPDATE_DR, JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
    {JEXJTAG_SELECT_IR_SCAN, JEXJTAG_CAPTURE_IR, JEXJTAG_TEST_LOGIC_RESET},
    {JEXJTAG_CAPTURE_IR, JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},
    {JEXJTAG_SHIFT_IR, JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},
    {JEXJTAG_EXIT1_IR, JEXJTAG_PAUSE_IR, JEXJTAG_UPDATE_IR},
    {JEXJTAG_PAUSE_IR, JEXJTAG_PAUSE_IR, JEXJTAG_EXIT2_IR},
    {JEXJTAG_EXIT2_IR, JEXJTAG_SHIFT_IR, JEXJTAG_UPDATE_IR},
    {JEXJTAG_UPDATE_IR, JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
};

// Distances by a plain breadth-first search over the diagram above.
std::array<std::array<int, 16>, 16> distances()
{
    std::array<std::array<int, 16>, 16> dist{};
    for (int from = 0; from < 16; ++from) {
        dist[from].fill(-1);
        dist[from][from] = 0;
        std::queue<int> q;
        q.push(from);
        while (!q.empty()) {
            const int s = q.front();
            q.pop();
            for (JexJtagTapState n : {kDiagram[s].on0, kDiagram[s].on1})
                if (dist[from][n] < 0) {
                    dist[from][n] = dist[from][s] + 1;
                    q.push(n);
                }
        }
    }
    return dist;
}

} // namespace

TEST(TapController, EveryStateFollowsTheIeeeDiagram)
{
    for (int s = 0; s < 16; ++s) {
        ASSERT_EQ(kDiagram[s].from, S(s));
        EXPECT_EQ(TapController::next(S(s), false), kDiagram[s].on0) << TapController::name(s);
        EXPECT_EQ(TapController::next(S(s), true), kDiagram[s].on1) << TapController::name(s);
        TapController tap(S(s));
        EXPECT_EQ(tap.clock(true), kDiagram[s].on1);
        EXPECT_EQ(tap.state(), kDiagram[s].on1);
    }
}

TEST(TapController, PathsAreShortestAndArrive)
{
    const auto dist = distances();
    for (int from = 0; from < 16; ++from) {
        for (int to = 0; to < 16; ++to) {
            const TapController::Path p = TapController::path(S(from), S(to));
            EXPECT_EQ(p.length, dist[from][to]) << TapController::name(from) << " -> " << TapController::name(to);
            EXPECT_LE(p.length, 8);
            TapController tap(S(from));
            for (unsigned i = 0; i < p.length; ++i) tap.clock(p.tmsAt(i));
            EXPECT_EQ(tap.state(), S(to)) << TapController::name(from) << " -> " << TapController::name(to);
        }
    }
}

