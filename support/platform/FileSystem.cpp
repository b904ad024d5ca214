// SPDX-License-Identifier: MIT
#include "platform/FileSystem.hpp"

#include <dirent.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>

namespace jexplatform {

bool isReadable(const std::string& path) { return access(path.c_str(), R_OK) == 0; }

bool isDirectory(const std::string& path)
{
    struct stat st {};
    return stat(path.c_str(), &st) == 0 && S_ISDIR(st.st_mode);
}

std::vector<std::string> listDirectory(const std::string& dir)
{
    std::vector<std::string> names;
    DIR* d = opendir(dir.c_str());
    if (!d) return names;
    while (const dirent* e = readdir(d)) {
        if (std::strcmp(e->d_name, ".") == 0 || std::strcmp(e->d_name, "..") == 0) continue;
        names.emplace_back(e->d_name);
    }
    closedir(d);
    std::sort(names.begin(), names.end());
    return names;
}

std::string homeDirectory()
{
    if (const char* home = std::getenv("HOME"); home && *home) return home;
    if (const passwd* pw = getpwuid(getuid()); pw && pw->pw_dir) return pw->pw_dir;
    return {};
}

bool ensurePrivateDirectory(const std::string& dir, std::string& reason)
{
    if (mkdir(dir.c_str(), 0700) == 0) return true;
    if (errno != EEXIST) {
        reason = std::strerror(errno);
        return false;
    }
    struct stat st {};
    if (lstat(dir.c_str(), &st) != 0) {
        reason = std::strerror(errno);
        return false;
    }
    if (!S_ISDIR(st.st_mode)) {
        reason = "not a directory";
        return false;
    }
    if (st.st_uid != geteuid()) {
        reason = "owned by another user";
        return false;
    }
    if ((st.st_mode & 077) != 0 && chmod(dir.c_str(), 0700) != 0) {
        reason = std::string("open to other users and cannot be made private: ") + std::strerror(errno);
        return false;
    }
    return true;
}

std::string perUserTemporaryDirectory(const std::string& stem)
{
    std::string base;
    for (const char* name : {"XDG_RUNTIME_DIR", "TMPDIR"})
        if (const char* value = std::getenv(name); value && *value) {
            base = value;
            break;
        }
    if (base.empty()) base = "/tmp";
    return base + kPathSeparator + stem + "-" + std::to_string(geteuid());
}

std::string createUniqueFile(const std::string& dir, const std::string& base, std::string& reason)
{
    std::string pattern = dir + kPathSeparator + base + ".XXXXXX";
    std::vector<char> buf(pattern.begin(), pattern.end());
    buf.push_back('\0');
    const mode_t old = umask(077);
    const int fd = mkstemp(buf.data()); // O_CREAT | O_EXCL, mode 0600
    umask(old);
    if (fd < 0) {
        reason = std::strerror(errno);
        return {};
    }
    close(fd);
    return std::string(buf.data());
}

} // namespace jexplatform
