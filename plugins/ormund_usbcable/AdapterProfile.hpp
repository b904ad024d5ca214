// SPDX-License-Identifier: MIT
#pragma once
// The adapters this cable knows: USB ids, the MPSSE channel wired to the JTAG
// connector, the GPIO levels and directions to start with, and how the reset
// lines are driven.  The values come from the boards' documentation and the
// interface files of the open JTAG tools.
//
// Pin masks are 16 bits: bits 0-7 are xDBUS0-7 (the MPSSE low byte), bits
// 8-15 xCBUS0-7 (the high byte).  TCK, TDI, TDO and TMS are always xDBUS0-3.
// A reset signal has a data mask (the line itself; `dataInverted` when a
// buffer inverts it) and an output-enable mask (a buffer enable, active high
// or low, or the data pin's own direction bit when both masks are equal).
// Asserting drives the line low with the output enabled; releasing drives
// it high (push-pull) or disables the output (open drain, when there is an
// enable and no push-pull).

#include <cstdint>
#include <string>
#include <vector>

namespace jexusb {

struct ResetSignal {
    uint16_t data = 0;
    bool dataInverted = false;
    uint16_t enable = 0;
    bool enableInverted = false;
    bool pushPull = false;

    bool present() const { return data != 0 || enable != 0; }
    // Applies assert (true) or release (false) to the 16-bit pin levels and directions.
    void apply(bool asserted, uint16_t& value, uint16_t& direction) const;
};

struct AdapterProfile {
    const char* name;        // `cable=` value
    const char* description; // what users call the board
    uint16_t vid;
    uint16_t pid;
    const char* product; // USB product string that identifies it; null: any
    char channel;        // 'A'..'D'
    uint16_t value;      // initial pin levels
    uint16_t direction;  // initial directions, 1 = output
    ResetSignal trst;
    ResetSignal srst;
    bool autodetect; // may be picked without cable= (false when its ids are a bare chip's)

    // All profiles, specific boards first, the generic chips last.
    static const std::vector<AdapterProfile>& all();
    // The profile with this name (case-insensitive); null when none.
    static const AdapterProfile* find(const std::string& name);
    // The first autodetectable profile whose ids and product string match.
    static const AdapterProfile* match(uint16_t vid, uint16_t pid, const std::string& product);
    // "name1, name2, ..." for messages.
    static std::string names();
};

} // namespace jexusb
