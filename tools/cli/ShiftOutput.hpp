// SPDX-License-Identifier: MIT
#pragma once
// The result of "shift": TDO, in the notation the data was written in.

#include <optional>
#include <ostream>
#include <string>

#include "BitVector.hpp"
#include "DataText.hpp"

namespace jexjtag::cli {

struct ShiftResult {
    std::string reg;                // "ir" or "dr"
    std::optional<unsigned> device; // none: the whole chain
    unsigned exitState = 0;
    DataNotation notation = DataNotation::Hex;
    std::optional<BitVector> tdi; // none: a read-only shift
    BitVector tdo;
    // The instruction shifted first (shift dr --ir), in its own notation.
    struct Instruction {
        DataNotation notation = DataNotation::Hex;
        BitVector tdi;
        BitVector tdo;
    };
    std::optional<Instruction> instruction;
};

// One line: TDO of the register named (the dr shift's after --ir).
void writeShiftText(std::ostream& out, const ShiftResult& result);
void writeShiftJson(std::ostream& out, const ShiftResult& result);

} // namespace jexjtag::cli
