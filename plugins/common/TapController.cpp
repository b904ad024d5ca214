#include "jexjtag/cable/TapController.hpp"

#include <array>

namespace jexcable {

namespace {

using S = JexJtagTapState;
constexpr unsigned kStates = JEXJTAG_STATE_SIZE;

// kNext[state][tms], IEEE 1149.1 figure 6-1.
constexpr S kNext[kStates][2] = {
    /* TEST_LOGIC_RESET */ {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_TEST_LOGIC_RESET},
    /* RUN_TEST_IDLE    */ {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
    /* SELECT_DR_SCAN   */ {JEXJTAG_CAPTURE_DR, JEXJTAG_SELECT_IR_SCAN},
    /* CAPTURE_DR       */ {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},
    /* SHIFT_DR         */ {JEXJTAG_SHIFT_DR, JEXJTAG_EXIT1_DR},
    /* EXIT1_DR         */ {JEXJTAG_PAUSE_DR, JEXJTAG_UPDATE_DR},
    /* PAUSE_DR         */ {JEXJTAG_PAUSE_DR, JEXJTAG_EXIT2_DR},
    /* EXIT2_DR         */ {JEXJTAG_SHIFT_DR, JEXJTAG_UPDATE_DR},
    /* UPDATE_DR        */ {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
    /* SELECT_IR_SCAN   */ {JEXJTAG_CAPTURE_IR, JEXJTAG_TEST_LOGIC_RESET},
    /* CAPTURE_IR       */ {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},
    /* SHIFT_IR         */ {JEXJTAG_SHIFT_IR, JEXJTAG_EXIT1_IR},
    /* EXIT1_IR         */ {JEXJTAG_PAUSE_IR, JEXJTAG_UPDATE_IR},
    /* PAUSE_IR         */ {JEXJTAG_PAUSE_IR, JEXJTAG_EXIT2_IR},
    /* EXIT2_IR         */ {JEXJTAG_SHIFT_IR, JEXJTAG_UPDATE_IR},
    /* UPDATE_IR        */ {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_SELECT_DR_SCAN},
};

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
                const unsigned n = kNext[s][tms];
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

JexJtagTapState TapController::next(JexJtagTapState state, bool tms)
{
    return kNext[static_cast<unsigned>(state) % kStates][tms ? 1 : 0];
}

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
