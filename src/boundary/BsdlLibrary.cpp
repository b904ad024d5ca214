// SPDX-License-Identifier: MIT
#include "boundary/BsdlLibrary.hpp"

#include "boundary/BsdlPart.hpp"
#include "bsdl/BsdlText.hpp"
#include "hostlayer/PortException.hpp"
#include "platform/FileSystem.hpp"
#include "util/Jex_Util.hpp"

namespace JexRT {

namespace {

bool isBsdlName(const std::string& name)
{
    const std::string upper = jexbsdl::upperCase(name);
    for (const char* ext : {".BSD", ".BSDL", ".BSM"}) {
        const std::string e(ext);
        if (upper.size() > e.size() && upper.compare(upper.size() - e.size(), e.size(), e) == 0) return true;
    }
    return false;
}

} // namespace

bool BsdlLibrary::addDirectory(const std::string& directory, unsigned& added, const SkipReport& skipped)
{
    added = 0;
    if (!jexplatform::isDirectory(directory)) return false;
    for (const std::string& name : jexplatform::listDirectory(directory)) {
        if (!isBsdlName(name)) continue;
        const std::string path = directory + jexplatform::kPathSeparator + name;
        if (jexplatform::isDirectory(path)) continue;
        std::unique_ptr<BsdlPart> part;
        try {
            part = BsdlPart::fromFile(path);
        } catch (const Port::Exception& e) {
            skipped(path, getLocalizedPortMsg(e.getMessage()));
            continue;
        }
        if (!part) {
            skipped(path, "it is not a BSDL file\n");
            continue;
        }
        const std::string& idcode = part->entity().idcode;
        if (idcode.size() != 32) {
            skipped(path, "it declares no IDCODE_REGISTER\n");
            continue;
        }
        Entry entry;
        for (char c : idcode) {
            entry.mask <<= 1;
            entry.value <<= 1;
            if (c == '0' || c == '1') entry.mask |= 1u;
            if (c == '1') entry.value |= 1u;
        }
        entry.entity = part->entity().name;
        entry.irLength = part->entity().instructionLength;
        entry.path = path;
        m_entries.push_back(std::move(entry));
        ++added;
    }
    return true;
}

const BsdlLibrary::Entry* BsdlLibrary::find(uint32_t idcode) const
{
    // The most specific pattern wins, so a file whose IDCODE was edited to
    // all don't-care bits only names what nothing else matches.
    const Entry* best = nullptr;
    int bestBits = -1;
    for (const Entry& entry : m_entries) {
        if ((idcode & entry.mask) != entry.value) continue;
        const int bits = __builtin_popcount(entry.mask);
        if (bits > bestBits) {
            best = &entry;
            bestBits = bits;
        }
    }
    return best;
}

} // namespace JexRT
