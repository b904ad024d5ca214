// SPDX-License-Identifier: MIT
#pragma once
// SvfScanRegister - what one scan command (SIR, SDR, HIR, HDR, TIR or TDR)
// remembers between statements: its length, TDI, MASK and SMASK.  A
// statement leaving out TDI reuses the last one, which is an error when the
// length changed or there was none; MASK and SMASK left out are reused at the
// same length and all ones after a change.  TDO is never remembered.

#include <cstdint>

#include "svf/SvfBits.hpp"
#include "svf/SvfStatement.hpp"

namespace JexRT {

class SvfScanRegister {
public:
    // Applies the statement's scan parameters, taking its vectors (the
    // statement gets the replaced storage back for reuse).  Throws
    // SvfError(BadFile) on the statement's line, before changing anything.
    void apply(SvfStatement& statement, const char* command);

    uint32_t length() const { return m_length; }
    const SvfBits& tdi() const { return m_tdi; }
    const SvfBits& mask() const { return m_mask; }
    bool hasTdo() const { return m_hasTdo; }
    const SvfBits& tdo() const { return m_tdo; }

private:
    bool m_used = false;
    uint32_t m_length = 0;
    SvfBits m_tdi;
    SvfBits m_mask;
    SvfBits m_smask;
    SvfBits m_tdo;
    bool m_hasTdo = false;
};

} // namespace JexRT
