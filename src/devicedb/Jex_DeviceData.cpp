// SPDX-License-Identifier: MIT
#include "jexjtag/rt/Jex_DeviceData.hpp"

#include <algorithm>
#include <climits>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <ostream>
#include <sstream>
#include <stdexcept>

#include "datafile/StaticAcdRead.hpp"
#include "platform/FileSystem.hpp"

namespace JexRT {

namespace {

constexpr size_t kReservedEntries = 300;
constexpr size_t kPatternLength = static_cast<size_t>(Jex_OneDeviceData::IDCODE_BIT_LEN);
constexpr int kMaxIRLength = 4096;

// White space as the C locale's isspace sees it, whatever the global locale.
bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\v' || c == '\f' || c == '\r'; }
bool isSeparator(char c) { return isSpace(c) || c == ','; }
bool isDigit(char c) { return c >= '0' && c <= '9'; }

// A decimal field of a list line: where it is, and its value.
struct NumberField {
    bool empty = true;
    bool tooLarge = false;
    int value = 0;
};

} // namespace

Jex_DeviceData::Jex_DeviceData() { m_entries.reserve(kReservedEntries); }

Jex_DeviceData::~Jex_DeviceData() = default;

void Jex_DeviceData::throwLogicError(const char* fileName, int lineNumber, const char* message)
{
    throw std::logic_error(std::string("Input error in file: ") + (fileName ? fileName : "") +
                           " line:" + std::to_string(lineNumber) + " - " + message);
}

Jex_OneDeviceData* Jex_DeviceData::readInEntry(const char* fileName, int lineNumber, const std::string& line,
                                               bool userEntry)
{
    const size_t n = line.size();
    size_t i = 0;
    while (i < n && isSpace(line[i])) ++i;

    // The pattern: only its first 33 characters are kept, enough to tell
    // that a longer one is wrong.
    std::string pattern;
    bool comment = false;
    for (; i < n && !isSeparator(line[i]); ++i) {
        const char c = line[i];
        if (c == '0' || c == '1' || c == 'X' || c == 'x') {
            if (pattern.size() <= kPatternLength) pattern += c;
        } else if (c == '#') {
            comment = true;
            break;
        } else if (c != '_') {
            throwLogicError(fileName, lineNumber, "invalid character in idcode.");
        }
    }

    NumberField fields[3];
    static const char* const kNonDigit[3] = {"non-digit character in register length.",
                                             "non-digit character in family type.",
                                             "non-digit character in sub type."};
    size_t nameStart = i;
    size_t nameEnd = i;
    if (!comment) {
        for (int f = 0; f < 3; ++f) {
            while (i < n && isSeparator(line[i])) ++i;
            NumberField& field = fields[f];
            std::uint64_t value = 0;
            for (; i < n && !isSeparator(line[i]); ++i) {
                if (!isDigit(line[i])) throwLogicError(fileName, lineNumber, kNonDigit[f]);
                field.empty = false;
                value = value * 10 + static_cast<unsigned>(line[i] - '0');
                if (value > static_cast<std::uint64_t>(INT_MAX)) {
                    field.tooLarge = true;
                    value = static_cast<std::uint64_t>(INT_MAX) + 1; // stays above the limit
                }
            }
            field.value = field.tooLarge ? 0 : static_cast<int>(value);
        }
        while (i < n && isSeparator(line[i])) ++i;
        nameStart = i;
        while (i < n && !isSpace(line[i]) && line[i] != '#') ++i;
        nameEnd = i;
    }
    const size_t nameLength = nameEnd - nameStart;

    if (pattern.empty() && fields[0].empty && fields[1].empty && nameLength == 0) return nullptr;
    if (pattern.size() != kPatternLength || nameLength < 2) throwLogicError(fileName, lineNumber, "bad data.");
    for (const NumberField& field : fields)
        if (field.empty || field.tooLarge) throwLogicError(fileName, lineNumber, "bad data.");
    // No device has a longer instruction register (the BSDL reader's limit too).
    if (fields[0].value > kMaxIRLength) throwLogicError(fileName, lineNumber, "bad data.");

    return new Jex_OneDeviceData(pattern, line.substr(nameStart, nameLength), fields[0].value, fields[1].value,
                                 fields[2].value, userEntry);
}

bool Jex_DeviceData::entryCompare(const Jex_OneDeviceData* a, const Jex_OneDeviceData* b)
{
    // Byte order of the patterns, with 'x' taken as 'X': the two spellings
    // of a don't-care bit are the same pattern.
    const std::string& ta = a->getMatchText();
    const std::string& tb = b->getMatchText();
    const size_t n = std::min(ta.size(), tb.size());
    for (size_t i = 0; i < n; ++i) {
        const char ca = ta[i] == 'x' ? 'X' : ta[i];
        const char cb = tb[i] == 'x' ? 'X' : tb[i];
        if (ca != cb) return static_cast<unsigned char>(ca) < static_cast<unsigned char>(cb);
    }
    if (ta.size() != tb.size()) return ta.size() < tb.size();
    return a->isUserEntry() && !b->isUserEntry();
}

void Jex_DeviceData::sortEntries()
{
    // The entries up to m_sortedCount are in order already: sort only what
    // came after them and merge the two runs, so adding a short list to a
    // long table costs little more than one pass over the table.
    const auto less = [](const std::unique_ptr<Jex_OneDeviceData>& a, const std::unique_ptr<Jex_OneDeviceData>& b) {
        return entryCompare(a.get(), b.get());
    };
    const auto middle = m_entries.begin() + static_cast<std::ptrdiff_t>(m_sortedCount);
    // Stable: entries of identical text keep the order they were read in.
    std::stable_sort(middle, m_entries.end(), less);
    std::inplace_merge(m_entries.begin(), middle, m_entries.end(), less);
    m_sortedCount = m_entries.size();
}

void Jex_DeviceData::addEntriesFromFile(const char* fileName, std::istream& in, bool userEntry)
{
    std::string line;
    int lineNumber = 0;
    try {
        while (std::getline(in, line)) {
            std::unique_ptr<Jex_OneDeviceData> entry(readInEntry(fileName, lineNumber, line, userEntry));
            if (entry) m_entries.push_back(std::move(entry));
            if (lineNumber < INT_MAX) ++lineNumber;
        }
    } catch (...) {
        sortEntries(); // the entries kept before a bad line take part in lookups
        throw;
    }
    sortEntries();
}

void Jex_DeviceData::addEntriesFromFile(const char* fileName, bool userEntry)
{
    const std::string name = fileName ? fileName : "";
    std::ifstream in;
    if (!name.empty() && !jexplatform::isDirectory(name)) in.open(name);
    if (!in.is_open()) throw std::logic_error("Error: Unable to open " + name);
    addEntriesFromFile(name.c_str(), in, userEntry);
    if (in.bad()) throw std::logic_error("Error: Unable to read " + name);

    StaticAcdRead dataFile(name.c_str(), nullptr, nullptr, 1, 0, 1);
    if (!dataFile.IsValid()) return;
    std::string list = dataFile.GetStringByKey("IDCODELIST", nullptr, 0, nullptr, 0);
    std::replace(list.begin(), list.end(), ':', '\n');
    if (list.empty()) return;
    std::istringstream listStream(list);
    const std::string location = dataFile.getlocation();
    addEntriesFromFile(location.c_str(), listStream, userEntry);
}

const Jex_OneDeviceData* Jex_DeviceData::findByIdcode(int code) const
{
    for (const auto& entry : m_entries)
        if (entry->isMatch(code)) return entry.get();
    return nullptr;
}

int Jex_DeviceData::getIRLength(int code) const
{
    const Jex_OneDeviceData* entry = findByIdcode(code);
    return entry ? entry->getIRLength() : 0;
}

std::string Jex_DeviceData::getDeviceName(int code) const
{
    const Jex_OneDeviceData* entry = findByIdcode(code);
    return entry ? entry->getName() : std::string();
}

void Jex_DeviceData::getFamilyTypeByIdcode(int code, int* familyType, int* subType) const
{
    const Jex_OneDeviceData* entry = findByIdcode(code);
    if (familyType) *familyType = entry ? entry->getFamilyType() : 0;
    if (subType) *subType = entry ? entry->getSubType() : 0;
}

void Jex_DeviceData::resetEntries()
{
    m_entries.clear();
    m_sortedCount = 0;
}

std::ostream& operator<<(std::ostream& out, const Jex_DeviceData& table)
{
    const std::ios_base::fmtflags flags = out.flags();
    for (size_t i = 0; i < table.getEntryCount(); ++i)
        out << "Entry " << std::dec << i << ":\n" << table.getEntry(i) << "\n";
    out.flags(flags);
    return out;
}

} // namespace JexRT
