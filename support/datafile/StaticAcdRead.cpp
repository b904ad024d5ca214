// SPDX-License-Identifier: MIT
#include "datafile/StaticAcdRead.hpp"

#include <fstream>

#include "hostlayer/Port_MsgDispatcher.hpp"
#include "platform/FileSystem.hpp"

namespace {

bool isBlank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f'; }

std::string trim(const std::string& text)
{
    size_t first = 0;
    size_t last = text.size();
    while (first < last && isBlank(text[first])) ++first;
    while (last > first && isBlank(text[last - 1])) --last;
    return text.substr(first, last - first);
}

std::string baseName(const std::string& path)
{
    const size_t slash = path.rfind(jexplatform::kPathSeparator);
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

std::wstring widen(const std::string& text) { return std::wstring(text.begin(), text.end()); }

} // namespace

std::string StaticAcdRead::dataFileNameFor(const std::string& listName)
{
    const size_t slash = listName.rfind(jexplatform::kPathSeparator);
    const size_t nameStart = (slash == std::string::npos) ? 0 : slash + 1;
    const size_t dot = listName.rfind('.');
    if (dot == std::string::npos || dot <= nameStart) return listName + ".acd";
    return listName.substr(0, dot) + ".acd";
}

StaticAcdRead::StaticAcdRead(const char* listName, const char* dataFileName,
                             const std::vector<std::string>* searchDirs, int lookBesideList, int warnOnBadFile,
                             int strict)
{
    std::string wanted;
    if (dataFileName) wanted = dataFileName;
    else if (listName) wanted = dataFileNameFor(listName);
    if (wanted.empty()) return;

    std::vector<std::string> candidates;
    if (lookBesideList) candidates.push_back(wanted);
    if (searchDirs)
        for (const std::string& dir : *searchDirs)
            if (!dir.empty()) {
                std::string path = dir;
                if (path.back() != jexplatform::kPathSeparator) path += jexplatform::kPathSeparator;
                candidates.push_back(path + baseName(wanted));
            }

    for (const std::string& path : candidates) {
        if (!jexplatform::isReadable(path) || jexplatform::isDirectory(path)) continue;
        std::string problem;
        if (parse(path, strict != 0, problem)) {
            m_valid = true;
            m_location = path;
        } else {
            m_values.clear();
            if (warnOnBadFile)
                Port_MsgDispatcher::dispatch(Port_MsgMan::MSG_WARNING,
                                             widen("Data file " + path + ": " + problem).c_str());
        }
        return; // the first data file found decides
    }
}

bool StaticAcdRead::parse(const std::string& path, bool strict, std::string& problem)
{
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        problem = "cannot be read";
        return false;
    }
    std::string line;
    unsigned lineNumber = 0;
    while (std::getline(in, line)) {
        ++lineNumber;
        const std::string trimmed = trim(line);
        if (trimmed.empty() || trimmed[0] == '#' || trimmed[0] == ';') continue;
        const size_t eq = line.find('=');
        const std::string key = (eq == std::string::npos) ? std::string() : trim(line.substr(0, eq));
        if (key.empty()) {
            if (!strict) continue;
            problem = "line " + std::to_string(lineNumber) + " is not KEY=value";
            return false;
        }
        std::string value = line.substr(eq + 1);
        if (!value.empty() && value.back() == '\r') value.pop_back();
        m_values.emplace_back(key, std::move(value));
    }
    if (in.bad()) {
        problem = "read error";
        return false;
    }
    return true;
}

std::string StaticAcdRead::GetStringByKey(const char* key, const char* subKey, int index,
                                          const char* defaultValue, int /*flags*/) const
{
    const std::string fallback = defaultValue ? defaultValue : "";
    if (!m_valid || !key || index < 0) return fallback;
    std::string wanted = key;
    if (subKey) wanted += std::string(".") + subKey;
    int seen = 0;
    for (const auto& [k, v] : m_values)
        if (k == wanted && seen++ == index) return v;
    return fallback;
}
