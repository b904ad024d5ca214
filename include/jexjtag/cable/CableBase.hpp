// SPDX-License-Identifier: MIT
#pragma once
// The base of every cable plug-in: the whole operation table of the plug-in
// ABI on top of a JtagTransport.  A cable derives from it, supplies the
// transport and a few hooks (open and close, lock key, target information,
// its own options), and ends with JEXJTAG_DEFINE_PLUGIN(MyCable).
//
// What the base does for every cable:
//  - openTarget: parses the arguments (PluginArgs), calls openCable(), makes
//    the cross-process lock on lockKey(), resets the TAPs (five TMS-high
//    clocks) and interrogates the chain (ChainScanner), so device-relative
//    shifts work right away; a chain that cannot be interrogated leaves an
//    empty description and a warning.  closeTarget: releases the lock, then
//    closeCable().
//  - The chain description (ChainLayout): filled by interrogation, changed by
//    the host's setters; device-relative shifts pad with it (IR: the other
//    devices' IR lengths of ones; DR: one BYPASS bit per other device).
//  - The twelve shifts: shortest TMS path, exit state, masks (TDI = tdi AND
//    tdiMask; a TDO bit outside tdoMask reads 0), bits beyond bitCount kept,
//    bitCount 0 only moves, a missing TDI/TDO buffer fails.  READ forms reach
//    the transport as read-only shifts, WRITE forms as write-only ones.
//  - navigateTAP(state, n): shortest path, then n clocks holding the state.
//  - Pins: setPin/getPin/pulsePin on TCK, TMS, TDI, TDO and the transport's
//    own pins.  The base keeps TCK/TMS/TDI levels; a rising TCK edge clocks
//    the chain (JtagTransport::clock) with them; other levels go to
//    JtagTransport::drivePin.  After other operations the pins show the
//    levels last driven, TCK high.
//  - flush, waitTime (JtagTransport::flush, sleep).
//  - Lock: lockTarget/unlockTarget on CableLock(lockKey()), cleanLocks.
//  - sendCommand "get" (inbuf: key) and "set" (inbuf: key=value): the
//    cable's getOption/setOption first, then the common options "trst" and
//    "srst" (0/1, when the transport has reset lines).
//  - Errors: every failure sends "<name>: <text>" to the session as an
//    error message and logs it; an exception from the transport
//    (std::runtime_error) becomes such a failure, and the TAP is reset
//    before the next operation; so does an exception from openCable or the
//    option hooks.
//
// The operations stay virtual: a cable may override one (calling the base)
// to add to it.  Everything here runs on the caller's thread; an instance is
// used by one session at a time.

#include <cstdint>
#include <exception>
#include <map>
#include <memory>
#include <string>

#include "jexjtag/plugin.hpp"

#include "CableLock.hpp"
#include "ChainLayout.hpp"
#include "JtagEngine.hpp"
#include "JtagTransport.hpp"
#include "PluginArgs.hpp"

namespace jexcable {

class CableBase : public jexjtag::PluginBase {
public:
    // `name` is the target type; it starts every message ("name: ...").
    explicit CableBase(std::string name);
    ~CableBase() override;

    uint32_t openTarget(uint32_t argc, const char** argv, JexJtagCallContext* context) override;
    uint32_t closeTarget() override;
    uint32_t interrogate() override;
    uint32_t getDeviceCount() override;
    uint32_t setDeviceCount(uint32_t count) override;
    int32_t getIRLength(uint32_t deviceIndex) override;
    uint32_t setIRLength(uint32_t deviceIndex, uint32_t irLength) override;
    uint32_t getDeviceIdcode(uint32_t deviceIndex) override;
    uint32_t setDeviceID(uint32_t deviceIndex, uint32_t idcode) override;
    uint32_t getTargetInfo(JexJtagTargetInfo* info) override;
    uint32_t lockTarget(uint32_t msWait) override;
    uint32_t unlockTarget() override;
    uint32_t cleanLocks() override;
    uint32_t navigateTAP(uint32_t newState, uint32_t clockRepeat) override;

