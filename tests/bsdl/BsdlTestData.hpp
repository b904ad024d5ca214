// SPDX-License-Identifier: MIT
#pragma once
// The vendor files in data/ and what MANIFEST.tsv says each must yield.

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

const std::string kData = BSDL_TEST_DATA_DIR;

struct ManifestRow {
    std::string file, entity, irLength, idcode, bypass, allBypass;
};

inline std::vector<ManifestRow> readManifest()
{
    std::ifstream in(kData + "/MANIFEST.tsv");
    std::vector<ManifestRow> rows;
    std::string line;
    std::getline(in, line); // column names
    while (std::getline(in, line)) {
        std::vector<std::string> f;
        std::stringstream s(line);
        for (std::string field; std::getline(s, field, '\t');) f.push_back(field);
        if (f.size() >= 6) rows.push_back({f[0], f[1], f[2], f[3], f[4], f[5]});
    }
    return rows;
}

// The number of .bsd files in data/: each must have its manifest row.
inline size_t vendorFileCount()
{
    size_t n = 0;
    for (const auto& entry : std::filesystem::directory_iterator(kData)) n += entry.path().extension() == ".bsd";
    return n;
}
