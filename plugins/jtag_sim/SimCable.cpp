#include "SimCable.hpp"

#include <stdexcept>
#include <utility>

#include "ChainScanner.hpp"
#include "ChainSpec.hpp"
#include "PluginArgs.hpp"
#include "PluginPlatform.hpp"
#include "TextCopy.hpp"

#ifndef JEXJTAG_SIM_VERSION
#define JEXJTAG_SIM_VERSION "0.0.0"
#endif

namespace jexsim {

using jexcable::ChainLayout;
using jexcable::ChainScanner;
using jexcable::JtagEngine;
using jexcable::PluginArgs;
using jexcable::ShiftSink;
using jexcable::ShiftSource;
using jexcable::TapController;
using jexcable::TextCopy;
using jexjtag::PluginHost;

namespace {

constexpr const char* kPrefix = "jtag_sim: ";
constexpr const char* kFirmware = "1.0.0";
constexpr const char* kNewFirmware = "1.1.0";

} // namespace

SimCable::~SimCable()
{
    stopRecording();
}

// ---- reporting --------------------------------------------------------------

uint32_t SimCable::fail(const std::string& text)
{
    const std::string message = kPrefix + text;
    PluginHost::log(1, "%s\n", message.c_str());
    PluginHost::sendMessage(sessionHandle(), JEX_MSG_ERROR, message.c_str());
    return JEX_FAILURE;
}

void SimCable::warn(const std::string& text)
{
    const std::string message = kPrefix + text;
    PluginHost::log(2, "%s\n", message.c_str());
    PluginHost::sendMessage(sessionHandle(), JEX_MSG_WARNING, message.c_str());
}

bool SimCable::requireOpen()
{
    if (m_open) return true;
    fail("the cable is not open");
    return false;
}

// ---- open and close ------------------------------------------------------------

void SimCable::buildChain()
{
    stopRecording();
    m_chain = std::make_unique<SimChain>(m_options.chain, &m_options.board);
    m_engine = std::make_unique<JtagEngine>(*m_chain);
}

void SimCable::stopRecording()
{
    if (m_chain) m_chain->setObserver(nullptr);
    m_vcd.reset();
}

bool SimCable::interrogateChain(std::string& error)
{
    ChainScanner::Result result;
    const uint64_t before = m_chain->cycles();
    const bool ok = ChainScanner(*m_engine).scan(result);
    syncPins(before);
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
    PluginHost::log(2, "%sinterrogated %u devices\n", kPrefix, m_layout.count());
    return true;
}

uint32_t SimCable::openTarget(uint32_t argc, const char** argv, JexJtagCallContext*)
{
    if (m_open) return fail("the cable is already open");
    SimOptions options;
    std::string error;
    std::vector<std::string> ignored;
    if (!options.apply(PluginArgs(argc, argv), error, &ignored)) return fail(error);
    for (const std::string& key : ignored)
        if (!PluginArgs::equalsIgnoreCase(key, "type")) PluginHost::log(3, "%signoring argument %s\n", kPrefix, key.c_str());

    m_options = std::move(options);
    buildChain();
    if (!m_options.vcdPath.empty()) {
        try {
            m_vcd = std::make_unique<VcdRecorder>(m_options.vcdPath, *m_chain, m_options.frequencyHz, m_tdi);
        } catch (const std::exception& e) {
            m_engine.reset();
            m_chain.reset();
            return fail(e.what());
        }
        m_chain->setObserver(m_vcd.get());
    }
    m_lock = std::make_unique<jexcable::CableLock>(m_options.port);
    m_layout.assign({});
    const uint64_t before = m_chain->cycles();
    m_engine->resetTap();
    syncPins(before);
    if (!interrogateChain(error)) warn("the chain cannot be interrogated: " + error);
    m_open = true;
    return JEX_SUCCESS;
}

uint32_t SimCable::closeTarget()
{
    if (!m_open) return fail("the cable is not open");
    m_lock.reset();
    stopRecording();
    m_engine.reset();
    m_chain.reset();
    m_layout.assign({});
    m_open = false;
    return JEX_SUCCESS;
}

// ---- chain description -----------------------------------------------------------

uint32_t SimCable::interrogate()
{
    if (!requireOpen()) return JEX_FAILURE;
    std::string error;
    if (!interrogateChain(error)) return fail("chain interrogation failed: " + error);
    return JEX_SUCCESS;
}

uint32_t SimCable::getDeviceCount()
{
    return m_layout.count();
}

uint32_t SimCable::setDeviceCount(uint32_t count)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!m_layout.resize(count))
        return fail("a chain of " + std::to_string(count) + " devices is more than " +
                    std::to_string(ChainLayout::kMaxDevices));
    return JEX_SUCCESS;
}

