// SPDX-License-Identifier: MIT
#include "hostlayer/Port_MsgDispatcher.hpp"

#include <algorithm>
#include <cstdarg>
#include <vector>

#include "hostlayer/Port_MsgManDefault.hpp"

namespace {

Port_MsgManDefault& builtInPrinter()
{
    // Never destroyed, like the state below: messages may come from atexit
    // handlers and global destructors.
    static Port_MsgManDefault* const printer = new Port_MsgManDefault("jexjtag");
    return *printer;
}

struct DispatcherState {
    DispatcherState() : managers{&builtInPrinter()}, defaultManager(&builtInPrinter()) {}
    std::vector<Port_MsgMan*> managers;
    Port_MsgMan* defaultManager;
};

// Built on first use, so the set is ready whatever the order of static
// initialisation.
DispatcherState& state()
{
    static DispatcherState* const s = new DispatcherState();
    return *s;
}

} // namespace

Port_MsgManInit::Port_MsgManInit() { state(); }

Port_MsgManInit::~Port_MsgManInit() = default;

// No instance at load time: the state is built on first use.  A cable plug-in
// that links this layer (for its BSDL reader) and never posts a message then
// allocates nothing that its unloading would leave behind.

Port_MsgMan* Port_MsgDispatcher::getDefaultMsgMan() { return state().defaultManager; }

bool Port_MsgDispatcher::addMsgMan(Port_MsgMan* manager)
{
    DispatcherState& s = state();
    if (!manager || std::find(s.managers.begin(), s.managers.end(), manager) != s.managers.end())
        return false;
    s.managers.push_back(manager);
    if (!s.defaultManager) s.defaultManager = manager;
    return true;
}

bool Port_MsgDispatcher::removeMsgMan(Port_MsgMan* manager)
{
    DispatcherState& s = state();
    auto it = std::find(s.managers.begin(), s.managers.end(), manager);
    if (!manager || it == s.managers.end()) return false;
    s.managers.erase(it);
    if (s.defaultManager == manager) s.defaultManager = s.managers.empty() ? nullptr : s.managers.front();
    return true;
}

void Port_MsgDispatcher::dispatch(Port_MsgMan::MsgType type, const wchar_t* text)
{
    // Copy: a manager may add or remove managers while it handles the message.
    const std::vector<Port_MsgMan*> managers = state().managers;
    for (Port_MsgMan* m : managers) m->outputMsg(type, text ? text : L"");
}

void Port_MsgDispatcher::post(Port_MsgMan::MsgType type, const wchar_t* format, ...)
{
    wchar_t buffer[1024];
    va_list args;
    va_start(args, format);
    builtInPrinter().msgFormat(buffer, sizeof buffer / sizeof buffer[0], format, args);
    va_end(args);
    dispatch(type, buffer);
}
