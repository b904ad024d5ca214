// SPDX-License-Identifier: MIT
#pragma once
// BsdlPart - one device's BSDL description as pin access needs it: the
// entity as read, the pin table (port elements that have a boundary cell,
// with the cells that capture, drive and enable them) and opcode lookups.

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "bsdl/BsdlEntity.hpp"

namespace JexRT {

class BsdlPart {
public:
    using Cell = jexbsdl::BsdlBoundaryRegister::Cell;
    using Function = jexbsdl::BsdlBoundaryRegister::Function;

    struct Pin {
        std::string port;      // "IO(0)"
        std::string pin;       // package pin, "" when unmapped
        Function function = Function::Input;
        int cell = -1;         // driving cell, else capturing cell
        int inputCell = -1;
        int outputCell = -1;
        int controlCell = -1;
    };

    // Reads the file (or the text) in full.  Throws Port::Exception for a
    // malformed file; null when it is not BSDL (the reason was raised).
    static std::unique_ptr<BsdlPart> fromFile(const std::string& path);
    static std::unique_ptr<BsdlPart> fromBuffer(const std::string& name, const char* data, size_t size);

    explicit BsdlPart(jexbsdl::BsdlEntity entity, std::string path);

    const jexbsdl::BsdlEntity& entity() const { return m_entity; }
    const std::string& path() const { return m_path; }
    const std::vector<Pin>& pins() const { return m_pins; }
    // Index of the pin named by port element ("IO(0)", any case) or package
    // pin; -1 when none.
    long findPin(const std::string& name) const;
    // The first opcode of the instruction (X bits as 0), "" when the part
    // has no such instruction.
    std::string opcode(const char* instruction) const;
    // The cells' safe values as register bits (X as 0), cell 0 first.
    std::vector<uint8_t> safeBits() const;

private:
    void buildPins();

    jexbsdl::BsdlEntity m_entity;
    std::string m_path;
    std::vector<Pin> m_pins;
};

} // namespace JexRT
