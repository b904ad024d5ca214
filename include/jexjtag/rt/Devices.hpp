// SPDX-License-Identifier: MIT
#pragma once
// Device-database functions of the JexRT class interface: a session's own
// IDCODE lists and device lookups by IDCODE.  Each returns JEX_SUCCESS or
// JEX_FAILURE and never throws.

#include <istream>
#include <string>

#include "../types.h"

namespace JexRT {

// Reads an IDCODE list from data into the database of the session of
// handle; its entries win over the installation's for the same pattern.
// fileName only labels messages.  JEX_FAILURE for an unknown handle or a bad
// line; the entries of the lines before a bad line stay.
JEXJTAG_API unsigned addDeviceData(unsigned handle, const std::string& fileName, std::istream& data);

// Looks up the device of idcode ('0'/'1' text, most significant bit first;
// a short text counts as having leading zeros).  Writes the name, and each
// of the numbers and the user-list flag whose pointer is not null; bypass
// becomes one '1' per bit of the IR length (empty when irLength is null).
// A code no entry matches succeeds with an empty name, zero numbers, flag
// false and bypass untouched.  JEX_FAILURE for an unknown handle, with the
// outputs untouched.
JEXJTAG_API unsigned idcodeLookup(unsigned handle, const std::string& idcode, std::string& deviceName,
                                  unsigned* irLength, unsigned* familyType, unsigned* familySubType,
                                  std::string& bypass, bool* isUserList);
// The same for a 32-bit code.
JEXJTAG_API unsigned idcodeLookup(unsigned handle, unsigned idcode, std::string& deviceName, unsigned* irLength,
                                  unsigned* familyType, unsigned* familySubType, std::string& bypass,
                                  bool* isUserList);

} // namespace JexRT
