// SPDX-License-Identifier: MIT
#include "jexjtag/cable/CableBase.hpp"

#include <exception>
#include <utility>

#include "jexjtag/cable/ChainScanner.hpp"
#include "jexjtag/cable/TextCopy.hpp"

namespace jexcable {

using jexjtag::PluginHost;

CableBase::CableBase(std::string name) : m_name(std::move(name)) {}

CableBase::~CableBase() = default;

// ---- reporting --------------------------------------------------------------

uint32_t CableBase::fail(const std::string& text)
{
    const std::string message = m_name + ": " + text;
    PluginHost::log(1, "%s\n", message.c_str());
    PluginHost::sendMessage(sessionHandle(), JEX_MSG_ERROR, message.c_str());
    return JEX_FAILURE;
}

void CableBase::warn(const std::string& text)
{
    const std::string message = m_name + ": " + text;
    PluginHost::log(2, "%s\n", message.c_str());
    PluginHost::sendMessage(sessionHandle(), JEX_MSG_WARNING, message.c_str());
}

bool CableBase::requireOpen()
{
    if (m_open) return true;
    fail("the cable is not open");
    return false;
}

// After clocks, the pins show the levels of the last one, TCK high.
void CableBase::syncPins()
{
    m_tck = true;
    m_tms = m_engine->lastTms();
    m_tdi = m_engine->lastTdi();
}

// ---- open and close ------------------------------------------------------------

void CableBase::attachTransport(JtagTransport& transport)
{
    m_transport = &transport;
    m_engine = std::make_unique<JtagEngine>(transport);
}

bool CableBase::interrogateChain(std::string& error, bool& cableFailed)
{
    ChainScanner::Result result;
    bool ok = false;
    const uint32_t status = run([&](JtagEngine& engine) { ok = ChainScanner(engine).scan(result); });
    cableFailed = status != JEX_SUCCESS;
    if (cableFailed) {
        error = "the cable failed";
        return false;
    }
    if (!ok) {
        error = result.error;
        return false;
    }
    m_layout.assign(result.devices);
    if (result.ambiguous) {
        std::string lengths;
        for (const auto& d : result.devices) lengths += (lengths.empty() ? "" : ",") + std::to_string(d.irLength);
        warn("the IR capture pattern leaves the IR lengths ambiguous; assuming " + lengths +
             " (correct them with setIRLength)");
    }
    PluginHost::log(2, "%s: interrogated %u devices\n", m_name.c_str(), m_layout.count());
    return true;
}

bool CableBase::resetAndInterrogate()
{
    m_layout.assign({});
    if (run([](JtagEngine& engine) { engine.resetTap(); }) != JEX_SUCCESS) return false;
    std::string error;
    bool cableFailed = false;
    if (interrogateChain(error, cableFailed)) return true;
    if (cableFailed) return false;
    warn("the chain cannot be interrogated: " + error);
    return true;
}

uint32_t CableBase::openTarget(uint32_t argc, const char** argv, JexJtagCallContext*)
{
    if (m_open) return fail("the cable is already open");
    m_layout.assign({});
    m_transport = nullptr;
    m_engine.reset();
    uint32_t opened = JEX_FAILURE;
    try {
        opened = openCable(PluginArgs(argc, argv));
    } catch (const std::exception& e) {
        opened = fail(e.what());
    }
    if (opened != JEX_SUCCESS) {
        m_engine.reset();
        m_transport = nullptr;
        return JEX_FAILURE;
    }
    if (!m_engine) {
        closeCable();
        return fail("the cable attached no transport");
    }
    m_lock = std::make_unique<CableLock>(lockKey());
    m_open = true;
    // A cable that fails on its first clocks is not open: the host hears
    // why, and nothing stays held.
    if (!resetAndInterrogate()) {
        closeTarget();
        return JEX_FAILURE;
    }
    return JEX_SUCCESS;
}

uint32_t CableBase::closeTarget()
{
    if (!m_open) return fail("the cable is not open");
    m_lock.reset();
    closeCable();
    m_engine.reset();
    m_transport = nullptr;
    m_layout.assign({});
    m_ownPins.clear();
    m_open = false;
    return JEX_SUCCESS;
}

// ---- chain description -----------------------------------------------------------

uint32_t CableBase::interrogate()
{
    if (!requireOpen()) return JEX_FAILURE;
    std::string error;
    bool cableFailed = false;
    if (!interrogateChain(error, cableFailed)) return fail("chain interrogation failed: " + error);
    return JEX_SUCCESS;
}

uint32_t CableBase::getDeviceCount()
{
    return m_layout.count();
}

uint32_t CableBase::setDeviceCount(uint32_t count)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!m_layout.resize(count))
        return fail("a chain of " + std::to_string(count) + " devices is more than " +
                    std::to_string(ChainLayout::kMaxDevices));
    return JEX_SUCCESS;
}

