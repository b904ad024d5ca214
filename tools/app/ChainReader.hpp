// SPDX-License-Identifier: MIT
#pragma once
// Detects the chain of an open target and reads what the library knows
// about each device.

#include <string>
#include <vector>

#include "MessageSink.hpp"
#include "ScanOutput.hpp"

namespace jexjtag::cli {

// Autodetects the chain (IR lengths from the device database), or with
// autodetect false only interrogates it (IR lengths as the plug-in found
// them).  Throws CliError.
void detectChain(unsigned handle, bool autodetect);

// The chain as it stands: IDCODE, IR length and database name of each
// device, device 0 first.  Throws CliError.
std::vector<ChainDevice> readChain(unsigned handle);

// The number of devices in the chain.  Throws CliError.
unsigned chainDeviceCount(unsigned handle);

// Names the devices the device database does not know from the BSDL files
// of `directories` (read once, indexed by IDCODE) and gives the target their
// IR lengths from the files.  Throws CliError when a directory cannot be read.
void nameFromBsdl(unsigned handle, const std::vector<std::string>& directories, std::vector<ChainDevice>& devices);

// Gives the devices whose IR length is still 0 the length the whole chain's
// IR capture shows (IrCapture), marked "capture"; a warning goes to sink when
// the capture is ambiguous.  Devices it cannot place stay "unknown".
void inferIrLengths(unsigned handle, std::vector<ChainDevice>& devices, MessageSink& sink);

} // namespace jexjtag::cli
