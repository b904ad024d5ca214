// SPDX-License-Identifier: MIT
#include "jexjtag/rt/DeviceDB.hpp"

#include <stdexcept>

#include "jexjtag/rt/Jex_Exception.hpp"
#include "util/Jex_Util.hpp"
#include "util/Logger.hpp"

namespace JexRT {

DeviceDB::DeviceDB() = default;

DeviceDB::~DeviceDB() = default;

void DeviceDB::init()
{
    // The data directory path always ends in a separator.
    const std::string path = Jex_Util::getDataDirPath() + "idcode.lst";
    Logger::logger.printLog(2, "*** Opening file %s\n", path.c_str());
    read(path, false);
}

void DeviceDB::read(const std::string& fileName, bool userEntry)
{
    Logger::logger.printLog(2, "*** Reached DeviceDB::read  filename=%s (and .acd if available)\n",
                            fileName.c_str());
    try {
        m_deviceData.addEntriesFromFile(fileName.c_str(), userEntry);
    } catch (const std::logic_error& e) {
        Logger::logger.printLog(2, "*** EXCEPTION: %s\n", e.what());
        throw Jex_Exception(e.what());
    }
    Logger::logger.printLog(2, "*** Successfully completed DeviceDB::read\n");
}

void DeviceDB::read(const std::string& fileName, std::istream& in, bool userEntry)
{
    Logger::logger.printLog(2, "*** Reached DeviceDB::read  filename=%s\n", fileName.c_str());
    try {
        m_deviceData.addEntriesFromFile(fileName.c_str(), in, userEntry);
    } catch (const std::logic_error& e) {
        Logger::logger.printLog(2, "*** EXCEPTION: %s\n", e.what());
        throw Jex_Exception(e.what());
    }
    Logger::logger.printLog(2, "*** Successfully completed DeviceDB::read\n");
}

void DeviceDB::clear() { m_deviceData.resetEntries(); }

DeviceRecord DeviceDB::getRecord(const IDCode& code) const
{
    const Jex_OneDeviceData* entry = m_deviceData.findByIdcode(static_cast<int>(code.getIDCode32()));
    if (!entry) throw Jex_Exception("Invalid DeviceRecord.");
    return DeviceRecord(entry);
}

} // namespace JexRT
