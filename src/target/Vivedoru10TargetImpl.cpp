// SPDX-License-Identifier: MIT
#include "target/Vivedoru10TargetImpl.hpp"

#include <cstring>

#include "jexjtag/rt/IDCode.hpp"
#include "platform/Process.hpp"
#include "plugin/PluginManager.hpp"
#include "session/Session.hpp"
#include "target/CallContextCopy.hpp"
#include "target/TapStateText.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"
#include "util/MethodLogger.hpp"
#include "util/TraceText.hpp"

namespace JexRT {

namespace {

constexpr unsigned kReadBit = JEXJTAG_SHIFT_READ;
constexpr unsigned kWriteBit = JEXJTAG_SHIFT_WRITE;
// Every device has an instruction register of at least 2 bits, and no
// chain is read with an IR scan longer than 4096 bits.
constexpr unsigned kMaxChainDevices = 2048;

// The plug-in's operation, or null (logged) when its table lacks it: a
// missing operation fails like a refusing plug-in instead of crashing.
template <typename Op>
Op pluginOp(const JexPluginInstance* instance, Op JexPluginOps::*member, const char* name)
{
    Op op = instance->ops ? instance->ops->*member : nullptr;
    if (!op) Logger::logger.printLog(1, "The plug-in instance has no %s operation!\n", name);
    return op;
}

// An instance goes back to the module that created it: a later discovery
// may have made another module serve the same type.
JexPluginInstance* createInstance(const std::string& type, const PluginModule*& creator)
{
    creator = nullptr;
    return Session::m_pluginManager ? Session::m_pluginManager->createPluginInstance(type, &creator) : nullptr;
}

void destroyInstance(const PluginModule* creator, JexPluginInstance* instance)
{
    if (Session::m_pluginManager) Session::m_pluginManager->destroyPluginInstance(creator, instance);
}

struct ShiftNames {
    const char* method;
    const char* tdiTitle;
    const char* tdoTitle;
};

const ShiftNames kShiftNames[] = {
    {"shiftChainIR", "TDI BUFFER BEFORE SHIFTCHAINIR:", "TDO BUFFER AFTER SHIFTCHAINIR:"},
    {"shiftDeviceIR", "TDI BUFFER BEFORE SHIFTDEVICEIR:", "TDO BUFFER AFTER SHIFTDEVICEIR:"},
    {"shiftChainDR", "TDI BUFFER BEFORE SHIFTCHAINDR:", "TDO BUFFER AFTER SHIFTCHAINDR:"},
    {"shiftDeviceDR", "TDI BUFFER BEFORE SHIFTDEVICEDR:", "TDO BUFFER AFTER SHIFTDEVICEDR:"},
};

} // namespace

Vivedoru10TargetImpl::Vivedoru10TargetImpl(Session* session) : m_session(session) {}

Vivedoru10TargetImpl::~Vivedoru10TargetImpl()
{
    try {
        if (m_plugin) close();
    } catch (...) {
        // Nothing may leave a destructor; the instance is lost with the target.
    }
}

bool Vivedoru10TargetImpl::hasPlugin() const
{
    if (m_plugin) return true;
    Logger::logger.printLog(1, "m_plugin is NULL!\n");
    return false;
}

void Vivedoru10TargetImpl::reportError(const std::string& text)
{
    if (m_session) m_session->sendMessage(JEX_MSG_ERROR, text);
    Logger::logger.printLog(1, "%s", text.c_str());
}

// ---- open and close ---------------------------------------------------------

unsigned Vivedoru10TargetImpl::open(const std::string& name, JexJtagCallContext* context,
                                    const std::vector<std::string>& args)
{
    MethodLogger tracer;
    tracer.setMethodName("open");
    unsigned result = JEX_FAILURE;

    std::vector<const char*> argv;
    argv.reserve(args.size());
    for (const std::string& arg : args) argv.push_back(arg.c_str());
    const unsigned argc = static_cast<unsigned>(argv.size());
    if (Logger::logger.isEnabled(3)) {
        Logger::logger.printLog(3, "open() argc=%u\n", argc);
        for (unsigned i = 0; i < argc; ++i) Logger::logger.printLog(3, "open() argv[%u]:%s\n", i, argv[i]);
    }

    // The open target keeps its instance, name and arguments, so that its
    // close gives the instance back under the type it was created with.
    if (m_plugin) {
        reportError("There is already a target opened for this session.  Close the target first or create a "
                    "new session to open a new target.\n");
        return tracer.setReturnStatus(result);
    }

    m_targetName = name;
    m_args = args;
    if (name.empty()) {
        reportError("No valid targetName provided!\n");
        return tracer.setReturnStatus(result);
    }

    const PluginModule* creator = nullptr;
    JexPluginInstance* instance = createInstance(name, creator);
    if (!instance) {
        reportError("Could not open plugin of the type: " + name +
                    ". Please check to make sure the correct plug-in for this type is installed.\n");
    } else {
        if (Logger::logger.isEnabled(3))
            Logger::logger.printLog(3, "Session::m_pluginManager->createPluginInstance(type=%s), returned %s\n",
                                    name.c_str(), PointerText(instance).c_str());
        if (auto setHandle = pluginOp(instance, &JexPluginOps::setSessionHandle, "setSessionHandle"))
            setHandle(instance, m_session ? m_session->getHandle() : 0);
        JexJtagCallContext copy = copyCallContext(context);
        if (auto openTarget = pluginOp(instance, &JexPluginOps::openTarget, "openTarget"))
            result = openTarget(instance, argc, argv.data(), &copy);
        if (Logger::logger.isEnabled(3))
            Logger::logger.printLog(3, "openTarget %s, returned %s\n", name.c_str(), statusText(result));
        if (JEX_FAILED(result)) {
            destroyInstance(creator, instance);
        } else {
            m_plugin = instance;
            m_creator = creator;
        }
    }

    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "open(m_plugin=%s) returning %s\n", PointerText(m_plugin).c_str(),
                                statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::close()
{
    MethodLogger tracer;
    tracer.setMethodName("close");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);

    if (auto closeTarget = pluginOp(m_plugin, &JexPluginOps::closeTarget, "closeTarget"))
        result = closeTarget(m_plugin);
    Logger::logger.printLog(3, "closeTarget() returning %s\n", statusText(result));

    JexPluginInstance* instance = m_plugin;
    m_plugin = nullptr;
    destroyInstance(m_creator, instance);
    m_creator = nullptr;
    return tracer.setReturnStatus(result);
}

// ---- locks -------------------------------------------------------------------

unsigned Vivedoru10TargetImpl::lock(unsigned msWait)
{
    MethodLogger tracer;
    tracer.setMethodName("lock");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin() || m_locked) return tracer.setReturnStatus(result);

