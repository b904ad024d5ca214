// SPDX-License-Identifier: MIT
#include "boundary/BsdlPart.hpp"

#include <memory>

#include "bsdl/BsdlReader.hpp"
#include "bsdl/BsdlText.hpp"

namespace JexRT {

namespace {

struct ReaderRelease {
    void operator()(BsdlReader* reader) const { reader->removeReader(); }
};

std::unique_ptr<BsdlPart> fromReader(BsdlReader* created, const std::string& path)
{
    std::unique_ptr<BsdlReader, ReaderRelease> reader(created);
    if (!reader) return nullptr;
    return std::make_unique<BsdlPart>(reader->entity(), path);
}

} // namespace

std::unique_ptr<BsdlPart> BsdlPart::fromFile(const std::string& path)
{
    return fromReader(BsdlReader::CreateBsdlReader(path.c_str()), path);
}

std::unique_ptr<BsdlPart> BsdlPart::fromBuffer(const std::string& name, const char* data, size_t size)
{
    return fromReader(BsdlReader::CreateBsdlReaderFromBuffer(name.c_str(), data, size), name);
}

BsdlPart::BsdlPart(jexbsdl::BsdlEntity entity, std::string path) : m_entity(std::move(entity)), m_path(std::move(path))
{
    buildPins();
}

void BsdlPart::buildPins()
{
    using Register = jexbsdl::BsdlBoundaryRegister;
    const auto& elements = m_entity.pins.elements();
    std::vector<Pin> byElement(elements.size());
    std::vector<bool> used(elements.size(), false);
    for (const Cell& cell : m_entity.boundary.cells()) {
        const auto attach = [&](const std::string& port, Function function) {
            if (port == "*") return;
            const long e = m_entity.pins.find(port);
            if (e < 0) return;
            Pin& pin = byElement[static_cast<size_t>(e)];
            used[static_cast<size_t>(e)] = true;
            const int number = static_cast<int>(cell.number);
            if (Register::captures(function) && pin.inputCell < 0) pin.inputCell = number;
            if (Register::drives(function) && pin.outputCell < 0) {
                pin.outputCell = number;
                pin.controlCell = cell.controlCell;
            }
        };
        attach(cell.port, cell.function);
        if (!cell.mergedInput.empty()) attach(cell.mergedInput, Function::Input);
    }
    for (size_t e = 0; e < elements.size(); ++e) {
        if (!used[e]) continue;
        Pin pin = byElement[e];
        pin.port = elements[e].name;
        pin.pin = elements[e].pin;
        const auto& cells = m_entity.boundary.cells();
        if (pin.outputCell >= 0 && pin.inputCell >= 0) pin.function = Function::Bidir;
        else if (pin.outputCell >= 0) pin.function = cells[static_cast<size_t>(pin.outputCell)].function;
        else if (pin.inputCell >= 0) pin.function = cells[static_cast<size_t>(pin.inputCell)].function;
        else continue; // only internal or control cells name it
        // A merged input counts as input, whatever its cell's main function.
        if (pin.outputCell < 0 && pin.inputCell >= 0 &&
            !Register::captures(cells[static_cast<size_t>(pin.inputCell)].function))
            pin.function = Function::Input;
        pin.cell = pin.outputCell >= 0 ? pin.outputCell : pin.inputCell;
        m_pins.push_back(std::move(pin));
    }
}

long BsdlPart::findPin(const std::string& name) const
{
    const long element = m_entity.pins.find(name);
    for (size_t i = 0; i < m_pins.size(); ++i) {
        if (element >= 0 && jexbsdl::equalsIgnoreCase(m_pins[i].port, m_entity.pins.elements()[element].name))
            return static_cast<long>(i);
    }
    for (size_t i = 0; i < m_pins.size(); ++i)
        if (!m_pins[i].pin.empty() && jexbsdl::equalsIgnoreCase(m_pins[i].pin, name)) return static_cast<long>(i);
    return -1;
}

std::string BsdlPart::opcode(const char* instruction) const
{
    const auto* found = m_entity.instructions.find(instruction);
    if (!found) return {};
    std::string bits = found->opcodes.front();
    for (char& c : bits)
        if (c == 'X' || c == 'x') c = '0';
    return bits;
}

std::vector<uint8_t> BsdlPart::safeBits() const
{
    std::vector<uint8_t> bits;
    bits.reserve(m_entity.boundary.size());
    for (const Cell& cell : m_entity.boundary.cells()) bits.push_back(cell.safe == '1' ? 1 : 0);
    return bits;
}

} // namespace JexRT
