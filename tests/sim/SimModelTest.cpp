// The simulated devices and chain, driven through the cable's TAP logic.
#include <gtest/gtest.h>

#include <random>

#include "ChainLayout.hpp"
#include "JtagEngine.hpp"
#include "SimChain.hpp"
#include "SimTestSupport.hpp"

using jexcable::ChainLayout;
using jexcable::JtagEngine;
using jexcable::ShiftSink;
using jexcable::ShiftSource;
using jexsim::DeviceSpec;
using jexsim::SimChain;
using jexsim::SimDevice;
using simtest::bits;
using simtest::value;

namespace {

constexpr auto IR = JtagEngine::Register::Instruction;
constexpr auto DR = JtagEngine::Register::Data;

// Device 0: ARM DAP-like, IR 4; device 1: no IDCODE, IR 5; device 2: IR 6.
std::vector<DeviceSpec> threeDevices()
{
    return {simtest::device(0x4BA00477, 4, 0xE, 0xA, 35), simtest::noIdcode(5, 0x5),
            simtest::device(0x0362D093, 6, 0x09, 0x02, 32, 0x11)};
}

struct Bench {
    explicit Bench(std::vector<DeviceSpec> specs) : chain(specs), engine(chain) { engine.resetTap(); }

    std::vector<uint8_t> read(JtagEngine::Register reg, unsigned n, bool tdi = true,
                              JexJtagTapState exit = JEXJTAG_RUN_TEST_IDLE)
    {
        std::vector<uint8_t> out(jexcable::BitBuffer::bytesFor(n), 0);
        engine.shiftLevel(reg, tdi, out.data(), n, exit);
        return out;
    }
    std::vector<uint8_t> write(JtagEngine::Register reg, const std::vector<uint8_t>& in, unsigned n,
                               uint64_t before = 0, uint64_t after = 0, JexJtagTapState exit = JEXJTAG_RUN_TEST_IDLE)
    {
        std::vector<uint8_t> out(jexcable::BitBuffer::bytesFor(n), 0);
        ShiftSink sink = ShiftSink::buffer(out.data());
        engine.shift(reg, ShiftSource::buffer(in.data()), sink, n, exit, before, after);
        return out;
    }

    SimChain chain;
    JtagEngine engine;
};

struct CountingObserver : jexsim::ChainObserver {
    void onClock(const SimChain&, bool, bool, bool) override { ++clocks; }
    uint64_t clocks = 0;
};

} // namespace

TEST(SimModel, ResetSelectsIdcodeAndCaptureIrLoadsEachDevicesPattern)
{
    Bench b(threeDevices());
    auto out = b.read(DR, 32 + 1 + 32 + 8);
    EXPECT_EQ(value(out, 32, 0), 0x4BA00477u) << "device 0 leaves first";
    EXPECT_EQ(value(out, 1, 32), 0u) << "a device without IDCODE selects BYPASS, which captures 0";
    EXPECT_EQ(value(out, 32, 33), 0x0362D093u);
    EXPECT_EQ(value(out, 8, 65), 0xFFu) << "then the TDI level comes through";

    out = b.read(IR, 15);
    EXPECT_EQ(value(out, 4, 0), 0x1u);
    EXPECT_EQ(value(out, 5, 4), 0x5u);
    EXPECT_EQ(value(out, 6, 9), 0x11u);
    // After the scan every IR holds ones: BYPASS everywhere, until a reset.
    for (std::size_t d = 0; d < b.chain.size(); ++d)
        EXPECT_EQ(b.chain.device(d).selected(), SimDevice::DataRegister::Bypass);
    b.engine.resetTap();
    EXPECT_EQ(b.chain.device(0).selected(), SimDevice::DataRegister::Idcode);
    EXPECT_EQ(b.chain.device(1).selected(), SimDevice::DataRegister::Bypass);
    EXPECT_EQ(b.chain.device(2).selected(), SimDevice::DataRegister::Idcode);
}

