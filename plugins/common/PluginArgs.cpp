#include "PluginArgs.hpp"

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

} // namespace jexcable
