// SPDX-License-Identifier: MIT
#pragma once
// Runs the built jexjtag program as a child process, with the environment
// the runner sets, and collects its exit status, standard output and
// standard error.  The process is a ChildProcess of the network tests, so
// every wait is bounded.

#include <stdlib.h>

#include <filesystem>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "net/ChildProcess.hpp"
#include "support/TestSupport.hpp"

namespace clitest {

struct RunResult {
    int exitCode = -1; // 128 + signal when killed, -1 when it did not end in time
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
        // The child inherits this process's environment, changed for the start only.
        std::vector<std::unique_ptr<testsupport::ScopedEnv>> env;
        for (const auto& [name, value] : m_env) {
            env.push_back(std::make_unique<testsupport::ScopedEnv>(name.c_str(), value));
            if (value.empty()) unsetenv(name.c_str());
        }
        std::vector<std::string> argv{programPath()};
        argv.insert(argv.end(), args.begin(), args.end());
        nettest::ChildProcess child(argv);
        env.clear();
        RunResult result;
        result.out = child.readAll();
        result.exitCode = child.wait();
        result.err = child.errorText();
        return result;
    }

private:
    testsupport::TempDir m_dir;
    std::map<std::string, std::string> m_env;
};

} // namespace clitest
