// SPDX-License-Identifier: MIT
// BSDL import of a session: the device facts of a BSDL file or text, read
// with the BSDL reader.  Errors go to the host as JEX_MSG_ERROR messages.

#include <cstdio>
#include <cstring>
#include <memory>
#include <string>
#include <utility>

#include "bsdl/BsdlReader.hpp"
#include "hostlayer/PortException.hpp"
#include "jexjtag/rt/Jex_Exception.hpp"
#include "session/Session.hpp"
#include "util/Jex_Util.hpp"

namespace JexRT {

namespace {

struct ReaderRelease {
    void operator()(BsdlReader* reader) const { reader->removeReader(); }
};

// Passes a reader's text through a zero-filled 2048-byte buffer, so every
// text is cut to 2047 characters.
std::string cutText(const char* text)
{
    char buffer[2048];
    std::memset(buffer, 0, sizeof buffer);
    if (text) std::strncpy(buffer, text, sizeof buffer - 1);
    return buffer;
}

// The part of a file name after its last separator.  Both '/' and '\' count,
// so a Windows-style name given to a POSIX build is split too.
std::string baseName(const std::string& filename)
{
    const size_t separator = filename.find_last_of("/\\");
    return separator == std::string::npos ? filename : filename.substr(separator + 1);
}

// Removes the temporary file when the import leaves by an exception; the
// normal path removes it itself and reports a failure to do so.
class TemporaryFile {
public:
    explicit TemporaryFile(std::string path) : m_path(std::move(path)) {}
    ~TemporaryFile()
    {
        if (!m_removed) std::remove(m_path.c_str());
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;

    const std::string& path() const { return m_path; }
    bool remove()
    {
        m_removed = true;
        return std::remove(m_path.c_str()) == 0;
    }

private:
    std::string m_path;
    bool m_removed = false;
};

} // namespace

unsigned Session::parseBSDLFromFile(const std::string& path, std::string& deviceName, unsigned* irlength,
                                    std::string& idcode, std::string& bypass, const std::string& shownName)
{
    try {
        std::unique_ptr<BsdlReader, ReaderRelease> reader(
            BsdlReader::CreateBsdlReader(path.c_str(), shownName.empty() ? path.c_str() : shownName.c_str()));
        if (!reader) {
            sendMessage(JEX_MSG_ERROR, "Could not obtain a BsdlReader\n");
            return JEX_FAILURE;
        }
        deviceName = cutText(reader->getCompName());
        const unsigned length = reader->getInstructionLength();
        if (irlength) *irlength = length;
        idcode = cutText(reader->getIdcode());
        bypass = cutText(reader->getInstructionOpcode("BYPASS"));
        return JEX_SUCCESS;
    } catch (const Port::Exception& e) {
        sendMessage(JEX_MSG_ERROR, getLocalizedPortMsg(e.getMessage()));
        return JEX_FAILURE;
    }
}

unsigned Session::readBSDLFile(const std::string& path, std::string& content)
{
    try {
        return BsdlReader::ReadFile(path.c_str(), path.c_str(), content) ? JEX_SUCCESS : JEX_FAILURE;
    } catch (const Port::Exception& e) {
        sendMessage(JEX_MSG_ERROR, getLocalizedPortMsg(e.getMessage()));
        return JEX_FAILURE;
    }
}

unsigned Session::parseBSDLFromBuffer(const std::string& filename, const char* buf, unsigned bufLen,
                                      std::string& deviceName, unsigned* irlength, std::string& idcode,
                                      std::string& bypass)
{
    if (bufLen > BsdlReader::kMaxFileSize) {
        sendMessage(JEX_MSG_ERROR, "BSDL file '" + filename + "': the text is larger than " +
                                       std::to_string(BsdlReader::kMaxFileSize >> 20) + " MiB; it is not read\n");
        return JEX_FAILURE;
    }
    try {
        TemporaryFile file(Jex_Util::createDotLumenfoldTempFile(baseName(filename)));
        std::FILE* out = std::fopen(file.path().c_str(), "wb");
        if (!out) {
            sendMessage(JEX_MSG_ERROR, "Could not create temporary file: " + file.path() + "\n");
            return JEX_FAILURE;
        }
        // A copy that is not complete (a full disk) would be read as a
        // different, truncated text: that counts as not created.
        const bool written = (bufLen == 0 || (buf && std::fwrite(buf, 1, bufLen, out) == bufLen));
        if (std::fclose(out) != 0 || !written) {
            sendMessage(JEX_MSG_ERROR, "Could not create temporary file: " + file.path() + "\n");
            return JEX_FAILURE;
        }

        const unsigned status = parseBSDLFromFile(file.path(), deviceName, irlength, idcode, bypass, filename);

        if (!file.remove())
            sendMessage(JEX_MSG_ERROR, "Could not remove temporary file: " + file.path() +
                                           ".\nTry deleting file manually from the .lumenfold directory.\n");
        return status;
    } catch (const Jex_Exception& e) {
        sendMessage(JEX_MSG_ERROR, e.getMessage());
        return JEX_FAILURE;
    }
}

} // namespace JexRT
