// SPDX-License-Identifier: MIT
// BSDL import through the exported C functions, as a host sees it: values,
// messages, buffer rules, trace lines and the temporary copy in
// $HOME/.lumenfold.

#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <unistd.h>
#include <filesystem>
#include <string>
#include <vector>

#include "BsdlTestData.hpp"
#include "jexjtag/jexjtag.h"
#include "support/TestSupport.hpp"

using testsupport::IsolatedEnvironment;
using testsupport::LogCapture;

namespace fs = std::filesystem;

namespace {

struct Received {
    unsigned type;
    std::string text;
};
std::vector<Received> g_received;

void record(unsigned, unsigned type, const char* text) { g_received.push_back({type, text}); }

struct Outputs {
    Outputs()
    {
        std::memset(name, 'Z', sizeof name);
        std::memset(idcode, 'Z', sizeof idcode);
        std::memset(bypass, 'Z', sizeof bypass);
        irlength = 0xABCD;
    }
    // Every text buffer holds only c.
    bool all(char c) const
    {
        return std::string(name, sizeof name) == std::string(sizeof name, c) &&
               std::string(idcode, sizeof idcode) == std::string(sizeof idcode, c) &&
               std::string(bypass, sizeof bypass) == std::string(sizeof bypass, c);
    }
    char name[64];
    unsigned irlength;
    char idcode[40];
    char bypass[16];
};

uint32_t parseFile(unsigned handle, const std::string& path, Outputs& o)
{
    return JexJtag_db_parseBSDLFile(handle, path.c_str(), o.name, sizeof o.name, &o.irlength, o.idcode,
                                    sizeof o.idcode, o.bypass, sizeof o.bypass);
}

uint32_t parseText(unsigned handle, const std::string& filename, const std::string& text, Outputs& o)
{
    return JexJtag_db_parseBSDL(handle, filename.c_str(), text.data(), static_cast<unsigned>(text.size()), o.name,
                                sizeof o.name, &o.irlength, o.idcode, sizeof o.idcode, o.bypass, sizeof o.bypass);
}

class BsdlImportTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        g_received.clear();
        fs::create_directories(env.root() / "data");
        fs::copy_file(std::string(JEXJTAG_TEST_SOURCE_DIR) + "/data/idcode.lst", env.root() / "data/idcode.lst");
        const std::string datadir = "datadir=" + (env.root() / "data").string() + "/";
        const char* args[] = {datadir.c_str()};
        ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(record, 1, args, &handle));
    }
    void TearDown() override { JexJtag_session_destroy(handle); }

    // Whatever the import did, it left nothing in the .lumenfold directory.
    void expectNoTemporaryFiles() const
    {
        const fs::path dir = env.home() / ".lumenfold";
        if (!fs::exists(dir)) return;
        for (const auto& entry : fs::directory_iterator(dir)) ADD_FAILURE() << "left behind: " << entry.path();
    }
    std::vector<std::string> messagesOf(unsigned type) const
    {
        std::vector<std::string> out;
        for (const Received& r : g_received)
            if (r.type == type) out.push_back(r.text);
        return out;
    }

    IsolatedEnvironment env;
    unsigned handle = 0;
};

} // namespace

TEST_F(BsdlImportTest, EveryVendorFileFromFileAndFromMemory)
{
    const std::vector<ManifestRow> rows = readManifest();
    ASSERT_GE(rows.size(), 30u);
    ASSERT_EQ(vendorFileCount(), rows.size());
    for (const ManifestRow& row : rows) {
        SCOPED_TRACE(row.file);
        const std::string path = kData + "/" + row.file;
        Outputs fromFile;
        ASSERT_EQ(JEX_SUCCESS, parseFile(handle, path, fromFile));
        EXPECT_EQ(row.entity, fromFile.name);
        EXPECT_EQ(std::stoul(row.irLength), fromFile.irlength);
        EXPECT_EQ(row.idcode, fromFile.idcode);
        EXPECT_EQ(row.bypass, fromFile.bypass);

        Outputs fromMemory;
        ASSERT_EQ(JEX_SUCCESS, parseText(handle, "C:\\bsdl\\" + row.file, testsupport::readFile(path), fromMemory));
        EXPECT_EQ(0, std::memcmp(&fromFile, &fromMemory, sizeof fromFile));
        EXPECT_TRUE(messagesOf(JEX_MSG_ERROR).empty());
        expectNoTemporaryFiles();
    }
    // The reader's warnings reach the host, naming the caller's file: a
    // board-test header line is reported as skipped.
    bool headerWarning = false;
    for (const std::string& w : messagesOf(JEX_MSG_WARNING))
        headerWarning |= w.find("BSDL file '" + kData + "/aspeed_AST2500.bsd', line 1: text before the entity "
                                "declaration") == 0;
    EXPECT_TRUE(headerWarning);
}

