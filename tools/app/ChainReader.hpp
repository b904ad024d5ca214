#pragma once
// Detects the chain of an open target and reads what the library knows
// about each device.

#include <vector>

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

} // namespace jexjtag::cli
