#pragma once
// Runs the built jexjtag program as a child process and collects its exit
// status, standard output and standard error.

#include <errno.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "support/TestSupport.hpp"

extern char** environ;

namespace clitest {

struct RunResult {
    int exitCode = -1; // -1 when the program did not exit normally
    std::string out;
    std::string err;
};

inline std::string programPath() { return std::string(JEXJTAG_TEST_BUILD_DIR) + "/bin/jexjtag"; }

class ProgramRunner {
public:
    ProgramRunner()
    {
        // A private home (for per-user files) and no log, plug-in or data settings from outside.
        m_env["HOME"] = (m_dir / "home").string();
        std::filesystem::create_directories(m_dir / "home");
        for (const char* name : {"JEXJTAG_LOG_LEVEL", "JEXJTAG_LOG_FILE", "JEXJTAG_PLUGIN_DIR", "JEXJTAG_DATA_DIR"})
            m_env[name] = "";
    }

    // Sets a variable for later runs (an empty value keeps it unset).
    void setEnv(const std::string& name, const std::string& value) { m_env[name] = value; }
    const testsupport::TempDir& dir() const { return m_dir; }

    RunResult run(const std::vector<std::string>& args) const
    {
        const std::string outPath = (m_dir / "stdout.txt").string();
        const std::string errPath = (m_dir / "stderr.txt").string();
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_addopen(&actions, 1, outPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
        posix_spawn_file_actions_addopen(&actions, 2, errPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);

        const std::string program = programPath();
        std::vector<std::string> argStore{program};
        argStore.insert(argStore.end(), args.begin(), args.end());
        std::vector<char*> argv;
        for (std::string& a : argStore) argv.push_back(a.data());
        argv.push_back(nullptr);

        std::vector<std::string> envStore;
        for (char** e = environ; *e; ++e) {
            const std::string entry = *e;
            const std::string name = entry.substr(0, entry.find('='));
            if (!m_env.count(name)) envStore.push_back(entry);
        }
        for (const auto& [name, value] : m_env)
            if (!value.empty()) envStore.push_back(name + "=" + value);
        std::vector<char*> envp;
        for (std::string& e : envStore) envp.push_back(e.data());
        envp.push_back(nullptr);

        pid_t pid = 0;
        const int rc = posix_spawn(&pid, program.c_str(), &actions, nullptr, argv.data(), envp.data());
        posix_spawn_file_actions_destroy(&actions);
        if (rc != 0) throw std::runtime_error("cannot start " + program);
        int status = 0;
        while (waitpid(pid, &status, 0) < 0)
            if (errno != EINTR) throw std::runtime_error("waitpid failed");
        RunResult result;
        result.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
        result.out = testsupport::readFile(outPath);
        result.err = testsupport::readFile(errPath);
        return result;
    }

private:
    testsupport::TempDir m_dir;
    std::map<std::string, std::string> m_env;
};

} // namespace clitest
