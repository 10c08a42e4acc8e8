#pragma once

#include "ConnectionPool.h"

#include <httplib.h>

#include <atomic>
#include <chrono>
#include <cstddef>
#include <string>

// The receiver's HTTPS server: cpp-httplib parses and routes the requests,
// on connections that this class accepts, reads and closes itself, so that
// every request is held to the limits below before any handler runs:
//   - TLS handshake, request line and headers within `timeout`, at most
//     `maxHeaderBytes` bytes and `maxHeaderCount` header lines (431 beyond);
//   - a request body only on `bodyPath`, with a Content-Length of at most
//     `maxBodyBytes` (411 without a length, 413 beyond) or chunked, cut off
//     once `maxBodyBytes` bytes (chunk framing included) have been read;
//   - a body at no less than SlowBytesPerSecond on average after `timeout`,
//     and no read waiting longer than `timeout`;
//   - one request per connection, on a pool of `workers` threads that drops
//     the slowest connections first when others wait (ConnectionPool).
// Refusals are answered before the body is read; the connection then reads
// and discards what the client still sends for a moment, so that the client
// sees the answer rather than a reset connection.
class ReceiverServer : public httplib::SSLServer
{
public:
    struct Limits
    {
        std::size_t maxBodyBytes = 64u * 1024 * 1024;
        std::size_t maxHeaderBytes = 64 * 1024; // request line and header lines together
        std::size_t maxHeaderCount = 100;
        std::chrono::seconds timeout{10};
        std::size_t workers = 8;
    };

    // Below this average rate a connection counts as slow.
    static constexpr double SlowBytesPerSecond = 8192;

    ReceiverServer(const std::string &certFile, const std::string &keyFile, std::string bodyPath,
                   const Limits &limits);

    // For the request being handled on the calling thread: true when its
    // body was cut off at the size limit.
    static bool bodyOverLimit();
    // For the request being handled on the calling thread: its body has been
    // read; from now on it is stored and answered and never cut.
    static void bodyRead();

private:
    bool process_and_close_socket(socket_t sock) override;
    bool serve(socket_t sock, ConnectionPool::Connection &connection, ConnectionPool &pool);
    // The status refusing `request` before its body is read (0: go on), and
    // the answer's text.
    int screen(const httplib::Request &request, std::string &text) const;
    std::size_t bodyBudget(const httplib::Request &request) const;

    const std::string m_bodyPath;
    const Limits m_limits;
    std::atomic<ConnectionPool *> m_pool{nullptr};
};
