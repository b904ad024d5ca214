// SPDX-License-Identifier: MIT
// POSIX implementation of PluginPlatform.
#include "jexjtag/cable/PluginPlatform.hpp"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <stdexcept>

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/types.h>
#include <unistd.h>

namespace jexcable {

namespace {

std::runtime_error systemError(const std::string& what, const std::string& path, int err)
{
    return std::runtime_error(what + " " + path + ": " + std::strerror(err));
}

} // namespace

std::string PluginPlatform::getEnv(const char* name)
{
    const char* value = name ? std::getenv(name) : nullptr;
    return value ? std::string(value) : std::string();
}

std::string PluginPlatform::userId()
{
    return std::to_string(static_cast<unsigned long>(::getuid()));
}

uint64_t PluginPlatform::processId()
{
    return static_cast<uint64_t>(::getpid());
}

void PluginPlatform::ensureDirectory(const std::string& path, bool privateToUser)
{
    if (path.empty()) throw std::runtime_error("empty directory name");
    // Create missing parents first, then the directory itself.
    for (std::size_t pos = path.find('/', 1); pos != std::string::npos; pos = path.find('/', pos + 1)) {
        const std::string parent = path.substr(0, pos);
        struct stat existing {};
        if (::stat(parent.c_str(), &existing) == 0 && S_ISDIR(existing.st_mode)) continue;
        if (::mkdir(parent.c_str(), 0700) != 0 && errno != EEXIST)
            throw systemError("cannot create directory", parent, errno);
    }
    if (::mkdir(path.c_str(), 0700) != 0 && errno != EEXIST)
        throw systemError("cannot create directory", path, errno);

    struct stat st {};
    if (::lstat(path.c_str(), &st) != 0) throw systemError("cannot examine directory", path, errno);
    if (privateToUser) {
        if (!S_ISDIR(st.st_mode)) throw std::runtime_error("not a directory (or a symbolic link): " + path);
        if (st.st_uid != ::getuid()) throw std::runtime_error("directory is owned by another user: " + path);
        if ((st.st_mode & 077) != 0 && ::chmod(path.c_str(), st.st_mode & 0700) != 0)
            throw systemError("cannot restrict access to", path, errno);
    } else {
        struct stat target {};
        if (::stat(path.c_str(), &target) != 0 || !S_ISDIR(target.st_mode))
            throw std::runtime_error("not a directory: " + path);
    }
}

PluginPlatform::FileHandle PluginPlatform::openLockFile(const std::string& path)
{
    int fd = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0666);
    if (fd < 0 && errno == EACCES) fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (fd < 0) throw systemError("cannot open lock file", path, errno);
    struct stat st {};
    if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
        ::close(fd);
        throw std::runtime_error("lock file is not a regular file: " + path);
    }
    return fd;
}

PluginPlatform::FileHandle PluginPlatform::openExisting(const std::string& path)
{
    int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (fd < 0) return kNoFile;
    struct stat st {};
    if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
        ::close(fd);
        return kNoFile;
    }
    return fd;
}

bool PluginPlatform::tryLockExclusive(FileHandle file)
{
    for (;;) {
        if (::flock(file, LOCK_EX | LOCK_NB) == 0) return true;
        if (errno == EINTR) continue;
        if (errno == EWOULDBLOCK) return false;
        throw std::runtime_error(std::string("cannot lock file: ") + std::strerror(errno));
    }
}

void PluginPlatform::closeFile(FileHandle file)
{
    if (file != kNoFile) ::close(file);
}

bool PluginPlatform::namesSameFile(FileHandle file, const std::string& path)
{
    struct stat open {};
    struct stat named {};
    if (::fstat(file, &open) != 0 || ::lstat(path.c_str(), &named) != 0) return false;
    return open.st_dev == named.st_dev && open.st_ino == named.st_ino;
}

void PluginPlatform::replaceContents(FileHandle file, const std::string& text)
{
    if (::ftruncate(file, 0) != 0) return;
    const char* data = text.data();
    std::size_t left = text.size();
    off_t offset = 0;
    while (left > 0) {
        const ssize_t n = ::pwrite(file, data, left, offset);
        if (n < 0) {
            if (errno == EINTR) continue;
            return;
        }
        data += n;
        offset += n;
        left -= static_cast<std::size_t>(n);
    }
}

std::string PluginPlatform::readSmallFile(const std::string& path, std::size_t maxBytes)
{
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (fd < 0) return {};
    std::string text(maxBytes, '\0');
    std::size_t got = 0;
    while (got < maxBytes) {
        const ssize_t n = ::read(fd, &text[got], maxBytes - got);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) break;
        got += static_cast<std::size_t>(n);
    }
    ::close(fd);
    text.resize(got);
    return text;
}

bool PluginPlatform::removeFile(const std::string& path)
{
    return ::unlink(path.c_str()) == 0;
}

std::vector<std::string> PluginPlatform::listDirectory(const std::string& path)
{
    std::vector<std::string> names;
    DIR* dir = ::opendir(path.c_str());
    if (!dir) return names;
    while (const struct dirent* entry = ::readdir(dir)) {
        const std::string name = entry->d_name;
        if (name != "." && name != "..") names.push_back(name);
    }
    ::closedir(dir);
    return names;
}

void PluginPlatform::sleepMicroseconds(uint64_t microseconds)
{
    struct timespec request {};
    request.tv_sec = static_cast<time_t>(microseconds / 1000000u);
    request.tv_nsec = static_cast<long>((microseconds % 1000000u) * 1000u);
    struct timespec remaining {};
    while (::nanosleep(&request, &remaining) != 0 && errno == EINTR) request = remaining;
}

uint64_t PluginPlatform::monotonicMicroseconds()
{
    struct timespec now {};
    ::clock_gettime(CLOCK_MONOTONIC, &now);
    return static_cast<uint64_t>(now.tv_sec) * 1000000u + static_cast<uint64_t>(now.tv_nsec) / 1000u;
}

std::string PluginPlatform::joinPath(const std::string& directory, const std::string& name)
{
    if (directory.empty()) return name;
    if (directory.back() == '/') return directory + name;
    return directory + "/" + name;
}

} // namespace jexcable
