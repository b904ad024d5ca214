// SPDX-License-Identifier: MIT
// A stand-in libusb-1.0 (soname libusb-1.0.so.0) whose only devices are
// emulated FTDI adapters.  The real libftdi1 runs on it unchanged: it finds
// the adapters, reads their descriptors and strings, claims interfaces, sends
// its vendor requests and moves bulk data, which the adapters' MPSSE engines
// answer in USB packets that start with the two modem-status bytes.  Only
// synchronous transfers exist; the asynchronous entry points fail with
// LIBUSB_ERROR_NOT_SUPPORTED.  Environment: FtdiEmuControl.h.

#include <libusb-1.0/libusb.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <memory>
#include <mutex>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "ChainSpec.hpp"
#include "FtdiEmuControl.h"
#include "MpsseEngine.hpp"
#include "SimChain.hpp"

#define EMU_API extern "C" __attribute__((visibility("default")))

struct libusb_context {
    int unused;
};

struct libusb_device {
    std::size_t index; // into adapters()
};

struct libusb_device_handle {
    libusb_device* device;
};

namespace {

constexpr const char* kDefaultAdapter = "0403:6010:2232H:Dual RS232-HS:JEX0001";
constexpr const char* kDefaultChain =
    "0x4BA00477:4:idcode=0xE:user=0xA:userbits=35,0x0362D093:6:idcode=0x9,0x41111043:8:idcode=0xE0:user=0x32";

struct Adapter {
    libusb_device device{};
    uint16_t vid = 0, pid = 0, bcd = 0x700;
    std::string product, serial;
    unsigned channels = 2;
    std::size_t packetSize = 512;
    std::unique_ptr<jexsim::SimChain> chain;
    std::vector<std::unique_ptr<ftdiemu::MpsseEngine>> engines;
};

struct World {
    std::vector<std::unique_ptr<Adapter>> adapters;
    bool deny = false;
    bool unplugged = false;
    std::string controlPath;
    std::string lastControl;
    long outBeforeUnplug = -1;
    FtdiEmuCounters counters{};
    std::string configuration; // the environment the adapters were built from
    unsigned openHandles = 0;
    std::mutex mutex;
};

std::string env(const char* name, const char* fallback = "")
{
    const char* v = std::getenv(name);
    return v && *v ? v : fallback;
}

// Splits at every `sep`, keeping empty fields ("a::" is three fields).
std::vector<std::string> split(const std::string& text, char sep)
{
    std::vector<std::string> parts;
    if (text.empty()) return parts;
    std::size_t start = 0;
    for (std::size_t at; (at = text.find(sep, start)) != std::string::npos; start = at + 1)
        parts.push_back(text.substr(start, at - start));
    parts.push_back(text.substr(start));
    return parts;
}

std::string configuration()
{
    std::string key;
    for (const char* name : {"JEXJTAG_FTDI_EMU_ADAPTERS", "JEXJTAG_FTDI_EMU_CHAIN", "JEXJTAG_FTDI_EMU_REJECT",
                             "JEXJTAG_FTDI_EMU_DENY", "JEXJTAG_FTDI_EMU_CONTROL"})
        key += env(name) + '\n';
    return key;
}

// Builds the adapters the environment describes.
void configure(World& w)
{
    w.adapters.clear();
    w.unplugged = false;
    w.lastControl.clear();
    w.outBeforeUnplug = -1;
    std::vector<jexsim::DeviceSpec> devices;
    std::string error;
    if (!jexsim::ChainSpec::parse(env("JEXJTAG_FTDI_EMU_CHAIN", kDefaultChain), devices, error))
        std::fprintf(stderr, "ftdi emulator: bad JEXJTAG_FTDI_EMU_CHAIN: %s\n", error.c_str());
    std::set<uint8_t> rejected;
    for (const std::string& op : split(env("JEXJTAG_FTDI_EMU_REJECT"), ','))
        rejected.insert(static_cast<uint8_t>(std::strtoul(op.c_str(), nullptr, 16)));
    for (const std::string& entry : split(env("JEXJTAG_FTDI_EMU_ADAPTERS", kDefaultAdapter), ';')) {
        const std::vector<std::string> f = split(entry, ':');
        if (f.size() < 5) {
            std::fprintf(stderr, "ftdi emulator: bad adapter \"%s\"\n", entry.c_str());
            continue;
        }
        auto a = std::make_unique<Adapter>();
        a->device.index = w.adapters.size();
        a->vid = static_cast<uint16_t>(std::strtoul(f[0].c_str(), nullptr, 16));
        a->pid = static_cast<uint16_t>(std::strtoul(f[1].c_str(), nullptr, 16));
        a->product = f[3];
        a->serial = f[4];
        std::size_t fifo = 4096;
        bool high = true;
        if (f[2] == "2232D") {
            a->bcd = 0x500;
            a->packetSize = 64;
            fifo = 384;
            high = false;
        } else if (f[2] == "4232H") {
            a->bcd = 0x800;
            a->channels = 4;
            fifo = 2048;
        } else if (f[2] == "232H") {
            a->bcd = 0x900;
            a->channels = 1;
            fifo = 1024;
        }
        a->chain = std::make_unique<jexsim::SimChain>(devices);
        for (unsigned c = 0; c < a->channels; ++c)
            a->engines.push_back(std::make_unique<ftdiemu::MpsseEngine>(*a->chain, high, a->packetSize, fifo, rejected));
        w.adapters.push_back(std::move(a));
    }
    w.deny = env("JEXJTAG_FTDI_EMU_DENY") == "1";
    w.controlPath = env("JEXJTAG_FTDI_EMU_CONTROL");
    w.configuration = configuration();
}

World& world()
{
    static World* w = [] {
        auto* made = new World;
        configure(*made);
        return made;
    }();
    return *w;
}

// Reads the control file; true while the adapters are plugged in.
bool present(World& w)
{
    if (w.unplugged) return false;
    if (!w.controlPath.empty()) {
        std::ifstream file(w.controlPath);
        std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
        if (text != w.lastControl) {
            w.lastControl = text;
            std::istringstream in(text);
            std::string word;
            long n = -1;
            in >> word >> n;
            if (word == "unplug") w.unplugged = true;
            else if (word == "unplug-after" && n >= 0) w.outBeforeUnplug = n;
        }
    }
    return !w.unplugged;
}

Adapter& adapterOf(libusb_device_handle* h)
{
    return *world().adapters[h->device->index];
}

} // namespace