    if (auto lockTarget = pluginOp(m_plugin, &JexPluginOps::lockTarget, "lockTarget")) result = lockTarget(m_plugin, msWait);
    Logger::logger.printLog(3, "lockTarget(msWait=%u) returning %s\n", msWait, statusText(result));
    if (!JEX_FAILED(result)) m_locked = true;
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::unlock()
{
    MethodLogger tracer;
    tracer.setMethodName("unlock");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin() || !m_locked) return tracer.setReturnStatus(result);

    if (auto unlockTarget = pluginOp(m_plugin, &JexPluginOps::unlockTarget, "unlockTarget"))
        result = unlockTarget(m_plugin);
    Logger::logger.printLog(3, "unlockTarget() returning %s\n", statusText(result));
    if (!JEX_FAILED(result)) m_locked = false;
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getLockStatus()
{
    MethodLogger tracer;
    tracer.setMethodName("getLockStatus");
    return m_locked ? JEXJTAG_LOCKED_ME : JEXJTAG_UNLOCKED;
}

unsigned Vivedoru10TargetImpl::cleanLocks(const std::string& type)
{
    MethodLogger tracer;
    tracer.setMethodName("cleanLocks");
    unsigned result = JEX_FAILURE;
    if (m_plugin) {
        Logger::logger.printLog(1, "m_plugin is not NULL!\n");
        return tracer.setReturnStatus(result);
    }

    const PluginModule* creator = nullptr;
    JexPluginInstance* instance = createInstance(type, creator);
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "Session::m_pluginManager->createPluginInstance(type=%s), returned %s\n",
                                type.c_str(), PointerText(instance).c_str());
    if (instance) {
        if (auto setHandle = pluginOp(instance, &JexPluginOps::setSessionHandle, "setSessionHandle"))
            setHandle(instance, m_session ? m_session->getHandle() : 0);
        if (auto clean = pluginOp(instance, &JexPluginOps::cleanLocks, "cleanLocks")) result = clean(instance);
        Logger::logger.printLog(3, "cleanLocks() returning %s\n", statusText(result));
        destroyInstance(creator, instance);
    }
    return tracer.setReturnStatus(result);
}

