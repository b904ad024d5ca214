// SPDX-License-Identifier: MIT
#include "bsdl/BsdlDiagnostics.hpp"

#include <cwchar>
#include <utility>

#include "hostlayer/PortException.hpp"
#include "hostlayer/Port_MsgDispatcher.hpp"

namespace jexbsdl {

namespace {

// Narrow (current locale) to wide; a byte that does not convert stands for
// itself, so a file name in another encoding still shows.
std::wstring widen(const std::string& text)
{
    std::wstring out;
    out.reserve(text.size());
    std::mbstate_t state {};
    const char* p = text.data();
    size_t left = text.size();
    while (left > 0) {
        wchar_t wc = 0;
        const size_t n = std::mbrtowc(&wc, p, left, &state);
        if (n == static_cast<size_t>(-1) || n == static_cast<size_t>(-2)) {
            out += static_cast<wchar_t>(static_cast<unsigned char>(*p));
            state = std::mbstate_t {};
            ++p;
            --left;
        } else if (n == 0) { // an embedded NUL
            out += L'?';
            ++p;
            --left;
        } else {
            out += wc;
            p += n;
            left -= n;
        }
    }
    return out;
}

} // namespace

BsdlDiagnostics::BsdlDiagnostics(std::string fileName) : m_fileName(std::move(fileName)) {}

std::wstring BsdlDiagnostics::format(unsigned line, const std::string& text) const
{
    std::string message = "BSDL file '" + m_fileName + "'";
    if (line > 0) message += ", line " + std::to_string(line);
    message += ": " + text + "\n";
    return widen(message);
}

void BsdlDiagnostics::error(unsigned line, const std::string& text) const
{
    throw Port::Exception(format(line, text));
}

void BsdlDiagnostics::warning(unsigned line, const std::string& text)
{
    if (m_warnings > kMaxWarnings) return;
    ++m_warnings;
    if (m_warnings > kMaxWarnings)
        raise(Port_MsgMan::MSG_WARNING, 0, "more warnings were suppressed");
    else
        raise(Port_MsgMan::MSG_WARNING, line, text);
}

void BsdlDiagnostics::report(unsigned line, const std::string& text) const
{
    raise(Port_MsgMan::MSG_ERROR, line, text);
}

void BsdlDiagnostics::raise(Port_MsgMan::MsgType type, unsigned line, const std::string& text) const
{
    const std::wstring message = format(line, text);
    Port_MsgDispatcher::dispatch(type, message.c_str());
}

} // namespace jexbsdl
