// SPDX-License-Identifier: MIT
/*
 * plugin.hpp - a small C++ helper for plug-in authors.
 *
 * Derive from jexjtag::PluginBase and override the operations your cable
 * supports; every other operation answers JEX_FAILURE (or 0 for the value
 * operations).  The operation table is filled with thunks that call the
 * member functions and stop every exception at the ABI boundary.
 *
 *     class MyCable : public jexjtag::PluginBase {
 *         uint32_t openTarget(uint32_t argc, const char** argv,
 *                             JexJtagCallContext* ctx) override { ... }
 *     };
 *     JEXJTAG_DEFINE_PLUGIN(MyCable)
 *
 * JEXJTAG_DEFINE_PLUGIN defines the five entry points; the callback table
 * the library gives is kept in jexjtag::PluginHost, through which the
 * plug-in sends messages and writes to the library's log.
 */
#ifndef JEXJTAG_PLUGIN_HPP
#define JEXJTAG_PLUGIN_HPP

#include <cstdarg>
#include <cstdint>
#include <stdexcept>

#include "plugin.h"

/* The helper's process-wide storage must stay private to each module.  Under
 * default visibility, g++ would give the function-local statics below
 * STB_GNU_UNIQUE binding: every module built with this header would then
 * share one callback table, and the loader could never free any of them. */
#if defined(__GNUC__) && !defined(_WIN32)
#  define JEXJTAG_PLUGIN_LOCAL __attribute__((visibility("hidden")))
#else
#  define JEXJTAG_PLUGIN_LOCAL
#endif

namespace jexjtag {

/* The host callbacks, kept for the module's lifetime. */
class PluginHost {
public:
    static void set(const JexPluginCallbacks* callbacks)
    {
        if (callbacks) table() = *callbacks;
        else table() = JexPluginCallbacks{};
    }
    static void sendMessage(uint32_t sessionHandle, uint32_t msgType, const char* text)
    {
        if (table().sendMessage) table().sendMessage(sessionHandle, msgType, text);
    }
    static void log(int level, const char* format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 2, 3)))
#endif
    {
        if (!table().vprintLog) return;
        va_list args;
        va_start(args, format);
        table().vprintLog(level, format, args);
        va_end(args);
    }
    static void dump(int level, const char* label, const uint8_t* bytes, uint32_t length)
    {
        if (table().dumpBuffer) table().dumpBuffer(level, label, bytes, length);
    }
    static void methodEntry(const char* name)
    {
        if (table().logMethodEntry) table().logMethodEntry(name);
    }
    static void methodExit(const char* name)
    {
        if (table().logMethodExit) table().logMethodExit(name);
    }

private:
    JEXJTAG_PLUGIN_LOCAL static JexPluginCallbacks& table()
    {
        static JexPluginCallbacks callbacks{};
        return callbacks;
    }
};

class PluginBase : public JexPluginInstance {
public:
    PluginBase() { ops = &operationTable(); }
    virtual ~PluginBase() = default;
    PluginBase(const PluginBase&) = delete;
    PluginBase& operator=(const PluginBase&) = delete;

    /* The C++ object behind an instance pointer the library hands back. */
    static PluginBase* from(JexPluginInstance* self) { return static_cast<PluginBase*>(self); }

