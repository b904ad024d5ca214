// SPDX-License-Identifier: MIT
#include "bsdl/BsdlReader.hpp"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string>

#include "bsdl/BsdlDiagnostics.hpp"
#include "bsdl/BsdlParser.hpp"

namespace {

using jexbsdl::BsdlDiagnostics;

// Reads the whole file once, from its start, without seeking, so pipes and
// FIFOs work too; false (with an error message raised) when it cannot.
// More than the size limit is never read: the read stops there and fails.
bool readFile(const char* path, std::string& content, BsdlDiagnostics& diagnostics)
{
    std::FILE* file = std::fopen(path, "rb");
    if (!file) {
        diagnostics.report(0, std::string("cannot be opened: ") + std::strerror(errno));
        return false;
    }
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> closer(file, &std::fclose);
    char chunk[65536];
    while (!std::ferror(file) && !std::feof(file)) {
        const size_t n = std::fread(chunk, 1, sizeof chunk, file);
        if (content.size() + n > BsdlReader::kMaxFileSize)
            diagnostics.error(0, "the file is larger than " + std::to_string(BsdlReader::kMaxFileSize >> 20) +
                                     " MiB; it is not read");
        content.append(chunk, n);
    }
    if (std::ferror(file)) {
        diagnostics.report(0, std::string("cannot be read: ") + std::strerror(errno));
        return false;
    }
    return true;
}

} // namespace

BsdlReader* BsdlReader::CreateBsdlReader(const char* path, const char* name)
{
    if (!path) return nullptr;
    if (!name) name = path;
    std::string content;
    if (!ReadFile(path, name, content)) return nullptr;
    return CreateBsdlReaderFromBuffer(name, content.data(), content.size());
}

bool BsdlReader::ReadFile(const char* path, const char* name, std::string& content)
{
    content.clear();
    if (!path) return false;
    BsdlDiagnostics diagnostics(name ? name : path);
    return readFile(path, content, diagnostics);
}

BsdlReader* BsdlReader::CreateBsdlReaderFromBuffer(const char* name, const char* data, size_t size)
{
    BsdlDiagnostics diagnostics(name ? name : "");
    if (size > kMaxFileSize)
        diagnostics.error(0, "the text is larger than " + std::to_string(kMaxFileSize >> 20) + " MiB; it is not read");
    struct Release {
        void operator()(BsdlReader* r) const { r->removeReader(); }
    };
    std::unique_ptr<BsdlReader, Release> reader(new BsdlReader);
    jexbsdl::BsdlParser parser(data, data ? size : 0, diagnostics);
    if (!parser.parse(reader->m_entity)) {
        diagnostics.report(0, "no entity declaration found; this is not a BSDL file");
        return nullptr;
    }
    return reader.release();
}

const char* BsdlReader::getCompName() const { return m_entity.name.c_str(); }

unsigned BsdlReader::getInstructionLength() const { return m_entity.instructionLength; }

const char* BsdlReader::getIdcode() const { return m_entity.idcode.c_str(); }

const char* BsdlReader::getInstructionOpcode(const char* instructionName) const
{
    if (!instructionName) return "";
    const jexbsdl::BsdlInstructionTable::Instruction* instruction = m_entity.instructions.find(instructionName);
    return instruction ? instruction->opcodes.front().c_str() : "";
}

void BsdlReader::removeReader() { delete this; }