TEST_F(BsdlImportTest, MalformedFileFailsWithTheProblemAndLeavesNoCopy)
{
    Outputs o;
    EXPECT_EQ(JEX_FAILURE, parseFile(handle, kData + "/fixtures/wrong-unterminated-string.bsd", o));
    const std::vector<std::string> errors = messagesOf(JEX_MSG_ERROR);
    ASSERT_EQ(1u, errors.size());
    // The message names the caller's file, the line and the problem.
    EXPECT_EQ(0u, errors[0].find("BSDL file '" + kData + "/fixtures/wrong-unterminated-string.bsd', line 32: "
                                 "string literal is not closed")) << errors[0];
    EXPECT_TRUE(o.all('\0'));
    EXPECT_EQ(0u, o.irlength);
    expectNoTemporaryFiles();

    // A text that is not BSDL at all: no reader.
    g_received.clear();
    EXPECT_EQ(JEX_FAILURE, parseText(handle, "notes.txt", "just some notes\n", o));
    ASSERT_FALSE(messagesOf(JEX_MSG_ERROR).empty());
    EXPECT_EQ("Could not obtain a BsdlReader\n", messagesOf(JEX_MSG_ERROR).back());
    expectNoTemporaryFiles();

    // Every wrong fixture fails, with an error message, and leaves no copy.
    for (const auto& entry : fs::directory_iterator(kData + "/fixtures")) {
        if (entry.path().filename().string().rfind("wrong-", 0) != 0) continue;
        SCOPED_TRACE(entry.path().string());
        g_received.clear();
        EXPECT_EQ(JEX_FAILURE, parseFile(handle, entry.path().string(), o));
        EXPECT_FALSE(messagesOf(JEX_MSG_ERROR).empty());
        expectNoTemporaryFiles();
    }
}

TEST_F(BsdlImportTest, BufferRules)
{
    const std::string good = kData + "/fixtures/good-missing-end.bsd";

    // A file name with blanks around it is trimmed.
    Outputs o;
    ASSERT_EQ(JEX_SUCCESS, parseFile(handle, "  " + good + " \t", o));
    EXPECT_STREQ("FIXTURE_DEV", o.name);
    EXPECT_EQ(std::string(sizeof o.name - 11, '\0'), std::string(o.name + 11, sizeof o.name - 11)); // NUL-padded

    // Texts longer than their buffers are cut to size - 1 and terminated.
    char name[5], idcode[9], bypass[3];
    unsigned irlength = 0;
    std::memset(name, 'Z', sizeof name);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_parseBSDLFile(handle, good.c_str(), name, sizeof name, &irlength, idcode,
                                                    sizeof idcode, bypass, sizeof bypass));
    EXPECT_STREQ("FIXT", name);
    EXPECT_STREQ("00010000", idcode);
    EXPECT_STREQ("11", bypass);
    EXPECT_EQ(4u, irlength);

    // Outputs not given are simply not written.
    irlength = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_db_parseBSDLFile(handle, good.c_str(), nullptr, 0, &irlength, nullptr, 0, nullptr, 0));
    EXPECT_EQ(4u, irlength);

    // A file that cannot be opened leaves every output as it was; the host
    // is told why.
    Outputs untouched;
    EXPECT_EQ(JEX_FAILURE, parseFile(handle, kData + "/no-such-file.bsd", untouched));
    EXPECT_TRUE(untouched.all('Z'));
    EXPECT_EQ(0xABCDu, untouched.irlength);
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_parseBSDLFile(handle, nullptr, nullptr, 0, &irlength, nullptr, 0, nullptr, 0));
    EXPECT_EQ(JEX_FAILURE, parseFile(handle, kData, untouched)); // a directory
    ASSERT_EQ(2u, messagesOf(JEX_MSG_ERROR).size());
    EXPECT_EQ("BSDL file '" + kData + "/no-such-file.bsd': cannot be opened: No such file or directory\n",
              messagesOf(JEX_MSG_ERROR)[0]);
    g_received.clear();

    // An unknown handle clears the outputs and fails without reading anything.
    Outputs cleared;
    EXPECT_EQ(JEX_FAILURE, parseFile(0x00770000, good, cleared));
    EXPECT_TRUE(cleared.all('\0'));
    EXPECT_EQ(0u, cleared.irlength);
    EXPECT_TRUE(g_received.empty());

    // A null text with a length fails; a null file name is an empty one.
    EXPECT_EQ(JEX_FAILURE, JexJtag_db_parseBSDL(handle, "x.bsd", nullptr, 10, o.name, sizeof o.name, &o.irlength,
                                                o.idcode, sizeof o.idcode, o.bypass, sizeof o.bypass));
    const std::string text = testsupport::readFile(good);
    EXPECT_EQ(JEX_SUCCESS, JexJtag_db_parseBSDL(handle, nullptr, text.data(), static_cast<unsigned>(text.size()),
                                                o.name, sizeof o.name, &o.irlength, o.idcode, sizeof o.idcode,
                                                o.bypass, sizeof o.bypass));
    expectNoTemporaryFiles();
}

