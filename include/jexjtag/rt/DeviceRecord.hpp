// SPDX-License-Identifier: MIT
#pragma once
// DeviceRecord - the answer of the device database for one IDCODE: a small
// handle on the matching entry.  The record does not own the entry; it is
// valid only while the entry stays in its database (until DeviceDB::clear
// or the database's destruction).

#include <string>

#include "../export.h"

namespace JexRT {

class Jex_OneDeviceData;

class JEXJTAG_API DeviceRecord {
public:
    // A record on entry; a null entry throws Jex_Exception
    // "Invalid DeviceRecord.".
    explicit DeviceRecord(const Jex_OneDeviceData* entry);
    DeviceRecord(const DeviceRecord& other) = default;
    DeviceRecord& operator=(const DeviceRecord& other) = default;
    virtual ~DeviceRecord();

    // Instruction-register length in bits.
    virtual unsigned int getIRLen() const;
    virtual unsigned int getFamilyType() const;
    virtual unsigned int getFamilySubType() const;
    virtual std::string getDeviceName() const;
    // True when the entry came from a list a caller added.
    virtual bool isUserList() const;

private:
    const Jex_OneDeviceData* m_entry;
};

} // namespace JexRT
