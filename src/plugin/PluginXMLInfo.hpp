// SPDX-License-Identifier: MIT
#pragma once
// getPluginXMLInfo - reads the target names of one plug-in descriptor.

#include <string>
#include <vector>

namespace JexRT {

// Parses the descriptor at path with PluginXMLHandler, in its own
// initialise/parse/terminate cycle of the XML parser.  JEX_SUCCESS when the
// document holds a "JexPlugin" element and at least one target name; names
// then holds the names in document order.  Otherwise JEX_FAILURE and names
// is empty (it is emptied first in every case).
unsigned getPluginXMLInfo(std::string path, std::vector<std::string>& names);

} // namespace JexRT
