// SPDX-License-Identifier: MIT
#include "RbbCable.hpp"

#include <stdexcept>

#include "jexjtag/cable/TextCopy.hpp"

#ifndef JEXJTAG_RBB_VERSION
#define JEXJTAG_RBB_VERSION "0.0.0"
#endif

namespace jexrbb {

using jexcable::PluginArgs;
using jexcable::TextCopy;

namespace {

constexpr unsigned kMaxTimeoutMs = 3600000;

bool parseTimeout(const std::string& text, unsigned& ms)
{
    if (text.empty() || text.size() > 7 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    const unsigned long value = std::stoul(text);
    if (value == 0 || value > kMaxTimeoutMs) return false;
    ms = static_cast<unsigned>(value);
    return true;
}

bool validPort(const std::string& text)
{
    if (text.empty() || text.size() > 5 || text.find_first_not_of("0123456789") != std::string::npos) return false;
    const unsigned long value = std::stoul(text);
    return value >= 1 && value <= 65535;
}

} // namespace

RbbCable::RbbCable() : CableBase("remote_bitbang") {}

RbbCable::~RbbCable() { m_transport.detach(); }

std::string RbbCable::address() const
{
    if (!m_socketPath.empty()) return m_socketPath;
    return (m_host.find(':') != std::string::npos ? "[" + m_host + "]" : m_host) + ":" + m_port;
}

uint32_t RbbCable::openCable(const PluginArgs& args)
{
    m_host = args.get("host").value_or("127.0.0.1");
    m_port = PluginArgs::trim(args.get("port").value_or(""));
    m_socketPath = args.get("socket").value_or("");
    unsigned timeoutMs = 5000;
    bool remoteSleep = false;
    if (const auto t = args.get("timeout"); t && !parseTimeout(PluginArgs::trim(*t), timeoutMs))
        return fail("timeout=" + *t + " is not a number of milliseconds from 1 to " + std::to_string(kMaxTimeoutMs));
    if (const auto s = args.get("remote_sleep"); s && !PluginArgs::parseFlag(PluginArgs::trim(*s), remoteSleep))
        return fail("remote_sleep=" + *s + " is not 0 or 1");
    if (m_socketPath.empty() && m_port.empty())
        return fail("open needs port=N (with host=NAME, default 127.0.0.1) or socket=PATH");
    if (!m_socketPath.empty() && args.has("port"))
        return fail("open takes port= or socket=, not both");
    if (m_socketPath.empty() && !validPort(m_port)) return fail("port=" + m_port + " is not a port from 1 to 65535");

    m_transport.setTimeoutMs(timeoutMs);
    m_transport.setRemoteSleep(remoteSleep);
    try {
        m_transport.attach(m_socketPath.empty() ? RbbSocket::connectTcp(m_host, m_port, timeoutMs)
                                                : RbbSocket::connectUnix(m_socketPath, timeoutMs));
    } catch (const std::runtime_error& e) {
        return fail(e.what());
    }
    attachTransport(m_transport);
    return JEX_SUCCESS;
}

void RbbCable::closeCable() { m_transport.detach(); }

std::string RbbCable::lockKey() const { return "remote_bitbang-" + address(); }

void RbbCable::describe(JexJtagTargetInfo& info)
{
    TextCopy::toField(info.target_name, "remote_bitbang");
    TextCopy::toField(info.plugin_name, "remote_bitbang");
    TextCopy::toField(info.driver_ver, std::string("remote_bitbang client ") + JEXJTAG_RBB_VERSION);
    TextCopy::toField(info.plugin_ver, JEXJTAG_RBB_VERSION);
    TextCopy::toField(info.vendor, "JexJtag");
    TextCopy::toField(info.port, address());
    TextCopy::toField(info.full_name, "remote_bitbang server at " + address());
    TextCopy::toField(info.target_uid, "remote_bitbang:" + address());
    TextCopy::toField(info.rawinfo, (m_socketPath.empty() ? "host=" + m_host + ";port=" + m_port
                                                          : "socket=" + m_socketPath) +
                                        ";timeout=" + std::to_string(m_transport.timeoutMs()) +
                                        ";remote_sleep=" + (m_transport.remoteSleep() ? "1" : "0"));
}

RbbCable::OptionStatus RbbCable::getOption(const std::string& key, std::string& value)
{
    if (key == "host") value = m_socketPath.empty() ? m_host : "";
    else if (key == "port") value = m_port;
    else if (key == "socket") value = m_socketPath;
    else if (key == "timeout") value = std::to_string(m_transport.timeoutMs());
    else if (key == "remote_sleep") value = m_transport.remoteSleep() ? "1" : "0";
    else return OptionStatus::Unknown;
    return OptionStatus::Done;
}

RbbCable::OptionStatus RbbCable::setOption(const std::string& key, const std::string& value)
{
    if (key == "timeout") {
        unsigned ms = 0;
        if (!parseTimeout(PluginArgs::trim(value), ms)) {
            fail("timeout " + value + " is not a number of milliseconds from 1 to " + std::to_string(kMaxTimeoutMs));
            return OptionStatus::Failed;
        }
        m_transport.setTimeoutMs(ms);
        return OptionStatus::Done;
    }
    if (key == "remote_sleep") {
        bool on = false;
        if (!PluginArgs::parseFlag(PluginArgs::trim(value), on)) {
            fail("remote_sleep " + value + " is not 0 or 1");
            return OptionStatus::Failed;
        }
        m_transport.setRemoteSleep(on);
        return OptionStatus::Done;
    }
    if (key == "host" || key == "port" || key == "socket") {
        fail("the server address (" + key + ") is set when the target is opened");
        return OptionStatus::Failed;
    }
    return OptionStatus::Unknown;
}

} // namespace jexrbb
