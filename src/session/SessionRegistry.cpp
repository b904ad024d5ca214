#include "session/SessionRegistry.hpp"

#include <algorithm>
#include <array>
#include <new>

#include "plugin/PluginManager.hpp"
#include "session/Session.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"

namespace JexRT {

namespace {

constexpr unsigned kIdMask = JEX_HANDLE_SESSION_MASK;
constexpr unsigned kIdStep = JEX_HANDLE_SESSION_STEP;
constexpr unsigned kIdCount = 256;

unsigned slotOf(unsigned handle) { return (handle & kIdMask) >> 16; }

// Process-wide state, created empty when the library is loaded.  Sessions
// the host never destroyed are not destroyed at unload.
struct Registry {
    std::array<Session*, kIdCount> sessions {}; // by session id
    unsigned liveCount = 0;
    unsigned counter = kIdStep;
    bool unloadOnLastDestroy = true;
    std::vector<SessionMessageListener*> listeners;
};

Registry& registry()
{
    static Registry r;
    return r;
}

} // namespace

Session* findSession(unsigned handle) { return registry().sessions[slotOf(handle)]; }

Target* findTarget(unsigned handle)
{
    const Session* session = findSession(handle);
    return session ? session->getTarget(handle & JEX_HANDLE_TARGET_MASK) : nullptr;
}

bool noLiveSessions() { return registry().liveCount == 0; }

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

    const std::vector<SessionMessageListener*> listeners = r.listeners;
    for (SessionMessageListener* listener : listeners) listener->sessionCreated(id);

    const std::string unload = Jex_Util::findKey(args, "unloadtargetsondestroy");
    if (!unload.empty()) r.unloadOnLastDestroy = Jex_Util::stricmp(unload, "false") != 0;
    return JEX_SUCCESS;
}

unsigned destroySession(unsigned handle)
{
    Registry& r = registry();
    Session* session = findSession(handle);
    if (!session) return JEX_FAILURE;

    delete session;
    r.sessions[slotOf(handle)] = nullptr;
    --r.liveCount;

    const std::vector<SessionMessageListener*> listeners = r.listeners;
    for (SessionMessageListener* listener : listeners) listener->sessionDestroyed(handle);

    // The last session takes the plug-in manager, and every module with it.
    if (r.liveCount == 0 && r.unloadOnLastDestroy) {
        delete Session::m_pluginManager;
        Session::m_pluginManager = nullptr;
    }
    return JEX_SUCCESS;
}

unsigned addSessionMessageListener(SessionMessageListener* listener)
{
    auto& list = registry().listeners;
    if (!listener || std::find(list.begin(), list.end(), listener) != list.end()) return JEX_FAILURE;
    list.push_back(listener);
    return JEX_SUCCESS;
}

unsigned removeSessionMessageListener(SessionMessageListener* listener)
{
    auto& list = registry().listeners;
    auto it = std::find(list.begin(), list.end(), listener);
    if (it == list.end()) return JEX_FAILURE;
    list.erase(it);
    return JEX_SUCCESS;
}

} // namespace JexRT
