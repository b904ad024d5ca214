// SPDX-License-Identifier: MIT
#pragma once
// SimPart - a simulated device's make-up taken from a BSDL file: IDCODE,
// IR length and capture, every instruction with its opcodes, and the
// boundary register with the pins its cells capture and drive.  Immutable
// once loaded; devices share it.
//
// Instructions the simulation acts on (by name, any case): BYPASS, IDCODE,
// SAMPLE, PRELOAD, EXTEST, HIGHZ, CLAMP.  Every other opcode the file
// declares, and every opcode it does not declare, selects BYPASS.  X bits
// of opcodes match either level; X bits of IDCODE and capture read 0.

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace jexsim {

class SimPart {
public:
    enum class Instruction { Bypass, Idcode, Sample, Extest, Highz, Clamp };

    struct Opcode {
        uint64_t value = 0;
        uint64_t mask = 0; // bits the opcode fixes
        Instruction instruction = Instruction::Bypass;
    };

    struct Cell {
        int pin = -1;         // pin the cell captures or drives; -1 none
        bool captures = false;
        bool drives = false;
        int mergedPin = -1;   // a merged cell's input pin
        int controlCell = -1; // cell that enables this output; -1: always on
        bool disableValue = false;
    };

    struct Pin {
        std::string name;    // port element, "IO(0)"
        std::string package; // package pin, "" when unmapped
        int outputCell = -1;
    };

    // Reads the BSDL file; null with `error` set when it cannot be used (not
    // readable, not sound BSDL, IR longer than 64 bits).
    static std::shared_ptr<const SimPart> load(const std::string& path, std::string& error);

    const std::string& path() const { return m_path; }
    const std::string& entity() const { return m_entity; }
    bool hasIdcode() const { return m_hasIdcode; }
    uint32_t idcode() const { return m_idcode; }
    uint32_t irLength() const { return m_irLength; }
    uint64_t irCapture() const { return m_capture; }
    // The first IDCODE opcode (X as 0); the BYPASS opcode when none.
    uint64_t idcodeOpcode() const { return m_idcodeOpcode; }

    Instruction decode(uint64_t instruction) const;
    const std::vector<Cell>& cells() const { return m_cells; }
    const std::vector<Pin>& pins() const { return m_pins; }
    // Pin by port element ("IO(0)", any case) or package pin; -1 when none.
    int findPin(const std::string& name) const;

private:
    std::string m_path;
    std::string m_entity;
    bool m_hasIdcode = false;
    uint32_t m_idcode = 0;
    uint32_t m_irLength = 0;
    uint64_t m_capture = 1;
    uint64_t m_idcodeOpcode = 0;
    std::vector<Opcode> m_opcodes;
    std::vector<Cell> m_cells;
    std::vector<Pin> m_pins;
};

} // namespace jexsim
