// SPDX-License-Identifier: MIT
#include "ServeListener.hpp"

#include <arpa/inet.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <stdexcept>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

namespace jexjtag::serve {

namespace {

std::string systemReason() { return std::strerror(errno); }

std::string addressText(const sockaddr* sa)
{
    char host[INET6_ADDRSTRLEN] = "?";
    if (sa->sa_family == AF_INET) {
        const auto* in = reinterpret_cast<const sockaddr_in*>(sa);
        inet_ntop(AF_INET, &in->sin_addr, host, sizeof host);
        return std::string(host) + ":" + std::to_string(ntohs(in->sin_port));
    }
    if (sa->sa_family == AF_INET6) {
        const auto* in6 = reinterpret_cast<const sockaddr_in6*>(sa);
        inet_ntop(AF_INET6, &in6->sin6_addr, host, sizeof host);
        return "[" + std::string(host) + "]:" + std::to_string(ntohs(in6->sin6_port));
    }
    return "local";
}

} // namespace

ServeListener::ServeListener(int fd, int stopFd, std::string address, std::string unixPath)
    : m_fd(fd), m_stopFd(stopFd), m_address(std::move(address)), m_unixPath(std::move(unixPath))
{
}

ServeListener::ServeListener(ServeListener&& other) noexcept
    : m_fd(other.m_fd), m_stopFd(other.m_stopFd), m_client(other.m_client), m_address(std::move(other.m_address)),
      m_unixPath(std::move(other.m_unixPath)), m_peer(std::move(other.m_peer))
{
    other.m_fd = other.m_client = -1;
    other.m_unixPath.clear();
}

ServeListener::~ServeListener()
{
    dropClient();
    if (m_fd >= 0) ::close(m_fd);
    if (!m_unixPath.empty()) ::unlink(m_unixPath.c_str());
}

ServeListener ServeListener::tcp(const std::string& hostPort, int stopFd)
{
    const std::size_t colon = hostPort.rfind(':');
    if (colon == std::string::npos || colon + 1 == hostPort.size())
        throw std::runtime_error("'" + hostPort + "' is not HOST:PORT");
    std::string host = hostPort.substr(0, colon);
    const std::string port = hostPort.substr(colon + 1);
    if (host.size() >= 2 && host.front() == '[' && host.back() == ']') host = host.substr(1, host.size() - 2);
    if (host.empty()) throw std::runtime_error("'" + hostPort + "' names no host");

    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    const int rc = ::getaddrinfo(host.c_str(), port.c_str(), &hints, &found);
    if (rc != 0) throw std::runtime_error("cannot listen on " + hostPort + ": " + gai_strerror(rc));
    std::string reason = "no address";
    for (addrinfo* ai = found; ai; ai = ai->ai_next) {
        const int fd = ::socket(ai->ai_family, ai->ai_socktype | SOCK_CLOEXEC, ai->ai_protocol);
        if (fd < 0) {
            reason = systemReason();
            continue;
        }
        const int one = 1;
        ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &one, sizeof one);
        sockaddr_storage bound{};
        socklen_t size = sizeof bound;
        if (::bind(fd, ai->ai_addr, ai->ai_addrlen) == 0 && ::listen(fd, 4) == 0 &&
            ::getsockname(fd, reinterpret_cast<sockaddr*>(&bound), &size) == 0) {
            ::freeaddrinfo(found);
            return ServeListener(fd, stopFd, addressText(reinterpret_cast<sockaddr*>(&bound)), "");
        }
        reason = systemReason();
        ::close(fd);
    }
    ::freeaddrinfo(found);
    throw std::runtime_error("cannot listen on " + hostPort + ": " + reason);
}

