// SPDX-License-Identifier: MIT
// Pin access end to end: parts made from a BSDL file in jtag_sim, sampled
// and driven through the C API (bsdl.h), between devices without BSDL.

#include <map>
#include <string>
#include <vector>

#include "SimSession.hpp"

namespace {

const std::string kPartFile = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/e2e/data/board_part.bsd";
const std::string kPart = "bsdl=" + kPartFile;

class Pins : public e2e::SimSession {
protected:
    void SetUp() override
    {
        SimSession::SetUp();
        ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_open(m_handle, kPartFile.c_str(), &part));
    }
    // Port element -> sampled level (-1: no capturing cell).
    std::map<std::string, int> sample(unsigned device, std::vector<uint8_t>* cells = nullptr)
    {
        signed char levels[16];
        unsigned char bits[2] = {};
        EXPECT_EQ(JEX_SUCCESS, JexJtag_bsdl_sample(m_handle, device, part, levels, 16, bits, sizeof bits));
        if (cells) *cells = {bits[0]};
        return named(levels);
    }
    std::map<std::string, int> named(const signed char* levels)
    {
        std::map<std::string, int> out;
        for (unsigned i = 0; i < 5; ++i) {
            JexBsdlPin pin;
            EXPECT_EQ(JEX_SUCCESS, JexJtag_bsdl_getPin(m_handle, part, i, &pin));
            out[pin.port] = levels[i];
        }
        return out;
    }
    uint32_t drive(unsigned device, std::vector<const char*> pins, const char* values,
                   std::map<std::string, int>* read = nullptr)
    {
        signed char levels[16];
        const uint32_t status = JexJtag_bsdl_extest(m_handle, device, part, static_cast<unsigned>(pins.size()),
                                                    pins.data(), values, levels, 16);
        if (read && status == JEX_SUCCESS) *read = named(levels);
        return status;
    }
    void set(const std::string& option)
    {
        ASSERT_EQ(JEX_SUCCESS, JexJtag_target_setOption(m_handle, option.substr(0, option.find('=')).c_str(),
                                                        option.substr(option.find('=') + 1).c_str()));
    }

    unsigned part = 0;
};

using Levels = std::map<std::string, int>;

} // namespace

TEST_F(Pins, SampleReadsThePinsTheBoardSetsBetweenDevicesWithoutBsdl)
{
    ASSERT_EQ(JEX_SUCCESS, open(e2e::kDap + "," + kPart + "," + e2e::kArtix, {"pins=1:IN0=1;1:IO(1)=1;1:9=0"}));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_autodetectChain(m_handle, 0));
    char idcode[33] = {};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_tap_getDeviceIdcode(m_handle, 1, idcode, sizeof idcode));
    EXPECT_EQ(e2e::idcodeText(0x3ACE1FFDu), std::string(idcode, 32));
    EXPECT_EQ((Levels {{"IN0", 1}, {"IN1", 0}, {"OUT0", -1}, {"IO(0)", 0}, {"IO(1)", 1}}), sample(1));

    // The board changes while the cable is open; package pins name pins too.
    set("pins=1:IN1=1;1:5=0");
    EXPECT_EQ((Levels {{"IN0", 0}, {"IN1", 1}, {"OUT0", -1}, {"IO(0)", 0}, {"IO(1)", 1}}), sample(1));
    char value[128];
    unsigned size = sizeof value;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_target_getOption(m_handle, "pins", value, &size));
    EXPECT_STREQ("1:5=0;1:IO(1)=1;1:9=0;1:IN1=1", value);

    // The devices around it still answer in BYPASS and IDCODE.
    ASSERT_EQ(JEX_SUCCESS, loadInstruction(2, 0x9, 6));
    EXPECT_EQ(e2e::kArtixId, readDeviceDR(2, 32));
    EXPECT_EQ(JEX_FAILURE, JexJtag_bsdl_sample(m_handle, 3, part, nullptr, 0, nullptr, 0));
}

