// The cross-process cable lock: contention between processes and cleaning of
// stale lock files.  Release when the holder is killed is tested end to end
// (tests/e2e/LockTest.cpp).
#include <gtest/gtest.h>

#include <chrono>
#include <fstream>

#include <sys/wait.h>
#include <unistd.h>

#include "jexjtag/cable/CableLock.hpp"
#include "support/TestSupport.hpp"

using jexcable::CableLock;

namespace {

// A pipe used to pass one byte between parent and child.
struct Pipe {
    Pipe() { EXPECT_EQ(::pipe(fd), 0); }
    ~Pipe()
    {
        ::close(fd[0]);
        ::close(fd[1]);
    }
    void send(char c) { EXPECT_EQ(::write(fd[1], &c, 1), 1); }
    char receive()
    {
        char c = 0;
        return ::read(fd[0], &c, 1) == 1 ? c : '\0';
    }
    int fd[2];
};

// Runs `body` in a child process; its return value is the exit status.
template <typename F>
pid_t spawn(F body)
{
    const pid_t pid = ::fork();
    if (pid == 0) {
        int status = 1;
        try {
            status = body();
        } catch (...) {
        }
        ::_exit(status);
    }
    return pid;
}

int waitExit(pid_t pid)
{
    int status = 0;
    ::waitpid(pid, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

class CableLockTest : public ::testing::Test {
protected:
    testsupport::TempDir dir;
    testsupport::ScopedEnv env{"JEXJTAG_LOCK_DIR", (dir.path() / "locks").string()};
};

} // namespace

TEST_F(CableLockTest, SecondProcessWaitsUntilTheHolderReleases)
{
    CableLock lock("sim0");
    ASSERT_TRUE(lock.acquire(0));
    EXPECT_NE(lock.holderDescription().find("pid " + std::to_string(::getpid())), std::string::npos);

    Pipe started;
    Pipe result;
    const pid_t child = spawn([&] {
        CableLock other("sim0");
        const auto t0 = std::chrono::steady_clock::now();
        const bool gotAtOnce = other.acquire(0);
        const bool gotIn100ms = other.acquire(100);
        const auto waited = std::chrono::steady_clock::now() - t0;
        started.send(gotAtOnce || gotIn100ms || waited < std::chrono::milliseconds(100) ? 'x' : 'w');
        const bool gotLater = other.acquire(20000); // the parent releases meanwhile
        result.send(gotLater ? 'y' : 'n');
        return 0;
    });
    EXPECT_EQ(started.receive(), 'w') << "the child got the lock the parent held, or did not wait";
    EXPECT_TRUE(lock.release());
    EXPECT_EQ(result.receive(), 'y');
    EXPECT_EQ(waitExit(child), 0);
    EXPECT_FALSE(lock.isHeld());
}

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
