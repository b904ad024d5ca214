// SPDX-License-Identifier: MIT
#pragma once
// The simulated JTAG cable: a plug-in instance of target type "jtag_sim".
//
// A cable of the cable SDK (jexcable::CableBase, which does the operations,
// the chain description, padding, pins and the lock) whose transport is a
// simulated chain (SimChain); it can record a waveform (VcdRecorder).  Open
// arguments and options: SimOptions; the lock is named by the port.
//
// What the simulator adds to the SDK's behaviour:
//  - TDO read as a pin shows the chain's output now (outside Shift states
//    the released TDO reads 1); pin levels and waits are drawn in the
//    waveform.  waitTime sleeps for real; flush also hands the waveform to
//    its file (the simulator has no queue: every operation is done when it
//    returns).
//  - sendCommand "get"/"set" on the options chain, port, frequency, vcd and
//    new_firmware.  Setting the chain swaps the simulated board and
//    interrogates it again (refused while a waveform is recorded); setting
//    the port is refused while the lock is held.

#include <cstdint>
#include <memory>
#include <string>

#include "jexjtag/cable/CableBase.hpp"

#include "SimChain.hpp"
#include "SimOptions.hpp"
#include "VcdRecorder.hpp"

namespace jexsim {

class SimCable : public jexcable::CableBase {
public:
    SimCable() : CableBase("jtag_sim") {}
    ~SimCable() override;

    // The waveform's buffered output goes to its file as well.
    uint32_t flush() override;

    // For tests and tools that link the model: what the instance holds.
    const SimChain* chain() const { return m_chain.get(); }
    const SimOptions& options() const { return m_options; }

protected:
    uint32_t openCable(const jexcable::PluginArgs& args) override;
    void closeCable() override;
    std::string lockKey() const override { return m_options.port; }
    void describe(JexJtagTargetInfo& info) override;
    OptionStatus getOption(const std::string& key, std::string& value) override;
    OptionStatus setOption(const std::string& key, const std::string& value) override;

private:
    void buildChain();
    void stopRecording();
    bool startRecording(const std::string& path);

    SimOptions m_options;
    std::unique_ptr<SimChain> m_chain;
    std::unique_ptr<VcdRecorder> m_vcd;
};

} // namespace jexsim