int32_t SimCable::getIRLength(uint32_t deviceIndex)
{
    return static_cast<int32_t>(m_layout.irLength(deviceIndex));
}

uint32_t SimCable::setIRLength(uint32_t deviceIndex, uint32_t irLength)
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

uint32_t SimCable::getDeviceIdcode(uint32_t deviceIndex)
{
    return m_layout.idcode(deviceIndex);
}

uint32_t SimCable::setDeviceID(uint32_t deviceIndex, uint32_t idcode)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!m_layout.setIdcode(deviceIndex, idcode))
        return fail("device " + std::to_string(deviceIndex) + " is outside the chain of " +
                    std::to_string(m_layout.count()) + " devices");
    return JEX_SUCCESS;
}

// ---- information ---------------------------------------------------------------------

uint32_t SimCable::getTargetInfo(JexJtagTargetInfo* info)
{
    if (!info) return fail("getTargetInfo without a record");
    if (!requireOpen()) return JEX_FAILURE;
    const std::string chainText = ChainSpec::format(m_options.chain);
    TextCopy::toField(info->target_name, "jtag_sim");
    TextCopy::toField(info->plugin_name, "jtag_sim");
    TextCopy::toField(info->fw_ver, kFirmware);
    TextCopy::toField(info->driver_ver, std::string("jtag_sim model ") + JEXJTAG_SIM_VERSION);
    TextCopy::toField(info->plugin_ver, JEXJTAG_SIM_VERSION);
    TextCopy::toField(info->vendor, "JexJtag");
    TextCopy::toField(info->frequency, std::to_string(m_options.frequencyHz));
    TextCopy::toField(info->port, m_options.port);
    TextCopy::toField(info->full_name, "JexJtag simulated JTAG cable on " + m_options.port + " (" +
                                           std::to_string(m_chain->size()) + " devices)");
    TextCopy::toField(info->target_uid, "jtag_sim:" + m_options.port);
    std::string raw = "port=" + m_options.port + ";frequency=" + std::to_string(m_options.frequencyHz) +
                      ";chain=" + chainText + ";vcd=" + m_options.vcdPath;
    if (m_options.newFirmware) raw += std::string(";new_firmware=") + kNewFirmware;
    TextCopy::toField(info->rawinfo, raw);
    info->target_flags = m_options.newFirmware ? JEXJTAG_FLAG_NEW_FIRMWARE : 0u;
    return JEX_SUCCESS;
}

// ---- lock ------------------------------------------------------------------------------

uint32_t SimCable::lockTarget(uint32_t msWait)
{
    if (!requireOpen()) return JEX_FAILURE;
    try {
        if (m_lock->acquire(msWait)) return JEX_SUCCESS;
        const std::string holder = m_lock->holderDescription();
        return fail("port " + m_options.port + " is locked by another process" +
                    (holder.empty() ? std::string() : " (" + holder + ")"));
    } catch (const std::exception& e) {
        return fail(std::string("cannot lock port ") + m_options.port + ": " + e.what());
    }
}

uint32_t SimCable::unlockTarget()
{
    if (!m_open || !m_lock || !m_lock->release()) {
        PluginHost::log(2, "%sunlockTarget without the lock\n", kPrefix);
        return JEX_FAILURE;
    }
    return JEX_SUCCESS;
}

uint32_t SimCable::cleanLocks()
{
    try {
        const unsigned removed = jexcable::CableLock::cleanStale();
        PluginHost::log(2, "%sremoved %u stale lock files\n", kPrefix, removed);
        return JEX_SUCCESS;
    } catch (const std::exception& e) {
        return fail(std::string("cannot clean the locks: ") + e.what());
    }
}

// ---- TAP -----------------------------------------------------------------------------------

void SimCable::syncPins(uint64_t cyclesBefore)
{
    if (!m_chain || m_chain->cycles() == cyclesBefore) return;
    m_tck = true;
    m_tms = m_chain->lastTms();
    m_tdi = m_chain->lastTdi();
}

uint32_t SimCable::navigateTAP(uint32_t newState, uint32_t clockRepeat)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (!TapController::isValid(newState)) return fail("navigateTAP to an invalid state " + std::to_string(newState));
    const auto state = static_cast<JexJtagTapState>(newState);
    if (clockRepeat > 0 && !TapController::isStable(state))
        return fail(std::string("cannot hold ") + TapController::name(state) + " for " +
                    std::to_string(clockRepeat) + " clocks: TMS cannot keep the TAP there");
    const uint64_t before = m_chain->cycles();
    m_engine->moveTo(state);
    m_engine->holdClocks(clockRepeat);
    syncPins(before);
    return JEX_SUCCESS;
}