// ---- control of the emulation (FtdiEmuControl.h) --------------------------------------------------

EMU_API void jexjtag_ftdi_emu_counters(FtdiEmuCounters* counters)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    if (counters) *counters = w.counters;
}

EMU_API void jexjtag_ftdi_emu_reset_counters(void)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    w.counters = FtdiEmuCounters{};
}

EMU_API int jexjtag_ftdi_emu_channel(unsigned adapter, unsigned channel, FtdiEmuChannel* state)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    if (!state || adapter >= w.adapters.size() || channel >= w.adapters[adapter]->engines.size()) return -1;
    const ftdiemu::MpsseEngine& e = *w.adapters[adapter]->engines[channel];
    *state = FtdiEmuChannel{e.tckHz(), e.divisor(), e.pins(), e.directions(), e.divideBy5(), e.adaptive(),
                            e.threePhase(), e.mpsse(), e.badCommands()};
    return 0;
}

// ---- libusb: context and devices -------------------------------------------------------------------

// A new context sees a changed environment (tests set it between cases)
// unless a device is open.
EMU_API int libusb_init(libusb_context** ctx)
{
    World& w = world();
    {
        std::lock_guard<std::mutex> lock(w.mutex);
        if (w.openHandles == 0 && configuration() != w.configuration) configure(w);
    }
    if (ctx) *ctx = new libusb_context{0};
    return LIBUSB_SUCCESS;
}

