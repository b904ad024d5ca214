// SPDX-License-Identifier: MIT
#pragma once
// BsdlParser - reads the entity of a BSDL text (IEEE 1149.1 Annex B, with the
// IEEE 1149.6 additions as vendors ship them) and keeps what the library asks
// for: the entity name, INSTRUCTION_LENGTH, IDCODE_REGISTER,
// INSTRUCTION_OPCODE, INSTRUCTION_CAPTURE, BOUNDARY_LENGTH,
// BOUNDARY_REGISTER, REGISTER_ACCESS, the ports and the pin map.
//
// The whole entity is checked for its statement structure: generic and port
// clauses, use clauses, constants (pin maps), attribute declarations and
// specifications in any order, and the closing "end".  Attributes that the
// library does not need (TAP_SCAN_CLOCK and the others) are checked for
// balanced parentheses and their terminating ';' but not stored.  Text before
// the entity that is not VHDL (board-test programs put a header line there)
// and text after it are skipped with a warning.
//
// The parser is iterative: no recursion, parenthesis nesting is capped, and
// stored attribute values are capped, so no input can exhaust the stack.

#include <cstddef>
#include <string>
#include <unordered_set>
#include <utility>
#include <vector>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlEntity.hpp"
#include "bsdl/BsdlLexer.hpp"
#include "bsdl/BsdlStringValue.hpp"
#include "bsdl/BsdlToken.hpp"

namespace jexbsdl {

class BsdlParser {
public:
    static constexpr unsigned kMaxNesting = 256;
    static constexpr size_t kMaxStoredValue = 1u << 20; // IDCODE_REGISTER, INSTRUCTION_OPCODE
    static constexpr unsigned kMaxInstructionLength = 4096;
    static constexpr unsigned kMaxBoundaryLength = 1u << 17;

    BsdlParser(const char* data, size_t size, BsdlDiagnostics& diagnostics);

    // Reads the text into `entity`.  False when the text holds no entity
    // declaration at all (it is not BSDL); throws Port::Exception when the
    // entity is malformed.
    bool parse(BsdlEntity& entity);

private:
    void advance() { m_lexer.next(m_token); }
    bool findEntity();
    void parseBody();
    void parseInterfaceList(const char* clause);
    void parseUse();
    void parseAttribute();
    void parseConstant();
    void parseEnd();
    void finish();

    void parseInstructionLength(unsigned line);
    void parseIdcode(unsigned line);
    void parseInstructionOpcode(unsigned line);
    void parseInstructionCapture(unsigned line);
    void parseBoundaryLength(unsigned line);
    void parseBoundaryRegister(unsigned line);
    void parseRegisterAccess(unsigned line);
    void addPorts(const std::vector<std::string>& tokens, unsigned line);

    // Skips to the ';' that ends the statement begun on `startLine` and
    // consumes it.
    void skipStatement(unsigned startLine);
    // Reads "literal { & literal } ;" (consuming the ';').
    void readStringExpression(BsdlStringValue& value, const std::string& what);
    // The 0/1/X digits of a bit-pattern string (white space dropped); any
    // other character is an error at its own line.
    std::string readBitPattern(const BsdlStringValue& value, const char* attribute);
    void expectDelimiter(const char* delimiter, const std::string& context);
    std::string expectIdentifier(const std::string& context);
    void enter(unsigned& depth) const;
    [[noreturn]] void unexpected(const std::string& expected) const;
    std::string describe(const BsdlToken& token) const;

    BsdlDiagnostics& m_diagnostics;
    BsdlLexer m_lexer;
    BsdlToken m_token;
    BsdlEntity* m_entity = nullptr;

    unsigned m_lengthLine = 0; // line of each stored attribute, 0 while not seen
    unsigned m_idcodeLine = 0;
    unsigned m_opcodeLine = 0;
    unsigned m_captureLine = 0;
    unsigned m_boundaryLengthLine = 0;
    unsigned m_boundaryLine = 0;
    unsigned m_registerAccessLine = 0;
    BsdlStringValue m_boundaryText;
    std::vector<std::pair<std::string, BsdlStringValue>> m_pinMaps; // PIN_MAP_STRING constants
    std::string m_physicalPinMap; // default of the PHYSICAL_PIN_MAP generic
    unsigned m_physicalPinMapLine = 0;
    std::unordered_set<std::string> m_constants; // upper-case names
};

} // namespace jexbsdl
