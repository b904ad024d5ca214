// SPDX-License-Identifier: MIT
#include "UsbCable.hpp"

#include <cstdlib>
#include <stdexcept>

#include "jexjtag/cable/TextCopy.hpp"

#ifndef JEXJTAG_USB_VERSION
#define JEXJTAG_USB_VERSION "0.0.0"
#endif

namespace jexusb {

using jexcable::PluginArgs;
using jexcable::TextCopy;

namespace {

constexpr const char* kTargetType = "ormund_usbcable";
constexpr uint8_t kLoopbackOff = 0x85;
constexpr uint8_t kProbe = 0xAA; // not a command: the chip answers 0xFA 0xAA

bool parseUnsigned(const std::string& text, int base, unsigned long max, unsigned long& value)
{
    const std::string t = PluginArgs::trim(text);
    if (t.empty()) return false;
    char* end = nullptr;
    value = std::strtoul(t.c_str(), &end, base);
    return end && *end == '\0' && value <= max && t[0] != '-';
}

bool parseBool(const std::string& text, bool& value)
{
    const std::string t = PluginArgs::toLower(PluginArgs::trim(text));
    if (t == "1" || t == "on" || t == "true" || t == "yes") value = true;
    else if (t == "0" || t == "off" || t == "false" || t == "no") value = false;
    else return false;
    return true;
}

std::string hex4(uint16_t v)
{
    char text[8];
    static const char* digits = "0123456789abcdef";
    for (int i = 3; i >= 0; --i, v = static_cast<uint16_t>(v >> 4)) text[i] = digits[v & 0xF];
    text[4] = '\0';
    return text;
}

} // namespace

UsbCable::UsbCable() : CableBase(kTargetType) {}

UsbCable::~UsbCable()
{
    closeCable();
}

bool UsbCable::parseFrequency(const std::string& text, uint32_t& hz)
{
    std::string t = PluginArgs::trim(text);
    double scale = 1;
    if (!t.empty() && (t.back() == 'k' || t.back() == 'K')) scale = 1e3;
    if (!t.empty() && (t.back() == 'm' || t.back() == 'M')) scale = 1e6;
    if (scale != 1) t.pop_back();
    if (t.empty() || t[0] == '-' || t[0] == '+') return false;
    char* end = nullptr;
    const double value = std::strtod(t.c_str(), &end) * scale;
    if (!end || *end != '\0' || !(value >= 1) || value > 100e6) return false;
    hz = static_cast<uint32_t>(value);
    return true;
}

// ---- open and close -------------------------------------------------------------------

uint32_t UsbCable::openCable(const PluginArgs& args)
{
    m_profile = nullptr;
    if (auto name = args.get("cable")) {
        m_profile = AdapterProfile::find(PluginArgs::trim(*name));
        if (!m_profile) return fail("unknown cable \"" + *name + "\" (known: " + AdapterProfile::names() + ")");
    }
    unsigned long number = 0;
    uint16_t vid = 0, pid = 0;
    const auto vidArg = args.get("vid"), pidArg = args.get("pid");
    if (vidArg.has_value() != pidArg.has_value()) return fail("vid= and pid= go together");
    if (vidArg) {
        if (!parseUnsigned(*vidArg, 16, 0xFFFF, number)) return fail("vid=" + *vidArg + " is not a USB id");
        vid = static_cast<uint16_t>(number);
        if (!parseUnsigned(*pidArg, 16, 0xFFFF, number)) return fail("pid=" + *pidArg + " is not a USB id");
        pid = static_cast<uint16_t>(number);
    }
    const std::string serial = PluginArgs::trim(args.get("serial").value_or(""));
    unsigned long index = 0;
    if (auto v = args.get("index"); v && !parseUnsigned(*v, 10, 255, index)) return fail("index=" + *v + " is not 0..255");
    std::optional<char> channel;
    if (auto v = args.get("channel")) {
        const std::string c = PluginArgs::toLower(PluginArgs::trim(*v));
        if (c.size() != 1 || c[0] < 'a' || c[0] > 'd') return fail("channel=" + *v + " is not A, B, C or D");
        channel = static_cast<char>(c[0] - 'a' + 'A');
    }
    m_requestedHz = 1000000;
    if (auto v = args.get("frequency"); v && !parseFrequency(*v, m_requestedHz))
        return fail("frequency=" + *v + " is not a frequency in Hz (k and M suffixes allowed)");
    m_latencyMs = 2;
    if (auto v = args.get("latency")) {
        if (!parseUnsigned(*v, 10, 255, number) || number == 0) return fail("latency=" + *v + " is not 1..255 ms");
        m_latencyMs = static_cast<unsigned>(number);
    }
    m_adaptive = false;
    if (auto v = args.get("adaptive"); v && !parseBool(*v, m_adaptive)) return fail("adaptive=" + *v + " is not 0 or 1");

    // Which adapters may be meant.
    std::vector<std::pair<uint16_t, uint16_t>> ids;
    if (vidArg) ids.emplace_back(vid, pid);
    else if (m_profile) ids.emplace_back(m_profile->vid, m_profile->pid);
    else
        for (const AdapterProfile& p : AdapterProfile::all()) ids.emplace_back(p.vid, p.pid);
    std::string warning;
    const std::vector<UsbDevice> attached = LibFtdiLink::list(ids, warning);
    std::vector<std::pair<UsbDevice, const AdapterProfile*>> candidates;
    for (const UsbDevice& d : attached) {
        if (!serial.empty() && d.serial != serial) continue;
        const AdapterProfile* profile = m_profile;
        if (profile && profile->product && !vidArg && d.product != profile->product) continue;
        if (!profile) profile = AdapterProfile::match(d.vid, d.pid, d.product);
        if (!profile && vidArg) profile = AdapterProfile::find("ft2232h"); // JTAG pins only
        if (profile) candidates.emplace_back(d, profile);
    }
    if (index >= candidates.size()) {
        std::string searched;
        for (const auto& [v, p] : ids) {
            const std::string id = hex4(v) + ":" + hex4(p);
            if (searched.find(id) == std::string::npos) searched += (searched.empty() ? "" : ", ") + id;
        }
        std::string text = candidates.empty() ? "no USB adapter found" : "no adapter with index " + std::to_string(index);
        text += " (USB ids " + searched + (serial.empty() ? "" : ", serial " + serial) +
                (m_profile ? ", cable " + std::string(m_profile->name) : "") + "; " +
                std::to_string(attached.size()) + " attached device(s) with these ids)";
        if (!warning.empty()) text += "; " + warning;
        return fail(text);
    }
    m_device = candidates[index].first;
    m_profile = candidates[index].second;
    m_channel = channel.value_or(m_profile->channel);

    std::string error;
    m_link = LibFtdiLink::open(m_device, m_channel, m_latencyMs, error);
    if (!m_link) return fail(error);
    if (m_adaptive && !m_link->highSpeed()) {
        closeCable();
        return fail("adaptive clocking needs an H chip; this adapter is an " + std::string("FT2232C/D"));
    }
    m_queue = std::make_unique<MpsseQueue>(*m_link, m_link->readWindow(), m_link->highSpeed());
    m_transport = std::make_unique<MpsseTransport>(*m_queue, *m_link, *m_profile);
    if (!setUp(error)) {
        closeCable();
        return fail(error);
    }
    attachTransport(*m_transport);
    return JEX_SUCCESS;
}

bool UsbCable::probe(std::string& error)
{
    uint8_t answer[2] = {0, 0};
    m_queue->raw({kProbe}, 2, answer);
    if (!m_queue->flush()) {
        error = m_queue->error();
        m_queue->clearError();
        std::string ignored;
        m_link->purge(ignored);
        return false;
    }
    if (answer[0] != 0xFA || answer[1] != kProbe) {
        error = "the adapter does not answer as an MPSSE engine does";
        return false;
    }
    return true;
}

bool UsbCable::setUp(std::string& error)
{
    uint16_t value = 0, direction = 0;
    MpsseTransport::initialPins(*m_profile, value, direction);
    m_actualHz = m_queue->setFrequency(m_requestedHz);
    if (m_link->highSpeed()) m_queue->setAdaptive(m_adaptive);
    m_queue->raw({kLoopbackOff});
    m_queue->setLow(static_cast<uint8_t>(value & 0xFF), static_cast<uint8_t>(direction & 0xFF));
    if (m_link->chipName() != "FT4232H") // its channels have no high byte
        m_queue->setHigh(static_cast<uint8_t>(value >> 8), static_cast<uint8_t>(direction >> 8));
    return probe(error);
}

void UsbCable::closeCable()
{
    m_transport.reset();
    m_queue.reset();
    m_link.reset();
}

std::string UsbCable::lockKey() const
{
    if (!m_device.serial.empty()) return "ftdi-" + m_device.serial;
    return "ftdi-bus" + std::to_string(m_device.bus) + "-" + m_device.ports;
}

// ---- information and options ---------------------------------------------------------

void UsbCable::describe(JexJtagTargetInfo& info)
{
    const std::string chip = m_link ? m_link->chipName() : "";
    const std::string version = LibFtdiLink::libraryVersion();
    TextCopy::toField(info.target_name, kTargetType);
    TextCopy::toField(info.plugin_name, kTargetType);
    TextCopy::toField(info.fw_ver, chip);
    TextCopy::toField(info.driver_ver, "libftdi1 " + version);
    TextCopy::toField(info.plugin_ver, JEXJTAG_USB_VERSION);
    TextCopy::toField(info.vendor, m_device.manufacturer);
    TextCopy::toField(info.frequency, std::to_string(m_actualHz));
    TextCopy::toField(info.port, m_device.location());
    TextCopy::toField(info.full_name, std::string(m_profile->description) + " (" + chip + ", serial " +
                                          (m_device.serial.empty() ? "none" : m_device.serial) + ") on " +
                                          m_device.location() + " channel " + m_channel);
    TextCopy::toField(info.target_uid, std::string(kTargetType) + ":" + lockKey());
    TextCopy::toField(info.rawinfo, "profile=" + std::string(m_profile->name) + ";chip=" + chip +
                                        ";serial=" + m_device.serial + ";bus=" + std::to_string(m_device.bus) +
                                        ";port=" + m_device.ports + ";channel=" + m_channel +
                                        ";libftdi1=" + version + ";frequency=" + std::to_string(m_actualHz) +
                                        ";product=" + m_device.product);
    info.target_flags = 0;
}

jexcable::CableBase::OptionStatus UsbCable::getOption(const std::string& key, std::string& value)
{
    if (key == "frequency") value = std::to_string(m_actualHz);
    else if (key == "adaptive") value = m_adaptive ? "1" : "0";
    else if (key == "latency") value = std::to_string(m_latencyMs);
    else if (key == "cable") value = m_profile ? m_profile->name : "";
    else if (key == "chip") value = m_link ? m_link->chipName() : "";
    else if (key == "serial") value = m_device.serial;
    else if (key == "location") value = m_device.location();
    else return OptionStatus::Unknown;
    return OptionStatus::Done;
}

jexcable::CableBase::OptionStatus UsbCable::setOption(const std::string& key, const std::string& value)
{
    std::string error;
    if (key == "frequency") {
        uint32_t hz = 0;
        if (!parseFrequency(value, hz)) {
            fail("frequency=" + value + " is not a frequency in Hz (k and M suffixes allowed)");
            return OptionStatus::Failed;
        }
        const uint32_t actual = m_queue->setFrequency(hz);
        if (!probe(error)) {
            fail(error);
            return OptionStatus::Failed;
        }
        m_requestedHz = hz;
        m_actualHz = actual;
        return OptionStatus::Done;
    }
    if (key == "adaptive") {
        bool on = false;
        if (!parseBool(value, on)) {
            fail("adaptive=" + value + " is not 0 or 1");
            return OptionStatus::Failed;
        }
        if (!m_link->highSpeed()) {
            fail("adaptive clocking needs an H chip; this adapter is an " + m_link->chipName());
            return OptionStatus::Failed;
        }
        m_queue->setAdaptive(on);
        if (!probe(error)) {
            fail(error);
            return OptionStatus::Failed;
        }
        m_adaptive = on;
        return OptionStatus::Done;
    }
    if (key == "latency") {
        unsigned long ms = 0;
        if (!parseUnsigned(value, 10, 255, ms) || ms == 0) {
            fail("latency=" + value + " is not 1..255 ms");
            return OptionStatus::Failed;
        }
        if (!m_link->setLatency(static_cast<unsigned>(ms), error)) {
            fail(error);
            return OptionStatus::Failed;
        }
        m_latencyMs = static_cast<unsigned>(ms);
        return OptionStatus::Done;
    }
    if (key == "cable" || key == "chip" || key == "serial" || key == "location") {
        fail("option \"" + key + "\" can only be read");
        return OptionStatus::Failed;
    }
    return OptionStatus::Unknown;
}

} // namespace jexusb
