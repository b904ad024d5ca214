// SPDX-License-Identifier: MIT
#pragma once
// BsdlPinMap - the device's ports (from the entity's port clause) and the
// package pins a PIN_MAP_STRING constant gives them:
//
//   port (CLK : in bit; IO : inout bit_vector(0 to 3); ...);
//   constant PKG : PIN_MAP_STRING := "CLK : 1, IO : (5, 6, 7, 8)";
//
// A bit_vector port becomes one element per index, named "IO(0)"; the pins
// of its list go to the indexes in the order the range declares them
// (left index first, so "(3 downto 0)" gives IO(3) the first pin).

#include <string>
#include <unordered_map>
#include <vector>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlStringValue.hpp"

namespace jexbsdl {

class BsdlPinMap {
public:
    struct Port {
        std::string name;      // as written
        std::string mode;      // in, out, inout, buffer, linkage (lower case)
        bool vector = false;   // bit_vector
        long left = 0;         // range of a bit_vector, as declared
        long right = 0;
        unsigned line = 0;
    };

    struct Element {
        std::string name;      // "CLK" or "IO(0)"
        std::string pin;       // package pin; "" when the pin map gives none
        size_t port = 0;       // index into ports()
    };

    // Adds a port declared by the port clause.
    void addPort(Port port);
    // Reads a PIN_MAP_STRING constant's value into the elements' pins;
    // throws (through diagnostics) when it does not follow the syntax, warns
    // about ports the clause does not declare and lists of the wrong size.
    void applyPinMap(const std::string& constantName, const BsdlStringValue& value, BsdlDiagnostics& diagnostics);

    const std::vector<Port>& ports() const { return m_ports; }
    const std::vector<Element>& elements() const { return m_elements; }
    const std::string& pinMapName() const { return m_pinMapName; }
    // The element named "IO(0)" or "CLK" (any case), or -1.
    long find(const std::string& elementName) const;

private:
    std::vector<Port> m_ports;
    std::vector<Element> m_elements;
    std::unordered_map<std::string, size_t> m_index; // upper-case element name -> element
    std::string m_pinMapName;
};

} // namespace jexbsdl
