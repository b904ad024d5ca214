// SPDX-License-Identifier: MIT
#pragma once
// Jex_OneDeviceData - one entry of an IDCODE list: a 32-bit IDCODE pattern
// with don't-care positions, the device's instruction-register length, two
// classification numbers and its name.

#include <iosfwd>
#include <string>

#include "../export.h"

namespace JexRT {

class JEXJTAG_API Jex_OneDeviceData {
public:
    // Number of characters of a pattern.
    static const int IDCODE_BIT_LEN = 32;

    // pattern: exactly 32 characters, each '0', '1', 'X' or 'x' (both
    // don't-care), the first one bit 31.  Throws std::invalid_argument for
    // any other pattern.  userEntry marks an entry of a list that a caller
    // added, as opposed to the installation's list.
    Jex_OneDeviceData(const std::string& pattern, const std::string& name, int irLength, int familyType,
                      int subType, bool userEntry);
    Jex_OneDeviceData(const Jex_OneDeviceData& other) = default;
    Jex_OneDeviceData& operator=(const Jex_OneDeviceData& other) = default;
    ~Jex_OneDeviceData() = default;

    int getIRLength() const { return irLength; }
    int getFamilyType() const { return familyType; }
    int getSubType() const { return subType; }
    std::string getName() const { return name; }
    bool isUserEntry() const { return userEntry; }

    // The pattern as read (underscores removed, case of 'x' kept).
    const std::string& getMatchText() const { return matchText; }
    // Bit set where the pattern has '0' or '1'.
    unsigned int getNonXMask() const { return static_cast<unsigned int>(nonXMask); }
    // Bit set where the pattern has '1'.
    unsigned int getIdcode() const { return static_cast<unsigned int>(idcode); }
    // The low 12 bits of getIdcode() (manufacturer code and bit 0).
    unsigned int getMfg() const { return static_cast<unsigned int>(mfg); }

    // True when code has the pattern's bit on every '0'/'1' position.
    bool isMatch(int code) const
    {
        const unsigned int mask = static_cast<unsigned int>(nonXMask);
        return (mask & static_cast<unsigned int>(code)) == (static_cast<unsigned int>(idcode) & mask);
    }
    // 32 characters '0'/'1', bit 31 first.
    static std::string intIdcodeToString(int code);

private:
    friend JEXJTAG_API std::ostream& operator<<(std::ostream& out, const Jex_OneDeviceData& entry);

    std::string matchText;
    int mfg = 0;
    int nonXMask = 0;
    int idcode = 0;
    std::string name;
    int irLength = 0;
    int familyType = 0;
    int subType = 0;
    bool userEntry = false;
};

// Diagnostic form of an entry, four lines:
//   org. match value:'<pattern>'
//   name:'<name>' ir length:<decimal> mfg:<3 hex digits> userentry:<1|0>
//   idcode  :<8 hex digits>
//   nonXMask:<8 hex digits>
// The stream's format flags are restored afterwards.
JEXJTAG_API std::ostream& operator<<(std::ostream& out, const Jex_OneDeviceData& entry);

} // namespace JexRT