int32_t CableBase::getIRLength(uint32_t deviceIndex)
{
    return static_cast<int32_t>(m_layout.irLength(deviceIndex));
}

uint32_t CableBase::setIRLength(uint32_t deviceIndex, uint32_t irLength)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!m_layout.contains(deviceIndex))
        return fail("device " + std::to_string(deviceIndex) + " is outside the chain of " +
                    std::to_string(m_layout.count()) + " devices");
    if (!m_layout.setIrLength(deviceIndex, irLength))
        return fail("IR length " + std::to_string(irLength) + " is more than " +
                    std::to_string(ChainLayout::kMaxIrLength));
    return JEX_SUCCESS;
}

uint32_t CableBase::getDeviceIdcode(uint32_t deviceIndex)
{
    return m_layout.idcode(deviceIndex);
}

uint32_t CableBase::setDeviceID(uint32_t deviceIndex, uint32_t idcode)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!m_layout.setIdcode(deviceIndex, idcode))
        return fail("device " + std::to_string(deviceIndex) + " is outside the chain of " +
                    std::to_string(m_layout.count()) + " devices");
    return JEX_SUCCESS;
}

uint32_t CableBase::getTargetInfo(JexJtagTargetInfo* info)
{
    if (!info) return fail("getTargetInfo without a record");
    if (!requireOpen()) return JEX_FAILURE;
    describe(*info);
    return JEX_SUCCESS;
}

// ---- lock ------------------------------------------------------------------------------

uint32_t CableBase::lockTarget(uint32_t msWait)
{
    if (!requireOpen()) return JEX_FAILURE;
    try {
        if (m_lock->acquire(msWait)) return JEX_SUCCESS;
        const std::string holder = m_lock->holderDescription();
        return fail("port " + m_lock->port() + " is locked by another process" +
                    (holder.empty() ? std::string() : " (" + holder + ")"));
    } catch (const std::exception& e) {
        return fail("cannot lock port " + m_lock->port() + ": " + e.what());
    }
}

uint32_t CableBase::unlockTarget()
{
    if (!m_open || !m_lock || !m_lock->release()) {
        PluginHost::log(2, "%s: unlockTarget without the lock\n", m_name.c_str());
        return JEX_FAILURE;
    }
    return JEX_SUCCESS;
}

uint32_t CableBase::cleanLocks()
{
    try {
        const unsigned removed = CableLock::cleanStale();
        PluginHost::log(2, "%s: removed %u stale lock files\n", m_name.c_str(), removed);
        return JEX_SUCCESS;
    } catch (const std::exception& e) {
        return fail(std::string("cannot clean the locks: ") + e.what());
    }
}

bool CableBase::renewLock()
{
    if (lockHeld()) return false;
    m_lock = std::make_unique<CableLock>(lockKey());
    return true;
}

// ---- TAP -----------------------------------------------------------------------------------

uint32_t CableBase::navigateTAP(uint32_t newState, uint32_t clockRepeat)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!TapController::isValid(newState)) return fail("navigateTAP to an invalid state " + std::to_string(newState));
    const auto state = static_cast<JexJtagTapState>(newState);
    if (clockRepeat > 0 && !TapController::isStable(state))
        return fail(std::string("cannot hold ") + TapController::name(state) + " for " +
                    std::to_string(clockRepeat) + " clocks: TMS cannot keep the TAP there");
    return run([&](JtagEngine& engine) {
        engine.moveTo(state);
        engine.holdClocks(clockRepeat);
    });
}

