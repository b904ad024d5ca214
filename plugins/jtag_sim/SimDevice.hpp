// SPDX-License-Identifier: MIT
#pragma once
// One simulated IEEE 1149.1 device: its own TAP controller, an instruction
// register, and three data registers:
//   BYPASS  1 bit, captures 0; selected by all ones and by every opcode the
//           device does not assign;
//   IDCODE  32 bits, captures the IDCODE; selected by Test-Logic-Reset when
//           the device has one (a device without IDCODE selects BYPASS);
//   USER    a scratch register of userBits bits: Update-DR stores what was
//           shifted in and Capture-DR loads it again, so what is written can
//           be read back.
// A device made from a BSDL file (DeviceSpec::part) has no USER register but
// its boundary register instead, selected by SAMPLE/PRELOAD and EXTEST:
// Capture-DR loads the level of each capturing cell's pin (other cells load
// their update latch), Update-DR loads the latches.  Under EXTEST and CLAMP
// the output cells drive their pins from the latches, where their control
// cells enable them; HIGHZ and every other instruction drive nothing.
// Capture-IR loads the device's capture value (binary ...01).
//
// Timing as in IEEE 1149.1: on each rising TCK edge the register action of
// the current state happens (Capture loads, Shift moves one bit toward TDO),
// then the state follows TMS; entering Update-IR/DR latches the shifted value,
// entering Test-Logic-Reset loads the reset instruction.  TDO shows the low
// bit of the shift register in Shift-IR/DR and is released (reads 1, as with
// a pull-up) in every other state.

#include <cstddef>
#include <cstdint>
#include <vector>

#include "DeviceSpec.hpp"
#include "jexjtag/cable/TapController.hpp"

namespace jexsim {

// The levels of the pins around the devices, as SimChain knows them.
class PinEnvironment {
public:
    virtual ~PinEnvironment() = default;
    virtual bool pinLevel(std::size_t device, int pin) const = 0;
};

class SimDevice {
public:
    enum class DataRegister { Bypass, Idcode, User, Boundary };

    explicit SimDevice(const DeviceSpec& description);

    const DeviceSpec& description() const { return m_spec; }
    JexJtagTapState state() const { return m_tap.state(); }
    uint64_t instruction() const { return m_instruction; }
    DataRegister selected() const;
    uint64_t userRegister() const { return m_user; }
    // The level this device drives on its TDO now.
    bool tdo() const
    {
        if (!m_shifting) return true;
        return m_wideActive ? (m_wide[0] & 1u) != 0 : (m_shift & 1u) != 0;
    }

    // Where a part's capturing cells read their pins: device `index` of env.
    void attach(const PinEnvironment* env, std::size_t index)
    {
        m_env = env;
        m_index = index;
    }
    // True when the device drives the pin now (EXTEST or CLAMP, output cell
    // enabled), with the level in `level`.
    bool drives(int pin, bool& level) const;
    // The update latches of the boundary register, cell 0 first.
    const std::vector<uint8_t>& latches() const { return m_latch; }

    // One rising TCK edge with these TMS and TDI levels.
    void clock(bool tms, bool tdi)
    {
        const JexJtagTapState now = m_tap.state();
        if (m_shifting && m_wideActive) {
            shiftWide(tdi);
        } else if (m_shifting) {
            m_shift >>= 1;
            if (tdi) m_shift |= uint64_t{1} << (m_shiftLength - 1);
        } else if (now == JEXJTAG_CAPTURE_IR || now == JEXJTAG_CAPTURE_DR) {
            capture(now);
        }
        const JexJtagTapState next = m_tap.clock(tms);
        if (next != now) enter(next); // staying put latches nothing
    }

    // Fast path for `count` (1..64) edges in Shift-IR or Shift-DR with TMS low:
    // shifts the low `count` bits of `in` (first bit in bit 0) through the
    // register and returns the `count` bits that left it on TDO.  The state
    // does not change.
    uint64_t shiftWord(uint64_t in, unsigned count)
    {
        if (m_wideActive) return shiftWideWord(in, count);
        const unsigned len = m_shiftLength;
        uint64_t lo;
        uint64_t hi;
        if (len >= 64) {
            lo = m_shift;
            hi = in;
        } else {
            lo = m_shift | (in << len);
            hi = in >> (64 - len); // len >= 1
        }
        uint64_t out;
        uint64_t rest;
        if (count >= 64) {
            out = lo;
            rest = hi;
        } else {
            out = lo & ((uint64_t{1} << count) - 1);
            rest = (lo >> count) | (hi << (64 - count));
        }
        m_shift = len >= 64 ? rest : rest & ((uint64_t{1} << len) - 1);
        return out;
    }
    // One rising edge's state change without register action (ends a fast
    // shift whose last bit had TMS high).
    void step(bool tms) { enter(m_tap.clock(tms)); }

private:
    void enter(JexJtagTapState state);
    void capture(JexJtagTapState state);
    void captureBoundary();
    void shiftWide(bool tdi);
    uint64_t shiftWideWord(uint64_t in, unsigned count);

    DeviceSpec m_spec;
    jexcable::TapController m_tap;
    uint64_t m_instruction;
    uint64_t m_shift = 0;
    unsigned m_shiftLength = 1;
    bool m_shifting = false;
    uint64_t m_user = 0;
    // The boundary register of a part: shift stage (bit i = cell i) and latches.
    std::vector<uint64_t> m_wide;
    std::vector<uint8_t> m_latch;
    bool m_wideActive = false;
    const PinEnvironment* m_env = nullptr;
    std::size_t m_index = 0;
};

} // namespace jexsim
