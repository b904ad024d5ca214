// SPDX-License-Identifier: MIT
// The example cable "wire_cable": a loopback on the cable SDK.  Everything a
// cable written outside the library needs is here: a profile table, the
// open arguments, the lock key, the target information, an option, and the
// module's entry points.  The transport is WireTransport.
//
// Open arguments: cable=PROFILE (default "wire"), port=NAME (default
// "wire0"; names the cross-process lock).  Option (sendCommand get/set):
// "cable" (read only), "transfers" (read only: queue flushes so far).

#include <memory>
#include <string>

#include <jexjtag/cable/CableBase.hpp>
#include <jexjtag/cable/TextCopy.hpp>

#include "WireTransport.hpp"

namespace wirecable {

// The profiles: how many flip-flops sit between TDI and TDO.
struct Profile {
    const char* name;
    unsigned delay;
    const char* description;
};

constexpr Profile kProfiles[] = {
    {"wire", 0, "TDI wired to TDO"},
    {"flipflop", 1, "one flip-flop between TDI and TDO"},
    {"byte", 8, "eight flip-flops between TDI and TDO"},
};

class WireCable : public jexcable::CableBase {
public:
    WireCable() : CableBase("wire_cable") {}

protected:
    uint32_t openCable(const jexcable::PluginArgs& args) override
    {
        const std::string name = args.get("cable").value_or("wire");
        m_profile = nullptr;
        for (const Profile& p : kProfiles)
            if (jexcable::PluginArgs::equalsIgnoreCase(name, p.name)) m_profile = &p;
        if (!m_profile) return fail("unknown cable profile \"" + name + "\" (wire, flipflop, byte)");
        m_port = args.get("port").value_or("wire0");
        m_transport = std::make_unique<WireTransport>(m_profile->delay);
        attachTransport(*m_transport);
        return JEX_SUCCESS;
    }

    void closeCable() override { m_transport.reset(); }

    std::string lockKey() const override { return "wire_cable:" + m_port; }

    void describe(JexJtagTargetInfo& info) override
    {
        using jexcable::TextCopy;
        TextCopy::toField(info.target_name, "wire_cable");
        TextCopy::toField(info.plugin_name, "wire_cable");
        TextCopy::toField(info.vendor, "JexJtag example");
        TextCopy::toField(info.port, m_port);
        TextCopy::toField(info.full_name, std::string("loopback cable: ") + m_profile->description);
        TextCopy::toField(info.target_uid, lockKey());
    }

    OptionStatus getOption(const std::string& key, std::string& value) override
    {
        if (key == "cable") value = m_profile->name;
        else if (key == "transfers") value = std::to_string(m_transport->transfers());
        else return OptionStatus::Unknown;
        return OptionStatus::Done;
    }

private:
    const Profile* m_profile = nullptr;
    std::string m_port;
    std::unique_ptr<WireTransport> m_transport;
};

} // namespace wirecable

JEXJTAG_DEFINE_PLUGIN(wirecable::WireCable)
