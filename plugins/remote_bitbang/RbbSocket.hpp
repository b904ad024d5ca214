// SPDX-License-Identifier: MIT
#pragma once
// The stream socket of the remote_bitbang cable: a TCP connection (with
// TCP_NODELAY) or a Unix-domain one, non-blocking, with waits bounded by a
// timeout.  This is the one file of the plug-in that calls the operating
// system.  Failures throw std::runtime_error with a message naming the
// server and the reason.

#include <cstddef>
#include <string>

namespace jexrbb {

class RbbSocket {
public:
    RbbSocket() = default;
    ~RbbSocket();
    RbbSocket(RbbSocket&& other) noexcept;
    RbbSocket& operator=(RbbSocket&& other) noexcept;
    RbbSocket(const RbbSocket&) = delete;
    RbbSocket& operator=(const RbbSocket&) = delete;

    // Connects to host:port (every address the name resolves to, in turn) or
    // to the socket at path, giving up after timeoutMs.
    static RbbSocket connectTcp(const std::string& host, const std::string& port, unsigned timeoutMs);
    static RbbSocket connectUnix(const std::string& path, unsigned timeoutMs);

    bool isOpen() const { return m_fd >= 0; }
    // "HOST:PORT" or the socket path, for messages.
    const std::string& peer() const { return m_peer; }

    // Sends what the socket takes now (never raises SIGPIPE); 0 when it
    // takes nothing without waiting.
    std::size_t sendSome(const char* data, std::size_t size);
    // Bytes that have arrived, up to capacity; 0 when none has.  Throws when
    // the server has closed the connection.
    std::size_t receiveSome(char* data, std::size_t capacity);
    // Waits until bytes arrive (or, with forWrite, the socket can take
    // more); throws after timeoutMs without either.  Signals do not cut it
    // short.
    void wait(bool forWrite, unsigned timeoutMs);
    // Closes the connection (nothing when closed).
    void close();

private:
    RbbSocket(int fd, std::string peer) : m_fd(fd), m_peer(std::move(peer)) {}

    int m_fd = -1;
    std::string m_peer;
};

} // namespace jexrbb
