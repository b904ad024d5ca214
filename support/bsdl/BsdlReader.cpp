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

// Reads the whole file; false (with an error message raised) when it cannot.
// The buffer is sized once from the file's length where the file has one,
// then whatever else the file holds (a pipe, a file still growing) is read
// on in chunks, up to the size limit.
bool readFile(const char* path, std::string& content, BsdlDiagnostics& diagnostics)
{
    std::FILE* file = std::fopen(path, "rb");
    if (!file) {
        diagnostics.report(0, std::string("cannot be opened: ") + std::strerror(errno));
        return false;
    }
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> closer(file, &std::fclose);
    const auto tooLarge = [&] {
        diagnostics.error(0, "the file is larger than " + std::to_string(BsdlReader::kMaxFileSize >> 20) +
                                 " MiB; it is not read");
    };
    if (std::fseek(file, 0, SEEK_END) == 0) {
        // A length beyond the limit is not trusted (directories report
        // huge ones): the chunked read below finds out what is there.
        const long length = std::ftell(file);
        if (std::fseek(file, 0, SEEK_SET) != 0) {
            diagnostics.report(0, std::string("cannot be read: ") + std::strerror(errno));
            return false;
        }
        if (length > 0 && static_cast<unsigned long>(length) <= BsdlReader::kMaxFileSize) {
            content.resize(static_cast<size_t>(length));
            content.resize(std::fread(&content[0], 1, content.size(), file));
        }
    }
    char chunk[65536];
    while (!std::ferror(file) && !std::feof(file)) {
        const size_t n = std::fread(chunk, 1, sizeof chunk, file);
        if (content.size() + n > BsdlReader::kMaxFileSize) tooLarge();
        content.append(chunk, n);
    }
    if (std::ferror(file)) {
        diagnostics.report(0, std::string("cannot be read: ") + std::strerror(errno));
        return false;
    }
    return true;
}

} // namespace

BsdlReader* BsdlReader::CreateBsdlReader(const char* path)
{
    if (!path) return nullptr;
    BsdlDiagnostics diagnostics(path);
    std::string content;
    if (!readFile(path, content, diagnostics)) return nullptr;
    return CreateBsdlReaderFromBuffer(path, content.data(), content.size());
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
