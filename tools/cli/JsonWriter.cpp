// SPDX-License-Identifier: MIT
#include "JsonWriter.hpp"

#include <cstdio>
#include <stdexcept>

namespace jexjtag::cli {

namespace {

// Length of the valid UTF-8 sequence at text[pos], or 0 when it is not one
// (overlong forms, surrogates and values above U+10FFFF are not).
size_t utf8SequenceLength(std::string_view text, size_t pos)
{
    const auto byte = [&](size_t i) { return static_cast<unsigned char>(text[i]); };
    const unsigned char lead = byte(pos);
    size_t length = 0;
    uint32_t code = 0;
    if (lead < 0x80) return 1;
    if (lead >= 0xC2 && lead <= 0xDF) {
        length = 2;
        code = lead & 0x1Fu;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3;
        code = lead & 0x0Fu;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4;
        code = lead & 0x07u;
    } else {
        return 0;
    }
    if (pos + length > text.size()) return 0;
    for (size_t i = 1; i < length; ++i) {
        if ((byte(pos + i) & 0xC0u) != 0x80u) return 0;
        code = (code << 6) | (byte(pos + i) & 0x3Fu);
    }
    if (length == 3 && (code < 0x800 || (code >= 0xD800 && code <= 0xDFFF))) return 0;
    if (length == 4 && (code < 0x10000 || code > 0x10FFFF)) return 0;
    return length;
}

} // namespace

JsonWriter::JsonWriter(std::ostream& out) : m_out(out) {}

std::string JsonWriter::quote(std::string_view text)
{
    std::string result = "\"";
    size_t pos = 0;
    while (pos < text.size()) {
        const unsigned char c = static_cast<unsigned char>(text[pos]);
        switch (c) {
        case '"': result += "\\\""; break;
        case '\\': result += "\\\\"; break;
        case '\b': result += "\\b"; break;
        case '\f': result += "\\f"; break;
        case '\n': result += "\\n"; break;
        case '\r': result += "\\r"; break;
        case '\t': result += "\\t"; break;
        default:
            if (c < 0x20) {
                char escape[8];
                std::snprintf(escape, sizeof escape, "\\u%04x", static_cast<unsigned>(c));
                result += escape;
            } else if (c < 0x80) {
                result += static_cast<char>(c);
            } else {
                const size_t length = utf8SequenceLength(text, pos);
                if (length == 0) {
                    result += "\\ufffd";
                    ++pos;
                    continue;
                }
                result.append(text.substr(pos, length));
                pos += length;
                continue;
            }
        }
        ++pos;
    }
    return result + "\"";
}

void JsonWriter::newline(size_t depth)
{
    m_out << '\n';
    for (size_t i = 0; i < depth; ++i) m_out << "  ";
}

void JsonWriter::beforeValue()
{
    if (m_done) throw std::logic_error("JsonWriter: value after the end of the document");
    if (m_levels.empty()) return;
    Level& level = m_levels.back();
    if (level.container == Container::Object) {
        if (!m_keyPending) throw std::logic_error("JsonWriter: object member without a key");
        m_keyPending = false;
        return;
    }
    if (level.count++ > 0) m_out << ',';
    newline(m_levels.size());
}

void JsonWriter::open(Container container, char bracket)
{
    beforeValue();
    m_out << bracket;
    m_levels.push_back({container, 0});
}

void JsonWriter::close(Container container, char bracket)
{
    if (m_levels.empty() || m_levels.back().container != container || m_keyPending)
        throw std::logic_error("JsonWriter: unbalanced container");
    const bool empty = m_levels.back().count == 0;
    m_levels.pop_back();
    if (!empty) newline(m_levels.size());
    m_out << bracket;
    if (m_levels.empty()) m_done = true;
}

JsonWriter& JsonWriter::beginObject()
{
    open(Container::Object, '{');
    return *this;
}

JsonWriter& JsonWriter::endObject()
{
    close(Container::Object, '}');
    return *this;
}

JsonWriter& JsonWriter::beginArray()
{
    open(Container::Array, '[');
    return *this;
}

JsonWriter& JsonWriter::endArray()
{
    close(Container::Array, ']');
    return *this;
}

JsonWriter& JsonWriter::key(std::string_view name)
{
    if (m_levels.empty() || m_levels.back().container != Container::Object || m_keyPending)
        throw std::logic_error("JsonWriter: key outside an object");
    Level& level = m_levels.back();
    if (level.count++ > 0) m_out << ',';
    newline(m_levels.size());
    m_out << quote(name) << ": ";
    m_keyPending = true;
    return *this;
}

JsonWriter& JsonWriter::string(std::string_view text)
{
    beforeValue();
    m_out << quote(text);
    if (m_levels.empty()) m_done = true;
    return *this;
}

JsonWriter& JsonWriter::number(uint64_t value)
{
    beforeValue();
    m_out << value;
    if (m_levels.empty()) m_done = true;
    return *this;
}

JsonWriter& JsonWriter::boolean(bool value)
{
    beforeValue();
    m_out << (value ? "true" : "false");
    if (m_levels.empty()) m_done = true;
    return *this;
}

JsonWriter& JsonWriter::null()
{
    beforeValue();
    m_out << "null";
    if (m_levels.empty()) m_done = true;
    return *this;
}

void JsonWriter::finish()
{
    if (!m_done || !m_levels.empty()) throw std::logic_error("JsonWriter: document not complete");
    m_out << '\n';
}

} // namespace jexjtag::cli
