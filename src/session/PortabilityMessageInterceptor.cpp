// SPDX-License-Identifier: MIT
#include "session/PortabilityMessageInterceptor.hpp"

#include <climits>
#include <cstring>
#include <cwchar>

#include "hostlayer/Port_MsgDispatcher.hpp"
#include "jexjtag/types.h"
#include "session/Message.hpp"
#include "session/MessageManager.hpp"
#include "util/Logger.hpp"

namespace JexRT {

namespace {

// The narrow form of the last host-layer message of this thread (1023
// characters at most).
thread_local char g_narrowText[1024];

// Converts `text` into g_narrowText in the current locale.  The text is cut
// at a character boundary when it does not fit; characters the locale
// cannot represent become '?'.
void toNarrow(const wchar_t* text)
{
    size_t used = 0;
    std::mbstate_t state {};
    char piece[MB_LEN_MAX];
    for (const wchar_t* p = text ? text : L""; *p; ++p) {
        size_t n = std::wcrtomb(piece, *p, &state);
        if (n == static_cast<size_t>(-1)) {
            piece[0] = '?';
            n = 1;
            state = std::mbstate_t {};
        }
        if (used + n > sizeof g_narrowText - 1) break;
        std::memcpy(g_narrowText + used, piece, n);
        used += n;
    }
    g_narrowText[used] = '\0';
}

} // namespace

PortabilityMessageInterceptor::PortabilityMessageInterceptor() : Port_MsgManDefault(nullptr) { install(); }

PortabilityMessageInterceptor::~PortabilityMessageInterceptor()
{
    if (m_replaceDefault) Port_MsgDispatcher::addMsgMan(m_previous);
    Port_MsgDispatcher::removeMsgMan(this);
}

bool PortabilityMessageInterceptor::install()
{
    m_previous = m_replaceDefault ? Port_MsgDispatcher::getDefaultMsgMan() : nullptr;
    bool result = Port_MsgDispatcher::addMsgMan(this);
    if (m_replaceDefault) result = Port_MsgDispatcher::removeMsgMan(m_previous);
    return result;
}

bool PortabilityMessageInterceptor::uninstall()
{
    if (m_replaceDefault) Port_MsgDispatcher::addMsgMan(m_previous);
    return Port_MsgDispatcher::removeMsgMan(this);
}

unsigned PortabilityMessageInterceptor::mapType(int hostLayerType)
{
    switch (hostLayerType) {
    case 0:
    case 4:
    case 5:
    case 6:
    case 8: return JEX_MSG_ERROR;
    case 1: return JEX_MSG_WARNING;
    case 2:
    case 7: return JEX_MSG_INFO;
    case 3: return JEX_MSG_SILENT;
    default: return JEX_MSG_NOISE;
    }
}

void PortabilityMessageInterceptor::outputMsg(MsgType type, const wchar_t* text)
{
    const unsigned msgType = mapType(type);
    toNarrow(text);
    Logger::logger.printLog(2, "Tornel: %s", g_narrowText);
    MessageManager::getInstance().broadcast(Message(msgType, g_narrowText));
}

} // namespace JexRT
