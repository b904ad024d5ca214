// SPDX-License-Identifier: MIT
#pragma once
// Jex_DeviceData - a table of IDCODE list entries.  It reads IDCODE lists
// from streams and files, keeps its entries sorted by the byte order of
// their pattern texts ('0' < '1' < 'X', with 'x' taken as 'X'), a caller's
// entry before an installation's of the same pattern and otherwise in the
// order read, and answers lookups by a 32-bit code with the first entry
// that matches.
//
// IDCODE list lines (the first line of a list is line 0):
//
//   <pattern> <IR length> <family type> <sub type> <name>  [ignored...]
//
// The pattern is 32 characters '0', '1', 'X' or 'x' (don't care), bit 31
// first; '_' may separate groups of bits.  Fields are separated by white
// space or commas (the name runs to the next white space or '#' and may
// hold commas).  '#' starts a comment in the pattern or right after the
// name; blank and comment-only lines carry no entry.  The three numbers
// are decimal, at most 2147483647 (the IR length at most 4096); the name
// has at least two characters.
// A bad line throws std::logic_error with the text
//   "Input error in file: <name> line:<n> - <reason>"
// where reason is "invalid character in idcode.", "non-digit character in
// register length.", "non-digit character in family type.", "non-digit
// character in sub type." or "bad data.".  Entries of the lines before a
// bad line stay in the table.

#include <cstddef>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

#include "../export.h"
#include "Jex_OneDeviceData.hpp"

namespace JexRT {

class JEXJTAG_API Jex_DeviceData {
public:
    // An empty table with room for 300 entries.
    Jex_DeviceData();
    ~Jex_DeviceData();
    // The table owns its entries; it is neither copied nor moved.
    Jex_DeviceData(const Jex_DeviceData&) = delete;
    Jex_DeviceData& operator=(const Jex_DeviceData&) = delete;

    // Reads every line of in as an IDCODE list line, appends the entries and
    // sorts the whole table.  fileName only labels error messages.  Throws
    // std::logic_error at the first bad line; the entries before it stay,
    // sorted in.
    void addEntriesFromFile(const char* fileName, std::istream& in, bool userEntry);
    // Reads the named file as above, then the "IDCODELIST" value of the data
    // file that belongs to it (NAME.acd beside NAME.lst), whose ':' stand
    // for line ends.  Throws std::logic_error "Error: Unable to open <name>"
    // when the file cannot be opened.  A missing or invalid data file is
    // skipped.
    void addEntriesFromFile(const char* fileName, bool userEntry);

    // The first entry, in table order, that code matches; null if none.
    const Jex_OneDeviceData* findByIdcode(int code) const;
    // IR length of the first match, 0 if none.
    int getIRLength(int code) const;
    // Name of the first match, "" if none.
    std::string getDeviceName(int code) const;
    // Family type and sub type of the first match, 0 and 0 if none.  Null
    // pointers are skipped.
    void getFamilyTypeByIdcode(int code, int* familyType, int* subType) const;

    // Deletes all entries.
    void resetEntries();

    // Number of entries, and the entry at index (table order).
    size_t getEntryCount() const { return m_entries.size(); }
    const Jex_OneDeviceData& getEntry(size_t index) const { return *m_entries.at(index); }

private:
    static Jex_OneDeviceData* readInEntry(const char* fileName, int lineNumber, const std::string& line,
                                          bool userEntry);
    [[noreturn]] static void throwLogicError(const char* fileName, int lineNumber, const char* message);
    static bool entryCompare(const Jex_OneDeviceData* a, const Jex_OneDeviceData* b);
    void sortEntries();

    std::vector<std::unique_ptr<Jex_OneDeviceData>> m_entries;
    size_t m_sortedCount = 0; // leading entries known to be in order
};

// Diagnostic form of the table: "Entry <index>:" (decimal), the entry's
// four lines and an empty line, for each entry in table order.
JEXJTAG_API std::ostream& operator<<(std::ostream& out, const Jex_DeviceData& table);

} // namespace JexRT
