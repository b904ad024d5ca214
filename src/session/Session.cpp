// SPDX-License-Identifier: MIT
#include "session/Session.hpp"

#include <cstdio>

#include "boundary/BoundaryStore.hpp"
#include "session/InternalSessionMessageListener.hpp"
#include "session/MessageManager.hpp"
#include "plugin/PluginManager.hpp"
#include "util/Jex_Util.hpp"

namespace JexRT {

PluginManager* Session::m_pluginManager = nullptr;

Session::Session(unsigned handle, JexMessageCallback msgCallback, const std::vector<std::string>& args)
{
    try {
        init(handle, msgCallback, args);
    } catch (...) {
        release();
        throw;
    }
}

Session::~Session() { release(); }

BoundaryStore& Session::boundary()
{
    if (!m_boundary) m_boundary = std::make_unique<BoundaryStore>();
    return *m_boundary;
}

void Session::init(unsigned handle, JexMessageCallback msgCallback, const std::vector<std::string>& args)
{
    m_handle = handle;
    m_msgCallback = msgCallback;
    m_args.insert(m_args.end(), args.begin(), args.end());

    m_messageListener = std::make_unique<InternalSessionMessageListener>(this);
    MessageManager::getInstance().addListener(m_messageListener.get());

    const std::string dataDir = Jex_Util::findKey(m_args, "datadir");
    if (!dataDir.empty()) Jex_Util::setUserDataDirPath(dataDir);

    m_deviceDB.init(); // the installation's idcode.lst; a session always has it

    // The first session creates the plug-in manager (which discovers and
    // loads the plug-ins); later sessions share it.
    if (!m_pluginManager) m_pluginManager = new PluginManager();
}

void Session::release()
{
    destroyTarget(0); // closes it while the host can still hear of it
    m_msgCallback = nullptr;
    m_handle = 0;
    m_args.clear();
    if (m_messageListener) {
        MessageManager::getInstance().removeListener(m_messageListener.get());
        m_messageListener.reset();
    }
}

void Session::sendMessage(unsigned msgType, const std::string& text)
{
    if (m_closing) return;
    if (m_msgCallback) {
        m_msgCallback(m_handle, msgType, text.c_str());
        return;
    }
    if (msgType == JEX_MSG_SILENT) return;
    const char* prefix = "";
    switch (msgType) {
    case JEX_MSG_ERROR: prefix = "Error:"; break;
    case JEX_MSG_WARNING: prefix = "Warning:"; break;
    case JEX_MSG_STATUS: prefix = "Status:"; break;
    case JEX_MSG_INFO: prefix = "Info:"; break;
    default: break;
    }
    std::fputs(prefix, stdout);
    std::fwrite(text.data(), 1, text.size(), stdout);
    std::fflush(stdout);
}

void Session::setPluginSearchPath(const std::string& path)
{
    m_pluginSearchPath = path;
    refreshTargetList();
}

// The target list belongs to the plug-in manager; a live session always
// has one, the checks only keep a misuse from crashing.
unsigned Session::refreshTargetList() { return m_pluginManager ? m_pluginManager->refreshTargetList() : JEX_FAILURE; }

unsigned Session::getTargetCount() { return m_pluginManager ? m_pluginManager->getTargetCount() : 0; }

unsigned Session::getTargetXMLSizeByIndex(unsigned index)
{
    return m_pluginManager ? m_pluginManager->getXMLSizeByIndex(index) : 0;
}

unsigned Session::getTargetByIndex(unsigned index, char* xmlBuf, unsigned xmlBufLen, std::string* targetName,
                                   std::string* pluginName)
{
    if (!m_pluginManager) return JEX_FAILURE;
    return m_pluginManager->getTargetByIndex(index, xmlBuf, xmlBufLen, targetName, pluginName);
}

} // namespace JexRT
