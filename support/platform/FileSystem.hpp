// SPDX-License-Identifier: MIT
#pragma once
// File-system services of the platform: the only place that lists
// directories, checks access and creates private files.

#include <string>
#include <vector>

namespace jexplatform {

// The path separator of the platform.
constexpr char kPathSeparator = '/';

// True when the file at path exists and can be read.
bool isReadable(const std::string& path);
// True when path names a directory (symbolic links are followed).
bool isDirectory(const std::string& path);
// Bare names of the entries of dir, without "." and "..", sorted by byte
// value so discovery order is the same on every machine.  Empty when the
// directory cannot be read.
std::vector<std::string> listDirectory(const std::string& dir);
// The user's home directory ("" when unknown).
std::string homeDirectory();
// Makes sure dir exists as a real directory owned by this user with mode
// 0700: creates it so when missing, takes group and other access away when
// it has any.  False (with a reason) otherwise.
bool ensurePrivateDirectory(const std::string& dir, std::string& reason);
// A per-user directory name for private files when the home directory
// cannot be used: <$XDG_RUNTIME_DIR, else $TMPDIR, else /tmp>/<stem>-<uid>.
// Nothing is created.
std::string perUserTemporaryDirectory(const std::string& stem);
// Creates a new, empty file dir/<base>.XXXXXX with a unique suffix, mode
// 0600, exclusively (never follows or reuses an existing name).  Returns
// its path, or "" (with a reason) on failure.
std::string createUniqueFile(const std::string& dir, const std::string& base, std::string& reason);

} // namespace jexplatform