TEST(SimModel, EveryUnassignedOpcodeActsAsBypass)
{
    for (uint64_t opcode = 0; opcode < 16; ++opcode) {
        Bench b({simtest::device(0x4BA00477, 4, 0xE, 0xA, 35)});
        b.write(IR, bits(opcode, 4), 4);
        EXPECT_EQ(b.chain.device(0).instruction(), opcode);
        const auto out = b.read(DR, 40);
        if (opcode == 0xE) {
            EXPECT_EQ(value(out, 32), 0x4BA00477u);
        } else if (opcode == 0xA) {
            EXPECT_EQ(value(out, 35), 0u) << "the user register starts cleared";
            EXPECT_EQ(value(out, 5, 35), 0x1Fu);
        } else {
            EXPECT_EQ(value(out, 1), 0u) << "opcode " << opcode;
            EXPECT_EQ(value(out, 39, 1), (uint64_t{1} << 39) - 1) << "opcode " << opcode << ": one-bit register";
        }
    }
}

TEST(SimModel, UserRegisterKeepsWhatIsWritten)
{
    Bench b({simtest::device(0x0362D093, 6, 0x09, 0x02, 32)});
    b.write(IR, bits(0x02, 6), 6);
    b.write(DR, bits(0xCAFEF00D, 32), 32);
    EXPECT_EQ(b.chain.device(0).userRegister(), 0xCAFEF00Du);
    // Read back while writing the next value.
    const auto old = b.write(DR, bits(0x12345678, 32), 32);
    EXPECT_EQ(value(old, 32), 0xCAFEF00Du);
    // A read drives TDI too: what it shifts in is what the register keeps.
    EXPECT_EQ(value(b.read(DR, 32, false), 32), 0x12345678u);
    EXPECT_EQ(b.chain.device(0).userRegister(), 0u);
    b.write(DR, bits(0x0BADCAFE, 32), 32);
    // Test-Logic-Reset changes the instruction, not the register.
    b.engine.resetTap();
    b.write(IR, bits(0x02, 6), 6);
    EXPECT_EQ(value(b.read(DR, 32), 32), 0x0BADCAFEu);
}

TEST(SimModel, DeviceRelativeShiftsAddressOnlyTheirDevice)
{
    Bench b(threeDevices());
    ChainLayout layout;
    layout.assign({{0x4BA00477, 4}, {0, 5}, {0x0362D093, 6}});
    // Device 2 gets USER1, the others BYPASS through the padding.
    b.write(IR, bits(0x02, 6), 6, layout.irBitsBefore(2), layout.irBitsAfter(2));
    EXPECT_EQ(b.chain.device(0).instruction(), 0xFu);
    EXPECT_EQ(b.chain.device(1).instruction(), 0x1Fu);
    EXPECT_EQ(b.chain.device(2).instruction(), 0x02u);
    b.write(DR, bits(0xA5A5A5A5, 32), 32, layout.bypassBitsBefore(2), layout.bypassBitsAfter(2));
    EXPECT_EQ(b.chain.device(2).userRegister(), 0xA5A5A5A5u);
    EXPECT_EQ(b.chain.device(0).userRegister(), 0u);
    const auto back = b.write(DR, bits(0, 32), 32, layout.bypassBitsBefore(2), layout.bypassBitsAfter(2));
    EXPECT_EQ(value(back, 32), 0xA5A5A5A5u);

    // Device 0's IR read-back shows its own capture, not its neighbours'.
    const auto capture = b.write(IR, bits(0xE, 4), 4, layout.irBitsBefore(0), layout.irBitsAfter(0));
    EXPECT_EQ(value(capture, 4), 0x1u);
    EXPECT_EQ(b.chain.device(0).instruction(), 0xEu);
    EXPECT_EQ(b.chain.device(2).instruction(), 0x3Fu);
}

