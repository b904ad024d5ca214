// SPDX-License-Identifier: MIT
#pragma once
// BsdlReader - reads a BSDL file (IEEE 1149.1 boundary-scan description) and
// answers the questions the library asks about the device: its entity name,
// instruction register length, IDCODE register and instruction opcodes, and
// (through entity()) its boundary register, pins and register access.
//
// A reader is created by CreateBsdlReader and released by removeReader;
// every text it returns stays valid until then.  A malformed file raises
// Port::Exception, whose message names the file, the line and the problem;
// oddities that do not stop the reading are raised as host-layer warnings.

#include <cstddef>
#include <string>

#include "bsdl/BsdlEntity.hpp"

class BsdlReader {
public:
    // Files larger than this are refused.
    static constexpr size_t kMaxFileSize = 64u << 20;

    // Reads the file at `path`; messages name the file `name` (default: the
    // path), for a copy read in place of the file the user gave.  Null when
    // the file cannot be read or holds no entity declaration (it is not
    // BSDL); the reason is raised as a host-layer error message.  Throws
    // Port::Exception when the file is BSDL but malformed or too large.
    static BsdlReader* CreateBsdlReader(const char* path, const char* name = nullptr);
    // Reads the file at `path` whole into content, once and without seeking
    // (pipes and FIFOs work), never more than kMaxFileSize bytes.  False
    // when it cannot be opened or read (the reason raised as a host-layer
    // error message, naming `name`); throws Port::Exception when it is
    // larger than kMaxFileSize.
    static bool ReadFile(const char* path, const char* name, std::string& content);
    // The same for a text in memory; `name` labels the messages.
    static BsdlReader* CreateBsdlReaderFromBuffer(const char* name, const char* data, size_t size);

    // The entity name as written.
    const char* getCompName() const;
    // INSTRUCTION_LENGTH.
    unsigned getInstructionLength() const;
    // IDCODE_REGISTER as 32 characters of 0, 1, X or x (as written, quotes,
    // '&', comments and white space removed); "" when the device declares no
    // IDCODE register.
    const char* getIdcode() const;
    // The first opcode declared for the instruction of that name (any case);
    // "" when the instruction is unknown or the name is null.
    const char* getInstructionOpcode(const char* instructionName) const;
    // Everything read from the entity: boundary cells, pins, all opcodes.
    const jexbsdl::BsdlEntity& entity() const { return m_entity; }
    // Releases the reader; it must not be used afterwards.
    void removeReader();

    BsdlReader(const BsdlReader&) = delete;
    BsdlReader& operator=(const BsdlReader&) = delete;

private:
    BsdlReader() = default;
    ~BsdlReader() = default;

    jexbsdl::BsdlEntity m_entity;
};
