// SPDX-License-Identifier: MIT
// Entry points of the ormund_usbcable plug-in module.
#include "UsbCable.hpp"

JEXJTAG_DEFINE_PLUGIN(jexusb::UsbCable)
