// SPDX-License-Identifier: MIT
#include "bsdl/BsdlBoundaryRegister.hpp"

#include "bsdl/BsdlText.hpp"
#include "bsdl/BsdlTextScanner.hpp"

namespace jexbsdl {

namespace {

using Function = BsdlBoundaryRegister::Function;

struct FunctionName {
    const char* name;
    Function function;
};

constexpr FunctionName kFunctions[] = {
    {"input", Function::Input},       {"clock", Function::Clock},       {"output2", Function::Output2},
    {"output3", Function::Output3},   {"control", Function::Control},   {"controlr", Function::Controlr},
    {"internal", Function::Internal}, {"bidir", Function::Bidir},       {"observe_only", Function::ObserveOnly},
};

constexpr const char* kResults[] = {"Z", "WEAK0", "WEAK1", "PULL0", "PULL1", "KEEPER"};

char bitValue(std::string_view text)
{
    if (text == "0" || text == "1") return text[0];
    if (text == "X" || text == "x") return 'X';
    return 0;
}

} // namespace

const char* BsdlBoundaryRegister::functionName(Function function)
{
    for (const FunctionName& f : kFunctions)
        if (f.function == function) return f.name;
    return "";
}

void BsdlBoundaryRegister::parse(const BsdlStringValue& value, unsigned length, BsdlDiagnostics& diagnostics)
{
    BsdlTextScanner s(value, diagnostics, "BOUNDARY_REGISTER");
    m_cells.assign(length, Cell {});
    std::vector<size_t> offsets(length, 0); // where each cell's entry starts, for late checks
    if (s.atEnd()) s.fail("no cell is described");
    for (;;) {
        const size_t start = (s.skipSpace(), s.position());
        s.setContext(std::string());
        const unsigned long number = s.number("a cell number");
        if (number >= length)
            s.failAt(start, "cell " + std::to_string(number) + " is outside the register of BOUNDARY_LENGTH " +
                                std::to_string(length));
        s.setContext("cell", number);
        Cell& stored = m_cells[number];
        // A second description of a number is a merged cell: one input (or
        // clock, observe_only) and one control or output function.
        Cell second;
        const bool again = stored.described;
        if (again && !stored.mergedInput.empty())
            s.failAt(start, "cell " + std::to_string(number) + " is described a third time");
        Cell& cell = again ? second : stored;
        cell.number = static_cast<unsigned>(number);
        cell.line = s.lineAt(start);
        cell.described = true;
        if (!again) offsets[number] = start;
        s.expect('(', "after the cell number");
        cell.cellType = s.identifier("the cell type");
        s.expect(',', "after the cell type");
        if (s.accept('*')) {
            cell.port = "*";
        } else {
            cell.port = s.identifier("a port name or '*'");
            if (s.accept('(')) {
                cell.port += '(';
                cell.port += std::to_string(s.number("a port index"));
                cell.port += ')';
                s.expect(')', "after the port index");
            }
        }
        s.expect(',', "after the port");
        const size_t functionAt = (s.skipSpace(), s.position());
        const std::string_view function = s.identifier("a cell function");
        bool known = false;
        for (const FunctionName& f : kFunctions)
            if (equalsIgnoreCase(function, f.name)) {
                cell.function = f.function;
                known = true;
            }
        if (!known)
            s.failAt(functionAt, "cell " + std::to_string(number) + " has the unknown function " + quoted(function) +
                                     " (input, clock, output2, output3, control, controlr, internal, bidir, "
                                     "observe_only)");
        s.expect(',', "after the function");
        const std::string_view safe = s.word("a safe value", ",()");
        cell.safe = bitValue(safe);
        if (!cell.safe) s.fail("the safe value of cell " + std::to_string(number) + " must be 0, 1 or X, found " + quoted(safe));
        if (s.accept(',')) {
            const unsigned long control = s.number("a control cell number");
            cell.controlCell = static_cast<int>(control);
            s.expect(',', "after the control cell");
            const std::string_view disable = s.word("a disable value", ",()");
            cell.disableValue = bitValue(disable);
            if (cell.disableValue != '0' && cell.disableValue != '1')
                s.fail("the disable value of cell " + std::to_string(number) + " must be 0 or 1, found " +
                       quoted(disable));
            s.expect(',', "after the disable value");
            const std::string_view result = s.identifier("a disable result");
            for (const char* r : kResults)
                if (equalsIgnoreCase(result, r)) cell.disableResult = r;
            if (cell.disableResult.empty())
                s.fail("the disable result of cell " + std::to_string(number) + " must be Z, WEAK0, WEAK1, PULL0, "
                       "PULL1 or KEEPER, found " + quoted(result));
        }
        s.expect(')', "at the end of the cell");
        if (again) {
            const auto inputOnly = [](const Cell& c) {
                return c.port != "*" && captures(c.function) && c.function != Function::Bidir;
            };
            const auto other = [](const Cell& c) { return !captures(c.function); };
            if (inputOnly(stored) && other(second)) {
                second.mergedInput = stored.port;
                second.line = stored.line;
                stored = second;
            } else if (inputOnly(second) && other(stored)) {
                stored.mergedInput = second.port;
            } else {
                s.failAt(start, "cell " + std::to_string(number) + " is described again (first on line " +
                                    std::to_string(stored.line) + ")");
            }
        }
        if (s.atEnd()) break;
        s.setContext(std::string());
        s.expect(',', "between cells");
        if (s.atEnd()) {
            diagnostics.warning(s.line(), "BOUNDARY_REGISTER ends with a ','");
            break;
        }
    }

    for (const Cell& cell : m_cells) {
        if (!cell.described)
            diagnostics.error(value.firstLine(), "BOUNDARY_REGISTER: cell " + std::to_string(&cell - m_cells.data()) +
                                                     " of BOUNDARY_LENGTH " + std::to_string(length) +
                                                     " is not described");
        if (cell.controlCell < 0) continue;
        const std::string which = "cell " + std::to_string(cell.number);
        if (static_cast<unsigned>(cell.controlCell) >= length)
            s.failAt(offsets[cell.number], which + " names control cell " + std::to_string(cell.controlCell) +
                                               ", which is outside the register");
        // An open-drain output (output2, or a bidir written that way) may
        // name itself: its own value switches it off.
        const Cell& control = m_cells[static_cast<size_t>(cell.controlCell)];
        const bool self = &control == &cell && (cell.function == Function::Output2 || cell.function == Function::Bidir);
        if (!isControl(control.function) && !self)
            s.failAt(offsets[cell.number], which + " names control cell " + std::to_string(cell.controlCell) +
                                               ", whose function is " + functionName(control.function) +
                                               ", not control");
    }
}

} // namespace jexbsdl
