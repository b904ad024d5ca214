// SPDX-License-Identifier: MIT
#pragma once
// Reads back what test modules recorded with tests/support/EntryLog.h.
// Construct one per test: it points JEXJTAG_TEST_ENTRY_LOG at a fresh file
// for its scope.

#include <algorithm>
#include <string>
#include <vector>

#include "support/EntryLog.h"
#include "support/TestSupport.hpp"

namespace testsupport {

class EntryLog {
public:
    EntryLog() : m_env(JEXJTAG_TEST_ENTRY_LOG_ENV, (m_dir / "entries.txt").string()) {}

    // Every recorded line, in order, without its line end.
    std::vector<std::string> lines() const
    {
        std::vector<std::string> out;
        const std::string text = readFile(m_dir / "entries.txt");
        size_t pos = 0;
        while (pos < text.size()) {
            size_t end = text.find('\n', pos);
            if (end == std::string::npos) end = text.size();
            out.push_back(text.substr(pos, end - pos));
            pos = end + 1;
        }
        return out;
    }
    // The events of one module ("<module> " removed), in order.
    std::vector<std::string> of(const std::string& module) const
    {
        std::vector<std::string> out;
        const std::string prefix = module + " ";
        for (const std::string& line : lines())
            if (line.compare(0, prefix.size(), prefix) == 0) out.push_back(line.substr(prefix.size()));
        return out;
    }
    size_t count(const std::string& line) const
    {
        const std::vector<std::string> all = lines();
        return static_cast<size_t>(std::count(all.begin(), all.end(), line));
    }
    // Forgets everything recorded so far.
    void clear() const { writeFile(m_dir / "entries.txt", ""); }

private:
    TempDir m_dir;
    ScopedEnv m_env;
};

} // namespace testsupport
