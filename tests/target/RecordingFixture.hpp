// SPDX-License-Identifier: MIT
#pragma once
// A test fixture around the recording plug-in: a private plug-in tree with
// both recording modules, a record file, a session whose messages are kept,
// and helpers to read what reached the plug-in.

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <algorithm>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include "jexjtag/jexjtag.h"
#include "plugins/recording/RecordingFormat.hpp"
#include "support/TestSupport.hpp"

namespace targettest {

using testsupport::Message;
using testsupport::messages;
using testsupport::idcodeText;
using testsupport::keepMessage;
using recording::pointerText;

// A pointer as the library's traces print it: "0x%08llX", or "NULL".
inline std::string tracedPointer(const void* pointer)
{
    if (!pointer) return "NULL";
    char text[32];
    std::snprintf(text, sizeof text, "0x%08llX",
                  static_cast<unsigned long long>(reinterpret_cast<std::uintptr_t>(pointer)));
    return text;
}

class RecordingFixture : public ::testing::Test {
protected:
    RecordingFixture()
        : m_record(recording::kRecordFileVariable, (m_env.root() / "record.txt").string()),
          m_config(recording::kConfigVariable, "")
    {
        for (const char* module : {"RecordingPlugin", "RecordingPluginB"}) installModule(module);
    }

    void SetUp() override { messages().clear(); }

    void TearDown() override
    {
        if (m_handle != kNoSession) JexJtag_session_destroy(m_handle);
    }

    // Copies a recording module into this test's plug-in tree (before the
    // session is created, which discovers the tree).
    void installModule(const std::string& module)
    {
        const std::filesystem::path from = std::filesystem::path(JEXJTAG_TEST_PLUGIN_ROOT) / "JexTests" / module;
        const std::filesystem::path to = m_env.pluginRoot() / "JexTests" / module;
        std::filesystem::create_directories(to);
        for (const char* ext : {".so", ".xml"})
            std::filesystem::copy_file(from / (module + ext), to / (module + ext),
                                       std::filesystem::copy_options::overwrite_existing);
    }
    void removeModule(const std::string& module) { std::filesystem::remove_all(m_env.pluginRoot() / "JexTests" / module); }

    // The plug-in's configuration for instances created from now on.
    void configure(const std::string& config) { setenv(recording::kConfigVariable, config.c_str(), 1); }

    unsigned createSession()
    {
        unsigned handle = 0;
        EXPECT_EQ(JEX_SUCCESS, JexJtag_session_create(keepMessage, 0, nullptr, &handle));
        m_handle = handle;
        return handle;
    }

    unsigned open(const std::string& type = "recording", std::vector<const char*> args = {},
                  JexJtagTargetInfo* info = nullptr, void* callerData = nullptr)
    {
        return JexJtag_target_open(m_handle, type.c_str(), callerData, static_cast<unsigned>(args.size()),
                                   args.empty() ? nullptr : args.data(), info);
    }

    // Creates the session and opens "recording" with args; forgets what the
    // plug-in recorded so far.
    unsigned openTarget(std::vector<const char*> args = {})
    {
        createSession();
        EXPECT_EQ(JEX_SUCCESS, open("recording", args));
        clearRecord();
        return m_handle;
    }

    // Every line recorded so far, in order (module prefix included).
    std::vector<std::string> record() const
    {
        std::vector<std::string> lines;
        std::istringstream in(testsupport::readFile(m_env.root() / "record.txt"));
        for (std::string line; std::getline(in, line);) lines.push_back(line);
        return lines;
    }
    // The lines of RecordingPlugin without its prefix, leaving out the
    // module entry points that loading and unloading call.
    std::vector<std::string> calls() const
    {
        std::vector<std::string> out;
        const std::string prefix = "RecordingPlugin: ";
        for (const std::string& line : record()) {
            const std::string call = line.substr(std::min(line.size(), prefix.size()));
            if (line.compare(0, prefix.size(), prefix) == 0 && call != "JexPlugin_loaded" &&
                call != "JexPlugin_setCallbacks" && call != "JexPlugin_unloaded")
                out.push_back(call);
        }
        return out;
    }
    void clearRecord() const { std::filesystem::remove(m_env.root() / "record.txt"); }

    static constexpr unsigned kNoSession = 0xFFFFFFFFu;

    testsupport::IsolatedEnvironment m_env;
    testsupport::ScopedEnv m_record;
    testsupport::ScopedEnv m_config;
    unsigned m_handle = kNoSession;
};

} // namespace targettest
