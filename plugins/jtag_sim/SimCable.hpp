#pragma once
// The simulated JTAG cable: a plug-in instance of target type "jtag_sim".
//
// It turns the operations of the plug-in ABI into TMS/TDI sequences
// (JtagEngine) on a simulated chain (SimChain), keeps the chain description a
// real driver keeps (ChainLayout: filled by interrogation, changed by the
// host's setters), locks its port across processes (CableLock) and can record
// a waveform (VcdRecorder).  Open arguments and options: SimOptions.
//
// Behaviour that hosts see:
//  - openTarget resets the TAPs (five TMS-high clocks) and interrogates the
//    chain, so device-relative shifts work right away; a chain that cannot be
//    interrogated leaves an empty description and a warning.
//  - Shifts end in the requested exit state (shortest TMS path).  READ drives
//    tdiLevel on TDI.  Masks (null: all bits): TDI drives tdi AND tdiMask; a
//    TDO bit outside tdoMask reads back as 0.  Buffer bits beyond bitCount
//    keep their values.  A bitCount of 0 only moves to the exit state.
//    A null tdi (WRITE) or tdo (READ) buffer with bits to shift fails.
//  - Device-relative shifts put the other devices in BYPASS: an IR shift
//    pads with ones for the IR lengths held for the other devices, a DR shift
//    with one bit per other device.  An index outside the held chain fails.
//  - navigateTAP(state, n): shortest path, then n clocks that keep the state;
//    n > 0 for a state that TMS cannot hold fails without clocking.
//  - Pins: setPin/getPin/pulsePin act on TCK, TMS, TDI (TDO can only be
//    read); a rising TCK edge clocks the chain with the TMS and TDI levels.
//    After other operations the pins show the levels last driven, TCK high.
//  - waitTime sleeps for real (and advances the waveform); flush hands the
//    waveform to its file (the simulator has no queue: every operation is
//    done when it returns).
//  - sendCommand "get" (inbuf: key) and "set" (inbuf: key=value) read and
//    change the options chain, port, frequency, vcd and new_firmware.
//    Setting the chain swaps the simulated board and interrogates it again
//    (refused while a waveform is recorded); setting the port is refused
//    while the lock is held.  Other commands fail with an error message.
//  - lockTarget/unlockTarget/cleanLocks: CableLock on the port.  Closing (or
//    destroying) the instance releases the lock.

#include <cstdint>
#include <memory>
#include <string>

#include "jexjtag/plugin.hpp"

#include "CableLock.hpp"
#include "ChainLayout.hpp"
#include "JtagEngine.hpp"
#include "SimChain.hpp"
#include "SimOptions.hpp"
#include "VcdRecorder.hpp"

namespace jexsim {

class SimCable : public jexjtag::PluginBase {
public:
    SimCable() = default;
    ~SimCable() override;

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

    // For tests and tools that link the model: what the instance holds.
    bool isOpen() const { return m_open; }
    const SimChain* chain() const { return m_chain.get(); }
    const jexcable::JtagEngine* engine() const { return m_engine.get(); }
    const jexcable::ChainLayout& layout() const { return m_layout; }
    const SimOptions& options() const { return m_options; }

private:
    // Which register and which device (chain-wide when `device` is false).
    struct Target {
        jexcable::JtagEngine::Register reg;
        bool device;
        uint32_t index;
    };

    uint32_t fail(const std::string& text);
    void warn(const std::string& text);
    bool requireOpen();
    uint32_t shift(Target target, const jexcable::ShiftSource& in, jexcable::ShiftSink& out, uint32_t bitCount,
                   uint32_t exitState, bool needsTdi, bool needsTdo, const void* tdi, const void* tdo);
    bool interrogateChain(std::string& error);
    void buildChain();
    void stopRecording();
    // status, or a failure with a message when writing the waveform has
    // failed (recording stops then: the file is incomplete).
    uint32_t checkRecording(uint32_t status, bool flush = false);
    void syncPins(uint64_t cyclesBefore);
    void driveTck(bool level);
    uint32_t setOption(const std::string& key, const std::string& value);

    bool m_open = false;
    SimOptions m_options;
    std::unique_ptr<SimChain> m_chain;
    std::unique_ptr<jexcable::JtagEngine> m_engine;
    std::unique_ptr<VcdRecorder> m_vcd;
    std::unique_ptr<jexcable::CableLock> m_lock;
    jexcable::ChainLayout m_layout;
    bool m_tck = false;
    bool m_tms = true;
    bool m_tdi = true;
};

} // namespace jexsim
