// SPDX-License-Identifier: MIT
// The cross-process cable lock: file names, directories and cleaning of
// stale lock files.  Contention between processes, and release when the
// holder is killed, are tested end to end (tests/e2e/LockTest.cpp).
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>


#include "jexjtag/cable/CableLock.hpp"
#include "support/TestSupport.hpp"

using jexcable::CableLock;

namespace {

class CableLockTest : public ::testing::Test {
protected:
    testsupport::TempDir dir;
    testsupport::ScopedEnv env{"JEXJTAG_LOCK_DIR", (dir.path() / "locks").string()};
};

} // namespace

TEST_F(CableLockTest, DifferentPortsDoNotContend)
{
    CableLock a("sim0");
    CableLock b("/dev/ttyUSB0");
    ASSERT_TRUE(a.acquire(0));
    ASSERT_TRUE(b.acquire(0));
    EXPECT_EQ(CableLock::fileNameFor("/dev/ttyUSB0"), "%2Fdev%2FttyUSB0.lock");
    EXPECT_EQ(b.path(), (dir.path() / "locks" / "%2Fdev%2FttyUSB0.lock").string());
    EXPECT_EQ(CableLock::fileNameFor(".."), "%...lock");
    EXPECT_EQ(CableLock::fileNameFor(""), "%.lock");
}

TEST_F(CableLockTest, CleanStaleRemovesOnlyFilesNobodyHolds)
{
    CableLock held("busy");
    ASSERT_TRUE(held.acquire(0));
    const auto locks = dir.path() / "locks";
    std::ofstream(locks / "stale.lock") << "pid 1 port stale\n";
    std::ofstream(locks / "notes.txt") << "not a lock\n";

    EXPECT_EQ(CableLock::cleanStale(), 1u);
    EXPECT_FALSE(std::filesystem::exists(locks / "stale.lock"));
    EXPECT_TRUE(std::filesystem::exists(locks / "notes.txt"));
    EXPECT_TRUE(std::filesystem::exists(held.path()));
    EXPECT_TRUE(held.isHeld());

    // After release the file is gone; a new holder makes a new one.
    EXPECT_TRUE(held.release());
    EXPECT_FALSE(std::filesystem::exists(held.path()));
    EXPECT_FALSE(held.release());
    EXPECT_EQ(CableLock::cleanStale(), 0u);
    EXPECT_EQ(CableLock::cleanStale((dir.path() / "missing").string()), 0u);
}

TEST_F(CableLockTest, ReleasingAnOrphanedLockLeavesTheNewFileAlone)
{
    // A holder whose file was removed behind its back still excludes
    // nobody; the next acquirer must not share the removed file's lock.
    CableLock first("sim0");
    ASSERT_TRUE(first.acquire(0));
    std::filesystem::remove(first.path()); // as a careless cleaner would
    CableLock second("sim0");
    ASSERT_TRUE(second.acquire(0)) << "a new file is made and locked";
    CableLock third("sim0");
    EXPECT_FALSE(third.acquire(0)) << "the new file is held";
    EXPECT_TRUE(second.release());
    EXPECT_TRUE(first.release()) << "releasing the orphan leaves other files alone";
    EXPECT_TRUE(third.acquire(0));
}

TEST_F(CableLockTest, DefaultDirectories)
{
    bool privateDir = true;
    EXPECT_EQ(CableLock::defaultDirectory(&privateDir), (dir.path() / "locks").string());
    EXPECT_FALSE(privateDir);
    testsupport::ScopedEnv noDir("JEXJTAG_LOCK_DIR", "");
    testsupport::ScopedEnv runtime("XDG_RUNTIME_DIR", dir.str());
    EXPECT_EQ(CableLock::defaultDirectory(&privateDir), (dir.path() / "jexjtag-locks").string());
    EXPECT_TRUE(privateDir);
    CableLock lock("sim0");
    ASSERT_TRUE(lock.acquire(0));
    EXPECT_EQ(std::filesystem::status(dir.path() / "jexjtag-locks").permissions() & std::filesystem::perms::all,
              std::filesystem::perms::owner_all);
}

TEST_F(CableLockTest, APrivateDirectoryMustNotBeASymlink)
{
    testsupport::ScopedEnv noDir("JEXJTAG_LOCK_DIR", "");
    testsupport::ScopedEnv runtime("XDG_RUNTIME_DIR", dir.str());
    std::filesystem::create_directory(dir.path() / "elsewhere");
    std::filesystem::create_directory_symlink(dir.path() / "elsewhere", dir.path() / "jexjtag-locks");
    CableLock lock("sim0");
    EXPECT_THROW(lock.acquire(0), std::runtime_error);
    EXPECT_FALSE(lock.isHeld());
}