uint32_t CableBase::shift(Target target, const ShiftSource& in, const ShiftSink& out, uint32_t bitCount,
                          uint32_t exitState, bool needsTdi, bool needsTdo, const void* tdi, const void* tdo)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!TapController::isValid(exitState)) return fail("invalid exit state " + std::to_string(exitState));
    if (bitCount > 0 && needsTdi && !tdi) return fail("shift without a TDI buffer");
    if (bitCount > 0 && needsTdo && !tdo) return fail("shift without a TDO buffer");
    uint64_t before = 0;
    uint64_t after = 0;
    if (target.device) {
        if (!m_layout.contains(target.index))
            return fail("device " + std::to_string(target.index) + " is outside the chain of " +
                        std::to_string(m_layout.count()) + " devices");
        if (target.reg == JtagEngine::Register::Instruction) {
            before = m_layout.irBitsBefore(target.index);
            after = m_layout.irBitsAfter(target.index);
        } else {
            before = m_layout.bypassBitsBefore(target.index);
            after = m_layout.bypassBitsAfter(target.index);
        }
    }
    const auto exit = static_cast<JexJtagTapState>(exitState);
    return run([&](JtagEngine& engine) {
        if (bitCount == 0) engine.moveTo(exit);
        else engine.shift(target.reg, in, out, bitCount, exit, before, after);
    });
}

namespace {
constexpr auto kIR = JtagEngine::Register::Instruction;
constexpr auto kDR = JtagEngine::Register::Data;
} // namespace

#define JEXCABLE_READ(reg, dev, idx)                                                                          \
    return shift(Target{reg, dev, idx}, ShiftSource::level(tdiLevel), ShiftSink::buffer(tdo, tdoMask), bitCount, \
                 exitState, false, true, nullptr, tdo)
#define JEXCABLE_WRITE(reg, dev, idx)                                                                         \
    return shift(Target{reg, dev, idx}, ShiftSource::buffer(tdi, tdiMask), ShiftSink::discard(), bitCount,     \
                 exitState, true, false, tdi, nullptr)
#define JEXCABLE_READWRITE(reg, dev, idx)                                                                     \
    return shift(Target{reg, dev, idx}, ShiftSource::buffer(tdi, tdiMask), ShiftSink::buffer(tdo, tdoMask),    \
                 bitCount, exitState, true, true, tdi, tdo)

uint32_t CableBase::shiftChainIRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                     uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READ(kIR, false, 0);
}
uint32_t CableBase::shiftChainIRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                      uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_WRITE(kIR, false, 0);
}
uint32_t CableBase::shiftChainIRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                          const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                          JexJtagCallContext*)
{
    JEXCABLE_READWRITE(kIR, false, 0);
}
uint32_t CableBase::shiftChainDRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                     uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READ(kDR, false, 0);
}
uint32_t CableBase::shiftChainDRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                      uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_WRITE(kDR, false, 0);
}
uint32_t CableBase::shiftChainDRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                          const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                          JexJtagCallContext*)
{
    JEXCABLE_READWRITE(kDR, false, 0);
}
uint32_t CableBase::shiftDeviceIRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                                      uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READ(kIR, true, deviceIndex);
}
uint32_t CableBase::shiftDeviceIRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask,
                                       uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_WRITE(kIR, true, deviceIndex);
}
uint32_t CableBase::shiftDeviceIRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo,
                                           const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                           uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READWRITE(kIR, true, deviceIndex);
}
uint32_t CableBase::shiftDeviceDRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                                      uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READ(kDR, true, deviceIndex);
}
uint32_t CableBase::shiftDeviceDRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask,
                                       uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_WRITE(kDR, true, deviceIndex);
}
uint32_t CableBase::shiftDeviceDRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo,
                                           const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                           uint32_t exitState, JexJtagCallContext*)
{
    JEXCABLE_READWRITE(kDR, true, deviceIndex);
}