uint32_t SimCable::shift(Target target, const ShiftSource& in, ShiftSink& out, uint32_t bitCount, uint32_t exitState,
                         bool needsTdi, bool needsTdo, const void* tdi, const void* tdo)
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
    const uint64_t cycles = m_chain->cycles();
    if (bitCount == 0) m_engine->moveTo(static_cast<JexJtagTapState>(exitState));
    else m_engine->shift(target.reg, in, out, bitCount, static_cast<JexJtagTapState>(exitState), before, after);
    syncPins(cycles);
    return JEX_SUCCESS;
}

#define JEXSIM_READ(reg, dev, idx)                                                                    \
    ShiftSink sink = ShiftSink::buffer(tdo, tdoMask);                                                 \
    return shift(Target{reg, dev, idx}, ShiftSource::level(tdiLevel), sink, bitCount, exitState, false, true, \
                 nullptr, tdo)
#define JEXSIM_WRITE(reg, dev, idx)                                                                   \
    ShiftSink sink = ShiftSink::discard();                                                            \
    return shift(Target{reg, dev, idx}, ShiftSource::buffer(tdi, tdiMask), sink, bitCount, exitState, true, false, \
                 tdi, nullptr)
#define JEXSIM_READWRITE(reg, dev, idx)                                                               \
    ShiftSink sink = ShiftSink::buffer(tdo, tdoMask);                                                 \
    return shift(Target{reg, dev, idx}, ShiftSource::buffer(tdi, tdiMask), sink, bitCount, exitState, true, true, \
                 tdi, tdo)

constexpr auto kIR = JtagEngine::Register::Instruction;
constexpr auto kDR = JtagEngine::Register::Data;

uint32_t SimCable::shiftChainIRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                    uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READ(kIR, false, 0);
}
uint32_t SimCable::shiftChainIRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                     uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_WRITE(kIR, false, 0);
}
uint32_t SimCable::shiftChainIRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                         const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                         JexJtagCallContext*)
{
    JEXSIM_READWRITE(kIR, false, 0);
}
uint32_t SimCable::shiftChainDRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                                    uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READ(kDR, false, 0);
}
uint32_t SimCable::shiftChainDRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                     uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_WRITE(kDR, false, 0);
}
uint32_t SimCable::shiftChainDRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                         const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                         JexJtagCallContext*)
{
    JEXSIM_READWRITE(kDR, false, 0);
}
uint32_t SimCable::shiftDeviceIRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                                     uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READ(kIR, true, deviceIndex);
}
uint32_t SimCable::shiftDeviceIRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask,
                                      uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_WRITE(kIR, true, deviceIndex);
}
uint32_t SimCable::shiftDeviceIRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo,
                                          const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                          uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READWRITE(kIR, true, deviceIndex);
}
uint32_t SimCable::shiftDeviceDRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                                     uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READ(kDR, true, deviceIndex);
}
uint32_t SimCable::shiftDeviceDRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask,
                                      uint32_t bitCount, uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_WRITE(kDR, true, deviceIndex);
}
uint32_t SimCable::shiftDeviceDRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo,
                                          const uint8_t* tdiMask, const uint8_t* tdoMask, uint32_t bitCount,
                                          uint32_t exitState, JexJtagCallContext*)
{
    JEXSIM_READWRITE(kDR, true, deviceIndex);
}

#undef JEXSIM_READ
#undef JEXSIM_WRITE
#undef JEXSIM_READWRITE

// ---- pins, waiting, flushing -----------------------------------------------------------------

uint32_t SimCable::flush()
{
    if (!requireOpen()) return JEX_FAILURE;
    if (m_vcd) m_vcd->flush();
    return JEX_SUCCESS;
}

void SimCable::driveTck(bool level)
{
    if (level == m_tck) return;
    m_tck = level;
    if (level) m_engine->clock(m_tms, m_tdi); // the rising edge; the recorder draws the cycle
    else if (m_vcd) m_vcd->pinLevel(JEXJTAG_TCK, false, *m_chain);
}

uint32_t SimCable::setPin(uint32_t pin, uint32_t value)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (value > 1) return fail("pin level " + std::to_string(value) + " is not 0 or 1");
    const bool level = value != 0;
    switch (pin) {
    case JEXJTAG_TCK:
        driveTck(level);
        return JEX_SUCCESS;
    case JEXJTAG_TMS:
    case JEXJTAG_TDI:
        (pin == JEXJTAG_TMS ? m_tms : m_tdi) = level;
        if (m_vcd) m_vcd->pinLevel(pin, level, *m_chain);
        return JEX_SUCCESS;
    case JEXJTAG_TDO:
        return fail("TDO is an input of the cable and cannot be set");
    default:
        return fail("unknown pin " + std::to_string(pin));
    }
}

