// SPDX-License-Identifier: MIT
#include "jexjtag/cable/TapController.hpp"

#include <array>

namespace jexcable {

namespace {

using S = JexJtagTapState;
constexpr unsigned kStates = JEXJTAG_STATE_SIZE;

constexpr const char* kNames[kStates] = {
    "Test-Logic-Reset", "Run-Test/Idle", "Select-DR-Scan", "Capture-DR", "Shift-DR", "Exit1-DR",
    "Pause-DR",         "Exit2-DR",      "Update-DR",      "Select-IR-Scan", "Capture-IR", "Shift-IR",
    "Exit1-IR",         "Pause-IR",      "Exit2-IR",       "Update-IR",
};

using PathTable = std::array<std::array<TapController::Path, kStates>, kStates>;

// Breadth-first search from every state, trying TMS 0 before TMS 1.
PathTable buildPaths()
{
    PathTable table{};
    for (unsigned from = 0; from < kStates; ++from) {
        std::array<bool, kStates> seen{};
        std::array<unsigned, kStates> queue{};
        unsigned head = 0;
        unsigned tail = 0;
        seen[from] = true;
        queue[tail++] = from;
        while (head < tail) {
            const unsigned s = queue[head++];
            for (unsigned tms = 0; tms < 2; ++tms) {
                const unsigned n = TapController::next(static_cast<S>(s), tms != 0);
                if (seen[n]) continue;
                seen[n] = true;
                TapController::Path p = table[from][s];
                p.tms = static_cast<uint8_t>(p.tms | (tms << p.length));
                ++p.length;
                table[from][n] = p;
                queue[tail++] = n;
            }
        }
    }
    return table;
}

} // namespace

TapController::Path TapController::path(JexJtagTapState from, JexJtagTapState to)
{
    static const PathTable table = buildPaths();
    return table[static_cast<unsigned>(from) % kStates][static_cast<unsigned>(to) % kStates];
}

bool TapController::isStable(JexJtagTapState state)
{
    switch (state) {
    case JEXJTAG_TEST_LOGIC_RESET:
    case JEXJTAG_RUN_TEST_IDLE:
    case JEXJTAG_SHIFT_DR:
    case JEXJTAG_PAUSE_DR:
    case JEXJTAG_SHIFT_IR:
    case JEXJTAG_PAUSE_IR:
        return true;
    default:
        return false;
    }
}

const char* TapController::name(uint32_t state)
{
    return state < kStates ? kNames[state] : "?";
}

} // namespace jexcable