TEST_F(Pins, ExtestOnOnePartIsSampledOnTheWiredOther)
{
    ASSERT_EQ(JEX_SUCCESS, open(kPart + "," + e2e::kEcp5 + "," + kPart,
                                {"wire=0:OUT0-2:IN0;0:IO(0)-2:IO(1);0:IO(1)-2:IN1", "pins=2:IN1=1"}));
    Levels read;
    ASSERT_EQ(JEX_SUCCESS, drive(0, {"OUT0", "IO(0)"}, "11", &read));
    // Under EXTEST a bidirectional pin reads what it drives.
    EXPECT_EQ(1, read["IO(0)"]);
    EXPECT_EQ((Levels {{"IN0", 1}, {"IN1", 1}, {"OUT0", -1}, {"IO(0)", 0}, {"IO(1)", 1}}), sample(2));

    // Pins not named keep their cells' safe values: device 0's IO(1) stays
    // released, so device 2's IN1 reads the board's 1; its own control cell
    // 6 holds 0 and cells 2 and 4 enable OUT0 and IO(0).
    ASSERT_EQ(JEX_SUCCESS, drive(0, {"IO(1)"}, "0"));
    EXPECT_EQ(0, sample(2)["IN1"]);
    EXPECT_EQ(0, sample(2)["IN0"]); // OUT0 released again: safe control value
    ASSERT_EQ(JEX_SUCCESS, drive(0, {"OUT0", "io(1)"}, "1z"));
    std::vector<uint8_t> cells;
    sample(0, &cells); // captures the latches EXTEST left
    EXPECT_EQ(0x0Cu, cells[0] & 0x5Cu); // cell 2 = 1, cell 3 = 1, cell 4 = 0, cell 6 = 0
    EXPECT_EQ(1, sample(2)["IN1"]);

    // HIGHZ releases every output; CLAMP drives the safe values.
    ASSERT_EQ(JEX_SUCCESS, drive(0, {"OUT0"}, "1"));
    EXPECT_EQ(1, sample(2)["IN0"]);
    ASSERT_EQ(JEX_SUCCESS, drive(0, {"OUT0"}, "1"));
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_highz(m_handle, 0, part));
    EXPECT_EQ(0, sample(2)["IN0"]);
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_clamp(m_handle, 0, part));
    EXPECT_EQ(0, sample(2)["IN0"]);
}

TEST_F(Pins, PinsThatCannotBeDrivenFailBeforeAnythingIsShifted)
{
    ASSERT_EQ(JEX_SUCCESS, open(kPart, {"pins=0:IN0=1"}));
    e2e::messages().clear();
    EXPECT_EQ(JEX_FAILURE, drive(0, {"IN0"}, "1"));
    EXPECT_EQ(JEX_FAILURE, drive(0, {"NOPE"}, "1"));
    EXPECT_EQ(JEX_FAILURE, drive(0, {"OUT0"}, "2"));
    EXPECT_EQ(JEX_FAILURE, drive(0, {"OUT0", "7"}, "10"));
    EXPECT_EQ((std::vector<std::string> {"pin IN0 has no output cell; it cannot be driven\n",
                                         "no pin NOPE in BOARD_PART\n", "pin OUT0: a level is 0, 1 or z\n",
                                         "pin OUT0 is named twice\n"}),
              e2e::messagesOfType(JEX_MSG_ERROR));
    EXPECT_EQ(1, sample(0)["IN0"]);
    // A bad board setting is refused and changes nothing.
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "pins", "0:NOPE=1"));
    EXPECT_EQ(JEX_FAILURE, JexJtag_target_setOption(m_handle, "wire", "0:IN0-1:IN0"));
    EXPECT_EQ(1, sample(0)["IN0"]);
}

TEST_F(Pins, AVendorPartWithALongRegisterDrivesAndReadsItsPins)
{
    // 104 cells: the register moves through the simulator 64 bits at a time.
    const std::string vendor = std::string(JEXJTAG_TEST_SOURCE_DIR) + "/tests/bsdl/data/lattice_LCMXO2_256HC_QFN32.bsd";
    ASSERT_EQ(JEX_SUCCESS, open("bsdl=" + vendor + "," + e2e::kArtix + ",bsdl=" + vendor,
                                {"pins=0:PL5C=1;0:PT9B=1", "wire=0:PT8C-2:PT8D;2:PT9A-0:PL5D"}));
    unsigned lattice = 0;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_open(m_handle, vendor.c_str(), &lattice));
    JexBsdlSummary s;
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_getSummary(m_handle, lattice, &s));
    ASSERT_EQ(104u, s.boundaryLength);
    const auto levelsOf = [&](unsigned device) {
        std::vector<signed char> levels(s.pinCount);
        EXPECT_EQ(JEX_SUCCESS, JexJtag_bsdl_sample(m_handle, device, lattice, levels.data(), s.pinCount, nullptr, 0));
        std::map<std::string, int> out;
        for (unsigned i = 0; i < s.pinCount; ++i) {
            JexBsdlPin pin;
            JexJtag_bsdl_getPin(m_handle, lattice, i, &pin);
            out[pin.port] = levels[i];
        }
        return out;
    };
    Levels before = levelsOf(0);
    EXPECT_EQ(1, before["PL5C"]);
    EXPECT_EQ(1, before["PT9B"]);
    EXPECT_EQ(0, before["PT8C"]);

    const char* pins[] = {"PT8C", "PT9A"};
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_extest(m_handle, 0, lattice, 1, pins, "1", nullptr, 0));
    EXPECT_EQ(1, levelsOf(2)["PT8D"]); // driven by device 0, held in EXTEST
    ASSERT_EQ(JEX_SUCCESS, JexJtag_bsdl_extest(m_handle, 2, lattice, 1, pins + 1, "1", nullptr, 0));
    EXPECT_EQ(1, levelsOf(0)["PL5D"]); // driven by device 2; SAMPLE releases device 0
    EXPECT_EQ(0, levelsOf(2)["PT8D"]);
}
