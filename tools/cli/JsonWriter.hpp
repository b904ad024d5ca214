// SPDX-License-Identifier: MIT
#pragma once
// A small streaming JSON writer: objects, arrays, strings, numbers, booleans
// and null, indented by two blanks per level.  Strings are escaped, and
// bytes that are not valid UTF-8 become U+FFFD, so the output is always
// valid JSON whatever the library's texts hold (each byte outside a valid
// sequence gives one U+FFFD).

#include <cstdint>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

namespace jexjtag::cli {

class JsonWriter {
public:
    explicit JsonWriter(std::ostream& out);

    JsonWriter& beginObject();
    JsonWriter& endObject();
    JsonWriter& beginArray();
    JsonWriter& endArray();
    // The name of the next member; only inside an object.
    JsonWriter& key(std::string_view name);

    JsonWriter& string(std::string_view text);
    JsonWriter& number(uint64_t value);
    JsonWriter& boolean(bool value);
    JsonWriter& null();

    // Ends the document with a line end; every container must be closed.
    void finish();

    // text as a JSON string literal, quotes included.
    static std::string quote(std::string_view text);

private:
    enum class Container { Object, Array };
    struct Level {
        Container container;
        unsigned count;
    };

    void beforeValue();
    void open(Container container, char bracket);
    void close(Container container, char bracket);
    void newline(size_t depth);

    std::ostream& m_out;
    std::vector<Level> m_levels;
    bool m_keyPending = false;
    bool m_done = false;
};

} // namespace jexjtag::cli