    virtual uint32_t openTarget(uint32_t, const char**, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t closeTarget() { return JEX_FAILURE; }
    virtual uint32_t interrogate() { return JEX_FAILURE; }
    virtual uint32_t getDeviceCount() { return 0; }
    virtual uint32_t setDeviceCount(uint32_t) { return JEX_FAILURE; }
    virtual int32_t getIRLength(uint32_t) { return 0; }
    virtual uint32_t setIRLength(uint32_t, uint32_t) { return JEX_FAILURE; }
    virtual uint32_t getDeviceIdcode(uint32_t) { return 0; }
    virtual uint32_t setDeviceID(uint32_t, uint32_t) { return JEX_FAILURE; }
    virtual uint32_t getTargetInfo(JexJtagTargetInfo*) { return JEX_FAILURE; }
    virtual uint32_t setSessionHandle(uint32_t handle) { m_sessionHandle = handle; return JEX_SUCCESS; }
    virtual uint32_t lockTarget(uint32_t) { return JEX_FAILURE; }
    virtual uint32_t unlockTarget() { return JEX_FAILURE; }
    virtual uint32_t cleanLocks() { return JEX_FAILURE; }
    virtual uint32_t navigateTAP(uint32_t, uint32_t) { return JEX_FAILURE; }
    virtual uint32_t shiftChainIRRead(bool, uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftChainIRWrite(const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftChainIRReadWrite(const uint8_t*, uint8_t*, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftChainDRRead(bool, uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftChainDRWrite(const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftChainDRReadWrite(const uint8_t*, uint8_t*, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceIRRead(uint32_t, bool, uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceIRWrite(uint32_t, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceIRReadWrite(uint32_t, const uint8_t*, uint8_t*, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceDRRead(uint32_t, bool, uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceDRWrite(uint32_t, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t shiftDeviceDRReadWrite(uint32_t, const uint8_t*, uint8_t*, const uint8_t*, const uint8_t*, uint32_t, uint32_t, JexJtagCallContext*) { return JEX_FAILURE; }
    virtual uint32_t flush() { return JEX_FAILURE; }
    virtual uint32_t setPin(uint32_t, uint32_t) { return JEX_FAILURE; }
    virtual uint32_t getPin(uint32_t, uint32_t*) { return JEX_FAILURE; }
    virtual uint32_t pulsePin(uint32_t, uint32_t) { return JEX_FAILURE; }
    virtual uint32_t waitTime(uint32_t) { return JEX_FAILURE; }
    virtual uint32_t sendCommand(const char*, const uint8_t*, uint32_t, uint8_t*, uint32_t*, JexJtagCallContext*) { return JEX_FAILURE; }

protected:
    uint32_t sessionHandle() const { return m_sessionHandle; }

private:
    uint32_t m_sessionHandle = 0;

    /* The object behind an instance pointer the library passed to an
     * operation; a null pointer becomes an exception, so the operation fails
     * instead of crashing. */
    static PluginBase* checked(JexPluginInstance* self)
    {
        if (!self) throw std::invalid_argument("null plug-in instance");
        return from(self);
    }

    /* Calls a member function, turning any exception into `onError`. */
    template <typename R, typename F>
    static R guarded(R onError, F&& call)
    {
        try {
            return call();
        } catch (...) {
            return onError;
        }
    }

    JEXJTAG_PLUGIN_LOCAL static const JexPluginOps& operationTable()
    {
        static const JexPluginOps table = makeTable();
        return table;
    }

    static JexPluginOps makeTable()
    {
        JexPluginOps t{};
        t.openTarget = [](JexPluginInstance* s, uint32_t argc, const char** argv, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->openTarget(argc, argv, c); }); };
        t.closeTarget = [](JexPluginInstance* s) { return guarded(JEX_FAILURE, [&] { return checked(s)->closeTarget(); }); };
        t.interrogate = [](JexPluginInstance* s) { return guarded(JEX_FAILURE, [&] { return checked(s)->interrogate(); }); };
        t.getDeviceCount = [](JexPluginInstance* s) { return guarded(0u, [&] { return checked(s)->getDeviceCount(); }); };
        t.setDeviceCount = [](JexPluginInstance* s, uint32_t n) { return guarded(JEX_FAILURE, [&] { return checked(s)->setDeviceCount(n); }); };
        t.getIRLength = [](JexPluginInstance* s, uint32_t d) { return guarded(int32_t{0}, [&] { return checked(s)->getIRLength(d); }); };
        t.setIRLength = [](JexPluginInstance* s, uint32_t d, uint32_t l) { return guarded(JEX_FAILURE, [&] { return checked(s)->setIRLength(d, l); }); };
        t.getDeviceIdcode = [](JexPluginInstance* s, uint32_t d) { return guarded(0u, [&] { return checked(s)->getDeviceIdcode(d); }); };
        t.setDeviceID = [](JexPluginInstance* s, uint32_t d, uint32_t id) { return guarded(JEX_FAILURE, [&] { return checked(s)->setDeviceID(d, id); }); };
        t.getTargetInfo = [](JexPluginInstance* s, JexJtagTargetInfo* i) { return guarded(JEX_FAILURE, [&] { return checked(s)->getTargetInfo(i); }); };
        t.setSessionHandle = [](JexPluginInstance* s, uint32_t h) { return guarded(JEX_FAILURE, [&] { return checked(s)->setSessionHandle(h); }); };
        t.lockTarget = [](JexPluginInstance* s, uint32_t ms) { return guarded(JEX_FAILURE, [&] { return checked(s)->lockTarget(ms); }); };
        t.unlockTarget = [](JexPluginInstance* s) { return guarded(JEX_FAILURE, [&] { return checked(s)->unlockTarget(); }); };
        t.cleanLocks = [](JexPluginInstance* s) { return guarded(JEX_FAILURE, [&] { return checked(s)->cleanLocks(); }); };
        t.navigateTAP = [](JexPluginInstance* s, uint32_t st, uint32_t n) { return guarded(JEX_FAILURE, [&] { return checked(s)->navigateTAP(st, n); }); };
        t.shiftChainIRRead = [](JexPluginInstance* s, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainIRRead(l, o, om, n, e, c); }); };
        t.shiftChainIRWrite = [](JexPluginInstance* s, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainIRWrite(i, im, n, e, c); }); };
        t.shiftChainIRReadWrite = [](JexPluginInstance* s, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainIRReadWrite(i, o, im, om, n, e, c); }); };
        t.shiftChainDRRead = [](JexPluginInstance* s, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainDRRead(l, o, om, n, e, c); }); };
        t.shiftChainDRWrite = [](JexPluginInstance* s, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainDRWrite(i, im, n, e, c); }); };
        t.shiftChainDRReadWrite = [](JexPluginInstance* s, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftChainDRReadWrite(i, o, im, om, n, e, c); }); };
        t.shiftDeviceIRRead = [](JexPluginInstance* s, uint32_t d, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceIRRead(d, l, o, om, n, e, c); }); };
        t.shiftDeviceIRWrite = [](JexPluginInstance* s, uint32_t d, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceIRWrite(d, i, im, n, e, c); }); };
        t.shiftDeviceIRReadWrite = [](JexPluginInstance* s, uint32_t d, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceIRReadWrite(d, i, o, im, om, n, e, c); }); };
        t.shiftDeviceDRRead = [](JexPluginInstance* s, uint32_t d, bool l, uint8_t* o, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceDRRead(d, l, o, om, n, e, c); }); };
        t.shiftDeviceDRWrite = [](JexPluginInstance* s, uint32_t d, const uint8_t* i, const uint8_t* im, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceDRWrite(d, i, im, n, e, c); }); };
        t.shiftDeviceDRReadWrite = [](JexPluginInstance* s, uint32_t d, const uint8_t* i, uint8_t* o, const uint8_t* im, const uint8_t* om, uint32_t n, uint32_t e, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->shiftDeviceDRReadWrite(d, i, o, im, om, n, e, c); }); };
        t.flush = [](JexPluginInstance* s) { return guarded(JEX_FAILURE, [&] { return checked(s)->flush(); }); };
        t.setPin = [](JexPluginInstance* s, uint32_t p, uint32_t v) { return guarded(JEX_FAILURE, [&] { return checked(s)->setPin(p, v); }); };
        t.getPin = [](JexPluginInstance* s, uint32_t p, uint32_t* v) { return guarded(JEX_FAILURE, [&] { return checked(s)->getPin(p, v); }); };
        t.pulsePin = [](JexPluginInstance* s, uint32_t p, uint32_t n) { return guarded(JEX_FAILURE, [&] { return checked(s)->pulsePin(p, n); }); };
        t.waitTime = [](JexPluginInstance* s, uint32_t us) { return guarded(JEX_FAILURE, [&] { return checked(s)->waitTime(us); }); };
        t.sendCommand = [](JexPluginInstance* s, const char* cmd, const uint8_t* in, uint32_t inLen, uint8_t* out, uint32_t* outLen, JexJtagCallContext* c) {
            return guarded(JEX_FAILURE, [&] { return checked(s)->sendCommand(cmd, in, inLen, out, outLen, c); }); };
        return t;
    }
};

} // namespace jexjtag

