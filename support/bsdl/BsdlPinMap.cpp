// SPDX-License-Identifier: MIT
#include "bsdl/BsdlPinMap.hpp"

#include "bsdl/BsdlText.hpp"
#include "bsdl/BsdlTextScanner.hpp"

namespace jexbsdl {

namespace {

// Ports beyond this many elements in all get none ("bit_vector(0 to
// 2000000000)"); real devices have a few thousand.
constexpr long kMaxElements = 1 << 17;

} // namespace

void BsdlPinMap::addPort(Port port)
{
    const size_t index = m_ports.size();
    const auto addElement = [&](std::string name) {
        m_index.emplace(upperCase(name), m_elements.size());
        m_elements.push_back(Element {std::move(name), std::string(), index});
    };
    if (!port.vector) {
        addElement(port.name);
    } else {
        const long step = port.left <= port.right ? 1 : -1;
        const long count = (port.left <= port.right ? port.right - port.left : port.left - port.right) + 1;
        if (count <= kMaxElements - static_cast<long>(m_elements.size()))
            for (long i = port.left;; i += step) {
                addElement(port.name + "(" + std::to_string(i) + ")");
                if (i == port.right) break;
            }
    }
    m_ports.push_back(std::move(port));
}

long BsdlPinMap::find(const std::string& elementName) const
{
    std::string key;
    key.reserve(elementName.size());
    for (char c : elementName)
        if (c != ' ' && c != '\t') key += toUpperAscii(c);
    const auto it = m_index.find(key);
    return it == m_index.end() ? -1 : static_cast<long>(it->second);
}

void BsdlPinMap::applyPinMap(const std::string& constantName, const BsdlStringValue& value,
                             BsdlDiagnostics& diagnostics)
{
    m_pinMapName = constantName;
    BsdlTextScanner s(value, diagnostics, "PIN_MAP_STRING " + constantName);
    if (s.atEnd()) return;
    for (;;) {
        const unsigned line = s.line();
        s.setContext(std::string());
        const std::string portName(s.identifier("a port name"));
        s.setContext("port " + portName);
        s.expect(':', "after the port name");
        std::vector<std::string> pins;
        if (s.accept('(')) {
            do pins.emplace_back(s.word("a pin", ",():"));
            while (s.accept(','));
            s.expect(')', "after the pins");
        } else {
            pins.emplace_back(s.word("a pin", ",():"));
        }

        const Port* port = nullptr;
        for (const Port& p : m_ports)
            if (equalsIgnoreCase(p.name, portName)) port = &p;
        if (!port) {
            diagnostics.warning(line, "PIN_MAP_STRING " + constantName + " maps port " + portName +
                                          ", which the port clause does not declare");
        } else if (!port->vector) {
            if (pins.size() != 1)
                diagnostics.warning(line, "port " + portName + " is a bit but gets " + std::to_string(pins.size()) +
                                              " pins; the first is used");
            m_elements[static_cast<size_t>(find(port->name))].pin = pins.front();
        } else {
            const long count = (port->left <= port->right ? port->right - port->left : port->left - port->right) + 1;
            if (static_cast<long>(pins.size()) != count)
                diagnostics.warning(line, "port " + portName + " has " + std::to_string(count) + " elements but gets " +
                                              std::to_string(pins.size()) + " pins");
            const long step = port->left <= port->right ? 1 : -1;
            long index = port->left;
            for (size_t k = 0; k < pins.size() && static_cast<long>(k) < count; ++k, index += step) {
                const long element = find(port->name + "(" + std::to_string(index) + ")");
                if (element >= 0) m_elements[static_cast<size_t>(element)].pin = pins[k];
            }
        }
        if (s.atEnd()) return;
        s.setContext(std::string());
        s.expect(',', "between ports");
        if (s.atEnd()) return; // a trailing ',' is common and harmless
    }
}

} // namespace jexbsdl
