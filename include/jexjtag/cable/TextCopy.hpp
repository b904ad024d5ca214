// SPDX-License-Identifier: MIT
#pragma once
// Copies text into the fixed buffers of the plug-in ABI.

#include <cstddef>
#include <cstdint>
#include <string>

namespace jexcable {

class TextCopy {
public:
    // Copies text into a char array of `size` bytes, cut to size - 1 bytes,
    // always NUL-terminated (nothing is written when size is 0).
    static void toField(char* field, std::size_t size, const std::string& text);
    template <std::size_t N>
    static void toField(char (&field)[N], const std::string& text)
    {
        toField(field, N, text);
    }

    // The reply convention of sendCommand: *length holds the buffer's
    // capacity on entry.  Copies what fits (capacity - 1 bytes and a NUL) and
    // sets *length to the full text length, NUL not counted, so a caller can
    // tell that the text was cut (*length >= capacity).  False (nothing
    // written) when length is null, or when out is null with a capacity.
    static bool toReply(uint8_t* out, uint32_t* length, const std::string& text);

    // The text in an input buffer of `length` bytes: up to the first NUL or
    // the end of the buffer, whichever comes first ("" for a null buffer).
    static std::string fromInput(const uint8_t* in, uint32_t length);
};

} // namespace jexcable
