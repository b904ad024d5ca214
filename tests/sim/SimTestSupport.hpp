// SPDX-License-Identifier: MIT
#pragma once
// Helpers for the simulated cable's tests: device specs and the callbacks
// that keep the messages a plug-in sends to its session.

#include <cstdint>
#include <string>
#include <vector>

#include "jexjtag/plugin.hpp"

#include "DeviceSpec.hpp"
#include "support/TestSupport.hpp"

namespace simtest {

inline jexsim::DeviceSpec device(uint32_t idcode, uint32_t irLength, uint64_t idcodeOp = 1, uint64_t userOp = 2,
                                 uint32_t userBits = 32, uint64_t capture = 1)
{
    jexsim::DeviceSpec d;
    d.idcode = idcode;
    d.irLength = irLength;
    d.idcodeOpcode = idcodeOp;
    d.userOpcode = userOp;
    d.userBits = userBits;
    d.irCapture = capture;
    return d;
}

inline jexsim::DeviceSpec noIdcode(uint32_t irLength, uint64_t capture = 1)
{
    jexsim::DeviceSpec d = device(0, irLength);
    d.hasIdcode = false;
    d.irCapture = capture;
    return d;
}

using testsupport::bitsOf;
using testsupport::valueOf;

// Plug-in callbacks that keep what the plug-in sends in testsupport::messages().
inline JexPluginCallbacks hostCallbacks()
{
    JexPluginCallbacks cb{};
    cb.sendMessage = &testsupport::keepMessage;
    return cb;
}

} // namespace simtest
