// SPDX-License-Identifier: MIT
// The built jexjtag program, run as a process against the simulated cable.

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "MiniJson.hpp"
#include "ProgramRunner.hpp"
#include "jexjtag/jexjtag.h"

using clitest::ProgramRunner;
using clitest::RunResult;

namespace {

bool contains(const std::string& text, const std::string& part) { return text.find(part) != std::string::npos; }

class CliProgramTest : public ::testing::Test {
protected:
    // Each test drives its own simulated port, with lock files of its own.
    CliProgramTest()
    {
        std::filesystem::create_directories(m_lockDir);
        runner.setEnv("JEXJTAG_LOCK_DIR", m_lockDir);
    }

    // jexjtag with args and the test's own port.
    RunResult run(std::vector<std::string> args, bool withPort = true)
    {
        if (withPort) {
            args.push_back("--arg");
            args.push_back("port=" + m_port);
        }
        return runner.run(args);
    }
    // The same, expecting success and valid JSON on stdout.
    minijson::Value runJson(std::vector<std::string> args)
    {
        args.push_back("--json");
        const RunResult r = run(args);
        EXPECT_EQ(0, r.exitCode) << r.err;
        EXPECT_EQ("", r.err);
        return minijson::parse(r.out);
    }

    ProgramRunner runner;
    const std::string m_lockDir = (runner.dir() / "locks").string();
    const std::string m_port = "clitest-" + std::to_string(getpid());
};

// A usage error: exit 2, one "jexjtag: " line and a hint on stderr, nothing on stdout.
void expectUsageError(const RunResult& r, const std::string& message)
{
    EXPECT_EQ(2, r.exitCode);
    EXPECT_EQ("", r.out);
    EXPECT_EQ(0u, r.err.find("jexjtag: " + message + "\nTry 'jexjtag")) << r.err;
}

// A failure: exit 1, nothing on stdout, and "jexjtag: " with part on stderr.
void expectFailure(const RunResult& r, const std::string& part)
{
    EXPECT_EQ(1, r.exitCode);
    EXPECT_EQ("", r.out);
    EXPECT_TRUE(contains(r.err, "jexjtag: " + part)) << r.err;
}

} // namespace

TEST_F(CliProgramTest, HelpExplainsEveryCommandWithExamples)
{
    RunResult r = run({"--help"}, false);
    EXPECT_EQ(0, r.exitCode);
    EXPECT_EQ("", r.err);
    const std::string mainHelp = r.out;
    for (const char* part : {"Exit status", "Examples:", "--json"}) EXPECT_TRUE(contains(mainHelp, part)) << part;
    for (const std::string command : {"targets", "scan", "lookup", "bsdl", "shift", "info"}) {
        EXPECT_TRUE(contains(mainHelp, "\n  " + command)) << command;
        r = run({command, "--help"}, false);
        EXPECT_EQ(0, r.exitCode) << command;
        EXPECT_EQ(0u, r.out.find("Usage: jexjtag " + command)) << command;
        EXPECT_TRUE(contains(r.out, "Examples:") && contains(r.out, "--json")) << command;
        EXPECT_EQ(r.out, run({"help", command}, false).out);
    }
    r = run({"--version"}, false);
    EXPECT_EQ(0, r.exitCode);
    EXPECT_TRUE(contains(r.out, "libJexJtag API version 0x")) << r.out;
}

TEST_F(CliProgramTest, BadUsageExitsWithTwo)
{
    // Each message of the argument parser is checked in ArgParserTest; these
    // come through the program's own paths: no command, a misplaced option,
    // and IDCODE, data and TAP state texts read while a command runs.
    expectUsageError(run({}, false), "no command given");
    expectUsageError(run({"scan", "--device", "1"}, false), "option --device does not apply to 'scan'");
    expectUsageError(run({"lookup", "0362D093"}), "'0362D093' is not an IDCODE: write it as hex (0x0362D093) or "
                                                  "as up to 32 binary digits");
    expectUsageError(run({"shift", "dr", "0xZ"}), "'0xZ' is not valid hexadecimal data");
    expectUsageError(run({"shift", "dr", "0x1", "--exit", "nowhere"}, false),
                     "'nowhere' is not a TAP state; use one of TEST_LOGIC_RESET, RUN_TEST_IDLE, SELECT_DR_SCAN, "
                     "CAPTURE_DR, SHIFT_DR, EXIT1_DR, PAUSE_DR, EXIT2_DR, UPDATE_DR, SELECT_IR_SCAN, CAPTURE_IR, "
                     "SHIFT_IR, EXIT1_IR, PAUSE_IR, EXIT2_IR, UPDATE_IR (or idle, reset)");
}

