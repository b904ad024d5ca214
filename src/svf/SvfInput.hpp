// SPDX-License-Identifier: MIT
#pragma once
// SvfInput - the SVF text in chunks of at most kChunk bytes: read from a
// file into one reused buffer, or sliced from the host's memory without a
// copy.  Memory use does not grow with the text.

#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

namespace JexRT {

class SvfInput {
public:
    static constexpr size_t kChunk = 256 * 1024;

    // Opens the file; throws SvfError (BadFile, line 0) when it cannot.
    explicit SvfInput(const std::string& path);
    // The host's text, which must outlive this object.
    SvfInput(const char* text, size_t length);
    ~SvfInput();
    SvfInput(const SvfInput&) = delete;
    SvfInput& operator=(const SvfInput&) = delete;

    // The next chunk in [*begin, *end); false at the end of the text.
    // Throws SvfError (BadFile) on a read error.
    bool next(const char** begin, const char** end);
    // The text's size in bytes (0 when unknown).
    uint64_t size() const { return m_size; }

private:
    std::FILE* m_file = nullptr;
    std::vector<char> m_buffer;
    const char* m_text = nullptr;
    size_t m_length = 0;
    size_t m_offset = 0;
    uint64_t m_size = 0;
};

} // namespace JexRT
