// SPDX-License-Identifier: MIT
#pragma once
// The listening socket of `jexjtag serve` and the one client connection it
// serves at a time.  Every wait also watches a stop descriptor (StopSignal)
// and gives up when it becomes readable.

#include <cstddef>
#include <string>

namespace jexjtag::serve {

class ServeListener {
public:
    // TCP on HOST:PORT ("127.0.0.1:0": any free port; "[::1]:N" for IPv6),
    // or a Unix-domain socket at path (a stale socket file is replaced).
    // Throws std::runtime_error with the system's reason.
    static ServeListener tcp(const std::string& hostPort, int stopFd);
    static ServeListener unixSocket(const std::string& path, int stopFd);
    ~ServeListener();
    ServeListener(ServeListener&& other) noexcept;
    ServeListener(const ServeListener&) = delete;
    ServeListener& operator=(const ServeListener&) = delete;
    ServeListener& operator=(ServeListener&&) = delete;

    // "HOST:PORT" with the port really bound, or the socket's path.
    const std::string& address() const { return m_address; }

    // Waits for the next client; false when a stop was requested.
    bool accept();
    // The client's address ("127.0.0.1:5555", or "local").
    const std::string& peer() const { return m_peer; }
    // Up to size bytes from the client: 0 when it has gone (or a stop was
    // requested), with its reason in *why.
    std::size_t receive(char* data, std::size_t size, std::string* why);
    // True when the client has sent bytes that receive() would return now.
    bool hasInput();
    // Sends everything; false when the client has gone or a stop came.
    // While the client does not take replies, its requests are read on and
    // kept for receive() (up to 16 MiB), so that a client that writes
    // everything before it reads does not stall both sides.
    bool send(const std::string& data);
    // Closes the client connection.
    void dropClient();

private:
    ServeListener(int fd, int stopFd, std::string address, std::string unixPath);
    bool waitFor(int fd, short events);

    int m_fd;
    int m_stopFd;
    int m_client = -1;
    std::string m_address;
    std::string m_unixPath;
    std::string m_peer;
    std::string m_early; // requests read while sending, not yet received
};

} // namespace jexjtag::serve