ServeListener ServeListener::unixSocket(const std::string& path, int stopFd)
{
    sockaddr_un addr{};
    addr.sun_family = AF_UNIX;
    if (path.empty() || path.size() >= sizeof addr.sun_path)
        throw std::runtime_error("'" + path + "' cannot name a Unix socket (empty or too long)");
    std::memcpy(addr.sun_path, path.c_str(), path.size() + 1);
    const int fd = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) throw std::runtime_error("cannot create a socket: " + systemReason());
    // A socket file nobody listens on any more is left from an earlier run.
    struct stat info {};
    if (::lstat(path.c_str(), &info) == 0 && S_ISSOCK(info.st_mode)) {
        const int probe = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
        if (probe >= 0 && ::connect(probe, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0 &&
            errno == ECONNREFUSED)
            ::unlink(path.c_str());
        if (probe >= 0) ::close(probe);
    }
    if (::bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0 || ::listen(fd, 4) != 0) {
        const std::string reason = systemReason();
        ::close(fd);
        throw std::runtime_error("cannot listen on " + path + ": " + reason);
    }
    return ServeListener(fd, stopFd, path, path);
}

bool ServeListener::waitFor(int fd, short events)
{
    pollfd fds[2] = {{fd, events, 0}, {m_stopFd, POLLIN, 0}};
    for (;;) {
        const int n = ::poll(fds, 2, -1);
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return false;
        if (fds[1].revents != 0) return false;
        if (fds[0].revents != 0) return true;
    }
}

bool ServeListener::accept()
{
    dropClient();
    while (waitFor(m_fd, POLLIN)) {
        sockaddr_storage peer{};
        socklen_t size = sizeof peer;
        const int fd = ::accept4(m_fd, reinterpret_cast<sockaddr*>(&peer), &size, SOCK_CLOEXEC);
        if (fd < 0) continue; // the client gave up meanwhile, or EINTR
        const int one = 1;
        if (peer.ss_family != AF_UNIX) ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
        m_client = fd;
        m_peer = addressText(reinterpret_cast<sockaddr*>(&peer));
        return true;
    }
    return false;
}

std::size_t ServeListener::receive(char* data, std::size_t size, std::string* why)
{
    if (!m_early.empty()) {
        const std::size_t n = std::min(size, m_early.size());
        std::memcpy(data, m_early.data(), n);
        m_early.erase(0, n);
        return n;
    }
    for (;;) {
        if (!waitFor(m_client, POLLIN)) {
            *why = "the server is stopping";
            return 0;
        }
        const ssize_t n = ::recv(m_client, data, size, 0);
        if (n > 0) return static_cast<std::size_t>(n);
        if (n < 0 && (errno == EINTR || errno == EAGAIN)) continue;
        *why = n == 0 ? "the client closed the connection" : "the connection failed: " + systemReason();
        return 0;
    }
}

bool ServeListener::hasInput()
{
    if (!m_early.empty()) return true;
    pollfd fds = {m_client, POLLIN, 0};
    return ::poll(&fds, 1, 0) > 0 && (fds.revents & POLLIN) != 0;
}

bool ServeListener::send(const std::string& data)
{
    constexpr std::size_t kMaxEarly = std::size_t(16) << 20;
    std::size_t done = 0;
    bool inputOpen = true;
    while (done < data.size()) {
        const ssize_t n = ::send(m_client, data.data() + done, data.size() - done, MSG_NOSIGNAL | MSG_DONTWAIT);
        if (n > 0) {
            done += static_cast<std::size_t>(n);
            continue;
        }
        if (n < 0 && errno == EINTR) continue;
        if (n < 0 && errno != EAGAIN && errno != EWOULDBLOCK) return false;
        const bool readOn = inputOpen && m_early.size() < kMaxEarly;
        pollfd fds[2] = {{m_client, static_cast<short>(POLLOUT | (readOn ? POLLIN : 0)), 0}, {m_stopFd, POLLIN, 0}};
        const int ready = ::poll(fds, 2, -1);
        if (ready < 0 && errno == EINTR) continue;
        if (ready < 0 || fds[1].revents != 0) return false;
        if (readOn && (fds[0].revents & POLLIN) != 0) {
            char chunk[1 << 16];
            const ssize_t got = ::recv(m_client, chunk, sizeof chunk, MSG_DONTWAIT);
            if (got > 0) m_early.append(chunk, static_cast<std::size_t>(got));
            // At the end of its input a client may still take the replies.
            else if (got == 0 || (errno != EAGAIN && errno != EINTR)) inputOpen = false;
        }
    }
    return true;
}

void ServeListener::dropClient()
{
    if (m_client >= 0) ::close(m_client);
    m_client = -1;
    m_peer.clear();
    m_early.clear();
}

} // namespace jexjtag::serve
