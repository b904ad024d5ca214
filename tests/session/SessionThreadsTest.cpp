// SPDX-License-Identifier: MIT
// Sessions of different threads share the registry, the plug-in manager and
// the message machinery.  Meant for a ThreadSanitizer build as well (see
// the README's "Checking thread safety").

#include <gtest/gtest.h>

#include <atomic>
#include <filesystem>
#include <thread>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

namespace {

void quiet(unsigned, unsigned, const char*) {}

TEST(SessionThreads, TwoThreadsCreateAndDestroyTheirOwnSessions)
{
    testsupport::IsolatedEnvironment env;
    const std::filesystem::path module = std::filesystem::path(JEXJTAG_TEST_PLUGIN_ROOT) / "JexTests/RecordingPlugin";
    std::filesystem::create_directories(env.pluginRoot() / "JexTests/RecordingPlugin");
    for (const char* file : {"RecordingPlugin.so", "RecordingPlugin.xml"})
        std::filesystem::copy_file(module / file, env.pluginRoot() / "JexTests/RecordingPlugin" / file);

    std::atomic<unsigned> failures {0};
    const auto work = [&] {
        for (int i = 0; i < 25; ++i) {
            unsigned handle = 0;
            unsigned count = 0;
            if (JEX_FAILED(JexJtag_session_create(quiet, 0, nullptr, &handle)) ||
                JEX_FAILED(JexJtag_session_getTargetCount(handle, &count)) || count != 2 ||
                JEX_FAILED(JexJtag_session_sendMessage(handle, JEX_MSG_INFO, "hello")) ||
                JEX_FAILED(JexJtag_session_destroy(handle)))
                ++failures;
        }
    };
    std::vector<std::thread> threads;
    for (int t = 0; t < 2; ++t) threads.emplace_back(work);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(0u, failures.load());
}

} // namespace
