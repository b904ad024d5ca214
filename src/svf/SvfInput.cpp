// SPDX-License-Identifier: MIT
#include "svf/SvfInput.hpp"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "svf/SvfError.hpp"

namespace JexRT {

SvfInput::SvfInput(const std::string& path)
{
    m_file = std::fopen(path.c_str(), "rb");
    if (!m_file) throw SvfError(SvfError::Kind::BadFile, 0, std::string("cannot open: ") + std::strerror(errno));
    struct stat info {};
    if (fstat(fileno(m_file), &info) == 0) {
        if (S_ISDIR(info.st_mode)) {
            std::fclose(m_file);
            m_file = nullptr;
            throw SvfError(SvfError::Kind::BadFile, 0, "cannot read: it is a directory");
        }
        if (S_ISREG(info.st_mode)) m_size = static_cast<uint64_t>(info.st_size);
    }
    m_buffer.resize(kChunk);
}

SvfInput::SvfInput(const char* text, size_t length) : m_text(text), m_length(text ? length : 0), m_size(m_length) {}

SvfInput::~SvfInput()
{
    if (m_file) std::fclose(m_file);
}

bool SvfInput::next(const char** begin, const char** end)
{
    if (!m_file) {
        if (m_offset >= m_length) return false;
        const size_t n = std::min(kChunk, m_length - m_offset);
        *begin = m_text + m_offset;
        *end = *begin + n;
        m_offset += n;
        return true;
    }
    const size_t n = std::fread(m_buffer.data(), 1, m_buffer.size(), m_file);
    if (n == 0) {
        if (std::ferror(m_file)) throw SvfError(SvfError::Kind::BadFile, 0, "read error");
        return false;
    }
    *begin = m_buffer.data();
    *end = *begin + n;
    return true;
}

} // namespace JexRT
