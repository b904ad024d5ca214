// SPDX-License-Identifier: MIT
#include "util/Jex_Util.hpp"

#include <cctype>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <mutex>

#include "platform/FileSystem.hpp"
#include "platform/Process.hpp"

namespace {

// The data directory a session set, shared by every thread; never
// destroyed, like the library's other process-wide state.
struct UserDataDir {
    std::mutex mutex;
    std::string dir;
};

UserDataDir& userDataDir()
{
    static UserDataDir* const dir = new UserDataDir();
    return *dir;
}

std::string withTrailingSeparator(std::string dir)
{
    if (dir.empty() || dir.back() != jexplatform::kPathSeparator) dir += jexplatform::kPathSeparator;
    return dir;
}

// Value of `arg` when it is "key=value" with key equal to `key` ignoring case.
bool matchKey(const char* arg, const std::string& key, std::string& value)
{
    if (!arg) return false;
    const char* eq = std::strchr(arg, '=');
    if (!eq || static_cast<size_t>(eq - arg) != key.size()) return false;
    if (Jex_Util::strnicmp(arg, key.c_str(), key.size()) != 0) return false;
    value = eq + 1;
    return true;
}

} // namespace

std::string Jex_Util::findKey(const std::vector<std::string>& args, const std::string& key)
{
    std::string value;
    std::string found;
    for (const std::string& arg : args)
        if (matchKey(arg.c_str(), key, value)) found = value;
    return found;
}

std::string Jex_Util::findKey(unsigned argc, const char* const* argv, const std::string& key)
{
    std::string value;
    std::string found;
    if (!argv) return found;
    for (unsigned i = 0; i < argc; ++i)
        if (matchKey(argv[i], key, value)) found = value;
    return found;
}

int Jex_Util::stricmp(const std::string& a, const std::string& b) { return stricmp(a.c_str(), b.c_str()); }

int Jex_Util::stricmp(const char* a, const char* b) { return strnicmp(a, b, SIZE_MAX); }

int Jex_Util::strnicmp(const char* a, const char* b, size_t n)
{
    if (!a || !b) return (a == b) ? 0 : (a ? 1 : -1);
    for (size_t i = 0; i < n; ++i) {
        const int ca = std::tolower(static_cast<unsigned char>(a[i]));
        const int cb = std::tolower(static_cast<unsigned char>(b[i]));
        if (ca != cb) return ca - cb;
        if (ca == 0) return 0;
    }
    return 0;
}

std::string Jex_Util::trimWhitespace(const std::string& text)
{
    size_t first = 0;
    size_t last = text.size();
    while (first < last && std::isspace(static_cast<unsigned char>(text[first]))) ++first;
    while (last > first && std::isspace(static_cast<unsigned char>(text[last - 1]))) --last;
    return text.substr(first, last - first);
}

std::string Jex_Util::findLibInPath(const std::string& /*libraryName*/)
{
    // The only library this is asked for is the one this code is linked into.
    static const int anchor = 0;
    return jexplatform::moduleDirectoryOf(&anchor);
}

void Jex_Util::getDirectoryFileList(const std::string& dir, bool /*recursive*/, std::vector<std::string>& names)
{
    names = jexplatform::listDirectory(dir);
}

int Jex_Util::isDirectory(const std::string& path) { return jexplatform::isDirectory(path) ? 1 : 0; }

std::string Jex_Util::getDataDirPath()
{
    {
        std::lock_guard<std::mutex> lock(userDataDir().mutex);
        if (!userDataDir().dir.empty()) return withTrailingSeparator(userDataDir().dir);
    }
    const std::string env = jexplatform::environment("JEXJTAG_DATA_DIR");
    if (!env.empty()) return withTrailingSeparator(env);
    // <prefix>/lib/libJexJtag.so finds <prefix>/share/jexjtag; a Debian
    // multiarch library, <prefix>/lib/<triplet>/libJexJtag.so, one level more.
    const std::string libDir = findLibInPath("libJexJtag");
    const std::string beside = libDir + "/../share/jexjtag";
    const std::string multiarch = libDir + "/../../share/jexjtag";
    if (!jexplatform::isDirectory(beside) && jexplatform::isDirectory(multiarch))
        return withTrailingSeparator(multiarch);
    return withTrailingSeparator(beside);
}

std::string Jex_Util::getPluginRootPath()
{
    const std::string libDir = findLibInPath("libJexJtag");
    const std::string packaged = libDir + "/jexjtag/plugins";
    if (jexplatform::isDirectory(packaged)) return packaged;
    return libDir + "/plugins";
}

void Jex_Util::setUserDataDirPath(const std::string& dir)
{
    std::lock_guard<std::mutex> lock(userDataDir().mutex);
    userDataDir().dir = dir;
}

std::string Jex_Util::dotLumenfoldDirectory()
{
    const std::string home = jexplatform::homeDirectory();
    if (home.empty()) throw Jex_Exception("Could not find the home directory for the .lumenfold directory.");
    return home + jexplatform::kPathSeparator + ".lumenfold";
}

std::string Jex_Util::privateTemporaryDirectory()
{
    // The home directory's .lumenfold, made private; when the home directory
    // is unusable (system users have none), a per-user one elsewhere.
    std::string homeReason = "no home directory";
    std::string dir;
    try {
        dir = dotLumenfoldDirectory();
        if (jexplatform::ensurePrivateDirectory(dir, homeReason)) return dir;
    } catch (const Jex_Exception&) {
    }
    const std::string fallback = jexplatform::perUserTemporaryDirectory("jexjtag-lumenfold");
    std::string reason;
    if (jexplatform::ensurePrivateDirectory(fallback, reason)) return fallback;
    throw Jex_Exception("Could not use the directory " + (dir.empty() ? std::string("~/.lumenfold") : dir) + ": " +
                        homeReason + ", nor " + fallback + ": " + reason + "\n");
}

std::string Jex_Util::createDotLumenfoldTempFile(const std::string& name)
{
    // Neutralise everything that could leave the directory: separators of
    // every platform, and names made only of dots.
    std::string base;
    for (char c : name) base += (c == '/' || c == '\\' || c == '\0') ? '_' : c;
    if (base.find_first_not_of('.') == std::string::npos) base = "tmp" + base;
    if (base.size() > 200) base.resize(200);

    const std::string dir = privateTemporaryDirectory();
    std::string reason;
    const std::string path = jexplatform::createUniqueFile(dir, base, reason);
    if (path.empty())
        throw Jex_Exception("Could not create temporary file: " + dir + jexplatform::kPathSeparator + base + ": " +
                            reason + "\n");
    return path;
}

std::string getLocalizedPortMsg(const wchar_t* text)
{
    std::string out;
    if (!text) return out;
    std::mbstate_t state {};
    char buffer[MB_LEN_MAX];
    for (const wchar_t* p = text; *p; ++p) {
        const size_t n = std::wcrtomb(buffer, *p, &state);
        if (n == static_cast<size_t>(-1)) {
            out += '?';
            state = std::mbstate_t {};
        } else {
            out.append(buffer, n);
        }
    }
    return out;
}

std::string getLocalizedPortMsg(const std::wstring& text) { return getLocalizedPortMsg(text.c_str()); }
