// SPDX-License-Identifier: MIT
// The session's device-database operations: a caller's IDCODE lists and
// lookups by IDCODE.

#include <exception>

#include "jexjtag/rt/Jex_Exception.hpp"
#include "session/Session.hpp"

namespace JexRT {

unsigned Session::addDeviceData(const std::string& name, std::istream& in)
{
    try {
        m_deviceDB.read(name, in, true);
        return JEX_SUCCESS;
    } catch (...) {
        return JEX_FAILURE;
    }
}

unsigned Session::idcodeLookup(const IDCode& idcode, std::string& deviceName, unsigned* irLength,
                               unsigned* familyType, unsigned* familySubType, std::string& bypass,
                               bool* isUserList)
{
    try {
        const DeviceRecord record = m_deviceDB.getRecord(idcode);
        deviceName = record.getDeviceName();
        if (irLength) *irLength = record.getIRLen();
        if (familyType) *familyType = record.getFamilyType();
        if (familySubType) *familySubType = record.getFamilySubType();
        if (isUserList) *isUserList = record.isUserList();
        // The BYPASS instruction is all ones, one per bit of the IR.
        bypass = irLength ? std::string(*irLength, '1') : std::string();
        return JEX_SUCCESS;
    } catch (const Jex_Exception&) {
        // No entry for the code: a device the database does not know.
        deviceName.clear();
        if (irLength) *irLength = 0;
        if (familyType) *familyType = 0;
        if (familySubType) *familySubType = 0;
        if (isUserList) *isUserList = false;
        return JEX_SUCCESS;
    } catch (...) {
        return JEX_FAILURE;
    }
}

} // namespace JexRT
