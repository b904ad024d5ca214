// SPDX-License-Identifier: MIT
#include "jexjtag/cable/PluginArgs.hpp"

#include <cctype>

namespace jexcable {

PluginArgs::PluginArgs(uint32_t argc, const char* const* argv)
{
    if (!argv) return;
    for (uint32_t i = 0; i < argc; ++i) {
        if (!argv[i]) continue;
        const std::string text = argv[i];
        const std::size_t eq = text.find('=');
        if (eq == std::string::npos) m_entries.emplace_back(trim(text), std::string());
        else m_entries.emplace_back(trim(text.substr(0, eq)), text.substr(eq + 1));
    }
}

std::optional<std::string> PluginArgs::get(const std::string& key) const
{
    for (auto it = m_entries.rbegin(); it != m_entries.rend(); ++it)
        if (equalsIgnoreCase(it->first, key)) return it->second;
    return std::nullopt;
}

bool PluginArgs::equalsIgnoreCase(const std::string& a, const std::string& b)
{
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (std::tolower(static_cast<unsigned char>(a[i])) != std::tolower(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

std::string PluginArgs::toLower(std::string text)
{
    for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

std::string PluginArgs::trim(const std::string& text)
{
    std::size_t begin = 0;
    std::size_t end = text.size();
    while (begin < end && std::isspace(static_cast<unsigned char>(text[begin]))) ++begin;
    while (end > begin && std::isspace(static_cast<unsigned char>(text[end - 1]))) --end;
    return text.substr(begin, end - begin);
}

bool PluginArgs::parseFrequency(const std::string& text, uint64_t maxHz, uint64_t& hz)
{
    std::string digits = trim(text);
    uint64_t scale = 1;
    if (!digits.empty()) {
        const char last = digits.back();
        if (last == 'k' || last == 'K') scale = 1000;
        else if (last == 'M') scale = 1000000;
        if (scale != 1) digits.pop_back();
    }
    if (digits.empty() || digits.size() > 10) return false;
    uint64_t value = 0;
    for (const char c : digits) {
        if (c < '0' || c > '9') return false;
        value = value * 10 + static_cast<uint64_t>(c - '0');
    }
    value *= scale;
    if (value == 0 || value > maxHz) return false;
    hz = value;
    return true;
}

bool PluginArgs::parseFlag(const std::string& text, bool& flag)
{
    const std::string t = toLower(trim(text));
    if (t == "1" || t == "true" || t == "yes" || t == "on") flag = true;
    else if (t == "0" || t == "false" || t == "no" || t == "off") flag = false;
    else return false;
    return true;
}

} // namespace jexcable
