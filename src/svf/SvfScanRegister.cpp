// SPDX-License-Identifier: MIT
#include "svf/SvfScanRegister.hpp"

#include <string>

#include "svf/SvfError.hpp"

namespace JexRT {

void SvfScanRegister::apply(SvfStatement& s, const char* command)
{
    const bool changed = !m_used || s.length != m_length;
    if (!s.given[SvfStatement::TDI] && s.length != 0) {
        if (!m_used)
            throw SvfError(SvfError::Kind::BadFile, s.line,
                           std::string("TDI is required: first ") + command + " without TDI");
        if (changed)
            throw SvfError(SvfError::Kind::BadFile, s.line,
                           std::string("TDI is required: ") + command + " length changed from " +
                               std::to_string(m_length) + " to " + std::to_string(s.length));
    }
    m_used = true;
    m_length = s.length;
    if (s.given[SvfStatement::TDI]) m_tdi.swap(s.vector[SvfStatement::TDI]);
    else if (s.length == 0) m_tdi.assignZeros(0);
    if (s.given[SvfStatement::MASK]) m_mask.swap(s.vector[SvfStatement::MASK]);
    else if (changed) m_mask.assignOnes(s.length);
    if (s.given[SvfStatement::SMASK]) m_smask.swap(s.vector[SvfStatement::SMASK]);
    else if (changed) m_smask.assignOnes(s.length);
    m_hasTdo = s.given[SvfStatement::TDO];
    if (m_hasTdo) m_tdo.swap(s.vector[SvfStatement::TDO]);
}

} // namespace JexRT
