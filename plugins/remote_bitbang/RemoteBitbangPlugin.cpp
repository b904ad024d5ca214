// SPDX-License-Identifier: MIT
// Entry points of the remote_bitbang plug-in module.
#include "RbbCable.hpp"

JEXJTAG_DEFINE_PLUGIN(jexrbb::RbbCable)
