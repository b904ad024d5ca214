// SPDX-License-Identifier: MIT
#pragma once
// The operating-system calls of the cable plug-ins: environment, private
// directories, lock files with whole-file advisory locks, sleeping and a
// monotonic clock.  This is the only place in plugins/ that talks to the
// operating system; everything else goes through these functions.
//
// Failures that a caller cannot sensibly go on from throw std::runtime_error
// with a message that names the path and the system's reason.

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace jexcable {

class PluginPlatform {
public:
    using FileHandle = int;
    static constexpr FileHandle kNoFile = -1;

    // Value of an environment variable, "" when unset.
    static std::string getEnv(const char* name);
    // The user id as decimal text (used to name per-user directories).
    static std::string userId();
    // This process's id.
    static uint64_t processId();

    // Makes sure `path` is a directory, creating it and its missing parents
    // (mode 0700).  With privateToUser the directory must also be a real
    // directory (not a symbolic link) owned by this user; group and other
    // access bits are removed.  Throws when that cannot be had.
    static void ensureDirectory(const std::string& path, bool privateToUser);

    // Opens (creating when missing, mode 0666 less the umask) a lock file
    // without following a symbolic link.  Opens read-only when the file
    // exists but is not writable for us.  Throws on failure.
    static FileHandle openLockFile(const std::string& path);
    // Opens an existing file for locking; kNoFile when it does not exist or
    // cannot be opened.
    static FileHandle openExisting(const std::string& path);
    // Tries once to take an exclusive lock on the whole file; false when
    // another open file description holds one.  The kernel drops the lock
    // when the last descriptor of this open file is closed, also when the
    // process dies.
    static bool tryLockExclusive(FileHandle file);
    static void closeFile(FileHandle file);
    // True when `path` (not followed if it is a link) still names the file
    // open as `file`.
    static bool namesSameFile(FileHandle file, const std::string& path);
    // Replaces the contents of an open file with `text` (best effort: a file
    // opened read-only keeps its contents).
    static void replaceContents(FileHandle file, const std::string& text);
    // Up to maxBytes of a file's contents, "" when it cannot be read.
    static std::string readSmallFile(const std::string& path, std::size_t maxBytes);
    // Removes a file; false when it could not be removed.
    static bool removeFile(const std::string& path);
    // Names of the entries of a directory, without "." and ".."; empty when
    // the directory cannot be read.
    static std::vector<std::string> listDirectory(const std::string& path);

    static void sleepMicroseconds(uint64_t microseconds);
    static uint64_t monotonicMicroseconds();

    // Joins a directory and a file name with the platform's separator.
    static std::string joinPath(const std::string& directory, const std::string& name);
};

} // namespace jexcable