#undef JEXCABLE_READ
#undef JEXCABLE_WRITE
#undef JEXCABLE_READWRITE

// ---- pins, waiting, flushing -----------------------------------------------------------------

uint32_t CableBase::flush()
{
    if (!requireOpen()) return JEX_FAILURE;
    return run([](JtagEngine& engine) { engine.transport().flush(); });
}

uint32_t CableBase::waitTime(uint32_t microseconds)
{
    if (!requireOpen()) return JEX_FAILURE;
    return run([&](JtagEngine& engine) { engine.transport().sleep(microseconds); });
}

void CableBase::driveTck(bool level)
{
    if (level == m_tck) return;
    m_tck = level;
    if (level) m_engine->clock(m_tms, m_tdi); // the rising edge clocks the chain
    else m_transport->drivePin(JEXJTAG_TCK, false);
}

// One level on one pin (TCK, TMS, TDI or the transport's own), no checks.
uint32_t CableBase::driveLevel(uint32_t pin, bool level)
{
    uint32_t status = JEX_SUCCESS;
    bool known = true;
    const uint32_t ran = run([&](JtagEngine&) {
        switch (pin) {
        case JEXJTAG_TCK: driveTck(level); break;
        case JEXJTAG_TMS:
        case JEXJTAG_TDI:
            (pin == JEXJTAG_TMS ? m_tms : m_tdi) = level;
            m_transport->drivePin(pin, level);
            break;
        default:
            known = m_transport->drivePin(pin, level);
            if (known) m_ownPins[pin] = level;
        }
    });
    if (ran != JEX_SUCCESS) return ran;
    if (!known) status = fail("unknown pin " + std::to_string(pin));
    return status;
}

uint32_t CableBase::setPin(uint32_t pin, uint32_t value)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (value > 1) return fail("pin level " + std::to_string(value) + " is not 0 or 1");
    if (pin == JEXJTAG_TDO) return fail("TDO is an input of the cable and cannot be set");
    return driveLevel(pin, value != 0);
}

uint32_t CableBase::getPin(uint32_t pin, uint32_t* value)
{
    if (!value) return fail("getPin without a place for the value");
    if (!requireOpen()) return JEX_FAILURE;
    switch (pin) {
    case JEXJTAG_TCK: *value = m_tck; return JEX_SUCCESS;
    case JEXJTAG_TMS: *value = m_tms; return JEX_SUCCESS;
    case JEXJTAG_TDI: *value = m_tdi; return JEX_SUCCESS;
    default: break;
    }
    bool level = false;
    bool readable = false;
    const uint32_t ran = run([&](JtagEngine&) { readable = m_transport->readPin(pin, level); });
    if (ran != JEX_SUCCESS) return ran;
    if (readable) {
        *value = level;
        return JEX_SUCCESS;
    }
    const auto own = m_ownPins.find(pin);
    if (own != m_ownPins.end()) {
        *value = own->second;
        return JEX_SUCCESS;
    }
    if (pin == JEXJTAG_TDO) return fail("TDO cannot be read on this cable");
    return fail("unknown pin " + std::to_string(pin));
}

uint32_t CableBase::pulsePin(uint32_t pin, uint32_t count)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (pin == JEXJTAG_TDO) return fail("TDO is an input of the cable and cannot be pulsed");
    bool current = false;
    if (count == 0 && pin > JEXJTAG_TCK && m_ownPins.count(pin) == 0 && !m_transport->readPin(pin, current))
        return fail("unknown pin " + std::to_string(pin));
    switch (pin) {
    case JEXJTAG_TCK: current = m_tck; break;
    case JEXJTAG_TMS: current = m_tms; break;
    case JEXJTAG_TDI: current = m_tdi; break;
    default: {
        const auto own = m_ownPins.find(pin);
        if (own != m_ownPins.end()) current = own->second;
    }
    }
    // Each pulse goes away from the current level and back.
    for (uint64_t i = 0; i < 2 * static_cast<uint64_t>(count); ++i) {
        current = !current;
        const uint32_t status = driveLevel(pin, current);
        if (status != JEX_SUCCESS) return status;
    }
    return JEX_SUCCESS;
}

