// SPDX-License-Identifier: MIT
#include "TapStateTable.hpp"

#include <array>

#include "jexjtag/types.h"

namespace jexjtag::serve {

namespace {

constexpr unsigned kStates = JEXJTAG_STATE_SIZE;

// kNext[state][tms]
constexpr uint8_t kNext[kStates][2] = {
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_TEST_LOGIC_RESET}, // Test-Logic-Reset
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},   // Run-Test/Idle
    {JEXJTAG_CAPTURE_DR, JEXJTAG_SELECT_IR_SCAN},      // Select-DR-Scan
    {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},              // Capture-DR
    {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},              // Shift-DR
    {JEXJTAG_PAUSE_DR, JEXJTAG_UPDATE_DR},             // Exit1-DR
    {JEXJTAG_PAUSE_DR, JEXJTAG_EXIT2_DR},              // Pause-DR
    {JEXJTAG_SHIFT_DR, JEXJTAG_UPDATE_DR},             // Exit2-DR
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},   // Update-DR
    {JEXJTAG_CAPTURE_IR, JEXJTAG_TEST_LOGIC_RESET},    // Select-IR-Scan
    {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},              // Capture-IR
    {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},              // Shift-IR
    {JEXJTAG_PAUSE_IR, JEXJTAG_UPDATE_IR},             // Exit1-IR
    {JEXJTAG_PAUSE_IR, JEXJTAG_EXIT2_IR},              // Pause-IR
    {JEXJTAG_SHIFT_IR, JEXJTAG_UPDATE_IR},             // Exit2-IR
    {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},   // Update-IR
};

// Distances and shortest-path counts by breadth-first search from each state.
struct Tables {
    std::array<std::array<uint8_t, kStates>, kStates> distance{};
    std::array<std::array<uint8_t, kStates>, kStates> paths{};

    Tables()
    {
        for (unsigned from = 0; from < kStates; ++from) {
            auto& dist = distance[from];
            auto& count = paths[from];
            dist.fill(0xFF);
            dist[from] = 0;
            count[from] = 1;
            unsigned queue[kStates];
            unsigned head = 0, tail = 0;
            queue[tail++] = from;
            while (head < tail) {
                const unsigned s = queue[head++];
                for (unsigned tms = 0; tms < 2; ++tms) {
                    const unsigned n = kNext[s][tms];
                    if (dist[n] == 0xFF) {
                        dist[n] = static_cast<uint8_t>(dist[s] + 1);
                        count[n] = count[s];
                        queue[tail++] = n;
                    } else if (dist[n] == dist[s] + 1) {
                        count[n] = static_cast<uint8_t>(count[n] + count[s] > 2 ? 2 : count[n] + count[s]);
                    }
                }
            }
        }
    }
};

const Tables& tables()
{
    static const Tables t;
    return t;
}

} // namespace

unsigned TapStateTable::next(unsigned state, bool tms) { return kNext[state % kStates][tms ? 1 : 0]; }

unsigned TapStateTable::distance(unsigned from, unsigned to) { return tables().distance[from][to]; }

bool TapStateTable::hasUniqueShortestPath(unsigned from, unsigned to) { return tables().paths[from][to] == 1; }

bool TapStateTable::isShift(unsigned state) { return state == JEXJTAG_SHIFT_DR || state == JEXJTAG_SHIFT_IR; }

bool TapStateTable::holds(unsigned state, bool tms)
{
    if (state == JEXJTAG_TEST_LOGIC_RESET) return tms;
    return !tms && (state == JEXJTAG_RUN_TEST_IDLE || state == JEXJTAG_PAUSE_DR || state == JEXJTAG_PAUSE_IR);
}

} // namespace jexjtag::serve
