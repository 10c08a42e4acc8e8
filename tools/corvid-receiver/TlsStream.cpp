#include "TlsStream.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <climits>

namespace {

// "ip" and "port" of a socket address (IPv4 or IPv6); both left as they are
// for other kinds.
void addressParts(const sockaddr_storage &address, std::string &ip, int &port)
{
    char text[INET6_ADDRSTRLEN] = {0};
    if (address.ss_family == AF_INET) {
        const auto &v4 = reinterpret_cast<const sockaddr_in &>(address);
        if (inet_ntop(AF_INET, &v4.sin_addr, text, sizeof text))
            ip = text;
        port = ntohs(v4.sin_port);
    } else if (address.ss_family == AF_INET6) {
        const auto &v6 = reinterpret_cast<const sockaddr_in6 &>(address);
        if (inet_ntop(AF_INET6, &v6.sin6_addr, text, sizeof text))
            ip = text;
        port = ntohs(v6.sin6_port);
    }
}

} // namespace

TlsStream::TlsStream(SSL *ssl, int socket, ConnectionPool::Connection &connection, int readTimeoutMs,
                     int writeTimeoutMs)
    : m_ssl(ssl)
    , m_socket(socket)
    , m_connection(connection)
    , m_readTimeoutMs(readTimeoutMs)
    , m_writeTimeoutMs(writeTimeoutMs)
{
}

void TlsStream::setBudget(std::size_t bytes)
{
    m_budget = bytes;
}

bool TlsStream::waitFor(short events, int timeoutMs) const
{
    pollfd entry{m_socket, events, 0};
    int ready;
    do
        ready = ::poll(&entry, 1, timeoutMs);
    while (ready < 0 && errno == EINTR);
    return ready > 0 && !(entry.revents & POLLNVAL);
}

bool TlsStream::is_readable() const
{
    return SSL_pending(m_ssl) > 0 || waitFor(POLLIN, m_readTimeoutMs);
}

bool TlsStream::is_writable() const
{
    return waitFor(POLLOUT, m_writeTimeoutMs);
}

ssize_t TlsStream::read(char *ptr, size_t size)
{
    if (m_budget == 0) {
        m_overBudget = true;
        return -1;
    }
    if (!is_readable())
        return -1;
    const int wanted = int(std::min<std::size_t>({size, m_budget, INT_MAX}));
    const int got = SSL_read(m_ssl, ptr, wanted);
    if (got <= 0)
        return -1;
    m_budget -= std::size_t(got);
    m_connection.bytes += std::uint64_t(got);
    return got;
}

ssize_t TlsStream::write(const char *ptr, size_t size)
{
    if (!is_writable())
        return -1;
    const int sent = SSL_write(m_ssl, ptr, int(std::min<std::size_t>(size, INT_MAX)));
    return sent > 0 ? sent : -1;
}

void TlsStream::get_remote_ip_and_port(std::string &ip, int &port) const
{
    sockaddr_storage address{};
    socklen_t length = sizeof address;
    if (::getpeername(m_socket, reinterpret_cast<sockaddr *>(&address), &length) == 0)
        addressParts(address, ip, port);
}

void TlsStream::get_local_ip_and_port(std::string &ip, int &port) const
{
    sockaddr_storage address{};
    socklen_t length = sizeof address;
    if (::getsockname(m_socket, reinterpret_cast<sockaddr *>(&address), &length) == 0)
        addressParts(address, ip, port);
}
