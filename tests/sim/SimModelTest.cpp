// SPDX-License-Identifier: MIT
// The simulated devices and chain, driven through the cable's TAP logic.
#include <gtest/gtest.h>

#include <random>

#include "jexjtag/cable/BitBuffer.hpp"
#include "jexjtag/cable/ChainLayout.hpp"
#include "jexjtag/cable/JtagEngine.hpp"
#include "SimChain.hpp"
#include "SimTestSupport.hpp"

using jexcable::ChainLayout;
using jexcable::JtagEngine;
using jexcable::ShiftSink;
using jexcable::ShiftSource;
using jexsim::DeviceSpec;
using jexsim::SimChain;
using jexsim::SimDevice;
using simtest::bitsOf;
using simtest::valueOf;

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
        engine.shift(reg, ShiftSource::buffer(in.data()), ShiftSink::buffer(out.data()), n, exit, before, after);
        return out;
    }

    SimChain chain;
    JtagEngine engine;
};

struct CountingObserver : jexsim::ChainObserver {
    void onClock(const SimChain&, bool, bool, bool) override { ++clocks; }
    void onPinLevel(const SimChain&, unsigned, bool) override {}
    void onWait(uint64_t) override {}
    uint64_t clocks = 0;
};

} // namespace

TEST(SimModel, EveryUnassignedOpcodeActsAsBypass)
{
    for (uint64_t opcode = 0; opcode < 16; ++opcode) {
        Bench b({simtest::device(0x4BA00477, 4, 0xE, 0xA, 35)});
        b.write(IR, bitsOf(opcode, 4), 4);
        EXPECT_EQ(b.chain.device(0).instruction(), opcode);
        const auto out = b.read(DR, 40);
        if (opcode == 0xE) {
            EXPECT_EQ(valueOf(out, 0, 32), 0x4BA00477u);
        } else if (opcode == 0xA) {
            EXPECT_EQ(valueOf(out, 0, 35), 0u) << "the user register starts cleared";
            EXPECT_EQ(valueOf(out, 35, 5), 0x1Fu);
        } else {
            EXPECT_EQ(valueOf(out, 0, 1), 0u) << "opcode " << opcode;
            EXPECT_EQ(valueOf(out, 1, 39), (uint64_t{1} << 39) - 1) << "opcode " << opcode << ": one-bit register";
        }
    }
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