TEST_F(BsdlImportTest, TemporaryCopyIsAlwaysRemovedAndMessagesNameTheCallersFile)
{
    Outputs o;
    const std::string bad = "entity DEV is attribute INSTRUCTION_LENGTH of DEV : entity is x;";
    const std::string dir = (env.home() / ".lumenfold").string();
    for (const auto& [given, shown] : {std::pair<std::string, std::string> {"/some/dir/dev.bsd", "/some/dir/dev.bsd"},
                                       {"C:\\boards\\win.bsd", "C:\\boards\\win.bsd"},
                                       {"  ../../escape.bsd  ", "../../escape.bsd"}}) {
        SCOPED_TRACE(given);
        g_received.clear();
        EXPECT_EQ(JEX_FAILURE, parseText(handle, given, bad, o));
        ASSERT_EQ(1u, messagesOf(JEX_MSG_ERROR).size());
        EXPECT_EQ(0u, messagesOf(JEX_MSG_ERROR)[0].find("BSDL file '" + shown + "', line 1:"))
            << messagesOf(JEX_MSG_ERROR)[0];
        expectNoTemporaryFiles();
    }
    EXPECT_FALSE(fs::exists(env.root() / "escape.bsd"));

}

// ~/.lumenfold is made private; when it cannot be used a per-user directory
// under $XDG_RUNTIME_DIR or $TMPDIR is; when neither can, the host is told.
TEST_F(BsdlImportTest, TemporaryDirectoryIsPrivateWithAFallback)
{
    const std::string text = testsupport::readFile(kData + "/st_CortexMx.bsd");
    const fs::path dir = env.home() / ".lumenfold";
    Outputs o;
    fs::create_directories(dir);
    fs::permissions(dir, fs::perms::all);
    ASSERT_EQ(JEX_SUCCESS, parseText(handle, "dev.bsd", text, o));
    EXPECT_EQ(fs::perms::owner_all, fs::status(dir).permissions() & fs::perms::all);

    testsupport::ScopedEnv runtime("XDG_RUNTIME_DIR", "");
    testsupport::ScopedEnv tmp("TMPDIR", env.root().path().string());
    const fs::path fallback = env.root() / ("jexjtag-lumenfold-" + std::to_string(geteuid()));
    {
        testsupport::ScopedEnv noHome("HOME", "/nonexistent"); // as system users have
        ASSERT_EQ(JEX_SUCCESS, parseText(handle, "dev.bsd", text, o));
        EXPECT_STREQ("CortexMx", o.name);
        EXPECT_EQ(fs::perms::owner_all, fs::status(fallback).permissions() & fs::perms::all);
        EXPECT_TRUE(fs::is_empty(fallback));
    }
    fs::remove_all(dir);
    testsupport::writeFile(dir, "in the way");
    fs::remove_all(fallback);
    testsupport::writeFile(fallback, "in the way too");
    g_received.clear();
    EXPECT_EQ(JEX_FAILURE, parseText(handle, "dev.bsd", text, o));
    ASSERT_EQ(1u, messagesOf(JEX_MSG_ERROR).size());
    EXPECT_EQ("Could not use the directory " + dir.string() + ": not a directory, nor " + fallback.string() +
                  ": not a directory\n",
              messagesOf(JEX_MSG_ERROR)[0]);
    EXPECT_EQ(std::string(sizeof o.name, '\0'), std::string(o.name, sizeof o.name));
}

// Read once without seeking (a pipe works), and never past 64 MiB: a larger
// file or text fails before anything is read whole or copied.
TEST_F(BsdlImportTest, PipesWorkAndTheSizeLimitComesFirst)
{
    int fds[2];
    ASSERT_EQ(0, pipe(fds));
    const std::string text = testsupport::readFile(kData + "/st_CortexMx.bsd");
    ASSERT_EQ(static_cast<ssize_t>(text.size()), write(fds[1], text.data(), text.size()));
    close(fds[1]);
    Outputs o;
    EXPECT_EQ(JEX_SUCCESS, parseFile(handle, "/dev/fd/" + std::to_string(fds[0]), o));
    close(fds[0]);
    EXPECT_STREQ("CortexMx", o.name);

    const fs::path huge = env.root() / "huge.bsd";
    { std::ofstream(huge).put(' '); }
    fs::resize_file(huge, 3ull << 30); // sparse
    g_received.clear();
    EXPECT_EQ(JEX_FAILURE, parseFile(handle, huge.string(), o));
    ASSERT_EQ(1u, messagesOf(JEX_MSG_ERROR).size());
    EXPECT_EQ("BSDL file '" + huge.string() + "': the file is larger than 64 MiB; it is not read\n",
              messagesOf(JEX_MSG_ERROR)[0]);
    g_received.clear();
    const std::string big((64u << 20) + 1, ' ');
    EXPECT_EQ(JEX_FAILURE, parseText(handle, "big.bsd", big, o));
    ASSERT_EQ(1u, messagesOf(JEX_MSG_ERROR).size());
    EXPECT_EQ("BSDL file 'big.bsd': the text is larger than 64 MiB; it is not read\n", messagesOf(JEX_MSG_ERROR)[0]);
    expectNoTemporaryFiles();
}
