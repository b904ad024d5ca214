#include "ChainReader.hpp"

#include <string>

#include "CliError.hpp"
#include "jexjtag/jexjtag.h"

namespace jexjtag::cli {

namespace {

constexpr unsigned kIdcodeSize = 33; // 32 digits and a NUL
constexpr unsigned kNameSize = 1024;

} // namespace

void detectChain(unsigned handle, bool autodetect)
{
    const uint32_t status = autodetect ? JexJtag_tap_autodetectChain(handle, JEXJTAG_SCAN_DEFAULT)
                                       : JexJtag_tap_interrogateChain(handle, JEXJTAG_SCAN_DEFAULT);
    if (JEX_FAILED(status)) throw CliError(autodetect ? "chain detection failed" : "chain interrogation failed");
}

unsigned chainDeviceCount(unsigned handle)
{
    unsigned count = 0;
    if (JEX_FAILED(JexJtag_tap_getDeviceCount(handle, &count))) throw CliError("cannot read the device count");
    return count;
}

std::vector<ChainDevice> readChain(unsigned handle)
{
    const unsigned count = chainDeviceCount(handle);
    std::vector<ChainDevice> devices;
    for (unsigned i = 0; i < count; ++i) {
        ChainDevice device;
        device.index = i;
        char idcode[kIdcodeSize] = {};
        if (JEX_FAILED(JexJtag_tap_getDeviceIdcode(handle, i, idcode, kIdcodeSize)))
            throw CliError("cannot read the IDCODE of device " + std::to_string(i));
        idcode[kIdcodeSize - 1] = '\0';
        device.idcodeBits = idcode;
        if (JEX_FAILED(JexJtag_tap_getIRLength(handle, i, &device.irLength)))
            throw CliError("cannot read the IR length of device " + std::to_string(i));
        char name[kNameSize] = {};
        if (JEX_FAILED(JexJtag_db_getDeviceNameForIdcode(handle, idcode, name, kNameSize)))
            throw CliError("device database lookup failed for device " + std::to_string(i));
        name[kNameSize - 1] = '\0';
        device.name = name;
        devices.push_back(device);
    }
    return devices;
}

} // namespace jexjtag::cli
