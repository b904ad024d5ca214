// SPDX-License-Identifier: MIT
#pragma once
// IR lengths from a whole-chain IR capture.  IEEE 1149.1 makes the two
// instruction-register bits nearest TDO of every device capture 1 then 0,
// so each device's IR starts where the captured bits (first out first) show
// a 1 followed by a 0.  With as many such places as devices the lengths are
// certain; with more, the neighbouring pieces whose joined length is
// smallest are joined (the pair nearest TDO on a tie) until one piece per
// device is left, and the result is ambiguous; with fewer there is none.
// This is the rule the cable plug-ins' chain interrogation follows.

#include <string>
#include <vector>

namespace jexjtag::cli {

struct IrInference {
    bool ok = false;
    bool ambiguous = false;
    std::vector<unsigned> lengths; // one per device, device 0 first
    std::string error;
};

// Splits the capture of `deviceCount` devices.
IrInference splitIrCapture(const std::vector<bool>& capture, unsigned deviceCount);

// Lengths for the devices whose entry in `known` is 0, the others' being
// known: a single run of unknown devices gets exactly the capture bits
// between its known neighbours (split by the rule above); several runs are
// placed by splitting the whole capture, which is then ambiguous unless it
// agrees with every known length (and fails when the lengths do not add up).
// A run of one device is never ambiguous: its bits are its IR.
IrInference inferUnknownIrLengths(const std::vector<bool>& capture, const std::vector<unsigned>& known);

} // namespace jexjtag::cli
