// SPDX-License-Identifier: MIT
#pragma once
// Helpers shared by the tests: temporary directories, environment settings
// that are restored, a capture of the library's log, the messages a host
// receives, and bit buffers.

#include <bitset>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"

namespace testsupport {

// A fresh directory, removed with everything in it at the end of the scope.
class TempDir {
public:
    TempDir()
    {
        std::string pattern = (std::filesystem::temp_directory_path() / "jexjtag-test-XXXXXX").string();
        if (!mkdtemp(pattern.data())) throw std::runtime_error("mkdtemp failed");
        m_path = pattern;
    }
    ~TempDir()
    {
        std::error_code ec;
        std::filesystem::permissions(m_path, std::filesystem::perms::owner_all,
                                     std::filesystem::perm_options::add, ec);
        std::filesystem::remove_all(m_path, ec);
    }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;

    const std::filesystem::path& path() const { return m_path; }
    std::string str() const { return m_path.string(); }
    std::filesystem::path operator/(const std::string& name) const { return m_path / name; }

private:
    std::filesystem::path m_path;
};

// Sets an environment variable for the scope; restores the old value.
class ScopedEnv {
public:
    ScopedEnv(const char* name, const std::string& value) : m_name(name)
    {
        if (const char* old = std::getenv(name)) {
            m_hadValue = true;
            m_old = old;
        }
        setenv(name, value.c_str(), 1);
    }
    ~ScopedEnv()
    {
        if (m_hadValue) setenv(m_name.c_str(), m_old.c_str(), 1);
        else unsetenv(m_name.c_str());
    }
    ScopedEnv(const ScopedEnv&) = delete;
    ScopedEnv& operator=(const ScopedEnv&) = delete;

private:
    std::string m_name;
    std::string m_old;
    bool m_hadValue = false;
};

inline void writeFile(const std::filesystem::path& path, const std::string& text)
{
    std::filesystem::create_directories(path.parent_path());
    std::ofstream out(path, std::ios::binary);
    out << text;
}

inline std::string readFile(const std::filesystem::path& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream s;
    s << in.rdbuf();
    return s.str();
}

// Captures the library's log at `level` into a file for the scope.  Log
// lines come back without the logger's "[jexjtag N] " prefix, each with its
// line end.
class LogCapture {
public:
    explicit LogCapture(int level = 5)
        : m_level("JEXJTAG_LOG_LEVEL", std::to_string(level)),
          m_file("JEXJTAG_LOG_FILE", (m_dir / "log.txt").string())
    {
        applyLogSettings();
    }
    ~LogCapture()
    {
        unsetenv("JEXJTAG_LOG_LEVEL");
        unsetenv("JEXJTAG_LOG_FILE");
        applyLogSettings();
    }

    // The text of every line logged so far (prefix removed).
    std::vector<std::string> lines() const
    {
        std::vector<std::string> out;
        const std::string text = readFile(m_dir / "log.txt");
        size_t pos = 0;
        while (pos < text.size()) {
            size_t start = pos;
            if (text.compare(pos, 9, "[jexjtag ") == 0) {
                const size_t close = text.find("] ", pos);
                if (close != std::string::npos) start = close + 2;
            }
            size_t next = text.find("\n[jexjtag ", start);
            next = (next == std::string::npos) ? text.size() : next + 1;
            out.push_back(text.substr(start, next - start));
            pos = next;
        }
        return out;
    }
    // True when some line equals `line` exactly.
    bool has(const std::string& line) const
    {
        for (const std::string& l : lines())
            if (l == line) return true;
        return false;
    }
    size_t count(const std::string& line) const
    {
        size_t n = 0;
        for (const std::string& l : lines())
            if (l == line) ++n;
        return n;
    }
    std::string text() const { return readFile(m_dir / "log.txt"); }

private:
    // The logger rereads its settings whenever logging is started.
    static void applyLogSettings()
    {
        unsigned version = 0;
        JexJtag_session_getAPIVersion(&version, nullptr, 128);
    }

    TempDir m_dir;
    ScopedEnv m_level;
    ScopedEnv m_file;
};

// Points the library at an empty plug-in tree, a private home directory and
// a private data directory (holding a copy of the build's idcode.lst) for
// the scope, so a test sees only what it sets up.
class IsolatedEnvironment {
public:
    IsolatedEnvironment()
        : m_plugins("JEXJTAG_PLUGIN_DIR", (m_root / "plugins").string()),
          m_home("HOME", (m_root / "home").string()),
          m_data("JEXJTAG_DATA_DIR", (m_root / "share/jexjtag").string())
    {
        std::filesystem::create_directories(m_root / "plugins");
        std::filesystem::create_directories(m_root / "home");
        std::filesystem::create_directories(dataDir());
#ifdef JEXJTAG_TEST_BUILD_DIR
        std::filesystem::copy_file(std::filesystem::path(JEXJTAG_TEST_BUILD_DIR) / "share/jexjtag/idcode.lst",
                                   dataDir() / "idcode.lst");
#endif
    }
    const TempDir& root() const { return m_root; }
    std::filesystem::path pluginRoot() const { return m_root / "plugins"; }
    std::filesystem::path home() const { return m_root / "home"; }
    // The default data directory (JEXJTAG_DATA_DIR) of the scope.
    std::filesystem::path dataDir() const { return m_root / "share/jexjtag"; }

private:
    TempDir m_root;
    ScopedEnv m_plugins;
    ScopedEnv m_home;
    ScopedEnv m_data;
};

// The messages delivered to the host, in order: keepMessage serves as
// a session's JexMessageCallback and as a plug-in's sendMessage callback.
struct Message {
    unsigned handle;
    unsigned type;
    std::string text;
};
inline std::vector<Message>& messages()
{
    static std::vector<Message> list;
    return list;
}
inline void keepMessage(unsigned handle, unsigned type, const char* text)
{
    messages().push_back({handle, type, text ? text : ""});
}
inline std::vector<std::string> messagesOfType(unsigned type)
{
    std::vector<std::string> out;
    for (const Message& m : messages())
        if (m.type == type) out.push_back(m.text);
    return out;
}
// True when a message of `type` contains `part`.
inline bool sawMessage(unsigned type, const std::string& part)
{
    for (const std::string& text : messagesOfType(type))
        if (text.find(part) != std::string::npos) return true;
    return false;
}

// Bit buffers as the C API and the plug-ins pass them: bit i is bit i%8 of byte i/8.
inline std::vector<uint8_t> bitsOf(uint64_t value, unsigned bits)
{
    std::vector<uint8_t> out((bits + 7) / 8, 0);
    for (unsigned i = 0; i < bits; ++i)
        if ((value >> i) & 1u) out[i / 8] |= static_cast<uint8_t>(1u << (i % 8));
    return out;
}
// `bits` bits of `buffer` from bit `first` on, bit `first` the least significant.
inline uint64_t valueOf(const std::vector<uint8_t>& buffer, unsigned first, unsigned bits)
{
    uint64_t value = 0;
    for (unsigned i = 0; i < bits; ++i)
        if ((buffer[(first + i) / 8] >> ((first + i) % 8)) & 1u) value |= uint64_t{1} << i;
    return value;
}
// An IDCODE as the C API writes it: 32 '0'/'1' characters, bit 31 first.
inline std::string idcodeText(uint32_t value) { return std::bitset<32>(value).to_string(); }

} // namespace testsupport
