// SPDX-License-Identifier: MIT
#include "util/Logger.hpp"

#include <cstdlib>
#include <cstring>
#include <vector>

#include "platform/Process.hpp"

Logger Logger::logger;

void Logger::startLogging()
{
    const std::string level = jexplatform::environment("JEXJTAG_LOG_LEVEL");
    const std::string path = jexplatform::environment("JEXJTAG_LOG_FILE");
    configure(level.empty() ? 0 : std::atoi(level.c_str()), path);
}

void Logger::configure(int level, const std::string& path)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    m_level = level < 0 ? 0 : level;
    if (path != m_path) openSink(path);
}

void Logger::openSink(const std::string& path)
{
    if (m_file) std::fclose(m_file);
    m_file = nullptr;
    m_midLine = false;
    m_path[0] = '\0';
    if (path.empty() || path.size() >= sizeof m_path) return;
    m_file = std::fopen(path.c_str(), "a");
    if (m_file) std::memcpy(m_path, path.c_str(), path.size() + 1);
}

void Logger::write(int level, const char* format, va_list args)
{
    std::lock_guard<std::mutex> lock(m_mutex);
    std::FILE* out = m_file ? m_file : stderr;
    char small[512];
    va_list again;
    va_copy(again, args);
    const int length = std::vsnprintf(small, sizeof small, format ? format : "", args);
    if (length < 0) {
        va_end(again);
        return;
    }
    std::vector<char> large;
    const char* text = small;
    if (static_cast<size_t>(length) >= sizeof small) {
        large.resize(static_cast<size_t>(length) + 1);
        std::vsnprintf(large.data(), large.size(), format ? format : "", again);
        text = large.data();
    }
    va_end(again);
    if (length == 0) return;
    if (!m_midLine) std::fprintf(out, "[jexjtag %d] ", level);
    std::fwrite(text, 1, static_cast<size_t>(length), out);
    m_midLine = text[length - 1] != '\n';
    std::fflush(out);
}

void Logger::dumpBuffer(int level, const char* title, const unsigned char* bytes, unsigned bitLength)
{
    if (!isEnabled(level)) return;
    std::lock_guard<std::mutex> lock(m_mutex);
    std::FILE* out = m_file ? m_file : stderr;
    if (m_midLine) std::fputc('\n', out);
    m_midLine = false;
    std::fprintf(out, "[jexjtag %d] %s (%u bits)\n", level, title ? title : "", bitLength);
    if (!bytes) {
        std::fprintf(out, "[jexjtag %d]   NULL\n", level);
        std::fflush(out);
        return;
    }
    const unsigned byteCount = static_cast<unsigned>((static_cast<unsigned long long>(bitLength) + 7) / 8);
    static const char hex[] = "0123456789ABCDEF";
    char line[16 + 32 * 3 + 2];
    for (unsigned offset = 0; offset < byteCount; offset += 32) {
        int n = std::snprintf(line, sizeof line, "  %08X:", offset);
        for (unsigned i = offset; i < byteCount && i < offset + 32; ++i) {
            line[n++] = ' ';
            line[n++] = hex[bytes[i] >> 4];
            line[n++] = hex[bytes[i] & 0xF];
        }
        line[n] = '\0';
        std::fprintf(out, "[jexjtag %d] %s\n", level, line);
    }
    std::fflush(out);
}

void Logger::logMethodEntry(const char* name)
{
    if (isEnabled(4)) printLog(4, "> %s\n", name ? name : "");
}

void Logger::logMethodExit(const char* name)
{
    if (isEnabled(4)) printLog(4, "< %s\n", name ? name : "");
}
