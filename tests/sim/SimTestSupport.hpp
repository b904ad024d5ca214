#pragma once
// Helpers for the simulated cable's tests: device specs, bit buffers and a
// recorder of the messages a plug-in sends to its session.

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "jexjtag/plugin.hpp"

#include "jexjtag/cable/BitBuffer.hpp"
#include "DeviceSpec.hpp"

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

// n bits of `value` (bit 0 first) as a buffer.
inline std::vector<uint8_t> bits(uint64_t value, unsigned n)
{
    std::vector<uint8_t> buffer(jexcable::BitBuffer::bytesFor(n), 0);
    for (unsigned i = 0; i < n; ++i) jexcable::BitBuffer::set(buffer.data(), i, (value >> i) & 1u);
    return buffer;
}

inline uint64_t value(const std::vector<uint8_t>& buffer, unsigned n, unsigned offset = 0)
{
    uint64_t v = 0;
    for (unsigned i = 0; i < n; ++i)
        if (jexcable::BitBuffer::get(buffer.data(), offset + i)) v |= uint64_t{1} << i;
    return v;
}

// Collects what the plug-in sends through the host callbacks.
struct Messages {
    static std::vector<std::pair<uint32_t, std::string>>& all()
    {
        static std::vector<std::pair<uint32_t, std::string>> list;
        return list;
    }
    static void send(uint32_t, uint32_t type, const char* text) { all().emplace_back(type, text ? text : ""); }
    static JexPluginCallbacks callbacks()
    {
        JexPluginCallbacks cb{};
        cb.sendMessage = &Messages::send;
        return cb;
    }
    static bool contains(uint32_t type, const std::string& part)
    {
        for (const auto& [t, text] : all())
            if (t == type && text.find(part) != std::string::npos) return true;
        return false;
    }
};

} // namespace simtest
