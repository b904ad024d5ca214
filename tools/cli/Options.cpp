// SPDX-License-Identifier: MIT
#include "Options.hpp"

#include "NumberText.hpp"
#include "UsageError.hpp"

namespace jexjtag::cli {

bool Options::flag(const std::string& name) const { return commandValues.count(name) != 0; }

std::optional<std::string> Options::value(const std::string& name) const
{
    const auto found = commandValues.find(name);
    if (found == commandValues.end() || found->second.empty()) return std::nullopt;
    return found->second.back();
}

std::vector<std::string> Options::values(const std::string& name) const
{
    const auto found = commandValues.find(name);
    return found == commandValues.end() ? std::vector<std::string>() : found->second;
}

std::optional<unsigned> Options::number(const std::string& name, unsigned maximum) const
{
    const auto text = value(name);
    if (!text) return std::nullopt;
    return optionNumber(name, *text, maximum);
}

unsigned optionNumber(const std::string& name, const std::string& value, unsigned maximum)
{
    const auto number = parseUnsigned(value, maximum);
    if (!number)
        throw UsageError("--" + name + " needs a number" +
                         (maximum != 0xFFFFFFFFu ? " from 0 to " + std::to_string(maximum) : std::string()) +
                         ", not '" + value + "'");
    return *number;
}

void checkNumberValue(const std::string& name, const std::string& value) { optionNumber(name, value); }

void checkNonEmptyValue(const std::string& name, const std::string& value)
{
    if (value.empty()) throw UsageError("--" + name + " needs a value");
}

} // namespace jexjtag::cli
