#pragma once
// A strict little JSON reader for the tests: it checks that a text is one
// valid JSON document and gives access to its values.

#include <cstdint>
#include <map>
#include <memory>
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
    bool has(const std::string& key) const
    {
        for (const auto& m : members)
            if (m.first == key) return true;
        return false;
    }
    const Value& operator[](const std::string& key) const
    {
        if (type != Type::Object) throw std::runtime_error("not an object");
        for (const auto& m : members)
            if (m.first == key) return m.second;
        throw std::runtime_error("no member " + key);
    }
    const Value& operator[](size_t index) const
    {
        if (type != Type::Array || index >= items.size()) throw std::runtime_error("no item");
        return items[index];
    }
    const std::string& str() const
    {
        if (type != Type::String) throw std::runtime_error("not a string");
        return text;
    }
    uint64_t uint() const
    {
        if (type != Type::Number) throw std::runtime_error("not a number");
        return static_cast<uint64_t>(number);
    }
    bool boolValue() const
    {
        if (type != Type::Bool) throw std::runtime_error("not a boolean");
        return boolean;
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
        while (m_pos < m_text.size() &&
               (m_text[m_pos] == ' ' || m_text[m_pos] == '\n' || m_text[m_pos] == '\r' || m_text[m_pos] == '\t'))
            ++m_pos;
    }
    bool literal(const char* word)
    {
        const std::string w(word);
        if (m_text.compare(m_pos, w.size(), w) != 0) return false;
        m_pos += w.size();
        return true;
    }
    char peek() const { return m_pos < m_text.size() ? m_text[m_pos] : '\0'; }

    Value value()
    {
        skipSpace();
        Value v;
        const char c = peek();
        if (c == '{') return object();
        if (c == '[') return array();
        if (c == '"') {
            v.type = Value::Type::String;
            v.text = string();
            return v;
        }
        if (literal("true")) {
            v.type = Value::Type::Bool;
            v.boolean = true;
            return v;
        }
        if (literal("false")) {
            v.type = Value::Type::Bool;
            return v;
        }
        if (literal("null")) return v;
        if (c == '-' || (c >= '0' && c <= '9')) return numberValue();
        fail("unexpected character");
    }

    Value numberValue()
    {
        const size_t start = m_pos;
        if (peek() == '-') ++m_pos;
        if (peek() == '0') ++m_pos;
        else if (peek() >= '1' && peek() <= '9')
            while (peek() >= '0' && peek() <= '9') ++m_pos;
        else fail("bad number");
        if (peek() == '.') {
            ++m_pos;
            if (!(peek() >= '0' && peek() <= '9')) fail("bad fraction");
            while (peek() >= '0' && peek() <= '9') ++m_pos;
        }
        if (peek() == 'e' || peek() == 'E') {
            ++m_pos;
            if (peek() == '+' || peek() == '-') ++m_pos;
            if (!(peek() >= '0' && peek() <= '9')) fail("bad exponent");
            while (peek() >= '0' && peek() <= '9') ++m_pos;
        }
        Value v;
        v.type = Value::Type::Number;
        v.number = std::stod(m_text.substr(start, m_pos - start));
        return v;
    }

    static void appendUtf8(std::string& out, uint32_t code)
    {
        if (code < 0x80) {
            out += static_cast<char>(code);
        } else if (code < 0x800) {
            out += static_cast<char>(0xC0 | (code >> 6));
            out += static_cast<char>(0x80 | (code & 0x3F));
        } else if (code < 0x10000) {
            out += static_cast<char>(0xE0 | (code >> 12));
            out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (code & 0x3F));
        } else {
            out += static_cast<char>(0xF0 | (code >> 18));
            out += static_cast<char>(0x80 | ((code >> 12) & 0x3F));
            out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (code & 0x3F));
        }
    }

    uint32_t hex4()
    {
        if (m_pos + 4 > m_text.size()) fail("short \\u escape");
        uint32_t v = 0;
        for (int i = 0; i < 4; ++i) {
            const char c = m_text[m_pos++];
            v <<= 4;
            if (c >= '0' && c <= '9') v |= static_cast<uint32_t>(c - '0');
            else if (c >= 'a' && c <= 'f') v |= static_cast<uint32_t>(c - 'a' + 10);
            else if (c >= 'A' && c <= 'F') v |= static_cast<uint32_t>(c - 'A' + 10);
            else fail("bad \\u escape");
        }
        return v;
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
            if (c != '\\') {
                out += static_cast<char>(c);
                continue;
            }
            const char e = m_text[m_pos++];
            switch (e) {
            case '"': out += '"'; break;
            case '\\': out += '\\'; break;
            case '/': out += '/'; break;
            case 'b': out += '\b'; break;
            case 'f': out += '\f'; break;
            case 'n': out += '\n'; break;
            case 'r': out += '\r'; break;
            case 't': out += '\t'; break;
            case 'u': {
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
                break;
            }
            default: fail("bad escape");
            }
        }
    }

    Value array()
    {
        ++m_pos;
        Value v;
        v.type = Value::Type::Array;
        skipSpace();
        if (peek() == ']') {
            ++m_pos;
            return v;
        }
        while (true) {
            v.items.push_back(value());
            skipSpace();
            if (peek() == ',') {
                ++m_pos;
                continue;
            }
            if (peek() == ']') {
                ++m_pos;
                return v;
            }
            fail("expected , or ]");
        }
    }

    Value object()
    {
        ++m_pos;
        Value v;
        v.type = Value::Type::Object;
        skipSpace();
        if (peek() == '}') {
            ++m_pos;
            return v;
        }
        while (true) {
            skipSpace();
            if (peek() != '"') fail("expected a key");
            std::string key = string();
            if (v.has(key)) fail("duplicate key " + key);
            skipSpace();
            if (peek() != ':') fail("expected :");
            ++m_pos;
            v.members.emplace_back(key, value());
            skipSpace();
            if (peek() == ',') {
                ++m_pos;
                continue;
            }
            if (peek() == '}') {
                ++m_pos;
                return v;
            }
            fail("expected , or }");
        }
    }

    const std::string& m_text;
    size_t m_pos = 0;
};

inline Value parse(const std::string& text) { return Parser(text).document(); }

} // namespace minijson
