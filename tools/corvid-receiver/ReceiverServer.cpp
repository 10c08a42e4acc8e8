#include "ReceiverServer.h"

#include "TlsStream.h"

#include <openssl/err.h>

#include <strings.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

namespace {

using Clock = ConnectionPool::Clock;

// How long, and how much, a closing connection reads and discards.
const Clock::duration LingerTime = std::chrono::seconds(1);
const std::size_t LingerBytes = 1024 * 1024;

// The request being served on this thread.
struct CurrentRequest
{
    TlsStream *stream = nullptr;
    ConnectionPool::Connection *connection = nullptr;
    ConnectionPool *pool = nullptr;
};
thread_local CurrentRequest t_current;

bool isDigits(const std::string &text)
{
    return !text.empty() && text.size() <= 19 && text.find_first_not_of("0123456789") == std::string::npos;
}

} // namespace

ReceiverServer::ReceiverServer(const std::string &certFile, const std::string &keyFile, std::string bodyPath,
                               const Limits &limits)
    : httplib::SSLServer(certFile.c_str(), keyFile.c_str()), m_bodyPath(std::move(bodyPath)), m_limits(limits)
{
    new_task_queue = [this] {
        auto *pool = new ConnectionPool(m_limits.workers, std::chrono::seconds(1), SlowBytesPerSecond);
        m_pool = pool;
        return pool;
    };
    set_read_timeout(m_limits.timeout.count());
    set_write_timeout(m_limits.timeout.count());
    set_payload_max_length(m_limits.maxBodyBytes);
    set_pre_routing_handler([this](const httplib::Request &request, httplib::Response &response) {
        std::string text;
        const int status = screen(request, text);
        if (!status)
            return HandlerResponse::Unhandled;
        response.status = status;
        response.set_content(text, "text/plain");
        return HandlerResponse::Handled;
    });
    set_expect_100_continue_handler([this](const httplib::Request &request, httplib::Response &response) {
        std::string text;
        const int status = screen(request, text);
        if (!status)
            return 100;
        response.set_content(text, "text/plain");
        return status;
    });
}

bool ReceiverServer::bodyOverLimit()
{
    return t_current.stream && t_current.stream->overBudget();
}

void ReceiverServer::bodyRead()
{
    if (t_current.pool)
        t_current.pool->setDeadline(*t_current.connection, Clock::now(), true);
}

int ReceiverServer::screen(const httplib::Request &request, std::string &text) const
{
    // cpp-httplib adds four entries of its own (REMOTE_ADDR, REMOTE_PORT,
    // LOCAL_ADDR, LOCAL_PORT).
    if (request.headers.size() > m_limits.maxHeaderCount + 4) {
        text = "refused: more than " + std::to_string(m_limits.maxHeaderCount) + " header lines\n";
        return 431;
    }
    if (request.method == "GET" || request.method == "HEAD")
        return 0;
    if (request.path != m_bodyPath) {
        text = "not found\n";
        return 404;
    }
    const size_t lengths = request.get_header_value_count("Content-Length");
    const bool coded = request.has_header("Transfer-Encoding");
    const std::string length = request.get_header_value("Content-Length");
    if (lengths > 1 || (lengths == 1 && (coded || !isDigits(length)))) {
        text = "refused: the request's length is unclear\n";
        return 400;
    }
    const std::string coding = request.get_header_value("Transfer-Encoding");
    if (lengths == 0
        && (!coded || request.get_header_value_count("Transfer-Encoding") > 1
            || ::strcasecmp(coding.c_str(), "chunked") != 0)) {
        text = "refused: a request body needs a Content-Length or chunked transfer coding\n";
        return 411;
    }
    if (lengths == 1 && std::stoull(length) > m_limits.maxBodyBytes) {
        text =
            "refused: the request body is larger than " + std::to_string(m_limits.maxBodyBytes) + " bytes\n";
        return 413;
    }
    return 0;
}

std::size_t ReceiverServer::bodyBudget(const httplib::Request &request) const
{
    const std::string length = request.get_header_value("Content-Length");
    if (request.method == "GET" || request.method == "HEAD")
        return 0;
    if (request.has_header("Transfer-Encoding"))
        return m_limits.maxBodyBytes;
    return isDigits(length) ? std::min<std::size_t>(std::stoull(length), m_limits.maxBodyBytes) : 0;
}

bool ReceiverServer::process_and_close_socket(socket_t sock)
{
    // Runs on a worker of the pool, which therefore exists.
    ConnectionPool &pool = *m_pool;
    ConnectionPool::Connection connection;
    connection.socket = sock;
    bool served = false;
    if (pool.track(connection, Clock::now() + m_limits.timeout)) {
        served = serve(sock, connection, pool);
        pool.untrack(connection);
    }
    ::close(sock);
    return served;
}

bool ReceiverServer::serve(socket_t sock, ConnectionPool::Connection &connection, ConnectionPool &pool)
{
    const timeval wait{static_cast<time_t>(m_limits.timeout.count()), 0};
    ::setsockopt(sock, SOL_SOCKET, SO_RCVTIMEO, &wait, sizeof wait);
    ::setsockopt(sock, SOL_SOCKET, SO_SNDTIMEO, &wait, sizeof wait);
    ERR_clear_error();
    SSL *ssl = SSL_new(ssl_context());
    if (!ssl)
        return false;
    bool served = false;
    if (SSL_set_fd(ssl, sock) == 1 && SSL_accept(ssl) == 1) {
        const int timeoutMs = int(std::chrono::milliseconds(m_limits.timeout).count());
        TlsStream stream(ssl, sock, connection, timeoutMs, timeoutMs);
        stream.setBudget(m_limits.maxHeaderBytes);
        t_current = CurrentRequest{&stream, &connection, &pool};
        bool closed = false;
        served = process_request(stream, true, closed, [&](httplib::Request &request) {
            request.ssl = ssl;
            const std::size_t budget = bodyBudget(request);
            stream.setBudget(budget);
            pool.setDeadline(connection,
                             Clock::now() + m_limits.timeout
                                 + std::chrono::seconds(budget / std::size_t(SlowBytesPerSecond)));
        });
        t_current = CurrentRequest();

        // Closing with unread data would reset the connection, and the client
        // might lose the answer: say goodbye, then discard what still comes.
        pool.setDeadline(connection, Clock::now() + LingerTime);
        SSL_shutdown(ssl);
        ::shutdown(sock, SHUT_WR);
        char discard[16384];
        std::size_t discarded = 0;
        for (int got; discarded < LingerBytes && (got = SSL_read(ssl, discard, sizeof discard)) > 0;)
            discarded += std::size_t(got);
    }
    SSL_free(ssl);
    ERR_clear_error();
    return served;
}