// ---- information, commands and options ----------------------------------------

unsigned Vivedoru10TargetImpl::getInfo(JexJtagTargetInfo* info)
{
    MethodLogger tracer;
    tracer.setMethodName("getInfo");
    unsigned result = JEX_FAILURE;
    if (info) std::memset(info, 0, sizeof *info);
    if (!hasPlugin()) return tracer.setReturnStatus(result);

    if (auto getTargetInfo = pluginOp(m_plugin, &JexPluginOps::getTargetInfo, "getTargetInfo"))
        result = getTargetInfo(m_plugin, info);
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "getTargetInfo(info=%s) returning %s\n", PointerText(info).c_str(),
                                statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::sendCommand(const std::string& command, const unsigned char* inbuf,
                                           unsigned inbuflen, unsigned char* outbuf, unsigned* outbuflen,
                                           JexJtagCallContext* context)
{
    MethodLogger tracer;
    tracer.setMethodName("sendCommand");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);

    JexJtagCallContext copy = copyCallContext(context);
    if (auto send = pluginOp(m_plugin, &JexPluginOps::sendCommand, "sendCommand"))
        result = send(m_plugin, command.c_str(), inbuf, inbuflen, outbuf, outbuflen, &copy);

    if (Logger::logger.isEnabled(3)) {
        const unsigned shownOutLen = outbuflen ? *outbuflen : 0;
        if (Jex_Util::stricmp(command, "set") == 0 || Jex_Util::stricmp(command, "get") == 0) {
            // The text of a get or set, read no further than inbuflen.
            const char* text = inbuf ? reinterpret_cast<const char*>(inbuf) : "NULL";
            const int textLen = inbuf ? static_cast<int>(strnlen(text, inbuflen)) : 4;
            Logger::logger.printLog(3, "sendCommand(cmd=%s, inbuf=%.*s, inbuflen=%u, outbuflen=%u) returning %s\n",
                                    command.c_str(), textLen, text, inbuflen, shownOutLen, statusText(result));
        } else {
            Logger::logger.printLog(3, "sendCommand(cmd=%s, inbuflen=%u, outbuflen=%u) returning %s\n",
                                    command.c_str(), inbuflen, shownOutLen, statusText(result));
        }
    }
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getOption(const std::string& key, std::string& value, unsigned* valuesize)
{
    MethodLogger tracer;
    tracer.setMethodName("getOption");
    // One spare zero byte: the text is read within the capacity the plug-in
    // was given, whatever it writes into the word afterwards.
    const unsigned capacity = valuesize ? *valuesize : 0;
    std::vector<char> buffer;
    if (capacity) buffer.assign(static_cast<size_t>(capacity) + 1, '\0');

    JexJtagCallContext context{};
    const unsigned result =
        sendCommand("get", reinterpret_cast<const unsigned char*>(key.c_str()), static_cast<unsigned>(key.size() + 1),
                    capacity ? reinterpret_cast<unsigned char*>(buffer.data()) : nullptr, valuesize, &context);
    if (!JEX_FAILED(result)) {
        if (capacity) value.assign(buffer.data(), strnlen(buffer.data(), capacity));
        else value.clear();
    }
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::setOption(const std::string& key, const std::string& value)
{
    MethodLogger tracer;
    tracer.setMethodName("setOption");
    const std::string text = key + "=" + value;
    JexJtagCallContext context{};
    return tracer.setReturnStatus(sendCommand("set", reinterpret_cast<const unsigned char*>(text.c_str()),
                                              static_cast<unsigned>(text.size() + 1), nullptr, nullptr, &context));
}

// ---- chain configuration --------------------------------------------------------

unsigned Vivedoru10TargetImpl::autodetect(unsigned algorithm)
{
    MethodLogger tracer;
    tracer.setMethodName("autodetect");
    if (!hasPlugin()) return tracer.setReturnStatus(JEX_FAILURE);
    if (JEX_FAILED(interrogate(algorithm))) return tracer.setReturnStatus(JEX_FAILURE);
    unsigned count = 0;
    if (JEX_FAILED(getDeviceCount(&count))) return tracer.setReturnStatus(JEX_FAILURE);

    for (unsigned i = 0; i < count; ++i) {
        IDCode idcode;
        if (JEX_FAILED(getDeviceIdcode(i, idcode))) return tracer.setReturnStatus(JEX_FAILURE);
        std::string name;
        std::string bypass;
        unsigned irLength = 0;
        unsigned familyType = 0;
        unsigned familySubType = 0;
        bool isUserList = false;
        const unsigned lookup = m_session ? m_session->idcodeLookup(idcode, name, &irLength, &familyType,
                                                                    &familySubType, bypass, &isUserList)
                                          : JEX_FAILURE;
        // An unknown device is a successful lookup with IR length 0; only a
        // failed lookup leaves the plug-in's IR length alone.
        if (!JEX_FAILED(lookup)) setIRLength(i, irLength);
    }
    return tracer.setReturnStatus(JEX_SUCCESS);
}

unsigned Vivedoru10TargetImpl::interrogate(unsigned /*algorithm*/)
{
    MethodLogger tracer;
    tracer.setMethodName("interrogate");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::interrogate, "interrogate")) result = op(m_plugin);
    Logger::logger.printLog(3, "interrogate() returning %s\n", statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getDeviceCount(unsigned* count)
{
    MethodLogger tracer;
    tracer.setMethodName("getDeviceCount");
    *count = 0;
    if (!hasPlugin()) return tracer.setReturnStatus(JEX_FAILURE);
    auto op = pluginOp(m_plugin, &JexPluginOps::getDeviceCount, "getDeviceCount");
    if (!op) return tracer.setReturnStatus(JEX_FAILURE);
    const unsigned answer = op(m_plugin);
    Logger::logger.printLog(3, "getDeviceCount() returning %d\n", static_cast<int>(answer));
    // The operation has no failure channel: an error value shows up as a
    // count that no chain can have.
    if (answer > kMaxChainDevices) {
        reportError("The plug-in reports " + std::to_string(answer) + " devices on the chain; a chain has at most " +
                    std::to_string(kMaxChainDevices) + ".\n");
        return tracer.setReturnStatus(JEX_FAILURE);
    }
    *count = answer;
    return tracer.setReturnStatus(JEX_SUCCESS);
}

unsigned Vivedoru10TargetImpl::setDeviceCount(unsigned count)
{
    MethodLogger tracer;
    tracer.setMethodName("setDeviceCount");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::setDeviceCount, "setDeviceCount")) result = op(m_plugin, count);
    Logger::logger.printLog(3, "setDeviceCount(count=%d) returning %s\n", static_cast<int>(count), statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getBypassCmd(unsigned deviceIndex, std::string& instruction)
{
    MethodLogger tracer;
    tracer.setMethodName("getBypassCmd");
    unsigned irlen = 0;
    const unsigned result = getIRLength(deviceIndex, &irlen);
    // The plug-in answers the IR length as an int: a negative answer is no
    // length at all.
    const int length = static_cast<int>(irlen);
    if (!JEX_FAILED(result) && length > 0) instruction.append(static_cast<size_t>(length), '1');
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::setBypassCmd(unsigned /*deviceIndex*/, const std::string& /*instruction*/)
{
    MethodLogger tracer;
    tracer.setMethodName("setBypassCmd");
    return tracer.setReturnStatus(JEX_FAILURE);
}

unsigned Vivedoru10TargetImpl::getIRLength(unsigned deviceIndex, unsigned* irlen)
{
    MethodLogger tracer;
    tracer.setMethodName("getIRLength");
    *irlen = 0;
    if (!hasPlugin()) return tracer.setReturnStatus(JEX_FAILURE);
    auto op = pluginOp(m_plugin, &JexPluginOps::getIRLength, "getIRLength");
    if (!op) return tracer.setReturnStatus(JEX_FAILURE);
    const int length = op(m_plugin, deviceIndex);
    *irlen = static_cast<unsigned>(length);
    Logger::logger.printLog(3, "getIRLength(deviceIndex=%d) returning %d\n", static_cast<int>(deviceIndex), length);
    return tracer.setReturnStatus(JEX_SUCCESS);
}

unsigned Vivedoru10TargetImpl::setIRLength(unsigned deviceIndex, unsigned irlen)
{
    MethodLogger tracer;
    tracer.setMethodName("setIRLength");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::setIRLength, "setIRLength")) result = op(m_plugin, deviceIndex, irlen);
    Logger::logger.printLog(3, "setIRLength(deviceIndex=%d, irlen=%d) returning %s\n", static_cast<int>(deviceIndex),
                            static_cast<int>(irlen), statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getDeviceIdcode(unsigned deviceIndex, IDCode& idcode)
{
    MethodLogger tracer;
    tracer.setMethodName("getDeviceIdcode");
    if (!hasPlugin()) return tracer.setReturnStatus(JEX_FAILURE);
    auto op = pluginOp(m_plugin, &JexPluginOps::getDeviceIdcode, "getDeviceIdcode");
    if (!op) return tracer.setReturnStatus(JEX_FAILURE);
    const unsigned value = op(m_plugin, deviceIndex);
    idcode.setIDCode(value);
    Logger::logger.printLog(3, "getDeviceIdcode(deviceIndex=%d) returning %x\n", static_cast<int>(deviceIndex), value);
    return tracer.setReturnStatus(JEX_SUCCESS);
}

unsigned Vivedoru10TargetImpl::setDeviceIdcode(unsigned deviceIndex, const IDCode& idcode)
{
    MethodLogger tracer;
    tracer.setMethodName("setDeviceIdcode");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    const unsigned value = idcode.getIDCode32();
    if (auto op = pluginOp(m_plugin, &JexPluginOps::setDeviceID, "setDeviceID")) result = op(m_plugin, deviceIndex, value);
    Logger::logger.printLog(3, "setDeviceID(deviceIndex=%d, idcode=%x) returning %s\n", static_cast<int>(deviceIndex),
                            value, statusText(result));
    return tracer.setReturnStatus(result);
}

// ---- navigation and shifts ---------------------------------------------------------

unsigned Vivedoru10TargetImpl::navigate(unsigned newState, unsigned clockRepeat, unsigned microSeconds)
{
    MethodLogger tracer;
    tracer.setMethodName("navigate");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);

    if (auto op = pluginOp(m_plugin, &JexPluginOps::navigateTAP, "navigateTAP"))
        result = op(m_plugin, newState, clockRepeat);
    if (Logger::logger.isEnabled(3))
        Logger::logger.printLog(3, "nagivateTAP(newState=%s, clockRepeat=%u) returning %s\n",
                                TapStateText(newState).c_str(), clockRepeat, statusText(result));

    if (microSeconds != 0) {
        if (auto flushOp = pluginOp(m_plugin, &JexPluginOps::flush, "flush")) flushOp(m_plugin);
        // Callers wait for device timing: never less than asked.
        jexplatform::sleepMicroseconds(microSeconds);
        Logger::logger.printLog(3, "Slept for %u microSeconds...\n", microSeconds);
    }
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::shiftChainIR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                                            const unsigned char* tdimask, const unsigned char* tdomask,
                                            unsigned shiftMode, unsigned exitState, JexJtagCallContext* context)
{
    return shift(Register::ChainIR, 0, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, context);
}

unsigned Vivedoru10TargetImpl::shiftDeviceIR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                                             unsigned bitCount, const unsigned char* tdimask,
                                             const unsigned char* tdomask, unsigned shiftMode, unsigned exitState,
                                             JexJtagCallContext* context)
{
    return shift(Register::DeviceIR, deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState,
                 context);
}

unsigned Vivedoru10TargetImpl::shiftChainDR(const unsigned char* tdibuf, unsigned char* tdobuf, unsigned bitCount,
                                            const unsigned char* tdimask, const unsigned char* tdomask,
                                            unsigned shiftMode, unsigned exitState, JexJtagCallContext* context)
{
    return shift(Register::ChainDR, 0, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState, context);
}

unsigned Vivedoru10TargetImpl::shiftDeviceDR(unsigned deviceIndex, const unsigned char* tdibuf, unsigned char* tdobuf,
                                             unsigned bitCount, const unsigned char* tdimask,
                                             const unsigned char* tdomask, unsigned shiftMode, unsigned exitState,
                                             JexJtagCallContext* context)
{
    return shift(Register::DeviceDR, deviceIndex, tdibuf, tdobuf, bitCount, tdimask, tdomask, shiftMode, exitState,
                 context);
}

unsigned Vivedoru10TargetImpl::shift(Register which, unsigned deviceIndex, const unsigned char* tdibuf,
                                     unsigned char* tdobuf, unsigned bitCount, const unsigned char* tdimask,
                                     const unsigned char* tdomask, unsigned shiftMode, unsigned exitState,
                                     JexJtagCallContext* context)
{
    const ShiftNames& names = kShiftNames[static_cast<int>(which)];
    MethodLogger tracer;
    tracer.setMethodName(names.method);
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);

    const bool reading = (shiftMode & kReadBit) != 0;
    const bool writing = (shiftMode & kWriteBit) != 0;
    if (writing && Logger::logger.isEnabled(3)) Logger::logger.dumpBuffer(3, names.tdiTitle, tdibuf, bitCount);

    JexJtagCallContext copy = copyCallContext(context);
    JexPluginInstance* const p = m_plugin;
    if (reading && writing) {
        switch (which) {
        case Register::ChainIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainIRReadWrite, "shiftChainIRReadWrite"))
                result = op(p, tdibuf, tdobuf, tdimask, tdomask, bitCount, exitState, &copy);
            break;
        case Register::DeviceIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceIRReadWrite, "shiftDeviceIRReadWrite"))
                result = op(p, deviceIndex, tdibuf, tdobuf, tdimask, tdomask, bitCount, exitState, &copy);
            break;
        case Register::ChainDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainDRReadWrite, "shiftChainDRReadWrite"))
                result = op(p, tdibuf, tdobuf, tdimask, tdomask, bitCount, exitState, &copy);
            break;
        case Register::DeviceDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceDRReadWrite, "shiftDeviceDRReadWrite"))
                result = op(p, deviceIndex, tdibuf, tdobuf, tdimask, tdomask, bitCount, exitState, &copy);
            break;
        }
    } else if (reading) {
        // Only the first byte of tdibuf counts, as the level TDI is held at.
        const bool tdiLevel = tdibuf && tdibuf[0] != 0;
        switch (which) {
        case Register::ChainIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainIRRead, "shiftChainIRRead"))
                result = op(p, tdiLevel, tdobuf, tdomask, bitCount, exitState, &copy);
            break;
        case Register::DeviceIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceIRRead, "shiftDeviceIRRead"))
                result = op(p, deviceIndex, tdiLevel, tdobuf, tdomask, bitCount, exitState, &copy);
            break;
        case Register::ChainDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainDRRead, "shiftChainDRRead"))
                result = op(p, tdiLevel, tdobuf, tdomask, bitCount, exitState, &copy);
            break;
        case Register::DeviceDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceDRRead, "shiftDeviceDRRead"))
                result = op(p, deviceIndex, tdiLevel, tdobuf, tdomask, bitCount, exitState, &copy);
            break;
        }
    } else if (writing) {
        switch (which) {
        case Register::ChainIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainIRWrite, "shiftChainIRWrite"))
                result = op(p, tdibuf, tdimask, bitCount, exitState, &copy);
            break;
        case Register::DeviceIR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceIRWrite, "shiftDeviceIRWrite"))
                result = op(p, deviceIndex, tdibuf, tdimask, bitCount, exitState, &copy);
            break;
        case Register::ChainDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftChainDRWrite, "shiftChainDRWrite"))
                result = op(p, tdibuf, tdimask, bitCount, exitState, &copy);
            break;
        case Register::DeviceDR:
            if (auto op = pluginOp(p, &JexPluginOps::shiftDeviceDRWrite, "shiftDeviceDRWrite"))
                result = op(p, deviceIndex, tdibuf, tdimask, bitCount, exitState, &copy);
            break;
        }
    }

    if (reading && Logger::logger.isEnabled(5)) Logger::logger.dumpBuffer(5, names.tdoTitle, tdobuf, bitCount);

    if (Logger::logger.isEnabled(3)) {
        const char* modeText = reading ? (writing ? "RW" : "R") : (writing ? "W" : "");
        const PointerText tdi(tdibuf), tdo(tdobuf), tdiMask(tdimask), tdoMask(tdomask);
        const TapStateText exit(exitState);
        if (which == Register::DeviceIR || which == Register::DeviceDR)
            Logger::logger.printLog(3,
                                    "%s(deviceIndex=%u, tdibuf=%s, tdobuf=%s, tdimask=%s, tdomask=%s, bitCount=%d, "
                                    "shiftMode=%s, exitState=%s) returning %s\n",
                                    names.method, deviceIndex, tdi.c_str(), tdo.c_str(), tdiMask.c_str(),
                                    tdoMask.c_str(), static_cast<int>(bitCount), modeText, exit.c_str(),
                                    statusText(result));
        else
            Logger::logger.printLog(3,
                                    "%s(tdibuf=%s, tdobuf=%s, tdimask=%s, tdomask=%s, bitCount=%d, shiftMode=%s, "
                                    "exitState=%s) returning %s\n",
                                    names.method, tdi.c_str(), tdo.c_str(), tdiMask.c_str(), tdoMask.c_str(),
                                    static_cast<int>(bitCount), modeText, exit.c_str(), statusText(result));
    }
    return tracer.setReturnStatus(result);
}

