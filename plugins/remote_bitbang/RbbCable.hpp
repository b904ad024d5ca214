// SPDX-License-Identifier: MIT
#pragma once
// The remote_bitbang network cable: a plug-in instance of target type
// "remote_bitbang", the client side of OpenOCD's remote_bitbang protocol.
// The server (a simulator, a GPIO daemon, `jexjtag serve`) drives the chain;
// this cable sends it levels and reads TDO through RbbTransport, and leaves
// TAP logic, chain interrogation, padding and the lock to CableBase.
//
// Open arguments: host=NAME (default 127.0.0.1) and port=N for TCP, or
// socket=PATH for a Unix-domain socket; timeout=MS (default 5000) for the
// connection and for every reply; remote_sleep=1 to send waits to the
// server as 'Z'/'z' requests (newer servers only) instead of sleeping here.
// Options ("get"/"set"): host, port, socket (read only), timeout and
// remote_sleep; "trst"/"srst" from CableBase drive the reset lines.
// The cross-process lock is keyed by the server address.

#include <string>

#include "jexjtag/cable/CableBase.hpp"

#include "RbbTransport.hpp"

namespace jexrbb {

class RbbCable : public jexcable::CableBase {
public:
    RbbCable();
    ~RbbCable() override;

protected:
    uint32_t openCable(const jexcable::PluginArgs& args) override;
    void closeCable() override;
    std::string lockKey() const override;
    void describe(JexJtagTargetInfo& info) override;
    OptionStatus getOption(const std::string& key, std::string& value) override;
    OptionStatus setOption(const std::string& key, const std::string& value) override;

private:
    std::string address() const;

    std::string m_host = "127.0.0.1";
    std::string m_port;
    std::string m_socketPath;
    RbbTransport m_transport;
};

} // namespace jexrbb
