// SPDX-License-Identifier: MIT
#pragma once
// What a cable driver believes about its chain: per device (index 0 nearest
// TDO) the IDCODE (0 when the device has none) and the IR length.  Filled by
// interrogation and changed by the host's overrides; device-relative shifts
// pad with it.  Nothing here touches the chain.

#include <cstdint>
#include <vector>

namespace jexcable {

class ChainLayout {
public:
    struct Device {
        uint32_t idcode = 0;
        uint32_t irLength = 0;
    };

    static constexpr uint32_t kMaxDevices = 4096;
    static constexpr uint32_t kMaxIrLength = 4096;

    uint32_t count() const { return static_cast<uint32_t>(m_devices.size()); }
    bool contains(uint32_t index) const { return index < m_devices.size(); }
    const std::vector<Device>& devices() const { return m_devices; }

    // Replaces the whole description.
    void assign(std::vector<Device> devices) { m_devices = std::move(devices); }
    // New devices get IDCODE 0 and IR length 0.  False above kMaxDevices.
    bool resize(uint32_t count);

    // 0 for an index outside the chain.
    uint32_t irLength(uint32_t index) const { return contains(index) ? m_devices[index].irLength : 0; }
    uint32_t idcode(uint32_t index) const { return contains(index) ? m_devices[index].idcode : 0; }
    // False for an index outside the chain (or a length above kMaxIrLength).
    bool setIrLength(uint32_t index, uint32_t length);
    bool setIdcode(uint32_t index, uint32_t idcode);

    // IR bits of the devices between `index` and TDO, and between it and TDI.
    uint64_t irBitsBefore(uint32_t index) const;
    uint64_t irBitsAfter(uint32_t index) const;
    // BYPASS bits around a device in a DR scan: one per other device.
    uint64_t bypassBitsBefore(uint32_t index) const { return index; }
    uint64_t bypassBitsAfter(uint32_t index) const { return contains(index) ? count() - 1u - index : 0; }

private:
    std::vector<Device> m_devices;
};

} // namespace jexcable
