// SPDX-License-Identifier: MIT
#pragma once
// SimBoard - what surrounds the simulated parts made from BSDL files: the
// levels the board holds their pins at, and wires between pins of two
// parts.  Text forms (the "pins" and "wire" options):
//
//   pins := setting (";" setting)*     setting := DEVICE ":" PIN "=" 0|1
//   wire := link (";" link)*           link    := DEVICE ":" PIN "-" DEVICE ":" PIN
//
// DEVICE is the chain index (0 nearest TDO) of a device made from a BSDL
// file; PIN a port element ("IO(0)", any case) or a package pin ("A4").
// Wired pins form one net: a pin a part drives (EXTEST, CLAMP) sets the
// level of its whole net; an undriven net reads the level set for any of
// its pins, else 0.

#include <cstdint>
#include <string>
#include <vector>

#include "DeviceSpec.hpp"

namespace jexsim {

struct SimBoard {
    struct PinRef {
        std::size_t device = 0;
        std::string pin; // as written
        bool operator==(const PinRef& o) const { return device == o.device && pin == o.pin; }
    };
    struct Setting {
        PinRef pin;
        bool level = false;
    };
    struct Wire {
        PinRef a, b;
    };

    std::vector<Setting> levels;
    std::vector<Wire> wires;
    uint64_t version = 0; // changes with every change, so users can cache

    // Adds (or changes) the settings of `text`; "" clears them all.  False
    // with `error` set when the text is bad or names a pin `chain` lacks
    // (nothing changes then).
    bool setLevels(const std::string& text, const std::vector<DeviceSpec>& chain, std::string& error);
    // Replaces the wires; "" removes them all.  Same checks.
    bool setWires(const std::string& text, const std::vector<DeviceSpec>& chain, std::string& error);
    std::string formatLevels() const;
    std::string formatWires() const;

    // The pin index a reference names in `chain`, or -1.
    static int resolve(const PinRef& ref, const std::vector<DeviceSpec>& chain);
};

} // namespace jexsim
