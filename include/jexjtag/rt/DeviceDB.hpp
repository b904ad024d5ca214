// SPDX-License-Identifier: MIT
#pragma once
// DeviceDB - the device database of a session: a Jex_DeviceData table filled
// from the installation's "idcode.lst" when the session starts and from
// lists that callers add later.  Every failure leaves it as Jex_Exception.

#include <iosfwd>
#include <string>

#include "../export.h"
#include "DeviceRecord.hpp"
#include "IDCode.hpp"
#include "Jex_DeviceData.hpp"

namespace JexRT {

class JEXJTAG_API DeviceDB {
public:
    // An empty database.
    DeviceDB();
    virtual ~DeviceDB();
    // The database owns its entries; it is neither copied nor moved.
    DeviceDB(const DeviceDB&) = delete;
    DeviceDB& operator=(const DeviceDB&) = delete;

    // Reads the installation's list: "idcode.lst" in the data directory (the
    // session's "datadir", else $JEXJTAG_DATA_DIR, else share/jexjtag beside
    // the library), as installation entries.  Throws Jex_Exception when the
    // list cannot be opened ("Error: Unable to open <path>") or holds a bad
    // line.
    virtual void init();
    // Reads the named IDCODE list file and its data-file section.
    virtual void read(const std::string& fileName, bool userEntry);
    // Reads an IDCODE list from in; fileName only labels messages.  A bad
    // line throws Jex_Exception with the parse message; the entries of the
    // lines before it stay.
    virtual void read(const std::string& fileName, std::istream& in, bool userEntry);
    // Deletes all entries; records taken before must not be used after.
    virtual void clear();
    // The record of the first entry that code matches (code is read with
    // IDCode::getIDCode32).  Throws Jex_Exception "Invalid DeviceRecord."
    // when no entry matches.
    virtual DeviceRecord getRecord(const IDCode& code) const;

    // The table, for inspection.
    const Jex_DeviceData& getDeviceData() const { return m_deviceData; }

private:
    Jex_DeviceData m_deviceData;
};

} // namespace JexRT
