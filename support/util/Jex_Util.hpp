// SPDX-License-Identifier: MIT
#pragma once
// Jex_Util - argument, text and directory helpers of the library.

#include <string>
#include <vector>

#include "jexjtag/rt/Jex_Exception.hpp"

class Jex_Util {
public:
    // Value of the "key=value" argument whose key equals `key` ignoring
    // case; the last such argument wins.  "" when absent.  Null entries are
    // skipped.
    static std::string findKey(const std::vector<std::string>& args, const std::string& key);
    static std::string findKey(unsigned argc, const char* const* argv, const std::string& key);

    // 0 when equal ignoring (ASCII) case, else <0 or >0 like strcmp.
    static int stricmp(const std::string& a, const std::string& b);
    static int stricmp(const char* a, const char* b);
    static int strnicmp(const char* a, const char* b, size_t n);
    // The text without leading and trailing white space.
    static std::string trimWhitespace(const std::string& text);

    // Directory (no trailing separator) of the loaded library named
    // `libraryName` ("libJexJtag"): the directory of this library's file.
    static std::string findLibInPath(const std::string& libraryName);
    // Fills `names` with the bare entry names of `dir` (sorted; no "." or
    // ".."); `recursive` is not supported and must be false.
    static void getDirectoryFileList(const std::string& dir, bool recursive, std::vector<std::string>& names);
    // Non-zero for a directory.
    static int isDirectory(const std::string& path);

    // Installation data directory, always ending in a separator: the one set
    // with setUserDataDirPath, else $JEXJTAG_DATA_DIR, else
    // <library dir>/../share/jexjtag/ (or <library dir>/../../share/jexjtag/
    // when only that exists: the library in a multiarch lib/<triplet>/).
    static std::string getDataDirPath();
    // Installation plug-in root (no trailing separator): <library dir>/jexjtag/plugins
    // when that is a directory (installed packages), else <library dir>/plugins
    // (the build tree).
    static std::string getPluginRootPath();
    // Process-wide override of the data directory ("" restores the default).
    static void setUserDataDirPath(const std::string& dir);

    // Creates a new private temporary file for `name` in the directory of
    // privateTemporaryDirectory() and returns its full path.  Separators and
    // ".." in name are neutralised, so the file never lands outside that
    // directory; the file is created exclusively with mode 0600 under a
    // unique suffix.  Throws Jex_Exception when it cannot.
    static std::string createDotLumenfoldTempFile(const std::string& name);
    // The per-user ".lumenfold" directory.
    static std::string dotLumenfoldDirectory();
    // Makes sure a private (0700, this user's) directory for temporary files
    // exists and returns it: $HOME/.lumenfold, or when that cannot be used,
    // the per-user directory jexjtag-lumenfold-<uid> under $XDG_RUNTIME_DIR,
    // $TMPDIR or /tmp.  Throws Jex_Exception when neither can be used.
    static std::string privateTemporaryDirectory();
};

// Narrow text (current locale) of a host-layer wide message; characters the
// locale cannot represent become '?'.
std::string getLocalizedPortMsg(const std::wstring& text);
std::string getLocalizedPortMsg(const wchar_t* text);
