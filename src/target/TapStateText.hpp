// SPDX-License-Identifier: MIT
#pragma once
// TapStateText - the name a trace prints for a TAP state value, without
// heap allocation.  Build one only when the level that prints it is on.
//
// The table holds the 16 state names (JEXJTAG_TEST_LOGIC_RESET ..
// JEXJTAG_UPDATE_IR) and, for 16 (JEXJTAG_STATE_SIZE, the number of states),
// the empty text.  A value past the table reads "unknown(N)"; nothing is
// ever read past the table.

#include "jexjtag/types.h"

namespace JexRT {

class TapStateText {
public:
    static constexpr unsigned kTableSize = JEXJTAG_STATE_SIZE + 1;

    // The table entry for state, or null for a value past the table.
    static const char* tableName(unsigned state);

    explicit TapStateText(unsigned state);
    const char* c_str() const { return m_text; }

private:
    const char* m_text;
    char m_unknown[24];
};

} // namespace JexRT
