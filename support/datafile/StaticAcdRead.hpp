// SPDX-License-Identifier: MIT
#pragma once
// StaticAcdRead - reader of the installation data file that belongs to an
// IDCODE list.  For a list NAME.lst the data file is NAME.acd beside it: a
// text file of "KEY=value" lines.  Blank lines and lines whose first
// non-blank character is '#' or ';' are skipped; white space around a key
// is dropped, the value is everything after the first '=' (a carriage
// return at its end aside).  Keys are compared exactly.

#include <string>
#include <utility>
#include <vector>

class StaticAcdRead {
public:
    // listName: the file the data belongs to; the data file is its name
    //   with the extension replaced by ".acd" (".acd" appended when it has
    //   none).
    // dataFileName: when not null, the data file to read instead.
    // searchDirs: when not null, directories searched in order for the data
    //   file's bare name when it is not found at its place.
    // lookBesideList: 0 skips the place beside the list (only searchDirs).
    // warnOnBadFile: 1 raises a host-layer warning for a data file that
    //   exists but cannot be read or parsed; 0 stays silent.
    // strict: 1 makes a line that is not "KEY=value" invalidate the file;
    //   0 skips such lines.
    StaticAcdRead(const char* listName, const char* dataFileName, const std::vector<std::string>* searchDirs,
                  int lookBesideList, int warnOnBadFile, int strict);

    // True when a data file was found and parsed.
    bool IsValid() const { return m_valid; }
    // The value of the index-th (from 0) occurrence of key, or of
    // "key.subKey" when subKey is not null; defaultValue ("" when null) when
    // the file is not valid or has no such occurrence.  flags: reserved, 0.
    std::string GetStringByKey(const char* key, const char* subKey, int index, const char* defaultValue,
                               int flags) const;
    // Path of the data file that was read ("" when none).
    std::string getlocation() const { return m_location; }

    // The data file name that belongs to listName.
    static std::string dataFileNameFor(const std::string& listName);

private:
    bool parse(const std::string& path, bool strict, std::string& problem);

    bool m_valid = false;
    std::string m_location;
    std::vector<std::pair<std::string, std::string>> m_values;
};
