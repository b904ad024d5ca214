// SPDX-License-Identifier: MIT
#pragma once
// A strict little JSON reader for the tests: it checks that a text is one
// valid JSON document in valid UTF-8 and gives access to its values.

#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

namespace minijson {

struct Value {
    enum class Type { Null, Bool, Number, String, Array, Object };
    Type type = Type::Null;
    bool boolean = false;
    double number = 0;
    std::string text;
    std::vector<Value> items;
    std::vector<std::pair<std::string, Value>> members; // in document order

    bool isNull() const { return type == Type::Null; }
    const Value* find(const std::string& key) const
    {
        for (const auto& m : members)
            if (m.first == key) return &m.second;
        return nullptr;
    }
    bool has(const std::string& key) const { return find(key) != nullptr; }
    const Value& operator[](const std::string& key) const
    {
        const Value* v = type == Type::Object ? find(key) : nullptr;
        if (!v) throw std::runtime_error("no member " + key);
        return *v;
    }
    const Value& operator[](size_t index) const
    {
        if (type != Type::Array || index >= items.size()) throw std::runtime_error("no item");
        return items[index];
    }
    const std::string& str() const { as(Type::String); return text; }
    uint64_t uint() const { as(Type::Number); return static_cast<uint64_t>(number); }
    bool boolValue() const { as(Type::Bool); return boolean; }

private:
    void as(Type t) const
    {
        if (type != t) throw std::runtime_error("JSON value of another type");
    }
};

class Parser {
public:
    explicit Parser(const std::string& text) : m_text(text) {}

    Value document()
    {
        Value v = value();
        skipSpace();
        if (m_pos != m_text.size()) fail("text after the document");
        return v;
    }

private:
    [[noreturn]] void fail(const std::string& what) const
    {
        throw std::runtime_error("JSON error at " + std::to_string(m_pos) + ": " + what);
    }
    void skipSpace()
    {
        while (m_pos < m_text.size() && std::string(" \n\r\t").find(m_text[m_pos]) != std::string::npos) ++m_pos;
    }
    bool literal(const std::string& word)
    {
        if (m_text.compare(m_pos, word.size(), word) != 0) return false;
        m_pos += word.size();
        return true;
    }
    char peek() const { return m_pos < m_text.size() ? m_text[m_pos] : '\0'; }
    bool digit() const { return peek() >= '0' && peek() <= '9'; }
    void digits(const char* what)
    {
        if (!digit()) fail(what);
        while (digit()) ++m_pos;
    }

    Value value()
    {
        skipSpace();
        Value v;
        const char c = peek();
        if (c == '{' || c == '[') return container(c == '{');
        if (c == '"') {
            v.type = Value::Type::String;
            v.text = string();
        } else if (literal("true")) {
            v.type = Value::Type::Bool;
            v.boolean = true;
        } else if (literal("false")) {
            v.type = Value::Type::Bool;
        } else if (!literal("null")) {
            const size_t start = m_pos;
            if (peek() == '-') ++m_pos;
            if (peek() == '0') ++m_pos;
            else digits("bad value");
            if (peek() == '.') ++m_pos, digits("bad fraction");
            if (peek() == 'e' || peek() == 'E') {
                ++m_pos;
                if (peek() == '+' || peek() == '-') ++m_pos;
                digits("bad exponent");
            }
            v.type = Value::Type::Number;
            v.number = std::stod(m_text.substr(start, m_pos - start));
        }
        return v;
    }

    static void appendUtf8(std::string& out, uint32_t code)
    {
        const int n = code < 0x80 ? 1 : code < 0x800 ? 2 : code < 0x10000 ? 3 : 4;
        static const unsigned char lead[] = {0, 0, 0xC0, 0xE0, 0xF0};
        out += static_cast<char>(n == 1 ? code : lead[n] | (code >> (6 * (n - 1))));
        for (int k = n - 2; k >= 0; --k) out += static_cast<char>(0x80 | ((code >> (6 * k)) & 0x3F));
    }

    uint32_t hex4()
    {
        if (m_pos + 4 > m_text.size()) fail("short \\u escape");
        const std::string digits = m_text.substr(m_pos, 4);
        if (digits.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos) fail("bad \\u escape");
        m_pos += 4;
        return static_cast<uint32_t>(std::stoul(digits, nullptr, 16));
    }

    // One UTF-8 sequence, checked for its length, continuation bytes, overlong
    // forms, surrogates and the Unicode range.
    void utf8(std::string& out, unsigned char c)
    {
        const int n = (c >> 5) == 0x6 ? 2 : (c >> 4) == 0xE ? 3 : (c >> 3) == 0x1E ? 4 : 0;
        if (n == 0 || m_pos + n - 1 > m_text.size()) fail("invalid UTF-8");
        uint32_t code = c & (0x7F >> n);
        for (int k = 1; k < n; ++k) {
            const unsigned char next = static_cast<unsigned char>(m_text[m_pos++]);
            if ((next & 0xC0) != 0x80) fail("invalid UTF-8");
            code = (code << 6) | (next & 0x3F);
        }
        static const uint32_t least[] = {0, 0, 0x80, 0x800, 0x10000};
        if (code < least[n] || code > 0x10FFFF || (code >= 0xD800 && code <= 0xDFFF)) fail("invalid UTF-8");
        appendUtf8(out, code);
    }

    std::string string()
    {
        ++m_pos; // opening quote
        std::string out;
        while (true) {
            if (m_pos >= m_text.size()) fail("unterminated string");
            const unsigned char c = static_cast<unsigned char>(m_text[m_pos++]);
            if (c == '"') return out;
            if (c < 0x20) fail("raw control character in string");
            if (c >= 0x80) {
                utf8(out, c);
                continue;
            }
            if (c != '\\') {
                out += static_cast<char>(c);
                continue;
            }
            const char e = peek();
            ++m_pos;
            const std::string from = "\"\\/bfnrt", to = "\"\\/\b\f\n\r\t";
            if (e != 'u') {
                if (from.find(e) == std::string::npos) fail("bad escape");
                out += to[from.find(e)];
                continue;
            }
            uint32_t code = hex4();
            if (code >= 0xD800 && code <= 0xDBFF) {
                if (!literal("\\u")) fail("lone high surrogate");
                const uint32_t low = hex4();
                if (low < 0xDC00 || low > 0xDFFF) fail("bad low surrogate");
                code = 0x10000 + ((code - 0xD800) << 10) + (low - 0xDC00);
            } else if (code >= 0xDC00 && code <= 0xDFFF) {
                fail("lone low surrogate");
            }
            appendUtf8(out, code);
        }
    }

    // An object (with unique string keys) or an array.
    Value container(bool isObject)
    {
        const char close = isObject ? '}' : ']';
        ++m_pos;
        Value v;
        v.type = isObject ? Value::Type::Object : Value::Type::Array;
        skipSpace();
        if (peek() == close) return ++m_pos, v;
        while (true) {
            skipSpace();
            if (isObject) {
                if (peek() != '"') fail("expected a key");
                std::string key = string();
                if (v.has(key)) fail("duplicate key " + key);
                skipSpace();
                if (peek() != ':') fail("expected :");
                ++m_pos;
                v.members.emplace_back(key, value());
            } else {
                v.items.push_back(value());
            }
            skipSpace();
            if (peek() == close) return ++m_pos, v;
            if (peek() != ',') fail(std::string("expected , or ") + close);
            ++m_pos;
        }
    }

    const std::string& m_text;
    size_t m_pos = 0;
};

inline Value parse(const std::string& text) { return Parser(text).document(); }

} // namespace minijson
