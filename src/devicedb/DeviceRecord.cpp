// SPDX-License-Identifier: MIT
#include "jexjtag/rt/DeviceRecord.hpp"

#include "jexjtag/rt/Jex_Exception.hpp"
#include "jexjtag/rt/Jex_OneDeviceData.hpp"

namespace JexRT {

DeviceRecord::DeviceRecord(const Jex_OneDeviceData* entry) : m_entry(entry)
{
    if (!m_entry) throw Jex_Exception("Invalid DeviceRecord.");
}

DeviceRecord::~DeviceRecord() { m_entry = nullptr; }

unsigned int DeviceRecord::getIRLen() const { return static_cast<unsigned int>(m_entry->getIRLength()); }
unsigned int DeviceRecord::getFamilyType() const { return static_cast<unsigned int>(m_entry->getFamilyType()); }
unsigned int DeviceRecord::getFamilySubType() const { return static_cast<unsigned int>(m_entry->getSubType()); }
std::string DeviceRecord::getDeviceName() const { return m_entry->getName(); }
bool DeviceRecord::isUserList() const { return m_entry->isUserEntry(); }

} // namespace JexRT
