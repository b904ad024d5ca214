// SPDX-License-Identifier: MIT
#include "SimCable.hpp"

#include <stdexcept>
#include <utility>

#include "ChainSpec.hpp"
#include "jexjtag/cable/TextCopy.hpp"

#ifndef JEXJTAG_SIM_VERSION
#define JEXJTAG_SIM_VERSION "0.0.0"
#endif

namespace jexsim {

using jexcable::PluginArgs;
using jexcable::TextCopy;
using jexjtag::PluginHost;

namespace {

constexpr const char* kFirmware = "1.0.0";
constexpr const char* kNewFirmware = "1.1.0";

} // namespace

SimCable::~SimCable()
{
    stopRecording();
}

void SimCable::buildChain()
{
    stopRecording();
    m_chain = std::make_unique<SimChain>(m_options.chain, &m_options.board);
    attachTransport(*m_chain);
}

void SimCable::stopRecording()
{
    if (m_chain) m_chain->setObserver(nullptr);
    m_vcd.reset();
}

bool SimCable::startRecording(const std::string& path)
{
    try {
        m_vcd = std::make_unique<VcdRecorder>(path, *m_chain, m_options.frequencyHz, tdiLevel());
    } catch (const std::exception& e) {
        fail(e.what());
        return false;
    }
    m_chain->setObserver(m_vcd.get());
    return true;
}

uint32_t SimCable::openCable(const PluginArgs& args)
{
    SimOptions options;
    std::string error;
    std::vector<std::string> ignored;
    if (!options.apply(args, error, &ignored)) return fail(error);
    for (const std::string& key : ignored)
        if (!PluginArgs::equalsIgnoreCase(key, "type")) PluginHost::log(3, "jtag_sim: ignoring argument %s\n", key.c_str());

    m_options = std::move(options);
    buildChain();
    if (!m_options.vcdPath.empty() && !startRecording(m_options.vcdPath)) {
        m_chain.reset();
        return JEX_FAILURE;
    }
    return JEX_SUCCESS;
}

void SimCable::closeCable()
{
    stopRecording();
    m_chain.reset();
}

void SimCable::describe(JexJtagTargetInfo& info)
{
    const std::string chainText = ChainSpec::format(m_options.chain);
    TextCopy::toField(info.target_name, "jtag_sim");
    TextCopy::toField(info.plugin_name, "jtag_sim");
    TextCopy::toField(info.fw_ver, kFirmware);
    TextCopy::toField(info.driver_ver, std::string("jtag_sim model ") + JEXJTAG_SIM_VERSION);
    TextCopy::toField(info.plugin_ver, JEXJTAG_SIM_VERSION);
    TextCopy::toField(info.vendor, "JexJtag");
    TextCopy::toField(info.frequency, std::to_string(m_options.frequencyHz));
    TextCopy::toField(info.port, m_options.port);
    TextCopy::toField(info.full_name, "JexJtag simulated JTAG cable on " + m_options.port + " (" +
                                          std::to_string(m_chain->size()) + " devices)");
    TextCopy::toField(info.target_uid, "jtag_sim:" + m_options.port);
    std::string raw = "port=" + m_options.port + ";frequency=" + std::to_string(m_options.frequencyHz) +
                      ";chain=" + chainText + ";vcd=" + m_options.vcdPath;
    if (m_options.newFirmware) raw += std::string(";new_firmware=") + kNewFirmware;
    TextCopy::toField(info.rawinfo, raw);
    info.target_flags = m_options.newFirmware ? JEXJTAG_FLAG_NEW_FIRMWARE : 0u;
}

uint32_t SimCable::flush()
{
    const uint32_t status = CableBase::flush();
    if (status == JEX_SUCCESS && m_vcd) m_vcd->flush();
    return status;
}

SimCable::OptionStatus SimCable::getOption(const std::string& key, std::string& value)
{
    return m_options.get(key, value) ? OptionStatus::Done : OptionStatus::Unknown;
}

SimCable::OptionStatus SimCable::setOption(const std::string& key, const std::string& value)
{
    SimOptions updated = m_options;
    std::string error;
    if (!updated.set(key, value, error)) {
        fail(error);
        return OptionStatus::Failed;
    }
    if (key == "chain") {
        if (m_vcd) {
            fail("the chain cannot change while a waveform is recorded (set vcd= first)");
            return OptionStatus::Failed;
        }
        m_options.chain = updated.chain;
        buildChain();
        resetAndInterrogate();
        return OptionStatus::Done;
    }
    if (key == "port") {
        const std::string previous = m_options.port;
        m_options.port = updated.port;
        if (!renewLock()) {
            m_options.port = previous;
            fail("the port cannot change while the cable is locked");
            return OptionStatus::Failed;
        }
        return OptionStatus::Done;
    }
    if (key == "vcd") {
        // The running recording is finished first (its file stays complete),
        // also when the new path is the same file.
        stopRecording();
        m_options.vcdPath.clear();
        if (updated.vcdPath.empty()) return OptionStatus::Done;
        if (!startRecording(updated.vcdPath)) return OptionStatus::Failed;
        m_options.vcdPath = updated.vcdPath;
        return OptionStatus::Done;
    }
    if (key == "frequency" && m_vcd) m_vcd->setFrequency(updated.frequencyHz);
    m_options = std::move(updated);
    return OptionStatus::Done;
}

} // namespace jexsim