EMU_API void libusb_exit(libusb_context* ctx)
{
    delete ctx;
}

EMU_API ssize_t libusb_get_device_list(libusb_context*, libusb_device*** list)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    const bool here = present(w);
    const std::size_t n = here ? w.adapters.size() : 0;
    auto** out = static_cast<libusb_device**>(std::calloc(n + 1, sizeof(libusb_device*)));
    if (!out) return LIBUSB_ERROR_NO_MEM;
    for (std::size_t i = 0; i < n; ++i) out[i] = &w.adapters[i]->device;
    *list = out;
    return static_cast<ssize_t>(n);
}

EMU_API void libusb_free_device_list(libusb_device** list, int)
{
    std::free(list);
}

// The adapters live as long as the process: references need no counting.
EMU_API libusb_device* libusb_ref_device(libusb_device* dev)
{
    return dev;
}

EMU_API void libusb_unref_device(libusb_device*) {}

EMU_API int libusb_get_device_descriptor(libusb_device* dev, libusb_device_descriptor* desc)
{
    const Adapter& a = *world().adapters[dev->index];
    std::memset(desc, 0, sizeof *desc);
    desc->bLength = LIBUSB_DT_DEVICE_SIZE;
    desc->bDescriptorType = LIBUSB_DT_DEVICE;
    desc->bcdUSB = a.packetSize == 64 ? 0x0110 : 0x0200;
    desc->bMaxPacketSize0 = 64;
    desc->idVendor = a.vid;
    desc->idProduct = a.pid;
    desc->bcdDevice = a.bcd;
    desc->iManufacturer = 1;
    desc->iProduct = 2;
    desc->iSerialNumber = a.serial.empty() ? 0 : 3;
    desc->bNumConfigurations = 1;
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_get_config_descriptor(libusb_device* dev, uint8_t index, libusb_config_descriptor** config)
{
    if (index != 0) return LIBUSB_ERROR_NOT_FOUND;
    const Adapter& a = *world().adapters[dev->index];
    // One allocation: the configuration, then its interfaces, alternate settings and endpoints.
    const std::size_t n = a.channels;
    const std::size_t size = sizeof(libusb_config_descriptor) + n * sizeof(libusb_interface) +
                             n * sizeof(libusb_interface_descriptor) + 2 * n * sizeof(libusb_endpoint_descriptor);
    auto* block = static_cast<unsigned char*>(std::calloc(1, size));
    if (!block) return LIBUSB_ERROR_NO_MEM;
    auto* cfg = reinterpret_cast<libusb_config_descriptor*>(block);
    auto* interfaces = reinterpret_cast<libusb_interface*>(cfg + 1);
    auto* settings = reinterpret_cast<libusb_interface_descriptor*>(interfaces + n);
    auto* endpoints = reinterpret_cast<libusb_endpoint_descriptor*>(settings + n);
    cfg->bLength = LIBUSB_DT_CONFIG_SIZE;
    cfg->bDescriptorType = LIBUSB_DT_CONFIG;
    cfg->bNumInterfaces = static_cast<uint8_t>(n);
    cfg->bConfigurationValue = 1;
    cfg->bmAttributes = 0x80;
    cfg->MaxPower = 45;
    cfg->interface = interfaces;
    for (std::size_t i = 0; i < n; ++i) {
        interfaces[i].altsetting = &settings[i];
        interfaces[i].num_altsetting = 1;
        settings[i].bLength = LIBUSB_DT_INTERFACE_SIZE;
        settings[i].bDescriptorType = LIBUSB_DT_INTERFACE;
        settings[i].bInterfaceNumber = static_cast<uint8_t>(i);
        settings[i].bNumEndpoints = 2;
        settings[i].bInterfaceClass = 0xFF;
        settings[i].endpoint = &endpoints[2 * i];
        for (int e = 0; e < 2; ++e) {
            libusb_endpoint_descriptor& ep = endpoints[2 * i + e];
            ep.bLength = LIBUSB_DT_ENDPOINT_SIZE;
            ep.bDescriptorType = LIBUSB_DT_ENDPOINT;
            ep.bEndpointAddress = static_cast<uint8_t>(e == 0 ? 0x81 + 2 * i : 0x02 + 2 * i);
            ep.bmAttributes = LIBUSB_TRANSFER_TYPE_BULK;
            ep.wMaxPacketSize = static_cast<uint16_t>(a.packetSize);
        }
    }
    *config = cfg;
    return LIBUSB_SUCCESS;
}

EMU_API void libusb_free_config_descriptor(libusb_config_descriptor* config)
{
    std::free(config);
}

EMU_API uint8_t libusb_get_bus_number(libusb_device*)
{
    return 1;
}

EMU_API uint8_t libusb_get_device_address(libusb_device* dev)
{
    return static_cast<uint8_t>(dev->index + 2);
}

EMU_API int libusb_get_port_numbers(libusb_device* dev, uint8_t* ports, int length)
{
    if (length < 2) return LIBUSB_ERROR_OVERFLOW;
    ports[0] = 2;
    ports[1] = static_cast<uint8_t>(dev->index + 1);
    return 2;
}

// ---- libusb: handles -----------------------------------------------------------------------------------

EMU_API int libusb_open(libusb_device* dev, libusb_device_handle** handle)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    if (!present(w)) return LIBUSB_ERROR_NO_DEVICE;
    if (w.deny) return LIBUSB_ERROR_ACCESS;
    *handle = new libusb_device_handle{dev};
    ++w.openHandles;
    return LIBUSB_SUCCESS;
}

