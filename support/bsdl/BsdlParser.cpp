// SPDX-License-Identifier: MIT
#include "bsdl/BsdlParser.hpp"

#include "bsdl/BsdlText.hpp"

namespace jexbsdl {

namespace {

using Kind = BsdlToken::Kind;

// Reserved words that can only begin a statement: meeting one inside a
// value means the statement before it lacks its ';'.
bool beginsStatement(const BsdlToken& token)
{
    if (token.kind != Kind::Identifier) return false;
    switch (token.text.size()) { // most identifiers are ruled out by length
    case 3: return token.isKeyword("end") || token.isKeyword("use");
    case 4: return token.isKeyword("port");
    case 6: return token.isKeyword("entity");
    case 7: return token.isKeyword("generic");
    case 8: return token.isKeyword("constant");
    case 9: return token.isKeyword("attribute");
    default: return false;
    }
}

} // namespace

BsdlParser::BsdlParser(const char* data, size_t size, BsdlDiagnostics& diagnostics)
    : m_diagnostics(diagnostics), m_lexer(data, size, diagnostics)
{
}

bool BsdlParser::parse(BsdlEntity& entity)
{
    m_entity = &entity;
    if (!findEntity()) return false;
    parseBody();
    finish();
    return true;
}

// Looks for "entity NAME is".  VHDL context clauses (library, use) may come
// before it; anything else there is skipped with one warning.
bool BsdlParser::findEntity()
{
    m_lexer.setLenient(true);
    unsigned skippedLine = 0;
    advance();
    while (m_token.kind != Kind::End) {
        if (m_token.isKeyword("entity")) {
            const unsigned line = m_token.line;
            advance();
            if (m_token.kind == Kind::Identifier) {
                std::string name(m_token.text);
                advance();
                if (m_token.isKeyword("is")) {
                    if (skippedLine)
                        m_diagnostics.warning(skippedLine, "text before the entity declaration is not BSDL; "
                                                           "it was skipped");
                    m_entity->name = std::move(name);
                    m_lexer.setLenient(false);
                    advance();
                    return true;
                }
            }
            if (!skippedLine) skippedLine = line;
            continue; // look at the current token again
        }
        if (m_token.isKeyword("library") || m_token.isKeyword("use")) {
            const unsigned line = m_token.line;
            advance();
            while (m_token.kind != Kind::End && !m_token.isDelimiter(";") && !m_token.isKeyword("entity")) advance();
            if (!m_token.isDelimiter(";")) {
                if (!skippedLine) skippedLine = line;
                continue;
            }
            advance();
            continue;
        }
        if (!skippedLine) skippedLine = m_token.line;
        advance();
    }
    return false;
}

void BsdlParser::parseBody()
{
    for (;;) {
        const BsdlToken& t = m_token;
        if (t.kind == Kind::End)
            m_diagnostics.error(t.line, "the file ends inside entity " + m_entity->name + ": 'end " +
                                            m_entity->name + ";' is missing");
        if (t.isKeyword("generic")) {
            parseInterfaceList("generic");
        } else if (t.isKeyword("port")) {
            parseInterfaceList("port");
        } else if (t.isKeyword("use")) {
            parseUse();
        } else if (t.isKeyword("attribute")) {
            parseAttribute();
        } else if (t.isKeyword("constant")) {
            parseConstant();
        } else if (t.isKeyword("end")) {
            parseEnd();
            return;
        } else if (t.kind == Kind::Identifier) {
            m_diagnostics.warning(t.line, "statement " + quoted(t.text) + " is not part of BSDL; it was skipped");
            skipStatement(t.line);
        } else if (t.isDelimiter(";")) {
            m_diagnostics.warning(t.line, "empty statement (';' alone) skipped");
            advance();
        } else {
            unexpected("a statement (attribute, constant, generic, port, use or end)");
        }
    }
}

// generic ( ... ) ;  and  port ( ... ) ;
// The lists are checked for balance; the generic's PHYSICAL_PIN_MAP default
// is kept to check that the pin map it names exists.
void BsdlParser::parseInterfaceList(const char* clause)
{
    const unsigned startLine = m_token.line;
    const bool generic = equalsIgnoreCase(clause, "generic");
    advance();
    expectDelimiter("(", std::string(clause) + " clause");
    unsigned depth = 1;
    bool elementStart = true;
    bool pinMapElement = false;
    std::vector<std::string> element; // the tokens of one port declaration
    unsigned elementLine = 0;
    const bool ports = !generic;
    while (depth > 0) {
        const BsdlToken& t = m_token;
        if (t.kind == Kind::End)
            m_diagnostics.error(t.line, std::string("the ") + clause + " clause begun on line " +
                                            std::to_string(startLine) + " is not closed");
        if (t.kind == Kind::Other) unexpected("a " + std::string(clause) + " list element");
        if (depth == 1 && beginsStatement(t))
            m_diagnostics.error(t.line, std::string("')' expected before ") + quoted(t.text) + ": the " + clause +
                                            " clause begun on line " + std::to_string(startLine) +
                                            " is not closed");
        if (ports) {
            if ((depth == 1 && t.isDelimiter(";")) || (depth == 1 && t.isDelimiter(")"))) {
                addPorts(element, elementLine);
                element.clear();
            } else {
                if (element.empty()) elementLine = t.line;
                element.emplace_back(t.text);
            }
        }
        if (t.isDelimiter("(")) {
            enter(depth);
        } else if (t.isDelimiter(")")) {
            --depth;
        } else if (depth == 1 && t.isDelimiter(";")) {
            elementStart = true;
            pinMapElement = false;
        } else if (depth == 1 && elementStart && t.kind == Kind::Identifier) {
            elementStart = false;
            pinMapElement = generic && t.isKeyword("PHYSICAL_PIN_MAP");
        } else if (depth == 1 && pinMapElement && t.isDelimiter(":=")) {
            advance();
            if (m_token.kind == Kind::String) {
                m_physicalPinMap = std::string(m_token.text);
                m_physicalPinMapLine = m_token.line;
            }
            continue; // the token after ":=" has not been looked at
        }
        advance();
    }
    expectDelimiter(";", std::string("the end of the ") + clause + " clause");
}

// NAME {, NAME} : MODE TYPE [( LEFT to|downto RIGHT )] -- one port declaration.
// Declarations that do not have this form are left to the clause's own
// balance check; they only give no ports.
void BsdlParser::addPorts(const std::vector<std::string>& tokens, unsigned line)
{
    size_t colon = 0;
    while (colon < tokens.size() && tokens[colon] != ":") ++colon;
    if (colon == 0 || colon + 2 >= tokens.size()) return;
    BsdlPinMap::Port port;
    for (char c : tokens[colon + 1]) port.mode += (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
    port.line = line;
    const std::string type = upperCase(tokens[colon + 2]);
    if (type == "BIT_VECTOR") {
        // "(" LEFT to|downto RIGHT ")"
        if (tokens.size() < colon + 8 || tokens[colon + 3] != "(") {
            m_diagnostics.warning(line, "the bit_vector port " + tokens[0] + " has no range; it is left out");
            return;
        }
        const auto number = [&](const std::string& text, long& value) {
            if (text.empty() || text.size() > 9) return false;
            value = 0;
            for (char c : text) {
                if (!isDigit(c)) return false;
                value = value * 10 + (c - '0');
            }
            return true;
        };
        const std::string direction = upperCase(tokens[colon + 5]);
        if (!number(tokens[colon + 4], port.left) || !number(tokens[colon + 6], port.right) ||
            (direction != "TO" && direction != "DOWNTO") || (direction == "TO") != (port.left <= port.right)) {
            m_diagnostics.warning(line, "the range of bit_vector port " + tokens[0] + " is not understood; it is "
                                        "left out");
            return;
        }
        port.vector = true;
    }
    for (size_t i = 0; i < colon; ++i) {
        if (tokens[i] == ",") continue;
        BsdlPinMap::Port named = port;
        named.name = tokens[i];
        m_entity->pins.addPort(std::move(named));
    }
}

// use NAME { . NAME } ;
void BsdlParser::parseUse()
{
    advance();
    expectIdentifier("use clause");
    while (m_token.isDelimiter(".")) {
        advance();
        expectIdentifier("use clause");
    }
    expectDelimiter(";", "the end of the use clause");
}

// attribute NAME : TYPE ;                              (declaration)
// attribute NAME of TARGET {, TARGET} : CLASS is VALUE ;  (specification)
void BsdlParser::parseAttribute()
{
    const unsigned line = m_token.line;
    advance();
    const std::string name = expectIdentifier("attribute");
    if (m_token.isDelimiter(":")) {
        skipStatement(line);
        return;
    }
    if (!m_token.isKeyword("of")) unexpected("'of' or ':' after attribute " + name);
    advance();
    const std::string target = expectIdentifier("attribute " + name);
    while (m_token.isDelimiter(",")) {
        advance();
        expectIdentifier("attribute " + name);
    }
    expectDelimiter(":", "attribute " + name);
    const std::string entityClass = expectIdentifier("attribute " + name);
    if (!m_token.isKeyword("is")) unexpected("'is' in attribute " + name);
    advance();

    if (!equalsIgnoreCase(entityClass, "entity")) {
        skipStatement(line);
        return;
    }
    if (!equalsIgnoreCase(target, m_entity->name))
        m_diagnostics.warning(line, "attribute " + name + " is given for " + quoted(target) + ", but the entity is " +
                                        m_entity->name);

    unsigned* seenLine = nullptr;
    void (BsdlParser::*reader)(unsigned) = nullptr;
    if (equalsIgnoreCase(name, "INSTRUCTION_LENGTH")) {
        seenLine = &m_lengthLine;
        reader = &BsdlParser::parseInstructionLength;
    } else if (equalsIgnoreCase(name, "IDCODE_REGISTER")) {
        seenLine = &m_idcodeLine;
        reader = &BsdlParser::parseIdcode;
    } else if (equalsIgnoreCase(name, "INSTRUCTION_OPCODE")) {
        seenLine = &m_opcodeLine;
        reader = &BsdlParser::parseInstructionOpcode;
    } else if (equalsIgnoreCase(name, "INSTRUCTION_CAPTURE")) {
        seenLine = &m_captureLine;
        reader = &BsdlParser::parseInstructionCapture;
    } else if (equalsIgnoreCase(name, "BOUNDARY_LENGTH")) {
        seenLine = &m_boundaryLengthLine;
        reader = &BsdlParser::parseBoundaryLength;
    } else if (equalsIgnoreCase(name, "BOUNDARY_REGISTER")) {
        seenLine = &m_boundaryLine;
        reader = &BsdlParser::parseBoundaryRegister;
    } else if (equalsIgnoreCase(name, "REGISTER_ACCESS")) {
        seenLine = &m_registerAccessLine;
        reader = &BsdlParser::parseRegisterAccess;
    }
    if (!reader) {
        skipStatement(line);
        return;
    }
    if (*seenLine) {
        m_diagnostics.warning(line, name + " is given again; the value of line " + std::to_string(*seenLine) +
                                        " is kept");
        skipStatement(line);
        return;
    }
    (this->*reader)(line);
    *seenLine = line;
}

void BsdlParser::parseInstructionLength(unsigned line)
{
    if (m_token.kind != Kind::Integer)
        m_diagnostics.error(m_token.line, "INSTRUCTION_LENGTH must be a positive integer, found " +
                                              describe(m_token));
    unsigned long long value = 0;
    for (char c : m_token.text) {
        if (c == '_') continue;
        value = value * 10 + static_cast<unsigned>(c - '0');
        if (value > kMaxInstructionLength)
            m_diagnostics.error(line, "INSTRUCTION_LENGTH " + quoted(m_token.text) + " is larger than " +
                                          std::to_string(kMaxInstructionLength));
    }
    if (value == 0) m_diagnostics.error(line, "INSTRUCTION_LENGTH must be at least 1, found 0");
    if (value == 1)
        m_diagnostics.warning(line, "INSTRUCTION_LENGTH 1 is below the minimum of 2 that IEEE 1149.1 requires");
    m_entity->instructionLength = static_cast<unsigned>(value);
    advance();
    expectDelimiter(";", "the end of INSTRUCTION_LENGTH");
}

std::string BsdlParser::readBitPattern(const BsdlStringValue& value, const char* attribute)
{
    std::string bits;
    const std::string& text = value.text();
    for (size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (c == ' ' || c == '\t') continue;
        if (c != '0' && c != '1' && c != 'X' && c != 'x')
            m_diagnostics.error(value.lineAt(i), std::string(attribute) + " may hold only 0, 1 and X, found " +
                                                     quoted(std::string_view(&text[i], 1)));
        bits += c;
    }
    return bits;
}

void BsdlParser::parseIdcode(unsigned line)
{
    BsdlStringValue value;
    readStringExpression(value, "IDCODE_REGISTER");
    std::string bits = readBitPattern(value, "IDCODE_REGISTER");
    if (bits.size() != 32)
        m_diagnostics.error(line, "IDCODE_REGISTER must have 32 bits, found " + std::to_string(bits.size()));
    if (!bits.empty() && bits.back() == '0')
        m_diagnostics.warning(line, "bit 0 of IDCODE_REGISTER is 0; IEEE 1149.1 requires 1");
    m_entity->idcode = std::move(bits);
}

void BsdlParser::parseInstructionOpcode(unsigned)
{
    BsdlStringValue value;
    readStringExpression(value, "INSTRUCTION_OPCODE");
    m_entity->instructions.parse(value, m_diagnostics);
}

void BsdlParser::parseInstructionCapture(unsigned line)
{
    BsdlStringValue value;
    readStringExpression(value, "INSTRUCTION_CAPTURE");
    std::string bits = readBitPattern(value, "INSTRUCTION_CAPTURE");
    if (bits.empty()) m_diagnostics.error(line, "INSTRUCTION_CAPTURE is empty");
    m_entity->instructionCapture = std::move(bits);
}

void BsdlParser::parseBoundaryLength(unsigned line)
{
    if (m_token.kind != Kind::Integer)
        m_diagnostics.error(m_token.line, "BOUNDARY_LENGTH must be a positive integer, found " + describe(m_token));
    unsigned long long value = 0;
    for (char c : m_token.text) {
        if (c == '_') continue;
        value = value * 10 + static_cast<unsigned>(c - '0');
        if (value > kMaxBoundaryLength)
            m_diagnostics.error(line, "BOUNDARY_LENGTH " + quoted(m_token.text) + " is larger than " +
                                          std::to_string(kMaxBoundaryLength));
    }
    if (value == 0) m_diagnostics.error(line, "BOUNDARY_LENGTH must be at least 1, found 0");
    m_entity->boundaryLength = static_cast<unsigned>(value);
    advance();
    expectDelimiter(";", "the end of BOUNDARY_LENGTH");
}

void BsdlParser::parseBoundaryRegister(unsigned)
{
    // Parsed in finish(): BOUNDARY_LENGTH may come after it.
    readStringExpression(m_boundaryText, "BOUNDARY_REGISTER");
}

void BsdlParser::parseRegisterAccess(unsigned)
{
    BsdlStringValue value;
    readStringExpression(value, "REGISTER_ACCESS");
    m_entity->registerAccess.parse(value, m_diagnostics);
}

// constant NAME : TYPE := VALUE ;
// Some vendors use pin-map names that are not VHDL identifiers
// ("PLQP0144KA-B"); such a name is taken as written, with a warning.
void BsdlParser::parseConstant()
{
    const unsigned line = m_token.line;
    advance();
    std::string name;
    unsigned pieces = 0;
    while (m_token.kind == Kind::Identifier || m_token.kind == Kind::Integer || m_token.isDelimiter("-")) {
        if (++pieces > 64) unexpected("':' after the constant's name");
        name += m_token.text;
        advance();
    }
    if (name.empty()) unexpected("the name of a constant");
    if (pieces > 1) m_diagnostics.warning(line, "constant name " + quoted(name) + " is not a VHDL identifier");
    expectDelimiter(":", "constant " + name);
    const std::string type = expectIdentifier("the type of constant " + name);
    expectDelimiter(":=", "constant " + name);
    m_constants.insert(upperCase(name));
    if (equalsIgnoreCase(type, "PIN_MAP_STRING") && m_token.kind == Kind::String) {
        m_pinMaps.emplace_back(name, BsdlStringValue());
        readStringExpression(m_pinMaps.back().second, "PIN_MAP_STRING " + name);
        return;
    }
    skipStatement(line);
}

// end [entity] [NAME] ;  and whatever follows it.
void BsdlParser::parseEnd()
{
    const unsigned line = m_token.line;
    advance();
    if (m_token.isKeyword("entity")) advance();
    if (m_token.kind == Kind::Identifier) {
        if (!equalsIgnoreCase(m_token.text, m_entity->name))
            m_diagnostics.warning(m_token.line, "'end " + std::string(m_token.text) + "' closes entity " +
                                                    m_entity->name);
        advance();
    }
    if (!m_token.isDelimiter(";")) unexpected("';' after 'end' on line " + std::to_string(line));
    m_lexer.setLenient(true);
    advance();
    if (m_token.kind != Kind::End)
        m_diagnostics.warning(m_token.line, "text after the end of entity " + m_entity->name + " is ignored");
}

void BsdlParser::finish()
{
    BsdlEntity& e = *m_entity;
    if (!m_lengthLine) m_diagnostics.error(0, "entity " + e.name + " has no INSTRUCTION_LENGTH attribute");
    if (!m_opcodeLine) {
        m_diagnostics.warning(0, "entity " + e.name + " has no INSTRUCTION_OPCODE attribute");
    } else {
        if (!e.instructions.find("BYPASS"))
            m_diagnostics.warning(m_opcodeLine, "INSTRUCTION_OPCODE declares no BYPASS instruction");
        e.instructions.checkLengths(e.instructionLength, m_diagnostics);
    }
    if (m_boundaryLine) {
        if (!m_boundaryLengthLine)
            m_diagnostics.error(m_boundaryLine, "BOUNDARY_REGISTER is given without BOUNDARY_LENGTH");
        m_entity->boundary.parse(m_boundaryText, e.boundaryLength, m_diagnostics);
    } else if (m_boundaryLengthLine) {
        m_diagnostics.warning(m_boundaryLengthLine, "BOUNDARY_LENGTH is given without BOUNDARY_REGISTER");
    }
    // The pin map the generic names; without one, the first of the file.
    const std::pair<std::string, BsdlStringValue>* pinMap = nullptr;
    for (const auto& candidate : m_pinMaps)
        if (equalsIgnoreCase(candidate.first, m_physicalPinMap)) pinMap = &candidate;
    if (!pinMap && !m_pinMaps.empty()) pinMap = &m_pinMaps.front();
    if (pinMap) m_entity->pins.applyPinMap(pinMap->first, pinMap->second, m_diagnostics);
    for (const BsdlBoundaryRegister::Cell& cell : e.boundary.cells()) {
        if (cell.port == "*" || e.pins.find(cell.port) >= 0) continue;
        m_diagnostics.warning(cell.line, "cell " + std::to_string(cell.number) + " names port " + cell.port +
                                             ", which the port clause does not declare");
    }
    // Several vendors default the generic to "UNDEFINED" on purpose, so that
    // the user has to choose a package.
    if (!m_physicalPinMap.empty() && !equalsIgnoreCase(m_physicalPinMap, "UNDEFINED") &&
        !m_constants.count(upperCase(m_physicalPinMap)))
        m_diagnostics.warning(m_physicalPinMapLine, "PHYSICAL_PIN_MAP " + quoted(m_physicalPinMap) +
                                                        " names no constant of this file");
}

void BsdlParser::skipStatement(unsigned startLine)
{
    unsigned depth = 0;
    for (;;) {
        const BsdlToken& t = m_token;
        if (t.kind == Kind::End)
            m_diagnostics.error(t.line, "';' expected before the end of the file (the statement begun on line " +
                                            std::to_string(startLine) + " is not ended)");
        if (t.kind == Kind::Other) unexpected("';'");
        if (t.isDelimiter("(")) {
            enter(depth);
        } else if (t.isDelimiter(")")) {
            if (depth == 0) unexpected("';'");
            --depth;
        } else if (depth == 0 && t.isDelimiter(";")) {
            advance();
            return;
        } else if (beginsStatement(t)) {
            m_diagnostics.error(t.line, "';' expected before " + quoted(t.text) + " (the statement begun on line " +
                                            std::to_string(startLine) + " is not ended)");
        }
        advance();
    }
}

void BsdlParser::readStringExpression(BsdlStringValue& value, const std::string& what)
{
    if (m_token.kind != Kind::String) unexpected(what + " as a string");
    for (;;) {
        if (m_token.kind == Kind::String) {
            if (value.size() + m_token.text.size() > kMaxStoredValue)
                m_diagnostics.error(m_token.line, what + " is longer than " + std::to_string(kMaxStoredValue) +
                                                      " characters");
            value.append(m_token.text, m_token.line);
            advance();
        }
        if (m_token.isDelimiter(";")) {
            advance();
            return;
        }
        if (m_token.isDelimiter("&")) {
            advance();
            if (m_token.kind != Kind::String) unexpected("a string literal after '&' in " + what);
        } else if (m_token.kind == Kind::String) {
            m_diagnostics.warning(m_token.line, "'&' missing between the string literals of " + what);
        } else if (beginsStatement(m_token)) {
            m_diagnostics.error(m_token.line, "';' expected before " + quoted(m_token.text) + " (" + what +
                                                  " is not ended)");
        } else {
            unexpected("'&' or ';' in " + what);
        }
    }
}

void BsdlParser::expectDelimiter(const char* delimiter, const std::string& context)
{
    if (!m_token.isDelimiter(delimiter)) unexpected("'" + std::string(delimiter) + "' in " + context);
    advance();
}

std::string BsdlParser::expectIdentifier(const std::string& context)
{
    if (m_token.kind != Kind::Identifier) unexpected("a name in " + context);
    std::string name(m_token.text);
    advance();
    return name;
}

void BsdlParser::enter(unsigned& depth) const
{
    if (++depth > kMaxNesting)
        m_diagnostics.error(m_token.line, "parentheses nested deeper than " + std::to_string(kMaxNesting) + " levels");
}

void BsdlParser::unexpected(const std::string& expected) const
{
    m_diagnostics.error(m_token.line, expected + " expected, found " + describe(m_token));
}

std::string BsdlParser::describe(const BsdlToken& token) const
{
    switch (token.kind) {
    case Kind::End: return "the end of the file";
    case Kind::String: return "the string " + quoted(token.text);
    case Kind::Other: return "the character " + quoted(token.text);
    default: return quoted(token.text);
    }
}

} // namespace jexbsdl