    uint32_t shiftChainIRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                              uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftChainIRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount, uint32_t exitState,
                               JexJtagCallContext* context) override;
    uint32_t shiftChainIRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask, const uint8_t* tdoMask,
                                   uint32_t bitCount, uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftChainDRRead(bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask, uint32_t bitCount,
                              uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftChainDRWrite(const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount, uint32_t exitState,
                               JexJtagCallContext* context) override;
    uint32_t shiftChainDRReadWrite(const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask, const uint8_t* tdoMask,
                                   uint32_t bitCount, uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftDeviceIRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                               uint32_t bitCount, uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftDeviceIRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftDeviceIRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                    const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                    JexJtagCallContext* context) override;
    uint32_t shiftDeviceDRRead(uint32_t deviceIndex, bool tdiLevel, uint8_t* tdo, const uint8_t* tdoMask,
                               uint32_t bitCount, uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftDeviceDRWrite(uint32_t deviceIndex, const uint8_t* tdi, const uint8_t* tdiMask, uint32_t bitCount,
                                uint32_t exitState, JexJtagCallContext* context) override;
    uint32_t shiftDeviceDRReadWrite(uint32_t deviceIndex, const uint8_t* tdi, uint8_t* tdo, const uint8_t* tdiMask,
                                    const uint8_t* tdoMask, uint32_t bitCount, uint32_t exitState,
                                    JexJtagCallContext* context) override;

    uint32_t flush() override;
    uint32_t setPin(uint32_t pin, uint32_t value) override;
    uint32_t getPin(uint32_t pin, uint32_t* value) override;
    uint32_t pulsePin(uint32_t pin, uint32_t count) override;
    uint32_t waitTime(uint32_t microseconds) override;
    uint32_t sendCommand(const char* command, const uint8_t* inBuffer, uint32_t inLength, uint8_t* outBuffer,
                         uint32_t* outLength, JexJtagCallContext* context) override;

    // What the instance holds (for tests and tools that link a cable).
    bool isOpen() const { return m_open; }
    const std::string& name() const { return m_name; }
    const ChainLayout& layout() const { return m_layout; }
    // Null while no transport is attached.
    const JtagEngine* engine() const { return m_engine.get(); }

protected:
    // How a cable's option hook answered.
    enum class OptionStatus {
        Done,    // handled
        Failed,  // handled, and the hook reported the failure with fail()
        Unknown  // not an option of this cable: the base tries its own
    };

    // ---- what a cable supplies ----------------------------------------------

    // Opens the cable from the open arguments (all of them, keys as given;
    // the library appends "type=<target type>").  On success it has called
    // attachTransport() and returns JEX_SUCCESS; on failure it has released
    // what it took and returns fail(...).
    virtual uint32_t openCable(const PluginArgs& args) = 0;
    // Releases what openCable took.  Called by closeTarget after the lock
    // is given up; the transport is detached afterwards.  A cable's
    // destructor must release an open cable itself (closeTarget may never
    // have come).
    virtual void closeCable() = 0;
    // The name of the cable's cross-process lock: the port, the adapter's
    // serial number, a socket address.  Asked after openCable and by
    // renewLock().
    virtual std::string lockKey() const = 0;
    // Fills the target information (the record is zeroed by the library).
    // Only called while open.
    virtual void describe(JexJtagTargetInfo& info) = 0;
    // The cable's own options.  Keys arrive trimmed and in lower case.
    // get: the value as text.  set: the new value as the host gave it.
    virtual OptionStatus getOption(const std::string& key, std::string& value);
    virtual OptionStatus setOption(const std::string& key, const std::string& value);

    // ---- what a cable may call ------------------------------------------------

    // Sends "<name>: <text>" to the session as an error and logs it (level
    // 1); returns JEX_FAILURE.
    uint32_t fail(const std::string& text);
    // The same as a warning (level 2).
    void warn(const std::string& text);
    // Runs the transport on which every following operation works; the
    // engine starts out believing the TAP is in Test-Logic-Reset.  Not
    // owned: it must stay valid until closeCable() returns or another is
    // attached.
    void attachTransport(JtagTransport& transport);
    JtagTransport* transport() { return m_transport; }
    // Resets the TAPs and interrogates the chain again (a chain that cannot
    // be interrogated leaves an empty description and a warning).  False
    // when the cable itself failed (its message has gone to the session).
    bool resetAndInterrogate();
    // Makes a new lock on lockKey() (after a cable changed its key).  False,
    // with nothing changed, while the lock is held.
    bool renewLock();
    bool lockHeld() const { return m_lock && m_lock->isHeld(); }
    // The TDI level the pins show (a waveform recorder starts from it).
    bool tdiLevel() const { return m_tdi; }
    // Runs `work` on the engine, then updates the pins from its last clock;
    // a transport exception fails with its message (the TAP is reset before
    // the next operation).
    template <typename Work>
    uint32_t run(Work&& work)
    {
        if (!m_engine) return fail("the cable has no transport");
        const uint64_t before = m_engine->clocks();
        try {
            work(*m_engine);
        } catch (const std::exception& e) {
            m_engine->forgetState();
            return fail(e.what());
        }
        if (m_engine->clocks() != before) syncPins();
        return JEX_SUCCESS;
    }

private:
    struct Target {
        JtagEngine::Register reg;
        bool device;
        uint32_t index;
    };

    bool requireOpen();
    void syncPins();
    // False with `error` set when the chain cannot be interrogated;
    // `cableFailed` tells a failing cable from a chain that makes no sense.
    bool interrogateChain(std::string& error, bool& cableFailed);
    uint32_t shift(Target target, const ShiftSource& in, const ShiftSink& out, uint32_t bitCount,
                   uint32_t exitState, bool needsTdi, bool needsTdo, const void* tdi, const void* tdo);
    void driveTck(bool level);
    uint32_t driveLevel(uint32_t pin, bool level);
    uint32_t getCommonOption(const std::string& key, std::string& value, bool& known);
    uint32_t setCommonOption(const std::string& key, const std::string& value, bool& known);

    std::string m_name;
    bool m_open = false;
    JtagTransport* m_transport = nullptr;
    std::unique_ptr<JtagEngine> m_engine;
    std::unique_ptr<CableLock> m_lock;
    ChainLayout m_layout;
    bool m_tck = false;
    bool m_tms = true;
    bool m_tdi = true;
    bool m_trst = false;
    bool m_srst = false;
    std::map<uint32_t, bool> m_ownPins; // levels driven on the transport's own pins
};

} // namespace jexcable
