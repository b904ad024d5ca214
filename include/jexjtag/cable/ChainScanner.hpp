// SPDX-License-Identifier: MIT
#pragma once
// Interrogates a JTAG chain the way a cable driver does, through JtagEngine:
//
//  1. Reset (five TMS-high clocks).  Every TAP now selects IDCODE, or BYPASS
//     when it has no IDCODE register.
//  2. DR scan with TDI high: a 1 bit starts a 32-bit IDCODE, a 0 bit is a
//     one-bit BYPASS register; 32 ones in a row (an IDCODE no device may have)
//     are the TDI level coming through, the end of the chain.
//  3. IR scan: maxIrBits zeros while reading the captured bits, then ones
//     until the first 1 appears on TDO; the zeros before it are the total IR
//     length L.  Update-IR then loads all ones (BYPASS) into every device.
//  4. DR scan with every device in BYPASS: the position of the first 1 after
//     the zero-capturing BYPASS bits is the device count, which must agree
//     with step 2.
//  5. Reset again, so the chain is left as it was found after power-up.
//
// IR lengths come from the captured IR bits.  IEEE 1149.1 makes the two
// bits of every instruction register nearest TDO capture 1 then 0 (binary
// ...01); the bits above are the device's own.  So each device's IR starts at
// a position p of the captured stream with bit p = 1 and bit p+1 = 0
// (a "boundary candidate"); position 0 must be one.
//  - As many candidates as devices: the lengths follow uniquely.
//  - Fewer: the chain does not behave as IEEE 1149.1 says; interrogation
//    fails.
//  - More (some device captures 1,0 in its upper bits too): ambiguous.  The
//    candidates cut the stream into pieces; the scanner repeatedly joins the
//    two neighbouring pieces whose joined length is smallest (the pair
//    nearest TDO on a tie) until there are as many pieces as devices.  The
//    idea: a stray 1,0 splits one IR into short pieces, and real IR lengths
//    lie close together.  The result is flagged as ambiguous so the driver
//    can warn; the host then corrects IR lengths (from its device database or
//    by hand).

#include <cstdint>
#include <string>
#include <vector>

#include "ChainLayout.hpp"
#include "JtagEngine.hpp"

namespace jexcable {

class ChainScanner {
public:
    struct Limits {
        uint32_t maxDevices = 1024;
        uint32_t maxIrBits = 4096;
    };

    struct Result {
        std::vector<ChainLayout::Device> devices; // index 0 nearest TDO
        std::vector<bool> hasIdcode;
        std::vector<bool> irCapture;               // captured IR bits, first out first
        bool ambiguous = false;                    // IR lengths were guessed
        std::string error;                         // why the scan failed
    };

    explicit ChainScanner(JtagEngine& engine) : m_engine(&engine) {}
    ChainScanner(JtagEngine& engine, Limits limits) : m_engine(&engine), m_limits(limits) {}

    // Scans the chain; false with result.error set when it cannot be made
    // sense of.  The TAP is left in Test-Logic-Reset either way.
    bool scan(Result& result);

    // The IR-length rule above, on its own: splits the captured bits of a
    // chain of deviceCount devices.  False with `error` set when impossible.
    static bool splitIr(const std::vector<bool>& capture, uint32_t deviceCount, std::vector<uint32_t>& lengths,
                        bool& ambiguous, std::string& error);

private:
    bool scanIdcodes(Result& result);
    bool scanIr(Result& result);
    bool countBypass(uint32_t& count, std::string& error);
    bool readBit();

    JtagEngine* m_engine;
    Limits m_limits;
};

} // namespace jexcable
