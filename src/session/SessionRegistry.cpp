// SPDX-License-Identifier: MIT
#include "session/SessionRegistry.hpp"

#include <algorithm>
#include <array>
#include <mutex>
#include <new>

#include "plugin/PluginManager.hpp"
#include "session/ApiCallScope.hpp"
#include "session/Session.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"

namespace JexRT {

namespace {

constexpr unsigned kIdMask = JEX_HANDLE_SESSION_MASK;
constexpr unsigned kIdStep = JEX_HANDLE_SESSION_STEP;
constexpr unsigned kIdCount = 256;

unsigned slotOf(unsigned handle) { return (handle & kIdMask) >> 16; }

// Process-wide state, created on first use and never destroyed, so that a
// host may destroy sessions from atexit handlers and global destructors.
// Sessions the host never destroyed are not destroyed at unload.  The mutex
// guards every field; it is never held while a host callback runs except
// during session creation (recursive, so the callback may call in).
struct Registry {
    std::recursive_mutex mutex;
    std::array<Session*, kIdCount> sessions {}; // by session id
    unsigned liveCount = 0;
    unsigned counter = kIdStep;
    bool unloadOnLastDestroy = true;
    std::vector<SessionMessageListener*> listeners;
};

Registry& registry()
{
    static Registry* const r = new Registry();
    return *r;
}

// Deletes a session already taken out of use, then the plug-in manager
// when it was the last one.
void finishDestroy(Session* session, unsigned handle)
{
    Registry& r = registry();
    delete session;
    std::vector<SessionMessageListener*> listeners;
    {
        std::lock_guard<std::recursive_mutex> lock(r.mutex);
        r.sessions[slotOf(handle)] = nullptr;
        --r.liveCount;
        listeners = r.listeners;
    }
    for (SessionMessageListener* listener : listeners) listener->sessionDestroyed(handle);

    // The last session takes the plug-in manager, and every module with it.
    std::lock_guard<std::recursive_mutex> lock(r.mutex);
    if (r.liveCount == 0 && r.unloadOnLastDestroy) {
        delete Session::m_pluginManager;
        Session::m_pluginManager = nullptr;
    }
}

} // namespace

Session* findSession(unsigned handle)
{
    Session* session = registry().sessions[slotOf(handle)];
    return session && !session->isClosing() ? session : nullptr;
}

Target* findTarget(unsigned handle)
{
    const Session* session = findSession(handle);
    return session ? session->getTarget(handle & JEX_HANDLE_TARGET_MASK) : nullptr;
}

bool noLiveSessions()
{
    std::lock_guard<std::recursive_mutex> lock(registry().mutex);
    return registry().liveCount == 0;
}

std::vector<std::string> getArgs(unsigned argc, const char** argv)
{
    std::vector<std::string> args;
    if (!argv) return args;
    args.reserve(argc);
    for (unsigned i = 0; i < argc; ++i) args.emplace_back(argv[i] ? argv[i] : "");
    return args;
}

unsigned createSession(JexMessageCallback msgCallback, unsigned argc, const char** argv, unsigned* handle)
{
    Registry& r = registry();
    if (!handle) return JEX_FAILURE;
    *handle = 0;
    if (argc > 0 && !argv) return JEX_FAILURE;
    for (unsigned i = 0; i < argc; ++i)
        if (!argv[i]) return JEX_FAILURE;

    std::unique_lock<std::recursive_mutex> lock(r.mutex);
    // The counter's id, or the next one no live session holds.
    unsigned id = r.counter;
    unsigned tries = 0;
    while (r.sessions[slotOf(id)] && tries < kIdCount) {
        id = (id + kIdStep) & kIdMask;
        ++tries;
    }
    if (tries == kIdCount) {
        Logger::logger.printLog(1, "JexJtag_session_create() - all %u session handles are in use\n", kIdCount);
        return JEX_FAILURE;
    }

    const std::vector<std::string> args = getArgs(argc, argv);
    Session* session = nullptr;
    try {
        session = new Session(id, msgCallback, args);
    } catch (const Jex_Exception& e) {
        Logger::logger.printLog(1, "\n%s\n", e.getMessage().c_str());
        return JEX_FAILURE;
    } catch (const std::bad_alloc&) {
        return JEX_FAILURE;
    }

    r.sessions[slotOf(id)] = session;
    ++r.liveCount;
    *handle = id;
    r.counter = (id + kIdStep) & kIdMask;

    const std::string unload = Jex_Util::findKey(args, "unloadtargetsondestroy");
    if (!unload.empty()) r.unloadOnLastDestroy = Jex_Util::stricmp(unload, "false") != 0;

    const std::vector<SessionMessageListener*> listeners = r.listeners;
    lock.unlock();
    for (SessionMessageListener* listener : listeners) listener->sessionCreated(id);
    return JEX_SUCCESS;
}

unsigned destroySession(unsigned handle)
{
    Session* session = findSession(handle);
    if (!session) return JEX_FAILURE;
    // From now on the handle reaches nothing; the id stays taken until the
    // session is gone.  A call under way on this thread (the callback's
    // caller) still uses it: it is deleted when that call returns.
    session->markClosing();
    if (ApiCallScope::nested()) ApiCallScope::defer([session, handle] { finishDestroy(session, handle); });
    else finishDestroy(session, handle);
    return JEX_SUCCESS;
}

unsigned addSessionMessageListener(SessionMessageListener* listener)
{
    std::lock_guard<std::recursive_mutex> lock(registry().mutex);
    auto& list = registry().listeners;
    if (!listener || std::find(list.begin(), list.end(), listener) != list.end()) return JEX_FAILURE;
    list.push_back(listener);
    return JEX_SUCCESS;
}

unsigned removeSessionMessageListener(SessionMessageListener* listener)
{
    std::lock_guard<std::recursive_mutex> lock(registry().mutex);
    auto& list = registry().listeners;
    auto it = std::find(list.begin(), list.end(), listener);
    if (it == list.end()) return JEX_FAILURE;
    list.erase(it);
    return JEX_SUCCESS;
}

} // namespace JexRT
