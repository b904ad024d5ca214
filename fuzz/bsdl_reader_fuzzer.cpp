// SPDX-License-Identifier: MIT
// Feeds arbitrary bytes to the BSDL reader.  The reader must either refuse
// them (null or Port::Exception) or give a reader whose answers keep their
// promises; nothing may crash, leak or run away.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "bsdl/BsdlReader.hpp"
#include "hostlayer/PortException.hpp"
#include "hostlayer/Port_MsgDispatcher.hpp"
#include "hostlayer/Port_MsgMan.hpp"

namespace {

// Swallows the reader's warnings instead of printing thousands of them.
class QuietMsgMan : public Port_MsgMan {
public:
    void outputMsg(MsgType, const wchar_t* text) override
    {
        if (!text) std::abort();
    }
};

bool isIdcode(const char* text)
{
    const size_t n = std::strlen(text);
    if (n == 0) return true;
    if (n != 32) return false;
    for (size_t i = 0; i < n; ++i)
        if (!std::strchr("01Xx", text[i])) return false;
    return true;
}

bool isOpcode(const char* text)
{
    for (const char* p = text; *p; ++p)
        if (!std::strchr("01Xx", *p)) return false;
    return true;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    static QuietMsgMan quiet;
    static const bool installed = [] {
        Port_MsgMan* printer = Port_MsgDispatcher::getDefaultMsgMan();
        Port_MsgDispatcher::addMsgMan(&quiet);
        Port_MsgDispatcher::removeMsgMan(printer);
        return true;
    }();
    (void)installed;

    BsdlReader* reader = nullptr;
    try {
        reader = BsdlReader::CreateBsdlReaderFromBuffer("fuzz.bsd", reinterpret_cast<const char*>(data), size);
    } catch (const Port::Exception& e) {
        if (e.getMessage().empty()) std::abort();
        return 0;
    }
    if (!reader) return 0;
    const unsigned length = reader->getInstructionLength();
    if (length == 0 || length > 4096) std::abort();
    if (std::strlen(reader->getCompName()) == 0) std::abort();
    if (!isIdcode(reader->getIdcode())) std::abort();
    if (!isOpcode(reader->getInstructionOpcode("BYPASS"))) std::abort();
    if (!isOpcode(reader->getInstructionOpcode("idcode"))) std::abort();
    reader->removeReader();
    return 0;
}
