// SPDX-License-Identifier: MIT
#include "jexjtag/cable/CableLock.hpp"

#include <algorithm>
#include <utility>

namespace jexcable {

namespace {

constexpr const char* kSuffix = ".lock";
constexpr uint64_t kPollMicroseconds = 5000;
constexpr int kReopenAttempts = 16;

bool endsWith(const std::string& text, const std::string& tail)
{
    return text.size() >= tail.size() && text.compare(text.size() - tail.size(), tail.size(), tail) == 0;
}

} // namespace

CableLock::CableLock(std::string port, std::string directory) : m_port(std::move(port))
{
    bool privateToUser = false;
    if (directory.empty()) directory = defaultDirectory(&privateToUser);
    m_directory = std::move(directory);
    m_privateDirectory = privateToUser;
    m_path = PluginPlatform::joinPath(m_directory, fileNameFor(m_port));
}

CableLock::~CableLock()
{
    release();
}

std::string CableLock::defaultDirectory(bool* privateToUser)
{
    const std::string configured = PluginPlatform::getEnv("JEXJTAG_LOCK_DIR");
    if (!configured.empty()) {
        if (privateToUser) *privateToUser = false;
        return configured;
    }
    if (privateToUser) *privateToUser = true;
    const std::string runtime = PluginPlatform::getEnv("XDG_RUNTIME_DIR");
    if (!runtime.empty()) return PluginPlatform::joinPath(runtime, "jexjtag-locks");
    return "/tmp/jexjtag-locks-" + PluginPlatform::userId();
}

std::string CableLock::fileNameFor(const std::string& port)
{
    static const char hex[] = "0123456789ABCDEF";
    std::string name;
    for (const char c : port) {
        const auto byte = static_cast<unsigned char>(c);
        const bool plain = (byte >= 'A' && byte <= 'Z') || (byte >= 'a' && byte <= 'z') ||
                           (byte >= '0' && byte <= '9') || byte == '.' || byte == '_' || byte == '-';
        if (plain) {
            name += c;
        } else {
            name += '%';
            name += hex[byte >> 4];
            name += hex[byte & 0xF];
        }
    }
    // "", "." and ".." are not usable file names on their own.
    if (name.empty() || name == "." || name == "..") name = "%" + name;
    return name + kSuffix;
}

void CableLock::prepareDirectory()
{
    if (m_directoryReady) return;
    PluginPlatform::ensureDirectory(m_directory, m_privateDirectory);
    m_directoryReady = true;
}

bool CableLock::tryOnce()
{
    prepareDirectory();
    for (int attempt = 0; attempt < kReopenAttempts; ++attempt) {
        const PluginPlatform::FileHandle file = PluginPlatform::openLockFile(m_path);
        if (!PluginPlatform::tryLockExclusive(file)) {
            PluginPlatform::closeFile(file);
            return false;
        }
        // The file may have been removed (by cleanStale or a releasing holder)
        // between our open and our flock: then we locked an orphan.
        if (PluginPlatform::namesSameFile(file, m_path)) {
            m_file = file;
            PluginPlatform::replaceContents(
                m_file, "pid " + std::to_string(PluginPlatform::processId()) + " port " + m_port + "\n");
            return true;
        }
        PluginPlatform::closeFile(file);
    }
    return false;
}

bool CableLock::acquire(uint32_t msWait)
{
    if (isHeld()) return true;
    const uint64_t start = PluginPlatform::monotonicMicroseconds();
    const uint64_t budget = static_cast<uint64_t>(msWait) * 1000u;
    for (;;) {
        if (tryOnce()) return true;
        const uint64_t elapsed = PluginPlatform::monotonicMicroseconds() - start;
        if (elapsed >= budget) return false;
        PluginPlatform::sleepMicroseconds(std::min(kPollMicroseconds, budget - elapsed));
    }
}

bool CableLock::release()
{
    if (!isHeld()) return false;
    // Remove the file while still holding it; a waiter that opened it before
    // notices the removal after its flock and opens the new file.
    if (PluginPlatform::namesSameFile(m_file, m_path)) PluginPlatform::removeFile(m_path);
    PluginPlatform::closeFile(m_file);
    m_file = PluginPlatform::kNoFile;
    return true;
}

std::string CableLock::holderDescription() const
{
    std::string text = PluginPlatform::readSmallFile(m_path, 256);
    while (!text.empty() && (text.back() == '\n' || text.back() == '\r' || text.back() == '\0')) text.pop_back();
    return text;
}

unsigned CableLock::cleanStale(const std::string& directory)
{
    const std::string dir = directory.empty() ? defaultDirectory() : directory;
    unsigned removed = 0;
    for (const std::string& name : PluginPlatform::listDirectory(dir)) {
        if (!endsWith(name, kSuffix)) continue;
        const std::string path = PluginPlatform::joinPath(dir, name);
        const PluginPlatform::FileHandle file = PluginPlatform::openExisting(path);
        if (file == PluginPlatform::kNoFile) continue;
        if (PluginPlatform::tryLockExclusive(file) && PluginPlatform::namesSameFile(file, path) &&
            PluginPlatform::removeFile(path))
            ++removed;
        PluginPlatform::closeFile(file);
    }
    return removed;
}

} // namespace jexcable