TEST_F(CliProgramTest, TargetsListsTheSimulatedCable)
{
    RunResult r = run({"targets"}, false);
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_TRUE(contains(r.out, "jtag_sim")) << r.out;

    const minijson::Value doc = runJson({"targets", "--xml"});
    bool found = false;
    for (const minijson::Value& t : doc["targets"].items)
        if (t["name"].str() == "jtag_sim") {
            found = true;
            EXPECT_TRUE(contains(t["xml"].str(), "<targetname>jtag_sim</targetname>")) << t["xml"].str();
        }
    EXPECT_TRUE(found);
    EXPECT_EQ(doc["targets"].items.size(), doc["count"].uint());
}

TEST_F(CliProgramTest, ScanPrintsTheDefaultChainWithDeviceNames)
{
    const RunResult r = run({"scan"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("", r.err);
    EXPECT_EQ("jtag_sim: 3 devices (device 0 is nearest TDO)\n"
              "  #  IDCODE      IR  DEVICE\n"
              "  0  0x4BA00477   4  ARM_JTAG-DP\n"
              "  1  0x0362D093   6  XC7A35T\n"
              "  2  0x41111043   8  LFE5U-25F\n",
              r.out);
}

TEST_F(CliProgramTest, ScanJsonOfAChainGivenOnTheCommandLine)
{
    const minijson::Value doc = runJson({"scan", "--chain", "0x0362D093:6,0x12345679:5"});
    EXPECT_EQ("jtag_sim", doc["target"].str());
    ASSERT_EQ(2u, doc["count"].uint());
    const minijson::Value& artix = doc["devices"][0];
    EXPECT_EQ(0u, artix["index"].uint());
    EXPECT_EQ("0x0362D093", artix["idcode"].str());
    EXPECT_EQ("00000011011000101101000010010011", artix["idcode_bits"].str());
    EXPECT_EQ(6u, artix["ir_length"].uint());
    EXPECT_EQ("XC7A35T", artix["name"].str());
    EXPECT_TRUE(artix["known"].boolValue());
    const minijson::Value& stranger = doc["devices"][1];
    EXPECT_EQ("0x12345679", stranger["idcode"].str());
    EXPECT_TRUE(stranger["name"].isNull());
    EXPECT_FALSE(stranger["known"].boolValue());
    // A device the database does not know gets the IR length the chain's IR capture shows.
    EXPECT_EQ(5u, stranger["ir_length"].uint());
    EXPECT_EQ("capture", stranger["ir_length_source"].str());
    EXPECT_EQ("database", artix["ir_length_source"].str());

    // Without autodetection the plug-in's own IR lengths stay.
    const minijson::Value plain = runJson({"scan", "--chain", "0x0362D093:6,0x12345679:5", "--no-autodetect"});
    EXPECT_EQ(5u, plain["devices"][1]["ir_length"].uint());
    EXPECT_EQ("XC7A35T", plain["devices"][0]["name"].str());
}

TEST_F(CliProgramTest, UnknownTargetTypeAndBadOpenArgumentsFailWithOne)
{
    RunResult r = run({"scan", "--target", "no_such_cable"});
    expectFailure(r, "unknown target type 'no_such_cable'; available: ");
    EXPECT_TRUE(contains(r.err, "jtag_sim")) << r.err;

    // The plug-in refuses a bad chain: its message, then ours.
    r = run({"scan", "--chain", "0x4BA00477:1"});
    expectFailure(r, "cannot open target 'jtag_sim'\n");
    EXPECT_TRUE(contains(r.err, "error: ")) << r.err;
}

TEST_F(CliProgramTest, LookupNamesKnownAndReportsUnknownIdcodes)
{
    RunResult r = run({"lookup", "0x0362D093"}, false);
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("IDCODE     0x0362D093\nDevice     XC7A35T\nIR length  6\nBYPASS     111111\n", r.out);

    // The version bits are not compared; bit text works as well.
    minijson::Value doc = runJson({"lookup", "01010011011000101101000010010011"});
    EXPECT_EQ("0x5362D093", doc["idcode"].str());
    EXPECT_EQ("01010011011000101101000010010011", doc["idcode_bits"].str());
    EXPECT_TRUE(doc["known"].boolValue());
    EXPECT_EQ("XC7A35T", doc["name"].str());
    EXPECT_EQ(6u, doc["ir_length"].uint());
    EXPECT_EQ("111111", doc["bypass"].str());

    doc = runJson({"lookup", "0x00000001"});
    EXPECT_FALSE(doc["known"].boolValue());
    EXPECT_TRUE(doc["name"].isNull());
    EXPECT_EQ(0u, doc["ir_length"].uint());
}

TEST_F(CliProgramTest, DatadirChoosesTheDeviceList)
{
    testsupport::writeFile(runner.dir() / "data" / "idcode.lst",
                           "XXXX_0001_0010_0011_0100_0101_0110_0111  5 1 0 MY_TEST_PART\n");
    const minijson::Value doc =
        runJson({"lookup", "0x01234567", "--datadir", (runner.dir() / "data").string()});
    EXPECT_EQ("MY_TEST_PART", doc["name"].str());
    EXPECT_EQ(5u, doc["ir_length"].uint());

    expectFailure(run({"lookup", "0x1", "--datadir", (runner.dir() / "missing").string()}),
                  "cannot create a library session");
}

TEST_F(CliProgramTest, ShiftDeviceRegistersOfTheDefaultChain)
{
    // Capture-IR of a 6-bit IR: ...01.  Hex data is fitted to the device's IR.
    RunResult r = run({"shift", "ir", "--device", "1", "0x09"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("0x01\n", r.out);
    r = run({"shift", "ir", "--device", "1", "001001"});
    EXPECT_EQ("000001\n", r.out);

    // The IDCODE instruction, then device 1's data register: its IDCODE.
    minijson::Value doc = runJson({"shift", "dr", "--device", "1", "--ir", "0x09", "--bits", "32"});
    EXPECT_EQ("dr", doc["register"].str());
    EXPECT_EQ(1u, doc["device"].uint());
    EXPECT_EQ(32u, doc["bits"].uint());
    EXPECT_EQ("RUN_TEST_IDLE", doc["exit_state"].str());
    EXPECT_TRUE(doc["tdi"].isNull());
    EXPECT_EQ("0x0362D093", doc["tdo"].str());
    EXPECT_EQ("00000011011000101101000010010011", doc["tdo_bits"].str());
    EXPECT_EQ(6u, doc["instruction"]["bits"].uint());
    EXPECT_EQ("0x09", doc["instruction"]["tdi"].str());
    EXPECT_EQ("0x01", doc["instruction"]["tdo"].str());

    // Device 2's IDCODE opcode is 0xE0; binary data written into its data register comes back shifted through.
    r = run({"shift", "dr", "-d", "2", "--ir", "0xE0", "0b00000000000000000000000000000000"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("0b01000001000100010001000001000011\n", r.out);
}

TEST_F(CliProgramTest, ShiftTheWholeChain)
{
    // Three IDCODEs, device 0's first out (the least significant bits).
    RunResult r = run({"shift", "dr", "--bits", "96"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("0x411110430362D0934BA00477\n", r.out);
    // Four bits written: TDO holds the first four bits of device 0's IDCODE.
    r = run({"shift", "dr", "0b1010"});
    EXPECT_EQ("0b0111\n", r.out);

    // The chain's IR (4 + 6 + 8 bits) captures ...01 in each device.
    r = run({"shift", "ir", "--bits", "18", "0x3FFFF", "--exit", "pause-ir"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ("0x00411\n", r.out);
    r = run({"shift", "ir", "0b111111111111111111"});
    EXPECT_EQ("0b000000010000010001\n", r.out);
}

TEST_F(CliProgramTest, ShiftRefusesWhatDoesNotFitTheDevice)
{
    const std::pair<std::vector<std::string>, std::string> cases[] = {
        {{"shift", "dr", "--device", "3", "--bits", "1"}, "there is no device 3: the chain has 3 devices"},
        // The message names the data as written, and its length after --bits.
        {{"shift", "ir", "--device", "1", "0b101"}, "device 1 has an IR length of 6, but 0b101 has 3 bits"},
        {{"shift", "ir", "--device", "1", "--bits", "8", "0x09"}, "device 1 has an IR length of 6, but 0x09 has 8 bits"},
        {{"shift", "dr", "--device", "1", "--ir", "0b111", "0x0"}, "device 1 has an IR length of 6, but 0b111 has 3 bits"},
        {{"shift", "ir", "--device", "1", "0xFF"},
         "data 0xFF does not fit into the 6-bit instruction register of device 1"},
    };
    for (const auto& [args, message] : cases) {
        const RunResult r = run(args);
        expectFailure(r, message);
        EXPECT_EQ("jexjtag: " + message + "\n", r.err); // and nothing else
    }
}

TEST_F(CliProgramTest, InfoShowsTheRecordAndTheApiVersion)
{
    RunResult r = run({"info"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_TRUE(contains(r.out, "target_type   jtag_sim\n")) << r.out;
    EXPECT_TRUE(contains(r.out, "api_version   0x")) << r.out;

    const minijson::Value doc = runJson({"info", "--arg", "new_firmware=1"});
    EXPECT_GT(doc["api_version"].uint(), 0u);
    EXPECT_EQ(0u, doc["api_version_text"].str().find("Version "));
    EXPECT_EQ("jtag_sim", doc["target_type"].str());
    EXPECT_TRUE(doc["target"]["new_firmware"].boolValue());
    EXPECT_EQ(m_port, doc["target"]["port"].str());

    // AVOID_FIRMWARE_UPDATE closes such a target again: no success then.
    expectFailure(run({"info", "--arg", "new_firmware=1", "--arg", "AVOID_FIRMWARE_UPDATE=true"}),
                  "target 'jtag_sim' was closed again after opening");
}

TEST_F(CliProgramTest, ALockHeldElsewhereIsReportedClearly)
{
    // This process holds the port's lock through the library.
    testsupport::ScopedEnv lockDir("JEXJTAG_LOCK_DIR", m_lockDir);
    unsigned handle = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_session_create(nullptr, 0, nullptr, &handle));
    const std::string portArg = "port=" + m_port;
    const char* args[] = {portArg.c_str()};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_open(handle, "jtag_sim", nullptr, 1, args, nullptr));
    unsigned status = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_lock(handle, 0, &status));

    expectFailure(run({"scan", "--lock-wait", "100"}),
                  "cannot lock target 'jtag_sim': locked by another process (waited 100 ms");
    // --no-lock goes ahead all the same.
    RunResult r = run({"scan", "--no-lock"});
    EXPECT_EQ(0, r.exitCode) << r.err;

    EXPECT_EQ(JEX_SUCCESS, JexJtag_target_unlock(handle));
    EXPECT_EQ(JEX_SUCCESS, JexJtag_session_destroy(handle));
    r = run({"scan", "--lock-wait", "100"});
    EXPECT_EQ(0, r.exitCode) << r.err;
}

TEST_F(CliProgramTest, LogLevelAndVerboseReachTheLibrary)
{
    const std::string logFile = (runner.dir() / "lib.log").string();
    RunResult r = run({"scan", "--log-level", "3", "--log-file", logFile});
    EXPECT_EQ(0, r.exitCode) << r.err;
    const std::string log = testsupport::readFile(logFile);
    EXPECT_TRUE(contains(log, "JexJtag_session_create() argc=0")) << log;
    EXPECT_TRUE(contains(log, "JexJtag_tap_autodetectChain() handle=65536, algorithm=JEXJTAG_SCAN_DEFAULT")) << log;
    EXPECT_TRUE(contains(log, "JexJtag_target_unlock() handle=65536")) << log;
}

// A device shift never reports a result computed with an unknown IR length.
TEST_F(CliProgramTest, ShiftFailsWhenADeviceOnTheChainHasNoKnownIRLength)
{
    expectFailure(run({"shift", "dr", "--device", "0", "--bits", "32", "--chain", "0x0362D093:6,0x12345679:5"}),
                  "the IR length of device 1 (IDCODE 0x12345679) is unknown");
    const RunResult r =
        run({"shift", "dr", "--device", "0", "--bits", "32", "--chain", "0x0362D093:6,0x12345679:5", "--no-autodetect"});
    EXPECT_EQ(0, r.exitCode) << r.err;
}

// The BSDL file is opened once: a FIFO works once a writer comes.
TEST_F(CliProgramTest, BsdlReadsAFifo)
{
    const std::string fifo = (runner.dir() / "dev.bsd").string();
    ASSERT_EQ(0, mkfifo(fifo.c_str(), 0600));
    std::thread writer([&] {
        const std::string text = "entity T is\n attribute INSTRUCTION_LENGTH of T : entity is 2;\n"
                                 " attribute INSTRUCTION_OPCODE of T : entity is \"BYPASS (11)\";\nend T;\n";
        // Bounded: a reader that never comes (or comes twice) fails the test, never hangs it.
        for (int pass = 0; pass < 2; ++pass) {
            int fd = -1;
            for (int i = 0; i < 500 && fd < 0; ++i) {
                fd = open(fifo.c_str(), O_WRONLY | O_NONBLOCK);
                if (fd < 0) usleep(10000);
            }
            if (fd < 0) return;
            if (pass == 0 && write(fd, text.data(), text.size()) < 0) ADD_FAILURE() << "write failed";
            close(fd);
        }
    });
    const RunResult r = run({"bsdl", fifo}, false);
    writer.join();
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_TRUE(contains(r.out, "IR length  2")) << r.out;
}

// A lock directory that cannot be used is reported as what it is.
TEST_F(CliProgramTest, AnUnusableLockDirectoryIsNotCalledAHolder)
{
    const std::string blocked = (runner.dir() / "not-a-dir").string();
    testsupport::writeFile(blocked, "");
    runner.setEnv("JEXJTAG_LOCK_DIR", blocked);
    const RunResult r = run({"scan", "--lock-wait", "0"});
    expectFailure(r, "cannot lock target 'jtag_sim': jtag_sim: cannot lock port");
    EXPECT_EQ(std::string::npos, r.err.find("locked by another process")) << r.err;
}

namespace {

const std::string kPartDir = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/e2e/data";
const std::string kPartFile = kPartDir + "/board_part.bsd";
// A part made from a BSDL file between a known device and an unknown one.
const std::string kPartChain = "0x4BA00477:4,bsdl=" + kPartFile + ",0x12345679:5";

} // namespace

TEST_F(CliProgramTest, PinsSamplesAndDrivesAPartMadeFromABsdlFile)
{
    const std::vector<std::string> base = {"pins", "-d", "1", "--bsdl", kPartFile, "--chain", kPartChain,
                                           "--arg", "pins=1:IN0=1;1:10=1"};
    const minijson::Value doc = runJson(base);
    EXPECT_EQ(1u, doc["device"].uint());
    const minijson::Value& in0 = doc["pins"][0];
    EXPECT_EQ("IN0", in0["port"].str());
    EXPECT_EQ("5", in0["pin"].str());
    EXPECT_EQ("input", in0["function"].str());
    EXPECT_EQ(0u, in0["cell"].uint());
    EXPECT_EQ(1u, in0["level"].uint());
    EXPECT_TRUE(doc["pins"][2]["level"].isNull()); // OUT0: no capturing cell
    EXPECT_EQ("bidir", doc["pins"][4]["function"].str());
    EXPECT_EQ(1u, doc["pins"][4]["level"].uint()); // IO(1), pin 10

    // Driven under EXTEST, a bidirectional pin reads its own level; a
    // released one the board's.
    std::vector<std::string> set = base;
    set.insert(set.end(), {"--set", "IO(0)=1", "IO(1)=z", "OUT0=0"});
    const minijson::Value driven = runJson(set);
    EXPECT_EQ(1u, driven["pins"][3]["level"].uint());
    EXPECT_EQ(1u, driven["pins"][4]["level"].uint());

    RunResult r = run(base);
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_EQ(0u, r.out.find("device 1 (BOARD_PART), SAMPLE: 5 pins\n"
                             "  PORT   PIN  FUNCTION  CELL  LEVEL\n"
                             "  IN0    5    input        0      1\n")) << r.out;
    std::vector<std::string> watch = base;
    watch.insert(watch.end(), {"--watch", "--count", "2", "--interval", "1"});
    r = run(watch);
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_TRUE(contains(r.out, "  IO(1)  10   bidir        7      1\n")) << r.out;
    std::vector<std::string> highz = base;
    highz.push_back("--highz");
    r = run(highz);
    EXPECT_EQ("device 1 (BOARD_PART): HIGHZ, every output released\n", r.out);

    expectUsageError(run({"pins", "--bsdl", kPartFile}), "'pins' needs --device N");
    expectUsageError(run({"pins", "-d", "1", "--bsdl", kPartFile, "IO(0)=1"}), "pin settings as operands need --set");
    expectUsageError(run({"pins", "-d", "1", "--bsdl", kPartFile, "--set", "IO(0)=2"}),
                     "'IO(0)=2' is not PORT=0, PORT=1 or PORT=z");
    std::vector<std::string> input = base;
    input.insert(input.end(), {"--set", "IN0=1"});
    expectFailure(run(input), "EXTEST of device 1 failed");
    expectFailure(run({"pins", "-d", "3", "--bsdl", kPartFile, "--chain", kPartChain}),
                  "device 3 is outside the chain of 3 devices");
    // The wrong file for the device is worth a warning.
    r = run({"pins", "-d", "1", "--bsdl", kPartFile, "--chain", kPartChain});
    EXPECT_EQ("", r.err);
    r = run({"pins", "-d", "2", "--bsdl", kPartFile, "--chain", kPartChain});
    EXPECT_TRUE(contains(r.err, "warning: device 2 has IDCODE 00010010001101000101011001111001, which ")) << r.err;
}

TEST_F(CliProgramTest, ScanNamesUnknownDevicesFromABsdlDirectory)
{
    const minijson::Value doc = runJson({"scan", "--chain", kPartChain, "--bsdl-dir", kPartDir});
    ASSERT_EQ(3u, doc["count"].uint());
    EXPECT_EQ("database", doc["devices"][0]["ir_length_source"].str());
    const minijson::Value& part = doc["devices"][1];
    EXPECT_EQ("BOARD_PART", part["name"].str());
    EXPECT_EQ(4u, part["ir_length"].uint());
    EXPECT_EQ("bsdl", part["ir_length_source"].str());
    EXPECT_EQ(kPartFile, part["bsdl_file"].str());
    EXPECT_EQ("capture", doc["devices"][2]["ir_length_source"].str());
    EXPECT_EQ(5u, doc["devices"][2]["ir_length"].uint());

    // Without the directory the part is unknown too; its IR length comes
    // from the capture.
    const minijson::Value bare = runJson({"scan", "--chain", kPartChain});
    EXPECT_TRUE(bare["devices"][1]["name"].isNull());
    EXPECT_EQ(4u, bare["devices"][1]["ir_length"].uint());
    EXPECT_EQ("capture", bare["devices"][1]["ir_length_source"].str());
    expectFailure(run({"scan", "--bsdl-dir", kPartDir + "/none"}), "cannot read the BSDL directory");
}
