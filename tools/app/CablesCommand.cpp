// SPDX-License-Identifier: MIT
// The "cables" command: the USB JTAG adapters attached to this machine that
// the ormund_usbcable plug-in can open.  No target is opened, so the list
// comes from the plug-in's adapter profiles and libftdi1's device listing
// directly rather than through the library.

#include "AdapterProfile.hpp"
#include "JsonWriter.hpp"
#include "LibFtdiLink.hpp"
#include "MessageSink.hpp"
#include "Options.hpp"
#include "TextTable.hpp"

#include "jexjtag/types.h"

namespace jexjtag::cli {

namespace {

const char* const kPage = R"HELP(Usage: jexjtag cables [OPTIONS]

Lists the attached USB JTAG adapters (FTDI MPSSE chips) that target type
ormund_usbcable can open: the profile it would use (its cable= argument),
the serial number, where the adapter sits on the USB and its product text.
Adapters whose ids are a bare FTDI chip's show the generic profile (ft2232h,
ft232h, ft4232h); give cable=busblaster and the like to open them with a
board's layout.  With none attached it says so and succeeds.

Options:
      --json      {"count": N, "cables": [{"profile", "serial", "bus", "port",
                  "vid", "pid", "product", "description"}]}
      --verbose: see jexjtag --help

Examples:
  jexjtag cables
  jexjtag scan --target ormund_usbcable --arg serial=FT5ZK1AB
)HELP";

struct Cable {
    jexusb::UsbDevice device;
    const jexusb::AdapterProfile* profile;
};

std::string hex4(uint16_t v)
{
    static const char* digits = "0123456789abcdef";
    std::string s(4, '0');
    for (int i = 3; i >= 0; --i, v = static_cast<uint16_t>(v >> 4)) s[static_cast<size_t>(i)] = digits[v & 0xF];
    return s;
}

void runCables(const Options& options, MessageSink& sink, std::ostream& out)
{
    std::vector<std::pair<uint16_t, uint16_t>> ids;
    for (const jexusb::AdapterProfile& p : jexusb::AdapterProfile::all()) ids.emplace_back(p.vid, p.pid);
    std::string warning;
    std::vector<Cable> cables;
    for (const jexusb::UsbDevice& d : jexusb::LibFtdiLink::list(ids, warning))
        if (const auto* profile = jexusb::AdapterProfile::match(d.vid, d.pid, d.product))
            cables.push_back({d, profile});
    if (!warning.empty()) sink.deliver(JEX_MSG_WARNING, warning.c_str());

    if (options.json) {
        JsonWriter json(out);
        json.beginObject();
        json.key("count").number(cables.size());
        json.key("cables").beginArray();
        for (const Cable& c : cables) {
            json.beginObject();
            json.key("profile").string(c.profile->name);
            json.key("serial").string(c.device.serial);
            json.key("bus").number(c.device.bus);
            json.key("port").string(c.device.ports);
            json.key("vid").string(hex4(c.device.vid));
            json.key("pid").string(hex4(c.device.pid));
            json.key("product").string(c.device.product);
            json.key("description").string(c.profile->description);
            json.endObject();
        }
        json.endArray();
        json.endObject();
        json.finish();
        return;
    }
    if (cables.empty()) {
        out << "no USB adapters attached\n";
        return;
    }
    out << cables.size() << (cables.size() == 1 ? " USB adapter" : " USB adapters") << ":\n";
    TextTable table;
    table.addRow({"PROFILE", "SERIAL", "BUS/PORT", "ID", "DESCRIPTION"});
    for (const Cable& c : cables)
        table.addRow({c.profile->name, c.device.serial.empty() ? "-" : c.device.serial,
                      std::to_string(c.device.bus) + "/" + c.device.ports,
                      hex4(c.device.vid) + ":" + hex4(c.device.pid),
                      c.device.product + " (" + c.profile->description + ")"});
    table.write(out, "  ");
}

} // namespace

extern const Command cablesCommand = {
    "cables", "cables", "list the attached USB JTAG adapters",
    {},
    0, 0, nullptr,
    nullptr,
    [] { return std::string(kPage); },
    runCables,
};

} // namespace jexjtag::cli
