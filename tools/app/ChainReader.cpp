// SPDX-License-Identifier: MIT
#include "ChainReader.hpp"

#include <string>

#include "CliError.hpp"
#include "IrCapture.hpp"
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
        if (!device.name.empty()) device.irLengthSource = "database";
        devices.push_back(device);
    }
    return devices;
}

void nameFromBsdl(unsigned handle, const std::vector<std::string>& directories, std::vector<ChainDevice>& devices)
{
    for (const std::string& directory : directories) {
        unsigned added = 0;
        if (JEX_FAILED(JexJtag_bsdl_addDirectory(handle, directory.c_str(), &added)))
            throw CliError("cannot read the BSDL directory '" + directory + "'");
    }
    for (ChainDevice& device : devices) {
        if (!device.name.empty()) continue; // the device list comes first
        char entity[kNameSize] = {};
        char path[4096] = {};
        unsigned irLength = 0;
        if (JEX_FAILED(JexJtag_bsdl_findByIdcode(handle, device.idcodeBits.c_str(), entity, sizeof entity, &irLength,
                                                 path, sizeof path)) ||
            entity[0] == '\0')
            continue;
        if (JEX_FAILED(JexJtag_tap_setIRLength(handle, device.index, irLength)))
            throw CliError("cannot set the IR length of device " + std::to_string(device.index));
        device.name = entity;
        device.irLength = irLength;
        device.irLengthSource = "bsdl";
        device.bsdlFile = path;
    }
}

namespace {

// The whole chain's IR capture: zeros in, then ones until the first one
// comes out; the bits before the zeros are what the IRs captured.  Leaves
// every device in BYPASS, then resets the TAPs.  Empty when it cannot tell.
std::vector<bool> captureChainIr(unsigned handle)
{
    constexpr unsigned kMaxBits = 4096;
    std::vector<unsigned char> tdi(2 * kMaxBits / 8, 0);
    for (unsigned i = kMaxBits / 8; i < tdi.size(); ++i) tdi[i] = 0xFF;
    std::vector<unsigned char> tdo(tdi.size(), 0);
    const bool shifted = !JEX_FAILED(JexJtag_tap_shiftChainIR(handle, JEXJTAG_SHIFT_READWRITE, JEXJTAG_RUN_TEST_IDLE,
                                                              nullptr, 2 * kMaxBits, tdi.data(), tdo.data(), nullptr,
                                                              nullptr));
    JexJtag_tap_navigate(handle, JEXJTAG_TEST_LOGIC_RESET, 0, 0);
    if (!shifted) return {};
    const auto bit = [&](unsigned i) { return ((tdo[i / 8] >> (i % 8)) & 1u) != 0; };
    for (unsigned i = kMaxBits; i < 2 * kMaxBits; ++i) {
        if (!bit(i)) continue;
        std::vector<bool> capture;
        for (unsigned k = 0; k < i - kMaxBits; ++k) capture.push_back(bit(k));
        return capture;
    }
    return {};
}

} // namespace

void inferIrLengths(unsigned handle, std::vector<ChainDevice>& devices, MessageSink& sink)
{
    std::vector<unsigned> known;
    bool missing = false;
    for (const ChainDevice& device : devices) {
        known.push_back(device.irLength);
        missing = missing || device.irLength == 0;
    }
    if (!missing) return;
    const std::vector<bool> capture = captureChainIr(handle);
    const IrInference inferred = inferUnknownIrLengths(capture, known);
    if (!inferred.ok) {
        for (ChainDevice& device : devices)
            if (device.irLength == 0) device.irLengthSource = "unknown";
        if (!capture.empty())
            sink.deliver(JEX_MSG_WARNING, ("the IR capture gives no IR length: " + inferred.error).c_str());
        return;
    }
    std::string assumed;
    for (ChainDevice& device : devices) {
        if (device.irLength != 0) continue;
        device.irLength = inferred.lengths[device.index];
        device.irLengthSource = "capture";
        assumed += (assumed.empty() ? "" : ", ") + std::to_string(device.index) + ": " + std::to_string(device.irLength);
        JexJtag_tap_setIRLength(handle, device.index, device.irLength);
    }
    if (inferred.ambiguous)
        sink.deliver(JEX_MSG_WARNING, ("the IR capture leaves IR lengths ambiguous; assuming (device: length) " +
                                       assumed + "; check them before shifting").c_str());
}

} // namespace jexjtag::cli
