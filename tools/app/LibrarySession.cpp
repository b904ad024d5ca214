// SPDX-License-Identifier: MIT
#include "LibrarySession.hpp"

#include <vector>

#include "CliError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

// The C callback carries no context; the program has one session at a time.
MessageSink* g_sink = nullptr;

void onLibraryMessage(unsigned /*handle*/, unsigned msgType, const char* text)
{
    if (g_sink) g_sink->deliver(msgType, text);
}

constexpr unsigned kNameSize = 1024;

} // namespace

LibrarySession::LibrarySession(const Options& options, MessageSink& sink) : m_sink(&sink)
{
    std::vector<std::string> args;
    if (!options.dataDir.empty()) args.push_back("datadir=" + options.dataDir);
    std::vector<const char*> argv;
    for (const std::string& arg : args) argv.push_back(arg.c_str());

    g_sink = &sink;
    unsigned handle = 0;
    const uint32_t status = JexJtag_session_create(onLibraryMessage, static_cast<unsigned>(argv.size()),
                                                   argv.empty() ? nullptr : argv.data(), &handle);
    if (JEX_FAILED(status)) {
        g_sink = nullptr;
        std::string message = "cannot create a library session";
        if (!options.dataDir.empty()) message += " (is '" + options.dataDir + "' a directory holding idcode.lst?)";
        throw CliError(message + "; --log-level 1 shows the library's reason");
    }
    m_handle = handle;
}

LibrarySession::~LibrarySession()
{
    JexJtag_session_destroy(m_handle);
    g_sink = nullptr;
}

std::vector<TargetEntry> LibrarySession::targets(bool withXml) const
{
    unsigned count = 0;
    if (JEX_FAILED(JexJtag_session_getTargetCount(m_handle, &count)))
        throw CliError("cannot read the target list");
    std::vector<TargetEntry> entries;
    for (unsigned i = 0; i < count; ++i) {
        unsigned xmlSize = 0;
        if (JEX_FAILED(JexJtag_session_getTargetXMLSizeByIndex(m_handle, i, &xmlSize)) || xmlSize == 0) xmlSize = 1;
        std::vector<char> xml(xmlSize, '\0');
        std::vector<char> name(kNameSize, '\0');
        std::vector<char> plugin(kNameSize, '\0');
        if (JEX_FAILED(JexJtag_session_getTargetByIndex(m_handle, i, xml.data(), xmlSize, name.data(), kNameSize,
                                                        plugin.data(), kNameSize)))
            throw CliError("cannot read target " + std::to_string(i) + " of the target list");
        xml.back() = '\0';
        TargetEntry entry;
        entry.index = i;
        entry.name = name.data();
        entry.plugin = plugin.data();
        if (withXml) entry.xml = xml.data();
        entries.push_back(entry);
    }
    return entries;
}

} // namespace jexjtag::cli