uint32_t SimCable::getPin(uint32_t pin, uint32_t* value)
{
    if (!value) return fail("getPin without a place for the value");
    if (!requireOpen()) return JEX_FAILURE;
    switch (pin) {
    case JEXJTAG_TCK: *value = m_tck; return JEX_SUCCESS;
    case JEXJTAG_TMS: *value = m_tms; return JEX_SUCCESS;
    case JEXJTAG_TDI: *value = m_tdi; return JEX_SUCCESS;
    case JEXJTAG_TDO: *value = m_chain->tdo(m_tdi); return JEX_SUCCESS;
    default: return fail("unknown pin " + std::to_string(pin));
    }
}

uint32_t SimCable::pulsePin(uint32_t pin, uint32_t count)
{
    if (!requireOpen()) return JEX_FAILURE;
    switch (pin) {
    case JEXJTAG_TCK:
        // Each pulse goes away from the current level and back: one rising edge.
        for (uint32_t i = 0; i < count; ++i) {
            driveTck(!m_tck);
            driveTck(!m_tck);
        }
        return JEX_SUCCESS;
    case JEXJTAG_TMS:
    case JEXJTAG_TDI:
        for (uint32_t i = 0; i < 2 * static_cast<uint64_t>(count); ++i) {
            bool& level = pin == JEXJTAG_TMS ? m_tms : m_tdi;
            level = !level;
            if (m_vcd) m_vcd->pinLevel(pin, level, *m_chain);
        }
        return JEX_SUCCESS;
    case JEXJTAG_TDO:
        return fail("TDO is an input of the cable and cannot be pulsed");
    default:
        return fail("unknown pin " + std::to_string(pin));
    }
}

uint32_t SimCable::waitTime(uint32_t microseconds)
{
    if (!requireOpen()) return JEX_FAILURE;
    if (m_vcd) {
        m_vcd->wait(microseconds);
        m_vcd->flush();
    }
    jexcable::PluginPlatform::sleepMicroseconds(microseconds);
    return JEX_SUCCESS;
}

// ---- commands -------------------------------------------------------------------------------

uint32_t SimCable::setOption(const std::string& rawKey, const std::string& value)
{
    const std::string key = PluginArgs::toLower(PluginArgs::trim(rawKey));
    SimOptions updated = m_options;
    std::string error;
    if (!updated.set(key, value, error)) return fail(error);

    if (key == "chain") {
        if (m_vcd) return fail("the chain cannot change while a waveform is recorded (set vcd= first)");
        m_options.chain = updated.chain;
        buildChain();
        m_layout.assign({});
        m_engine->resetTap();
        syncPins(0);
        if (!interrogateChain(error)) warn("the chain cannot be interrogated: " + error);
        return JEX_SUCCESS;
    }
    if (key == "port") {
        if (m_lock && m_lock->isHeld()) return fail("the port cannot change while the cable is locked");
        m_options.port = updated.port;
        m_lock = std::make_unique<jexcable::CableLock>(m_options.port);
        return JEX_SUCCESS;
    }
    if (key == "vcd") {
        // The running recording is finished first (its file stays complete),
        // also when the new path is the same file.
        stopRecording();
        m_options.vcdPath.clear();
        if (updated.vcdPath.empty()) return JEX_SUCCESS;
        try {
            m_vcd = std::make_unique<VcdRecorder>(updated.vcdPath, *m_chain, m_options.frequencyHz, m_tdi);
        } catch (const std::exception& e) {
            return fail(e.what());
        }
        m_chain->setObserver(m_vcd.get());
        m_options.vcdPath = updated.vcdPath;
        return JEX_SUCCESS;
    }
    if (key == "frequency" && m_vcd) m_vcd->setFrequency(updated.frequencyHz);
    m_options = std::move(updated);
    return JEX_SUCCESS;
}

uint32_t SimCable::sendCommand(const char* command, const uint8_t* inBuffer, uint32_t inLength, uint8_t* outBuffer,
                               uint32_t* outLength, JexJtagCallContext*)
{
    if (!command) return fail("sendCommand without a command");
    if (!requireOpen()) return JEX_FAILURE;
    const std::string input = TextCopy::fromInput(inBuffer, inLength);
    if (PluginArgs::equalsIgnoreCase(command, "get")) {
        std::string value;
        if (!m_options.get(input, value)) return fail("unknown option \"" + input + "\"");
        if (!TextCopy::toReply(outBuffer, outLength, value)) return fail("get \"" + input + "\" without a reply buffer");
        return JEX_SUCCESS;
    }
    if (PluginArgs::equalsIgnoreCase(command, "set")) {
        const std::size_t eq = input.find('=');
        if (eq == std::string::npos) return fail("set needs key=value, not \"" + input + "\"");
        return setOption(input.substr(0, eq), input.substr(eq + 1));
    }
    return fail(std::string("unknown command \"") + command + "\" (this cable knows \"get\" and \"set\")");
}

} // namespace jexsim
