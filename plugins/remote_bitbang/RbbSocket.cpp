// SPDX-License-Identifier: MIT
#include "RbbSocket.hpp"

#include <cerrno>
#include <chrono>
#include <cstring>
#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <stdexcept>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>
#include <utility>

namespace jexrbb {

namespace {

using Clock = std::chrono::steady_clock;

std::string reason(int error) { return std::strerror(error); }

// poll() for one descriptor, resumed after signals until the deadline.
int pollUntil(int fd, short events, Clock::time_point deadline, short* revents)
{
    for (;;) {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
        pollfd p = {fd, events, 0};
        const int n = ::poll(&p, 1, left > 0 ? static_cast<int>(left) : 0);
        if (n < 0 && errno == EINTR) continue;
        *revents = p.revents;
        return n;
    }
}

// A non-blocking connect that gives up at the deadline; the descriptor
// stays non-blocking.  Returns -1 with the error in *error.
int connectOne(int family, const sockaddr* addr, socklen_t size, Clock::time_point deadline, int* error)
{
    const int fd = ::socket(family, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
    if (fd < 0) {
        *error = errno;
        return -1;
    }
    if (::connect(fd, addr, size) != 0) {
        if (errno != EINPROGRESS && errno != EINTR) {
            *error = errno;
            ::close(fd);
            return -1;
        }
        short revents = 0;
        const int n = pollUntil(fd, POLLOUT, deadline, &revents);
        int soError = 0;
        socklen_t len = sizeof soError;
        if (n <= 0) soError = ETIMEDOUT;
        else if (::getsockopt(fd, SOL_SOCKET, SO_ERROR, &soError, &len) != 0) soError = errno;
        if (soError != 0) {
            *error = soError;
            ::close(fd);
            return -1;
        }
    }
    return fd;
}

} // namespace

RbbSocket::~RbbSocket() { close(); }

RbbSocket::RbbSocket(RbbSocket&& other) noexcept : m_fd(other.m_fd), m_peer(std::move(other.m_peer))
{
    other.m_fd = -1;
}

RbbSocket& RbbSocket::operator=(RbbSocket&& other) noexcept
{
    if (this != &other) {
        close();
        m_fd = other.m_fd;
        m_peer = std::move(other.m_peer);
        other.m_fd = -1;
    }
    return *this;
}

RbbSocket RbbSocket::connectTcp(const std::string& host, const std::string& port, unsigned timeoutMs)
{
    const std::string peer = (host.find(':') != std::string::npos ? "[" + host + "]" : host) + ":" + port;
    const auto deadline = Clock::now() + std::chrono::milliseconds(timeoutMs);
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_NUMERICSERV;
    addrinfo* found = nullptr;
    const int rc = ::getaddrinfo(host.c_str(), port.c_str(), &hints, &found);
    if (rc != 0) throw std::runtime_error("cannot connect to " + peer + ": " + gai_strerror(rc));
    int error = ENOENT;
    for (addrinfo* ai = found; ai; ai = ai->ai_next) {
        const int fd = connectOne(ai->ai_family, ai->ai_addr, ai->ai_addrlen, deadline, &error);
        if (fd < 0) continue;
        ::freeaddrinfo(found);
        const int one = 1;
        ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        return RbbSocket(fd, peer);
    }
    ::freeaddrinfo(found);
    throw std::runtime_error("cannot connect to " + peer + ": " + reason(error));
}

RbbSocket RbbSocket::connectUnix(const std::string& path, unsigned timeoutMs)
{
    sockaddr_un addr{};
    addr.sun_family = AF_UNIX;
    if (path.empty() || path.size() >= sizeof addr.sun_path)
        throw std::runtime_error("'" + path + "' cannot name a Unix socket (empty or too long)");
    std::memcpy(addr.sun_path, path.c_str(), path.size() + 1);
    int error = 0;
    const int fd = connectOne(AF_UNIX, reinterpret_cast<const sockaddr*>(&addr), sizeof addr,
                              Clock::now() + std::chrono::milliseconds(timeoutMs), &error);
    if (fd < 0) throw std::runtime_error("cannot connect to " + path + ": " + reason(error));
    return RbbSocket(fd, path);
}

std::size_t RbbSocket::sendSome(const char* data, std::size_t size)
{
    for (;;) {
        const ssize_t n = ::send(m_fd, data, size, MSG_NOSIGNAL | MSG_DONTWAIT);
        if (n >= 0) return static_cast<std::size_t>(n);
        if (errno == EINTR) continue;
        if (errno == EAGAIN || errno == EWOULDBLOCK) return 0;
        throw std::runtime_error("the connection to " + m_peer + " failed: " + reason(errno));
    }
}

std::size_t RbbSocket::receiveSome(char* data, std::size_t capacity)
{
    for (;;) {
        const ssize_t n = ::recv(m_fd, data, capacity, MSG_DONTWAIT);
        if (n > 0) return static_cast<std::size_t>(n);
        if (n == 0) throw std::runtime_error("the server at " + m_peer + " closed the connection");
        if (errno == EINTR) continue;
        if (errno == EAGAIN || errno == EWOULDBLOCK) return 0;
        throw std::runtime_error("the connection to " + m_peer + " failed: " + reason(errno));
    }
}

void RbbSocket::wait(bool forWrite, unsigned timeoutMs)
{
    short revents = 0;
    const auto deadline = Clock::now() + std::chrono::milliseconds(timeoutMs);
    const int n = pollUntil(m_fd, static_cast<short>(POLLIN | (forWrite ? POLLOUT : 0)), deadline, &revents);
    if (n < 0) throw std::runtime_error("the connection to " + m_peer + " failed: " + reason(errno));
    if (n == 0)
        throw std::runtime_error("the server at " + m_peer + " did not answer within " + std::to_string(timeoutMs) +
                                 " ms");
}

void RbbSocket::close()
{
    if (m_fd >= 0) ::close(m_fd);
    m_fd = -1;
}

} // namespace jexrbb
