// SPDX-License-Identifier: MIT
#include "svf/SvfLexer.hpp"

#include <algorithm>
#include <array>

#include "svf/SvfError.hpp"
#include "svf/SvfInput.hpp"

namespace JexRT {

namespace {

// Character classes: 0..15 hex digit values, then the others.
enum : int8_t { kOther = -1, kSpace = -2, kNewline = -3, kOpen = -4, kClose = -5, kSemicolon = -6, kBang = -7, kSlash = -8 };

constexpr std::array<int8_t, 256> makeClasses()
{
    std::array<int8_t, 256> t{};
    for (auto& v : t) v = kOther;
    for (int c = '0'; c <= '9'; ++c) t[c] = static_cast<int8_t>(c - '0');
    for (int c = 'A'; c <= 'F'; ++c) t[c] = static_cast<int8_t>(c - 'A' + 10);
    for (int c = 'a'; c <= 'f'; ++c) t[c] = static_cast<int8_t>(c - 'a' + 10);
    t[' '] = t['\t'] = t['\r'] = t['\f'] = t['\v'] = kSpace;
    t['\n'] = kNewline;
    t['('] = kOpen;
    t[')'] = kClose;
    t[';'] = kSemicolon;
    t['!'] = kBang;
    t['/'] = kSlash;
    return t;
}

constexpr std::array<int8_t, 256> kClass = makeClasses();

inline int8_t classOf(char c) { return kClass[static_cast<unsigned char>(c)]; }

} // namespace

void SvfLexer::fail(const std::string& text) const
{
    throw SvfError(SvfError::Kind::BadFile, m_statementLine ? m_statementLine : m_line, text);
}

bool SvfLexer::fill()
{
    m_before += static_cast<uint64_t>(m_p - m_chunk);
    const char* begin = nullptr;
    const char* end = nullptr;
    if (!m_input->next(&begin, &end)) {
        m_chunk = m_p = m_end;
        return false;
    }
    m_chunk = m_p = begin;
    m_end = end;
    if (m_hook) m_hook(offset());
    return true;
}

void SvfLexer::skipComment()
{
    for (;;) {
        while (m_p < m_end) {
            if (*m_p == '\n') return;
            ++m_p;
        }
        if (!fill()) return;
    }
}

bool SvfLexer::slashComment()
{
    if (m_p == m_end && !fill()) return false;
    if (*m_p != '/') return false;
    skipComment();
    return true;
}

SvfLexer::Token SvfLexer::next()
{
    // White space and comments.
    for (;;) {
        if (m_p == m_end && !fill()) {
            m_tokenLine = m_line;
            return Token::End;
        }
        const int8_t k = classOf(*m_p);
        if (k == kSpace) {
            ++m_p;
        } else if (k == kNewline) {
            ++m_p;
            ++m_line;
        } else if (k == kBang) {
            skipComment();
        } else if (k == kSlash) {
            ++m_p;
            if (!slashComment()) {
                m_tokenLine = m_line;
                fail("unexpected '/'");
            }
        } else {
            break;
        }
    }
    m_tokenLine = m_line;
    switch (classOf(*m_p)) {
    case kOpen: ++m_p; return Token::Open;
    case kClose: ++m_p; return Token::Close;
    case kSemicolon: ++m_p; return Token::Semicolon;
    default: break;
    }
    m_word.clear();
    for (;;) {
        if (m_p == m_end && !fill()) return Token::Word;
        const char c = *m_p;
        const int8_t k = classOf(c);
        if (k == kSpace || k == kNewline || k == kOpen || k == kClose || k == kSemicolon || k == kBang) break;
        ++m_p;
        if (k == kSlash && slashComment()) break;
        if (m_word.size() >= kMaxWord) fail("a word of more than 4096 characters");
        m_word += (c >= 'a' && c <= 'z') ? static_cast<char>(c - 'a' + 'A') : c;
    }
    return Token::Word;
}

void SvfLexer::readHex(std::vector<uint8_t>& digits)
{
    // digits is grown ahead of the writes (by at least one chunk) and cut
    // to the count at the end: no per-digit bookkeeping in the loop.
    size_t n = 0;
    for (;;) {
        if (m_p == m_end && !fill()) {
            digits.resize(n);
            fail("scan data without ')' at the end of the file");
        }
        const char* p = m_p;
        const char* const end = m_end;
        const size_t room = n + static_cast<size_t>(end - p);
        if (digits.size() < room) digits.resize(std::max(room, digits.size() * 2));
        uint8_t* out = digits.data();
        while (p < end) {
            const int8_t k = classOf(*p);
            if (k >= 0) {
                out[n] = static_cast<uint8_t>(k);
                n += (k != 0 || n != 0); // leading zeros are dropped
                ++p;
                continue;
            }
            if (k == kSpace) {
                ++p;
                continue;
            }
            if (k == kNewline) {
                ++p;
                ++m_line;
                continue;
            }
            m_p = p + 1;
            if (k == kClose) {
                digits.resize(n);
                return;
            }
            if (k == kBang) {
                m_p = p;
                skipComment();
            } else if (k == kSlash) {
                if (!slashComment()) fail("'/' in scan data");
            } else {
                const unsigned char c = static_cast<unsigned char>(*p);
                if (c >= 0x21 && c < 0x7F)
                    fail(std::string("'") + static_cast<char>(c) + "' in scan data (hex digits only)");
                fail("a character that is not a hex digit in scan data");
            }
            break;
        }
        if (p == end) m_p = p;
    }
}

} // namespace JexRT
