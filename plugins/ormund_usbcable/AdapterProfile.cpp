// SPDX-License-Identifier: MIT
#include "AdapterProfile.hpp"

#include "jexjtag/cable/PluginArgs.hpp"

namespace jexusb {

void ResetSignal::apply(bool asserted, uint16_t& value, uint16_t& direction) const
{
    const bool openDrainRelease = !asserted && !pushPull && enable != 0;
    // The line level: low when asserted; high when released push-pull.
    const bool high = !asserted && !openDrainRelease;
    if (data != 0) {
        value = (high != dataInverted) ? static_cast<uint16_t>(value | data) : static_cast<uint16_t>(value & ~data);
        if (enable != data) direction = static_cast<uint16_t>(direction | data);
    }
    if (enable == 0) return;
    const bool enabled = !openDrainRelease;
    if (enable == data) { // the pin's own direction is its enable
        direction = enabled ? static_cast<uint16_t>(direction | enable) : static_cast<uint16_t>(direction & ~enable);
        return;
    }
    direction = static_cast<uint16_t>(direction | enable);
    value = (enabled != enableInverted) ? static_cast<uint16_t>(value | enable) : static_cast<uint16_t>(value & ~enable);
}

namespace {

constexpr uint16_t kVidFtdi = 0x0403;
constexpr uint16_t kVidOlimex = 0x15BA;

// Buffered boards of the JTAGkey family: ACBUS0 nTRST, ACBUS1 nSRST, with
// active-low buffer enables on ACBUS2 and ACBUS3; ADBUS4 (low) enables the
// TCK/TDI/TMS buffer.
constexpr ResetSignal kKeyTrst{0x0100, false, 0x0400, true, true};
constexpr ResetSignal kKeySrst{0x0200, false, 0x0800, true, false};

// Olimex -H boards: ACBUS0 nTRST, nSRST pulled low through a transistor
// switched by ACBUS1 (open drain), ACBUS3 the LED.
constexpr ResetSignal kOlimexSrst{0, false, 0x0200, false, false};

std::vector<AdapterProfile> makeProfiles()
{
    const ResetSignal none{};
    return {
        {"olimex-arm-usb-ocd-h", "Olimex ARM-USB-OCD-H", kVidOlimex, 0x002B, "Olimex OpenOCD JTAG ARM-USB-OCD-H", 'A',
         0x0908, 0x0B1B, ResetSignal{0x0100, false, 0, false, true}, kOlimexSrst, true},
        {"olimex-arm-usb-tiny-h", "Olimex ARM-USB-TINY-H", kVidOlimex, 0x002A, "Olimex OpenOCD JTAG ARM-USB-TINY-H",
         'A', 0x0808, 0x0A1B, ResetSignal{0x0100, false, 0x0100, false, true}, kOlimexSrst, true},
        {"jtagkey", "Amontec JTAGkey", kVidFtdi, 0xCFF8, "Amontec JTAGkey", 'A', 0x0C08, 0x0F1B, kKeyTrst, kKeySrst,
         true},
        {"jtagkey2", "Amontec JTAGkey-2", kVidFtdi, 0xCFF8, "Amontec JTAGkey-2", 'A', 0x0C08, 0x0F1B, kKeyTrst,
         kKeySrst, true},
        {"tigard", "Tigard (JTAG on port B)", kVidFtdi, 0x6010, "Tigard V1.1", 'B', 0x0038, 0x003B,
         ResetSignal{0x0010, false, 0, false, true}, ResetSignal{0x0020, false, 0, false, true}, true},
        {"ft2232h-minimodule", "FTDI FT2232H mini-module", kVidFtdi, 0x6010, "FT2232H MiniModule", 'A', 0x0008,
         0x000B, none, ResetSignal{0x0020, false, 0x0020, false, false}, true},
        // A bare FT2232H says "Dual RS232-HS" as the Bus Blaster does, so the
        // generic profile (JTAG pins only) is the one picked without cable=.
        {"ft2232h", "FT2232H board, JTAG on ADBUS0-3", kVidFtdi, 0x6010, nullptr, 'A', 0x0008, 0x000B, none, none,
         true},
        {"ft232h", "FT232H board, JTAG on ADBUS0-3", kVidFtdi, 0x6014, nullptr, 'A', 0x0008, 0x000B, none, none, true},
        {"ft4232h", "FT4232H board, JTAG on ADBUS0-3", kVidFtdi, 0x6011, nullptr, 'A', 0x0008, 0x000B, none, none,
         true},
        {"busblaster", "Dangerous Prototypes Bus Blaster v2/v3 (JTAGkey buffer)", kVidFtdi, 0x6010, "Dual RS232-HS",
         'A', 0x0C08, 0x0F1B, kKeyTrst, kKeySrst, false},
    };
}

} // namespace

const std::vector<AdapterProfile>& AdapterProfile::all()
{
    static const std::vector<AdapterProfile> profiles = makeProfiles();
    return profiles;
}

const AdapterProfile* AdapterProfile::find(const std::string& name)
{
    for (const AdapterProfile& p : all())
        if (jexcable::PluginArgs::equalsIgnoreCase(p.name, name)) return &p;
    return nullptr;
}

const AdapterProfile* AdapterProfile::match(uint16_t vid, uint16_t pid, const std::string& product)
{
    for (const AdapterProfile& p : all())
        if (p.autodetect && p.vid == vid && p.pid == pid && (!p.product || product == p.product)) return &p;
    return nullptr;
}

std::string AdapterProfile::names()
{
    std::string text;
    for (const AdapterProfile& p : all()) text += (text.empty() ? "" : ", ") + std::string(p.name);
    return text;
}

} // namespace jexusb
