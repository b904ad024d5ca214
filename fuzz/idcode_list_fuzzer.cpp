// SPDX-License-Identifier: MIT
// Fuzz target of the IDCODE list reader: any input either reads or throws
// the reader's std::logic_error, and whatever is in the table afterwards
// keeps the table's invariants.

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <sstream>
#include <stdexcept>
#include <string>

#include "jexjtag/rt/Jex_DeviceData.hpp"

using JexRT::Jex_DeviceData;
using JexRT::Jex_OneDeviceData;

namespace {

void check(bool condition)
{
    if (!condition) __builtin_trap();
}

bool isSpace(char c) { return c == ' ' || c == '\t' || c == '\n' || c == '\v' || c == '\f' || c == '\r'; }

void checkEntry(const Jex_OneDeviceData& e)
{
    const std::string& text = e.getMatchText();
    check(text.size() == 32);
    for (char c : text) check(c == '0' || c == '1' || c == 'X' || c == 'x');
    check((e.getIdcode() & ~e.getNonXMask()) == 0);
    check(e.getMfg() == (e.getIdcode() & 0xFFFu));
    check(e.getIRLength() >= 0 && e.getFamilyType() >= 0 && e.getSubType() >= 0);
    const std::string name = e.getName();
    check(name.size() >= 2);
    for (char c : name) check(!isSpace(c) && c != '#');
    check(e.isMatch(static_cast<int>(e.getIdcode())));
}

// The table's order: pattern texts byte by byte with x read as X, caller's
// entries first among equal texts.
std::string orderKey(const Jex_OneDeviceData& e)
{
    std::string key = e.getMatchText();
    for (char& c : key)
        if (c == 'x') c = 'X';
    return key;
}

bool inOrder(const Jex_OneDeviceData& a, const Jex_OneDeviceData& b)
{
    const int order = orderKey(a).compare(orderKey(b));
    return order < 0 || (order == 0 && (a.isUserEntry() || !b.isUserEntry()));
}

// Reads text into table; true when it read completely.
bool readList(Jex_DeviceData& table, const std::string& text, bool user)
{
    const size_t before = table.getEntryCount();
    std::istringstream in(text);
    try {
        table.addEntriesFromFile("fuzz.lst", in, user);
        return true;
    } catch (const std::logic_error& e) {
        check(std::strncmp(e.what(), "Input error in file: fuzz.lst line:", 35) == 0);
        check(table.getEntryCount() >= before); // nothing already read is lost
        return false;
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    Jex_DeviceData table;
    bool sorted = readList(table, text, false);
    // The same text once more as a caller's list: its entries go first.
    sorted = readList(table, text, true) && sorted;

    for (size_t i = 0; i < table.getEntryCount(); ++i) {
        checkEntry(table.getEntry(i));
        if (sorted && i > 0) check(inOrder(table.getEntry(i - 1), table.getEntry(i)));
    }
    for (size_t i = 0; i < table.getEntryCount() && i < 8; ++i) {
        const int code = static_cast<int>(table.getEntry(i).getIdcode());
        const Jex_OneDeviceData* found = table.findByIdcode(code);
        check(found != nullptr && found->isMatch(code));
        if (sorted) check(found->isUserEntry() || !table.getEntry(i).isUserEntry());
    }
    std::ostringstream dump;
    dump << table;
    return 0;
}
