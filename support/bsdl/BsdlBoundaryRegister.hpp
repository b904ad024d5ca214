// SPDX-License-Identifier: MIT
#pragma once
// BsdlBoundaryRegister - the cells of a BOUNDARY_REGISTER attribute:
//
//   "num (cell, port, function, safe [, ccell, disval, rslt])" , ...
//
// for example "2 (BC_1, IO(0), output3, X, 3, 0, Z)".  A port of "*" means
// the cell has no port.  Cells are kept by number; every number from 0 to
// BOUNDARY_LENGTH - 1 must be described, once, or twice for a merged cell
// (an input entry and a control or output entry of the same number).

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlStringValue.hpp"

namespace jexbsdl {

class BsdlBoundaryRegister {
public:
    // IEEE 1149.1 cell functions, in the order of the C API's values.
    enum class Function { Input, Clock, Output2, Output3, Control, Controlr, Internal, Bidir, ObserveOnly };

    struct Cell {
        unsigned number = 0;
        std::string cellType;      // "BC_1" as written
        std::string port;          // "IO(0)", "CLK" or "*"
        Function function = Function::Internal;
        char safe = 'X';           // '0', '1' or 'X'
        int controlCell = -1;      // -1: no disable fields (ccell, disval, rslt)
        char disableValue = 0;     // '0' or '1' with a control cell, else 0
        std::string disableResult; // "Z", "WEAK0", "WEAK1", "PULL0", "PULL1", "KEEPER"; "" without
        std::string mergedInput;   // a merged cell's input port (a second entry
                                   // "16 (BC_1, OE, input, X)" beside its control
                                   // entry); "" for a plain cell
        unsigned line = 0;         // line of the file the cell stands on
        bool described = false;    // false for a number no entry described
    };

    // The function's name as BSDL writes it ("observe_only"); "" for none.
    static const char* functionName(Function function);
    // True for control and controlr.
    static bool isControl(Function function) { return function == Function::Control || function == Function::Controlr; }
    // True for the functions whose cell drives a pin: output2, output3, bidir.
    static bool drives(Function function)
    {
        return function == Function::Output2 || function == Function::Output3 || function == Function::Bidir;
    }
    // True for the functions whose cell captures a pin: input, clock, bidir, observe_only.
    static bool captures(Function function)
    {
        return function == Function::Input || function == Function::Clock || function == Function::Bidir ||
               function == Function::ObserveOnly;
    }

    // Parses the attribute for a register of `length` cells; throws (through
    // diagnostics) for a malformed entry, a number out of range or given
    // twice, an unknown function, or disable fields whose control
    // cell is not a control cell (an output2 or bidir cell may name itself:
    // open drain); a number left undescribed is an error too.
    void parse(const BsdlStringValue& value, unsigned length, BsdlDiagnostics& diagnostics);

    // The cells, indexed by number.
    const std::vector<Cell>& cells() const { return m_cells; }
    size_t size() const { return m_cells.size(); }
    bool empty() const { return m_cells.empty(); }

private:
    std::vector<Cell> m_cells;
};

} // namespace jexbsdl