// ---- commands -------------------------------------------------------------------------------

CableBase::OptionStatus CableBase::getOption(const std::string&, std::string&)
{
    return OptionStatus::Unknown;
}

CableBase::OptionStatus CableBase::setOption(const std::string&, const std::string&)
{
    return OptionStatus::Unknown;
}

uint32_t CableBase::getCommonOption(const std::string& key, std::string& value, bool& known)
{
    known = m_transport && m_transport->hasResetLines() && (key == "trst" || key == "srst");
    if (known) value = (key == "trst" ? m_trst : m_srst) ? "1" : "0";
    return JEX_SUCCESS;
}

uint32_t CableBase::setCommonOption(const std::string& key, const std::string& value, bool& known)
{
    known = m_transport && m_transport->hasResetLines() && (key == "trst" || key == "srst");
    if (!known) return JEX_SUCCESS;
    bool asserted = false;
    if (!PluginArgs::parseFlag(value, asserted)) return fail(key + ": \"" + value + "\" is not 0 or 1");
    const bool trst = key == "trst" ? asserted : m_trst;
    const bool srst = key == "srst" ? asserted : m_srst;
    const uint32_t status = run([&](JtagEngine& engine) { engine.transport().setResetLines(trst, srst); });
    if (status != JEX_SUCCESS) return status;
    m_trst = trst;
    m_srst = srst;
    // A TAP reset through TRST puts the TAPs in Test-Logic-Reset.
    if (trst) m_engine->forgetState();
    return JEX_SUCCESS;
}

uint32_t CableBase::sendCommand(const char* command, const uint8_t* inBuffer, uint32_t inLength, uint8_t* outBuffer,
                                uint32_t* outLength, JexJtagCallContext*)
{
    if (!command) return fail("sendCommand without a command");
    if (!requireOpen()) return JEX_FAILURE;
    const std::string input = TextCopy::fromInput(inBuffer, inLength);
    if (PluginArgs::equalsIgnoreCase(command, "get")) {
        const std::string key = PluginArgs::toLower(PluginArgs::trim(input));
        std::string value;
        OptionStatus answer = OptionStatus::Failed;
        try {
            answer = getOption(key, value);
        } catch (const std::exception& e) {
            fail(e.what());
        }
        switch (answer) {
        case OptionStatus::Failed: return JEX_FAILURE;
        case OptionStatus::Done: break;
        case OptionStatus::Unknown: {
            bool known = false;
            getCommonOption(key, value, known);
            if (!known) return fail("unknown option \"" + input + "\"");
        }
        }
        if (!TextCopy::toReply(outBuffer, outLength, value)) return fail("get \"" + input + "\" without a reply buffer");
        return JEX_SUCCESS;
    }
    if (PluginArgs::equalsIgnoreCase(command, "set")) {
        const std::size_t eq = input.find('=');
        if (eq == std::string::npos) return fail("set needs key=value, not \"" + input + "\"");
        const std::string key = PluginArgs::toLower(PluginArgs::trim(input.substr(0, eq)));
        const std::string value = input.substr(eq + 1);
        bool known = false;
        const uint32_t common = setCommonOption(key, value, known);
        if (known) return common;
        OptionStatus answer = OptionStatus::Failed;
        try {
            answer = setOption(key, value);
        } catch (const std::exception& e) {
            fail(e.what());
        }
        switch (answer) {
        case OptionStatus::Failed: return JEX_FAILURE;
        case OptionStatus::Done: return JEX_SUCCESS;
        case OptionStatus::Unknown: break;
        }
        return fail("unknown option \"" + key + "\"");
    }
    return fail(std::string("unknown command \"") + command + "\" (this cable knows \"get\" and \"set\")");
}

} // namespace jexcable
