// SPDX-License-Identifier: MIT
// The cable lock end to end: two processes contending for one simulated
// port, the lock's release when its holder is killed, and JexJtagTargetLock
// objects nesting over two sessions of one process.

#include <gtest/gtest.h>

#include <errno.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>

#include "SimSession.hpp"
#include "jexjtag/rt/JexJtagTargetLock.hpp"

using namespace e2e;

namespace {

using E2eLockTest = SimSession;

void ignoreMessage(unsigned, unsigned, const char*) {}

// Runs in a forked child: a session of its own opens jtag_sim on `port`,
// takes the lock and reports 'L' on `fd` ('F' when anything failed), then
// waits to be killed.  Never returns into the test framework.
[[noreturn]] void holdLockUntilKilled(int fd, const std::string& port)
{
    char verdict = 'F';
    unsigned handle = 0;
    const std::string portArg = "port=" + port;
    const char* argv[] = {portArg.c_str()};
    unsigned status = 0;
    if (JexJtag_session_create(ignoreMessage, 0, nullptr, &handle) == JEX_SUCCESS &&
        JexJtag_target_open(handle, "jtag_sim", nullptr, 1, argv, nullptr) == JEX_SUCCESS &&
        JexJtag_target_lock(handle, 1000, &status) == JEX_SUCCESS && status == JEXJTAG_LOCKED_ME)
        verdict = 'L';
    if (write(fd, &verdict, 1) != 1 || verdict != 'L') _exit(1);
    for (;;) pause();
}

// A child that is killed and reaped at the end of the scope, also when an
// assertion leaves the test early.  reap() gives the wait status.
struct Child {
    pid_t pid;
    ~Child() { reap(); }
    int reap()
    {
        int status = 0;
        if (pid <= 0) return -1;
        ::kill(pid, SIGKILL);
        while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
        }
        pid = -1;
        return status;
    }
};

// One byte from fd within timeoutMs; '\0' when none came.
char readByte(int fd, int timeoutMs)
{
    pollfd p{fd, POLLIN, 0};
    if (poll(&p, 1, timeoutMs) != 1) return '\0';
    char c = '\0';
    return read(fd, &c, 1) == 1 ? c : '\0';
}

} // namespace

TEST_F(E2eLockTest, AnotherProcessHoldsThePortUntilItIsKilled)
{
    int pipeFds[2];
    ASSERT_EQ(0, pipe(pipeFds));
    const pid_t pid = fork();
    ASSERT_GE(pid, 0);
    if (pid == 0) {
        close(pipeFds[0]);
        holdLockUntilKilled(pipeFds[1], m_port);
    }
    close(pipeFds[1]);
    Child child{pid};
    const char verdict = readByte(pipeFds[0], 30000);
    close(pipeFds[0]);
    ASSERT_EQ('L', verdict) << "the child could not take the lock";

    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    unsigned status = 0;
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(m_handle, 100, &status));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, status);
    const std::vector<std::string> errors = messagesOfType(JEX_MSG_ERROR);
    ASSERT_EQ(1u, errors.size());
    EXPECT_EQ("jtag_sim: port " + m_port + " is locked by another process (pid " + std::to_string(pid) + " port " +
                  m_port + ")",
              errors[0]);

    // The kernel drops the dead holder's lock; its lock file stays behind.
    const int waitStatus = child.reap();
    ASSERT_TRUE(WIFSIGNALED(waitStatus));
    EXPECT_EQ(SIGKILL, WTERMSIG(waitStatus));
    EXPECT_TRUE(std::filesystem::exists(m_dir / "locks" / (m_port + ".lock")));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 2000, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));
}

TEST_F(E2eLockTest, LockObjectsNestAndTheOutermostReleases)
{
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices));
    // A second session of this process opens the same port: it contends
    // for the lock like another program would.
    unsigned other = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &other));
    ASSERT_EQ(JEX_SUCCESS, open(kThreeDevices, {}, nullptr, other));
    unsigned status = 0;

    {
        JexRT::JexJtagTargetLock outer(m_handle, JexRT::JexJtagTargetLock::ONE_MINUTE_MAX_WAIT);
        EXPECT_TRUE(outer.holdsLock());
        {
            JexRT::JexJtagTargetLock inner(m_handle, 10);
            EXPECT_FALSE(inner.holdsLock());
        }
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getLockStatus(m_handle, &status));
        EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status) << "the inner object released nothing";
        EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(other, 0, &status));

        // A lock object that is not granted the lock holds nothing and throws nothing.
        JexRT::JexJtagTargetLock refused(other, 20);
        EXPECT_FALSE(refused.holdsLock());
    }
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getLockStatus(m_handle, &status));
    EXPECT_EQ(unsigned{JEXJTAG_UNLOCKED}, status);

    // Now the other session gets the port; destroying it with the lock held
    // hands the port back.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(other, 0, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_lock(m_handle, 0, &status));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_destroy(other));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(m_handle, 0, &status));
    EXPECT_EQ(unsigned{JEXJTAG_LOCKED_ME}, status);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_unlock(m_handle));

    // Without a target there is nothing to lock: the object throws.
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_close(m_handle));
    EXPECT_THROW(JexRT::JexJtagTargetLock(m_handle, 10), JexRT::Jex_AbortException);
}
