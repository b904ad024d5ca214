// SPDX-License-Identifier: MIT
#include "jexjtag/rt/Jex_OneDeviceData.hpp"

#include <iomanip>
#include <ostream>
#include <stdexcept>

namespace JexRT {

Jex_OneDeviceData::Jex_OneDeviceData(const std::string& pattern, const std::string& name_, int irLength_,
                                     int familyType_, int subType_, bool userEntry_)
    : matchText(pattern), name(name_), irLength(irLength_), familyType(familyType_), subType(subType_),
      userEntry(userEntry_)
{
    if (pattern.size() != static_cast<size_t>(IDCODE_BIT_LEN))
        throw std::invalid_argument("IDCODE pattern must have 32 characters: '" + pattern + "'");
    unsigned int mask = 0;
    unsigned int bits = 0;
    for (char c : pattern) {
        mask <<= 1;
        bits <<= 1;
        switch (c) {
        case '0': mask |= 1u; break;
        case '1':
            mask |= 1u;
            bits |= 1u;
            break;
        case 'X':
        case 'x': break;
        default: throw std::invalid_argument("invalid character in IDCODE pattern: '" + pattern + "'");
        }
    }
    nonXMask = static_cast<int>(mask);
    idcode = static_cast<int>(bits);
    mfg = static_cast<int>(bits & 0xFFFu);
}

std::string Jex_OneDeviceData::intIdcodeToString(int code)
{
    const unsigned int value = static_cast<unsigned int>(code);
    std::string text(IDCODE_BIT_LEN, '0');
    for (int i = 0; i < IDCODE_BIT_LEN; ++i)
        if (value & (1u << (IDCODE_BIT_LEN - 1 - i))) text[static_cast<size_t>(i)] = '1';
    return text;
}

std::ostream& operator<<(std::ostream& out, const Jex_OneDeviceData& entry)
{
    const std::ios_base::fmtflags flags = out.flags();
    const char fill = out.fill();
    out << "org. match value:'" << entry.matchText << "'\n";
    out << "name:'" << entry.name << "'" << " ir length:" << std::dec << entry.irLength << " mfg:" << std::hex
        << std::setw(3) << std::setfill('0') << entry.getMfg() << " userentry:" << (entry.userEntry ? 1 : 0)
        << "\n";
    out << "idcode  :" << std::hex << std::setw(8) << std::setfill('0') << entry.getIdcode() << "\n";
    out << "nonXMask:" << std::hex << std::setw(8) << std::setfill('0') << entry.getNonXMask() << "\n";
    out.flags(flags);
    out.fill(fill);
    return out;
}

} // namespace JexRT