/* Defines the five entry points for a plug-in whose instances are `Class`
 * (default-constructible, derived from jexjtag::PluginBase). */
#define JEXJTAG_DEFINE_PLUGIN(Class)                                                   \
    extern "C" JEXJTAG_PLUGIN_EXPORT JexPluginInstance* JexPlugin_create(void)         \
    {                                                                                  \
        try {                                                                          \
            return static_cast<JexPluginInstance*>(new Class());                       \
        } catch (...) {                                                                \
            return nullptr;                                                            \
        }                                                                              \
    }                                                                                  \
    extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_destroy(JexPluginInstance* i)  \
    {                                                                                  \
        if (!i) return JEX_FAILURE;                                                    \
        delete jexjtag::PluginBase::from(i);                                           \
        return JEX_SUCCESS;                                                            \
    }                                                                                  \
    extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_loaded(void) { return JEX_SUCCESS; } \
    extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_unloaded(void)                 \
    {                                                                                  \
        jexjtag::PluginHost::set(nullptr);                                             \
        return JEX_SUCCESS;                                                            \
    }                                                                                  \
    extern "C" JEXJTAG_PLUGIN_EXPORT uint32_t JexPlugin_setCallbacks(const JexPluginCallbacks* cb) \
    {                                                                                  \
        jexjtag::PluginHost::set(cb);                                                  \
        return JEX_SUCCESS;                                                            \
    }

#endif /* JEXJTAG_PLUGIN_HPP */
