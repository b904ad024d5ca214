// SPDX-License-Identifier: MIT
#include "MessageSink.hpp"

#include "jexjtag/types.h"

namespace jexjtag::cli {

MessageSink::MessageSink(std::ostream& out, bool verbose) : m_out(out), m_verbose(verbose) {}

std::string MessageSink::prefixFor(unsigned msgType)
{
    switch (msgType) {
    case JEX_MSG_ERROR: return "error: ";
    case JEX_MSG_WARNING: return "warning: ";
    case JEX_MSG_STATUS: return "status: ";
    case JEX_MSG_INFO: return "info: ";
    case JEX_MSG_NOISE: return "noise: ";
    case JEX_MSG_SILENT: return "silent: ";
    default: return "debug(" + std::to_string(msgType) + "): ";
    }
}

bool MessageSink::alwaysShown(unsigned msgType)
{
    return msgType == JEX_MSG_ERROR || msgType == JEX_MSG_WARNING || msgType == JEX_MSG_STATUS ||
           msgType == JEX_MSG_INFO;
}

void MessageSink::deliver(unsigned msgType, const char* text)
{
    std::string body = text ? text : "";
    while (!body.empty() && (body.back() == '\n' || body.back() == '\r')) body.pop_back();
    if (msgType == JEX_MSG_ERROR) m_lastError = body;
    if (!m_verbose && !alwaysShown(msgType)) return;
    m_out << prefixFor(msgType) << body << '\n';
    m_out.flush();
}

} // namespace jexjtag::cli
