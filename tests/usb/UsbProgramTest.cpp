// SPDX-License-Identifier: MIT
// The jexjtag program with the USB cable: on the emulated adapter (the child
// finds the stand-in libusb-1.0 through LD_LIBRARY_PATH) and on the real
// libftdi1 and libusb with no adapter attached.

#include <gtest/gtest.h>

#include "../cli/ProgramRunner.hpp"

namespace {

class UsbProgram : public ::testing::Test {
protected:
    UsbProgram()
    {
        m_run.setEnv("JEXJTAG_LOCK_DIR", (m_run.dir() / "locks").string());
        std::filesystem::create_directories(m_run.dir() / "locks");
    }
    void useEmulator() { m_run.setEnv("LD_LIBRARY_PATH", JEXJTAG_FTDI_EMU_DIR); }
    clitest::ProgramRunner m_run;
};

} // namespace

TEST_F(UsbProgram, CablesListsAndScanReadsTheEmulatedAdapter)
{
    useEmulator();
    m_run.setEnv("JEXJTAG_FTDI_EMU_ADAPTERS",
                 "0403:6010:2232H:Dual RS232-HS:JEX0001;15ba:002a:2232H:Olimex OpenOCD JTAG ARM-USB-TINY-H:OL7");
    const clitest::RunResult cables = m_run.run({"cables"});
    EXPECT_EQ(0, cables.exitCode) << cables.err;
    EXPECT_NE(std::string::npos, cables.out.find("2 USB adapters:")) << cables.out;
    EXPECT_NE(std::string::npos, cables.out.find("olimex-arm-usb-tiny-h  OL7      1/2.2     15ba:002a")) << cables.out;

    const clitest::RunResult r =
        m_run.run({"scan", "--target", "ormund_usbcable", "--arg", "cable=olimex-arm-usb-tiny-h"});
    EXPECT_EQ(0, r.exitCode) << r.err;
    EXPECT_NE(std::string::npos, r.out.find("ormund_usbcable: 3 devices")) << r.out;
    EXPECT_NE(std::string::npos, r.out.find("0x0362D093   6  XC7A35T")) << r.out;
}

TEST_F(UsbProgram, WithoutAnAdapterOpenFailsWithAMessage)
{
    m_run.setEnv("LD_LIBRARY_PATH", "");
    const clitest::RunResult r = m_run.run({"scan", "--target", "ormund_usbcable", "--arg", "cable=ft232h"});
    EXPECT_NE(0, r.exitCode);
    EXPECT_NE(std::string::npos, r.err.find("ormund_usbcable: no USB adapter found (USB ids 0403:6014")) << r.err;
    const clitest::RunResult cables = m_run.run({"cables"});
    EXPECT_EQ(0, cables.exitCode) << cables.err;
    EXPECT_EQ("no USB adapters attached\n", cables.out);
}