// ---- pins and waiting ----------------------------------------------------------------

unsigned Vivedoru10TargetImpl::flush()
{
    MethodLogger tracer;
    tracer.setMethodName("flush");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::flush, "flush")) result = op(m_plugin);
    Logger::logger.printLog(3, "flush() returning %s\n", statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::setPin(unsigned pin, unsigned value)
{
    MethodLogger tracer;
    tracer.setMethodName("setPin");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::setPin, "setPin")) result = op(m_plugin, pin, value);
    Logger::logger.printLog(3, "setPin(pin=%u, value=%u) returning %s\n", pin, value, statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::getPin(unsigned pin, unsigned* value)
{
    MethodLogger tracer;
    tracer.setMethodName("getPin");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::getPin, "getPin")) result = op(m_plugin, pin, value);
    Logger::logger.printLog(3, "getPin(pin=%u, *value=%u) returning %s\n", pin, value ? *value : 0u,
                            statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::pulsePin(unsigned pin, unsigned count)
{
    MethodLogger tracer;
    tracer.setMethodName("pulsePin");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::pulsePin, "pulsePin")) result = op(m_plugin, pin, count);
    Logger::logger.printLog(3, "pulsePin(pin=%u, count=%u) returning %s\n", pin, count, statusText(result));
    return tracer.setReturnStatus(result);
}

unsigned Vivedoru10TargetImpl::waitTime(unsigned microSeconds)
{
    MethodLogger tracer;
    tracer.setMethodName("waitTime");
    unsigned result = JEX_FAILURE;
    if (!hasPlugin()) return tracer.setReturnStatus(result);
    if (auto op = pluginOp(m_plugin, &JexPluginOps::waitTime, "waitTime")) result = op(m_plugin, microSeconds);
    Logger::logger.printLog(3, "waitTime(us=%u) returning %s\n", microSeconds, statusText(result));
    return tracer.setReturnStatus(result);
}

} // namespace JexRT
