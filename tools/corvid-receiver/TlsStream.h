#pragma once

#include "ConnectionPool.h"

#include <httplib.h>

#include <openssl/ssl.h>

#include <cstddef>

// One accepted TLS connection as the HTTP parser reads and writes it, with a
// budget: reads fail once the budget for the current part of the request
// (its request line and headers, then its body) is spent, so that no request
// makes the receiver read more than its limits, whatever framing it uses.
// Every byte read is counted for the connection pool.
class TlsStream : public httplib::Stream
{
public:
    TlsStream(SSL *ssl, int socket, ConnectionPool::Connection &connection, int readTimeoutMs,
              int writeTimeoutMs);

    // The bytes that may still be read before reads fail.
    void setBudget(std::size_t bytes);
    // True when a read failed because the budget was spent.
    bool overBudget() const { return m_overBudget; }

    bool is_readable() const override;
    bool is_writable() const override;
    ssize_t read(char *ptr, size_t size) override;
    ssize_t write(const char *ptr, size_t size) override;
    void get_remote_ip_and_port(std::string &ip, int &port) const override;
    void get_local_ip_and_port(std::string &ip, int &port) const override;
    socket_t socket() const override { return m_socket; }

private:
    bool waitFor(short events, int timeoutMs) const;

    SSL *m_ssl;
    int m_socket;
    ConnectionPool::Connection &m_connection;
    int m_readTimeoutMs;
    int m_writeTimeoutMs;
    std::size_t m_budget = 0;
    bool m_overBudget = false;
};