TEST(SimModel, ExitStatesAreReachedAndShiftsContinue)
{
    Bench b({simtest::device(0x0362D093, 6, 0x09, 0x02, 32)});
    b.write(IR, bits(0x02, 6), 6);
    // Write 32 bits in two pieces: stay in Shift-DR, then go through Pause-DR.
    b.write(DR, bits(0xBEEF, 16), 16, 0, 0, JEXJTAG_SHIFT_DR);
    EXPECT_EQ(b.engine.state(), JEXJTAG_SHIFT_DR);
    b.write(DR, bits(0x1234, 16), 16, 0, 0, JEXJTAG_PAUSE_DR);
    EXPECT_EQ(b.engine.state(), JEXJTAG_PAUSE_DR);
    EXPECT_EQ(b.chain.device(0).state(), JEXJTAG_PAUSE_DR);
    b.engine.moveTo(JEXJTAG_UPDATE_DR);
    EXPECT_EQ(b.chain.device(0).userRegister(), 0x1234BEEFu);
}

TEST(SimModel, TdoIsReleasedOutsideShiftStatesAndAWireChainPassesTdi)
{
    Bench b(threeDevices());
    EXPECT_TRUE(b.chain.tdo(false)) << "TLR: TDO released, reads high";
    SimChain wire({});
    EXPECT_FALSE(wire.tdo(false));
    EXPECT_TRUE(wire.clock(false, true));
    JtagEngine engine(wire);
    const auto data = bits(0x5A, 8);
    std::vector<uint8_t> out(1, 0);
    ShiftSink sink = ShiftSink::buffer(out.data());
    engine.shift(DR, ShiftSource::buffer(data.data()), sink, 8, JEXJTAG_RUN_TEST_IDLE);
    EXPECT_EQ(out[0], 0x5A);
}

// The word-wide shift path must behave exactly as clocking bit by bit.
TEST(SimModel, WordShiftMatchesBitByBitClocking)
{
    std::vector<DeviceSpec> specs = threeDevices();
    specs.push_back(simtest::device(0x41111043, 8, 0xE0, 0x32, 64));
    specs.push_back(simtest::device(0x12345679, 64, 0x5, 0x6, 1, 0x1));
    Bench fast(specs);
    Bench slow(specs);
    CountingObserver observer;
    slow.chain.setObserver(&observer);
    const uint64_t unobserved = slow.chain.cycles();

    std::mt19937 rng(1234);
    const JexJtagTapState exits[] = {JEXJTAG_RUN_TEST_IDLE, JEXJTAG_PAUSE_DR, JEXJTAG_PAUSE_IR, JEXJTAG_SHIFT_DR,
                                     JEXJTAG_SHIFT_IR, JEXJTAG_UPDATE_DR, JEXJTAG_TEST_LOGIC_RESET};
    for (int round = 0; round < 300; ++round) {
        const auto reg = rng() % 2 ? IR : DR;
        const unsigned n = 1 + rng() % 200;
        std::vector<uint8_t> data(jexcable::BitBuffer::bytesFor(n));
        for (auto& byte : data) byte = static_cast<uint8_t>(rng());
        const uint64_t before = rng() % 3 == 0 ? rng() % 70 : 0;
        const uint64_t after = rng() % 3 == 0 ? rng() % 70 : 0;
        const JexJtagTapState exit = exits[rng() % 7];
        const auto a = fast.write(reg, data, n, before, after, exit);
        const auto b = slow.write(reg, data, n, before, after, exit);
        ASSERT_EQ(a, b) << "round " << round;
        ASSERT_EQ(fast.chain.cycles(), slow.chain.cycles());
        for (std::size_t d = 0; d < specs.size(); ++d) {
            ASSERT_EQ(fast.chain.device(d).state(), slow.chain.device(d).state());
            ASSERT_EQ(fast.chain.device(d).instruction(), slow.chain.device(d).instruction()) << "round " << round;
            ASSERT_EQ(fast.chain.device(d).userRegister(), slow.chain.device(d).userRegister());
        }
        ASSERT_EQ(fast.chain.lastTdi(), slow.chain.lastTdi());
    }
    EXPECT_EQ(observer.clocks, slow.chain.cycles() - unobserved);
}
