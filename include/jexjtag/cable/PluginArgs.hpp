// SPDX-License-Identifier: MIT
#pragma once
// The open arguments of a plug-in instance: NUL-terminated "key=value"
// texts.  Keys compare without regard to case; when a key occurs more than
// once the last occurrence counts.  An argument without '=' is a key with an
// empty value.

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace jexcable {

class PluginArgs {
public:
    PluginArgs() = default;
    // Null argv, or null entries in it, are skipped.
    PluginArgs(uint32_t argc, const char* const* argv);

    // The value of the last argument with this key, if any.
    std::optional<std::string> get(const std::string& key) const;
    bool has(const std::string& key) const { return get(key).has_value(); }
    // Every argument in order, keys as given.
    const std::vector<std::pair<std::string, std::string>>& entries() const { return m_entries; }

    static bool equalsIgnoreCase(const std::string& a, const std::string& b);
    static std::string toLower(std::string text);
    static std::string trim(const std::string& text);
    // A frequency in Hz: decimal digits with an optional k (1000) or M
    // (1000000) suffix, 1 Hz to maxHz.  False (hz untouched) otherwise.
    static bool parseFrequency(const std::string& text, uint64_t maxHz, uint64_t& hz);
    // 1/true/yes/on or 0/false/no/off, in any case.  False (flag untouched)
    // otherwise.
    static bool parseFlag(const std::string& text, bool& flag);

private:
    std::vector<std::pair<std::string, std::string>> m_entries;
};

} // namespace jexcable