EMU_API void libusb_close(libusb_device_handle* handle)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    --w.openHandles;
    delete handle;
}

EMU_API libusb_device* libusb_get_device(libusb_device_handle* handle)
{
    return handle->device;
}

EMU_API int libusb_claim_interface(libusb_device_handle* handle, int number)
{
    return number >= 0 && static_cast<unsigned>(number) < adapterOf(handle).channels ? LIBUSB_SUCCESS
                                                                                      : LIBUSB_ERROR_NOT_FOUND;
}

EMU_API int libusb_release_interface(libusb_device_handle*, int)
{
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_detach_kernel_driver(libusb_device_handle*, int)
{
    return LIBUSB_ERROR_NOT_FOUND; // no kernel driver is bound
}

EMU_API int libusb_set_auto_detach_kernel_driver(libusb_device_handle*, int)
{
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_get_configuration(libusb_device_handle*, int* config)
{
    *config = 1;
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_set_configuration(libusb_device_handle*, int)
{
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_get_string_descriptor_ascii(libusb_device_handle* handle, uint8_t index, unsigned char* data,
                                               int length)
{
    const Adapter& a = adapterOf(handle);
    const std::string text = index == 1 ? "FTDI" : index == 2 ? a.product : index == 3 ? a.serial : "";
    if (text.empty() || length <= 0) return LIBUSB_ERROR_INVALID_PARAM;
    const int n = static_cast<int>(text.size()) < length - 1 ? static_cast<int>(text.size()) : length - 1;
    std::memcpy(data, text.data(), static_cast<std::size_t>(n));
    data[n] = 0;
    return n;
}

// FTDI vendor requests: wIndex names the channel (1 = A ... 4 = D).
EMU_API int libusb_control_transfer(libusb_device_handle* handle, uint8_t type, uint8_t request, uint16_t value,
                                    uint16_t index, unsigned char* data, uint16_t length, unsigned int)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    if (!present(w)) return LIBUSB_ERROR_NO_DEVICE;
    Adapter& a = adapterOf(handle);
    const unsigned channel = (index & 0xFF) == 0 ? 0 : (index & 0xFF) - 1u;
    if (channel >= a.channels) return LIBUSB_ERROR_PIPE;
    ftdiemu::MpsseEngine& e = *a.engines[channel];
    if (type & LIBUSB_ENDPOINT_IN) {
        std::memset(data, 0, length);
        if (request == 0x0A && length >= 1) data[0] = static_cast<uint8_t>(e.latency()); // GET_LATENCY_TIMER
        if (request == 0x0C && length >= 1) data[0] = static_cast<uint8_t>(e.pins());    // READ_PINS
        if (request == 0x90 && length >= 2) data[0] = data[1] = 0xFF;                   // READ_EEPROM: blank
        return length;
    }
    switch (request) {
    case 0x00: // RESET: 0 the SIO, 1 and 2 purge
        if (value == 0) e.setMpsse(false);
        e.purge();
        break;
    case 0x09: e.setLatency(value & 0xFF); break;              // SET_LATENCY_TIMER
    case 0x0B: e.setMpsse(((value >> 8) & 0xFF) == 0x02); break; // SET_BITMODE
    default: break; // baud rate, flow control, event characters: no effect here
    }
    return 0;
}

EMU_API int libusb_bulk_transfer(libusb_device_handle* handle, unsigned char endpoint, unsigned char* data, int length,
                                 int* transferred, unsigned int)
{
    World& w = world();
    std::lock_guard<std::mutex> lock(w.mutex);
    if (transferred) *transferred = 0;
    if (!present(w)) return LIBUSB_ERROR_NO_DEVICE;
    Adapter& a = adapterOf(handle);
    const unsigned channel = ((endpoint & 0x7F) - (endpoint & LIBUSB_ENDPOINT_IN ? 1u : 2u)) / 2u;
    if (channel >= a.channels || length < 0) return LIBUSB_ERROR_PIPE;
    ftdiemu::MpsseEngine& e = *a.engines[channel];
    if (endpoint & LIBUSB_ENDPOINT_IN) {
        const std::size_t n = e.read(data, static_cast<std::size_t>(length));
        ++w.counters.bulkIn;
        w.counters.bytesIn += n;
        if (transferred) *transferred = static_cast<int>(n);
        return LIBUSB_SUCCESS;
    }
    if (w.outBeforeUnplug == 0) {
        w.unplugged = true;
        return LIBUSB_ERROR_NO_DEVICE;
    }
    if (w.outBeforeUnplug > 0) --w.outBeforeUnplug;
    ++w.counters.bulkOut;
    w.counters.bytesOut += static_cast<uint64_t>(length);
    if (!e.write(data, static_cast<std::size_t>(length))) return LIBUSB_ERROR_TIMEOUT; // the chip stalled
    if (transferred) *transferred = length;
    return LIBUSB_SUCCESS;
}

// ---- libusb: asynchronous transfers (not emulated) -------------------------------------------------

EMU_API libusb_transfer* libusb_alloc_transfer(int iso_packets)
{
    const std::size_t size =
        sizeof(libusb_transfer) + static_cast<std::size_t>(iso_packets) * sizeof(libusb_iso_packet_descriptor);
    return static_cast<libusb_transfer*>(std::calloc(1, size));
}

EMU_API void libusb_free_transfer(libusb_transfer* transfer)
{
    std::free(transfer);
}

EMU_API int libusb_submit_transfer(libusb_transfer*)
{
    return LIBUSB_ERROR_NOT_SUPPORTED;
}

EMU_API int libusb_cancel_transfer(libusb_transfer*)
{
    return LIBUSB_ERROR_NOT_FOUND;
}

EMU_API int libusb_handle_events_timeout(libusb_context*, struct timeval*)
{
    return LIBUSB_SUCCESS;
}

EMU_API int libusb_handle_events_timeout_completed(libusb_context*, struct timeval*, int* completed)
{
    if (completed) *completed = 1;
    return LIBUSB_SUCCESS;
}
