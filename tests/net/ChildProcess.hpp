// SPDX-License-Identifier: MIT
#pragma once
// A child process for the network tests (a remote_bitbang server, OpenOCD):
// started with posix_spawn, its standard output on a pipe read with
// timeouts, standard error in a file; killed at the end of the scope.  Every
// wait is bounded.

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "support/TestSupport.hpp"

extern char** environ;

namespace nettest {

class ChildProcess {
public:
    explicit ChildProcess(std::vector<std::string> args)
    {
        int out[2];
        if (::pipe2(out, O_CLOEXEC) != 0) throw std::runtime_error("pipe failed");
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_adddup2(&actions, out[1], 1);
        posix_spawn_file_actions_addopen(&actions, 2, (m_dir / "stderr.txt").c_str(), O_WRONLY | O_CREAT, 0600);
        std::vector<char*> argv;
        for (std::string& a : args) argv.push_back(a.data());
        argv.push_back(nullptr);
        const int rc = posix_spawnp(&m_pid, argv[0], &actions, nullptr, argv.data(), environ);
        posix_spawn_file_actions_destroy(&actions);
        ::close(out[1]);
        m_out = out[0];
        if (rc != 0) {
            ::close(m_out);
            throw std::runtime_error("cannot start " + args[0]);
        }
    }
    ~ChildProcess()
    {
        if (m_pid > 0) {
            ::kill(m_pid, SIGKILL);
            ::waitpid(m_pid, nullptr, 0);
        }
        ::close(m_out);
    }
    ChildProcess(const ChildProcess&) = delete;
    ChildProcess& operator=(const ChildProcess&) = delete;

    // The next line of standard output ("" at its end or after timeoutMs).
    std::string readLine(int timeoutMs = 10000)
    {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
        for (;;) {
            const size_t end = m_buffer.find('\n');
            if (end != std::string::npos) {
                std::string line = m_buffer.substr(0, end);
                m_buffer.erase(0, end + 1);
                return line;
            }
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
                                  deadline - std::chrono::steady_clock::now())
                                  .count();
            pollfd p = {m_out, POLLIN, 0};
            if (left <= 0 || ::poll(&p, 1, static_cast<int>(left)) <= 0) return "";
            char chunk[4096];
            const ssize_t n = ::read(m_out, chunk, sizeof chunk);
            if (n <= 0) return "";
            m_buffer.append(chunk, static_cast<size_t>(n));
        }
    }
    // Everything on standard output until the process closes it (or
    // timeoutMs passes).
    std::string readAll(int timeoutMs = 20000)
    {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
        std::string all = std::move(m_buffer);
        m_buffer.clear();
        for (;;) {
            const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
                                  deadline - std::chrono::steady_clock::now())
                                  .count();
            pollfd p = {m_out, POLLIN, 0};
            if (left <= 0 || ::poll(&p, 1, static_cast<int>(left)) <= 0) return all;
            char chunk[4096];
            const ssize_t n = ::read(m_out, chunk, sizeof chunk);
            if (n <= 0) return all;
            all.append(chunk, static_cast<size_t>(n));
        }
    }
    // The address a server announces with "listening on ADDRESS".
    std::string listeningAddress()
    {
        const std::string line = readLine();
        const std::string prefix = "listening on ";
        if (line.compare(0, prefix.size(), prefix) != 0)
            throw std::runtime_error("no 'listening on' line, got '" + line + "'; stderr: " + errorText());
        return line.substr(prefix.size());
    }
    // Sends `sig` and waits (up to timeoutMs) for the end: the exit status,
    // 128 + signal when killed, -1 when it did not end in time.
    int stop(int sig = SIGTERM, int timeoutMs = 10000)
    {
        ::kill(m_pid, sig);
        return wait(timeoutMs);
    }
    int wait(int timeoutMs = 10000)
    {
        const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
        int status = 0;
        while (::waitpid(m_pid, &status, WNOHANG) == 0) {
            if (std::chrono::steady_clock::now() > deadline) return -1;
            std::this_thread::sleep_for(std::chrono::milliseconds(5));
        }
        m_pid = -1;
        return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    }
    std::string errorText() const { return testsupport::readFile(m_dir / "stderr.txt"); }

private:
    testsupport::TempDir m_dir;
    pid_t m_pid = -1;
    int m_out = -1;
    std::string m_buffer;
};

} // namespace nettest
