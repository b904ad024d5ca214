// SPDX-License-Identifier: MIT
#include "LibFtdiLink.hpp"

#include <ftdi.h>
#include <libusb.h>

#include <algorithm>
#include <chrono>

#include "jexjtag/cable/PluginPlatform.hpp"

namespace jexusb {

namespace {

// Frees a libftdi device list at the end of the scope.
struct DeviceList {
    ftdi_device_list* head = nullptr;
    ~DeviceList()
    {
        if (head) ftdi_list_free(&head);
    }
};

std::string portPath(libusb_device* dev)
{
    uint8_t ports[8];
    const int n = libusb_get_port_numbers(dev, ports, 8);
    std::string path;
    for (int i = 0; i < n; ++i) path += (i ? "." : "") + std::to_string(ports[i]);
    return path.empty() ? "?" : path;
}

std::string hex4(uint16_t v)
{
    static const char* digits = "0123456789abcdef";
    std::string s(4, '0');
    for (int i = 3; i >= 0; --i, v = static_cast<uint16_t>(v >> 4)) s[static_cast<std::size_t>(i)] = digits[v & 0xF];
    return s;
}

std::string permissionHint()
{
    return std::string("permission denied: install the udev rule ") + LibFtdiLink::kUdevRule +
           " into /etc/udev/rules.d/, then run 'udevadm control --reload' and plug the adapter in again";
}

} // namespace

std::string LibFtdiLink::libraryVersion()
{
    const ftdi_version_info v = ftdi_get_library_version();
    return v.version_str ? v.version_str : std::to_string(v.major) + "." + std::to_string(v.minor);
}

std::vector<UsbDevice> LibFtdiLink::list(const std::vector<std::pair<uint16_t, uint16_t>>& ids, std::string& warning)
{
    std::vector<UsbDevice> found;
    ftdi_context* ctx = ftdi_new();
    if (!ctx) {
        warning = "libftdi1 cannot start (libusb initialisation failed)";
        return found;
    }
    std::vector<std::pair<uint16_t, uint16_t>> unique;
    for (const auto& id : ids)
        if (std::find(unique.begin(), unique.end(), id) == unique.end()) unique.push_back(id);
    for (const auto& [vid, pid] : unique) {
        DeviceList devices;
        if (ftdi_usb_find_all(ctx, &devices.head, vid, pid) < 0) continue;
        for (ftdi_device_list* d = devices.head; d; d = d->next) {
            UsbDevice dev;
            dev.vid = vid;
            dev.pid = pid;
            dev.bus = libusb_get_bus_number(d->dev);
            dev.ports = portPath(d->dev);
            char manufacturer[128] = "", product[128] = "", serial[128] = "";
            if (ftdi_usb_get_strings(ctx, d->dev, manufacturer, sizeof manufacturer, product, sizeof product, serial,
                                     sizeof serial) < 0) {
                libusb_device_handle* h = nullptr;
                const int rc = libusb_open(d->dev, &h);
                if (rc == 0) libusb_close(h);
                warning = "cannot read the strings of USB device " + hex4(vid) + ":" + hex4(pid) + " on " +
                          dev.location() + (rc == LIBUSB_ERROR_ACCESS ? ": " + permissionHint() : "");
            }
            dev.manufacturer = manufacturer;
            dev.product = product;
            dev.serial = serial;
            found.push_back(dev);
        }
    }
    ftdi_free(ctx);
    std::stable_sort(found.begin(), found.end(), [](const UsbDevice& a, const UsbDevice& b) {
        return a.bus != b.bus ? a.bus < b.bus : a.ports < b.ports;
    });
    return found;
}

std::unique_ptr<LibFtdiLink> LibFtdiLink::open(const UsbDevice& device, char channel, unsigned latencyMs,
                                               std::string& error)
{
    const std::string name = "USB device " + hex4(device.vid) + ":" + hex4(device.pid) + " on " + device.location();
    if (channel < 'A' || channel > 'D') {
        error = std::string("channel ") + channel + " does not exist (A to D)";
        return nullptr;
    }
    ftdi_context* ctx = ftdi_new();
    if (!ctx) {
        error = "libftdi1 cannot start (libusb initialisation failed)";
        return nullptr;
    }
    std::unique_ptr<LibFtdiLink> link(new LibFtdiLink(ctx));
    if (ftdi_set_interface(ctx, static_cast<ftdi_interface>(INTERFACE_A + (channel - 'A'))) < 0) {
        error = link->failure("cannot select the channel");
        return nullptr;
    }
    DeviceList devices;
    libusb_device* target = nullptr;
    if (ftdi_usb_find_all(ctx, &devices.head, device.vid, device.pid) > 0)
        for (ftdi_device_list* d = devices.head; d && !target; d = d->next)
            if (libusb_get_bus_number(d->dev) == device.bus && portPath(d->dev) == device.ports) target = d->dev;
    if (!target) {
        error = name + " is no longer attached";
        return nullptr;
    }
    if (ftdi_usb_open_dev(ctx, target) < 0) {
        // libftdi1 folds libusb's reasons into one code; ask libusb which it was.
        libusb_device_handle* h = nullptr;
        const int rc = libusb_open(target, &h);
        if (rc == 0) libusb_close(h);
        if (rc == LIBUSB_ERROR_ACCESS) error = "cannot open " + name + ": " + permissionHint();
        else if (rc == LIBUSB_ERROR_NO_DEVICE) error = name + " was unplugged";
        else error = link->failure(("cannot open " + name + " channel " + channel + " (in use by another program?)").c_str());
        return nullptr;
    }
    switch (ctx->type) {
    case TYPE_2232C: link->m_chip = "FT2232C/D"; link->m_highSpeed = false; link->m_window = 384; break;
    case TYPE_2232H: link->m_chip = "FT2232H"; link->m_window = 4096; break;
    case TYPE_4232H: link->m_chip = "FT4232H"; link->m_window = 2048; break;
    case TYPE_232H: link->m_chip = "FT232H"; link->m_window = 1024; break;
    default:
        error = name + " is an FTDI chip without an MPSSE engine";
        return nullptr;
    }
    const bool channelOk = (ctx->type == TYPE_2232H || ctx->type == TYPE_4232H) ? channel <= 'B' : channel == 'A';
    if (!channelOk) {
        error = link->m_chip + " has no MPSSE engine on channel " + channel;
        return nullptr;
    }
    // Bounds on every bulk transfer (libftdi1's default is 5 s each).
    ctx->usb_read_timeout = 1000;
    ctx->usb_write_timeout = 2000;
    ftdi_write_data_set_chunksize(ctx, 64 * 1024);
    ftdi_read_data_set_chunksize(ctx, 16 * 1024);
    if (ftdi_usb_reset(ctx) < 0 || ftdi_set_bitmode(ctx, 0, BITMODE_RESET) < 0 || ftdi_tcioflush(ctx) < 0 ||
        ftdi_set_latency_timer(ctx, static_cast<unsigned char>(std::clamp(latencyMs, 1u, 255u))) < 0 ||
        ftdi_set_bitmode(ctx, 0x0B, BITMODE_MPSSE) < 0) {
        error = link->failure(("cannot put " + name + " into MPSSE mode").c_str());
        return nullptr;
    }
    return link;
}

LibFtdiLink::~LibFtdiLink()
{
    if (m_ctx->usb_dev) {
        ftdi_set_bitmode(m_ctx, 0, BITMODE_RESET);
        ftdi_usb_close(m_ctx);
    }
    ftdi_free(m_ctx);
}

std::string LibFtdiLink::failure(const char* what) const
{
    const char* why = ftdi_get_error_string(m_ctx);
    return std::string(what) + " (libftdi1: " + (why && *why ? why : "unknown error") + ")";
}

bool LibFtdiLink::write(const uint8_t* data, std::size_t size, std::string& error)
{
    std::size_t done = 0;
    while (done < size) {
        const int n = ftdi_write_data(m_ctx, data + done, static_cast<int>(std::min<std::size_t>(size - done, 1u << 20)));
        if (n <= 0) {
            error = failure("USB write failed: the adapter was unplugged or stopped answering");
            return false;
        }
        done += static_cast<std::size_t>(n);
    }
    return true;
}

bool LibFtdiLink::read(uint8_t* data, std::size_t size, unsigned timeoutMs, std::string& error)
{
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
    std::size_t got = 0;
    while (got < size) {
        const int n = ftdi_read_data(m_ctx, data + got, static_cast<int>(size - got));
        if (n < 0) {
            error = failure("USB read failed: the adapter was unplugged or stopped answering");
            return false;
        }
        got += static_cast<std::size_t>(n);
        if (got == size) break;
        if (std::chrono::steady_clock::now() >= deadline) {
            error = "the adapter did not answer: " + std::to_string(got) + " of " + std::to_string(size) +
                    " bytes came within " + std::to_string(timeoutMs) + " ms";
            return false;
        }
        if (n == 0) jexcable::PluginPlatform::sleepMicroseconds(50);
    }
    return true;
}

std::size_t LibFtdiLink::pending() const
{
    return m_ctx->readbuffer_remaining;
}

bool LibFtdiLink::purge(std::string& error)
{
    if (ftdi_tcioflush(m_ctx) < 0) {
        error = failure("cannot purge the adapter's buffers");
        return false;
    }
    return true;
}

bool LibFtdiLink::setLatency(unsigned ms, std::string& error)
{
    if (ms < 1 || ms > 255) {
        error = "latency " + std::to_string(ms) + " ms is outside 1..255";
        return false;
    }
    if (ftdi_set_latency_timer(m_ctx, static_cast<unsigned char>(ms)) < 0) {
        error = failure("cannot set the latency timer");
        return false;
    }
    return true;
}

} // namespace jexusb
