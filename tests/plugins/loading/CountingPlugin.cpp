// SPDX-License-Identifier: MIT
// A test module built on jexjtag::PluginBase that records every entry point
// it receives (tests/support/EntryLog.h) and, through its sendCommand
// operation, calls the host callbacks on request:
//
//   "message <type> <text>"  sendMessage(session handle, type, text)
//   "log <level> <text>"     vprintLog(level, "%s\n", text)
//   "dump <level>"           dumpBuffer(level, "counting dump", in, inLength)
//   "trace <name>"           logMethodEntry(name), then logMethodExit(name)
//
// Built several times under different names (JEX_TEST_MODULE).

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#include "jexjtag/plugin.hpp"
#include "support/EntryLog.h"

#ifndef JEX_TEST_MODULE
#error "JEX_TEST_MODULE names the module"
#endif

namespace {

unsigned g_nextInstance = 1;

class CountingInstance : public jexjtag::PluginBase {
public:
    CountingInstance() : m_id(g_nextInstance++) {}
    unsigned id() const { return m_id; }

    uint32_t setSessionHandle(uint32_t handle) override
    {
        jexTestEntryLog(JEX_TEST_MODULE, "setSessionHandle %u %u", m_id, handle);
        return PluginBase::setSessionHandle(handle);
    }
    uint32_t sendCommand(const char* command, const uint8_t* in, uint32_t inLength, uint8_t*, uint32_t*,
                         JexJtagCallContext*) override
    {
        const std::string text = command ? command : "";
        const size_t space = text.find(' ');
        const std::string verb = text.substr(0, space);
        const std::string rest = space == std::string::npos ? std::string() : text.substr(space + 1);
        const size_t space2 = rest.find(' ');
        const std::string number = rest.substr(0, space2);
        const std::string tail = space2 == std::string::npos ? std::string() : rest.substr(space2 + 1);
        if (verb == "message") {
            jexjtag::PluginHost::sendMessage(sessionHandle(), static_cast<uint32_t>(std::strtoul(number.c_str(), nullptr, 0)),
                                             tail.c_str());
        } else if (verb == "log") {
            jexjtag::PluginHost::log(std::atoi(number.c_str()), "%s\n", tail.c_str());
        } else if (verb == "dump") {
            jexjtag::PluginHost::dump(std::atoi(number.c_str()), "counting dump", in, inLength);
        } else if (verb == "trace") {
            jexjtag::PluginHost::methodEntry(rest.c_str());
            jexjtag::PluginHost::methodExit(rest.c_str());
        } else {
            return JEX_FAILURE;
        }
        return JEX_SUCCESS;
    }

private:
    unsigned m_id;
};

} // namespace

extern "C" JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)
{
    auto* instance = new CountingInstance();
    jexTestEntryLog(JEX_TEST_MODULE, "create %u", instance->id());
    return instance;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* instance)
{
    auto* counting = static_cast<CountingInstance*>(jexjtag::PluginBase::from(instance));
    jexTestEntryLog(JEX_TEST_MODULE, "destroy %u", counting ? counting->id() : 0u);
    delete counting;
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void)
{
    jexTestEntryLog(JEX_TEST_MODULE, "loaded");
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void)
{
    jexTestEntryLog(JEX_TEST_MODULE, "unloaded");
    jexjtag::PluginHost::set(nullptr);
    return JEX_SUCCESS;
}

extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* callbacks)
{
    const bool complete = callbacks && callbacks->sendMessage && callbacks->vprintLog && callbacks->dumpBuffer &&
                          callbacks->logMethodEntry && callbacks->logMethodExit;
    jexTestEntryLog(JEX_TEST_MODULE, "setCallbacks %s", complete ? "complete" : "incomplete");
    jexjtag::PluginHost::set(callbacks);
    return JEX_SUCCESS;
}
