// SPDX-License-Identifier: MIT
#pragma once
// The library's message manager inside the host layer's dispatcher.  It
// stands in place of the dispatcher's previous default manager and turns
// every host-layer message into a library message for all live sessions.

#include "hostlayer/Port_MsgManDefault.hpp"

namespace JexRT {

class PortabilityMessageInterceptor : public Port_MsgManDefault {
public:
    // Installs itself.
    PortabilityMessageInterceptor();
    // Uninstalls itself, giving the dispatcher its previous default back.
    ~PortabilityMessageInterceptor() override;

    void outputMsg(MsgType type, const wchar_t* text) override;

    // Takes the default manager's place in the dispatcher.
    virtual bool install();
    // Gives the place back.
    virtual bool uninstall();

    // The library message type of a host-layer message type.
    static unsigned mapType(int hostLayerType);

private:
    Port_MsgMan* m_previous = nullptr;
    bool m_replaceDefault = true;
};

} // namespace JexRT
