// SPDX-License-Identifier: MIT
#pragma once
// BsdlLibrary - BSDL files indexed by their IDCODE_REGISTER, X bits as
// don't-care, for naming the devices of a chain.  Each file is read once,
// when its directory is added; only what a lookup answers is kept.

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace JexRT {

class BsdlLibrary {
public:
    struct Entry {
        uint32_t mask = 0;  // bits the IDCODE_REGISTER fixes
        uint32_t value = 0; // their values
        std::string entity;
        unsigned irLength = 0;
        std::string path;
    };

    // Reports a file that was skipped and why.
    using SkipReport = std::function<void(const std::string& path, const std::string& reason)>;

    // Reads every .bsd, .bsdl and .bsm file (any case) of the directory, in
    // name order; false when the directory cannot be read.  `added` gets
    // the number of files indexed.
    bool addDirectory(const std::string& directory, unsigned& added, const SkipReport& skipped);
    // The matching entry that fixes the most bits (the first added of
    // those); null when none matches.
    const Entry* find(uint32_t idcode) const;
    size_t size() const { return m_entries.size(); }

private:
    std::vector<Entry> m_entries;
};

} // namespace JexRT
