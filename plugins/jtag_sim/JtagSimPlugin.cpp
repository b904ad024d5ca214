// SPDX-License-Identifier: MIT
// Entry points of the jtag_sim plug-in module.
#include "SimCable.hpp"

JEXJTAG_DEFINE_PLUGIN(jexsim::SimCable)
