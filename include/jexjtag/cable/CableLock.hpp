// SPDX-License-Identifier: MIT
#pragma once
// A cross-process lock on one cable, identified by its port.
//
// Each port has a lock file in the lock directory:
//   $JEXJTAG_LOCK_DIR when set,
//   else $XDG_RUNTIME_DIR/jexjtag-locks when XDG_RUNTIME_DIR is set,
//   else /tmp/jexjtag-locks-<uid>.
// The last two are private to the user (created with mode 0700, refused when
// they belong to someone else or are a symbolic link).  The file name is the
// port with every byte outside [A-Za-z0-9._-] written as %XX, plus ".lock",
// so "/dev/ttyUSB0" locks "%2Fdev%2FttyUSB0.lock".
//
// Holding the lock means holding an exclusive flock() on that file.  The
// kernel releases it when the holder closes it or dies, so a crashed holder
// never blocks anybody.  A lock file left behind by such a holder is harmless
// and is removed by cleanStale().  Removal races with a process that has just
// opened the file: after taking the flock, acquire() checks that the path
// still names the file it locked and starts again if not.
//
// The holder writes "pid <n> port <port>" into the file for diagnostics.
// Every plug-in that drives a physical or simulated cable uses this class,
// so two programs opening the same port contend for it whatever the plug-in.

#include <cstdint>
#include <string>

#include "PluginPlatform.hpp"

namespace jexcable {

class CableLock {
public:
    // A lock on `port` in `directory` (the default directory when empty).
    // Nothing is touched on disk until acquire().
    explicit CableLock(std::string port, std::string directory = std::string());
    ~CableLock();
    CableLock(const CableLock&) = delete;
    CableLock& operator=(const CableLock&) = delete;

    // Waits up to msWait milliseconds for the lock (0: one try).  True when
    // the lock is held on return (also when it was held already).  Throws
    // std::runtime_error when the lock directory or file cannot be used.
    bool acquire(uint32_t msWait);
    // Gives the lock up and removes the lock file.  False when not held.
    bool release();
    bool isHeld() const { return m_file != PluginPlatform::kNoFile; }

    const std::string& port() const { return m_port; }
    const std::string& directory() const { return m_directory; }
    const std::string& path() const { return m_path; }
    // What the current holder wrote into the lock file ("" when unknown).
    std::string holderDescription() const;

    // The lock directory from the environment, and whether it is the
    // per-user default (which must be private to the user).
    static std::string defaultDirectory(bool* privateToUser = nullptr);
    // The file name that the lock on `port` uses.
    static std::string fileNameFor(const std::string& port);
    // Removes every lock file in `directory` (default when empty) that no
    // process holds; returns how many were removed.  Files that are not lock
    // files are left alone.
    static unsigned cleanStale(const std::string& directory = std::string());

private:
    bool tryOnce();
    void prepareDirectory();

    std::string m_port;
    std::string m_directory;
    bool m_privateDirectory = false;
    bool m_directoryReady = false;
    std::string m_path;
    PluginPlatform::FileHandle m_file = PluginPlatform::kNoFile;
};

} // namespace jexcable
