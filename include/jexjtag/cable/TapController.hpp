// SPDX-License-Identifier: MIT
#pragma once
// The IEEE 1149.1 TAP controller: sixteen states moved by TMS on each rising
// edge of TCK, and the shortest TMS sequence between any two states.
//
// Used on both sides of a cable: a simulated device keeps one per TAP, and a
// cable driver keeps one to follow the state it has driven the chain into.

#include <cstdint>

#include "jexjtag/types.h"

namespace jexcable {

class TapController {
public:
    // A TMS sequence: bit i is the TMS level of the i-th clock.
    struct Path {
        uint8_t tms = 0;
        uint8_t length = 0;
        bool tmsAt(unsigned i) const { return (tms >> i) & 1u; }
    };

    TapController() = default;
    explicit TapController(JexJtagTapState state) : m_state(state) {}

    JexJtagTapState state() const { return m_state; }
    void setState(JexJtagTapState state) { m_state = state; }
    // One rising edge of TCK with this TMS level; returns the new state.
    JexJtagTapState clock(bool tms)
    {
        m_state = next(m_state, tms);
        return m_state;
    }

    static JexJtagTapState next(JexJtagTapState state, bool tms)
    {
        // [state][tms], IEEE 1149.1 figure 6-1, in JexJtagTapState order.
        static constexpr uint8_t kNext[16][2] = {
            {1, 0},   {1, 2},   {3, 9},  {4, 5},  {4, 5},  {6, 8},  {6, 7},  {4, 8},
            {1, 2},   {10, 0},  {11, 12}, {11, 12}, {13, 15}, {13, 14}, {11, 15}, {1, 2},
        };
        return static_cast<JexJtagTapState>(kNext[static_cast<unsigned>(state) & 15u][tms ? 1 : 0]);
    }
    // The shortest TMS sequence from one state to another (empty when equal).
    // Among sequences of the same length the one whose first differing TMS is
    // 0 is chosen.  No shortest path is longer than 8 clocks.
    static Path path(JexJtagTapState from, JexJtagTapState to);
    // True for the six states the TAP stays in while TMS holds one level:
    // Test-Logic-Reset (TMS 1), Run-Test/Idle, Shift-DR, Pause-DR, Shift-IR,
    // Pause-IR (TMS 0).
    static bool isStable(JexJtagTapState state);
    // The TMS level that keeps a stable state (1 only for Test-Logic-Reset).
    static bool holdingTms(JexJtagTapState state) { return state == JEXJTAG_TEST_LOGIC_RESET; }
    static bool isValid(uint32_t state) { return state < JEXJTAG_STATE_SIZE; }
    static bool isShift(JexJtagTapState state) { return state == JEXJTAG_SHIFT_DR || state == JEXJTAG_SHIFT_IR; }
    // IEEE 1149.1 name of a state ("Shift-DR"); "?" for an invalid value.
    static const char* name(uint32_t state);

private:
    JexJtagTapState m_state = JEXJTAG_TEST_LOGIC_RESET;
};

} // namespace jexcable
