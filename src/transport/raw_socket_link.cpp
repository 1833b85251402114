#include "transport/raw_socket_link.h"

#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <memory>

#include "instruments/instrument_error.h"

namespace zp::transport {

namespace {

using Clock = std::chrono::steady_clock;
constexpr std::size_t kChunk = 64 * 1024;

struct AddrInfoDeleter {
    void operator()(addrinfo* info) const { freeaddrinfo(info); }
};

int remainingMs(Clock::time_point deadline) {
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0) return 0;
    return left.count() > 1'000'000'000 ? 1'000'000'000 : static_cast<int>(left.count());
}

// Waits for the event; false on timeout. Throws LinkFailure on a poll error.
bool waitFor(int fd, short events, Clock::time_point deadline) {
    while (true) {
        pollfd p{fd, events, 0};
        const int n = ::poll(&p, 1, remainingMs(deadline));
        if (n > 0) return true;
        if (n == 0) return false;
        if (errno != EINTR) throw LinkFailure(std::string("poll: ") + std::strerror(errno), false);
    }
}

// Connects one address; returns the socket or -1 with errno-style reason in `why`.
int connectOne(const addrinfo& ai, Clock::time_point deadline, std::string& why) {
    const int fd =
        ::socket(ai.ai_family, ai.ai_socktype | SOCK_CLOEXEC | SOCK_NONBLOCK, ai.ai_protocol);
    if (fd < 0) {
        why = std::strerror(errno);
        return -1;
    }
    int rc = ::connect(fd, ai.ai_addr, ai.ai_addrlen);
    if (rc != 0 && errno == EINPROGRESS) {
        try {
            if (!waitFor(fd, POLLOUT, deadline)) {
                why = "connection timed out";
                ::close(fd);
                return -1;
            }
        } catch (const LinkFailure& e) {
            why = e.what();
            ::close(fd);
            return -1;
        }
        int error = 0;
        socklen_t length = sizeof error;
        ::getsockopt(fd, SOL_SOCKET, SO_ERROR, &error, &length);
        rc = error == 0 ? 0 : -1;
        errno = error;
    }
    if (rc != 0) {
        why = std::strerror(errno);
        ::close(fd);
        return -1;
    }
    return fd;
}

}  // namespace

RawSocketLink::RawSocketLink(const std::string& host, int port, std::chrono::milliseconds ioTimeout,
                             std::chrono::milliseconds connectTimeout)
    : peer_(host + ":" + std::to_string(port)) {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    addrinfo* found = nullptr;
    const int gai = ::getaddrinfo(host.c_str(), std::to_string(port).c_str(), &hints, &found);
    if (gai != 0) {
        throw InstrumentError(kTransportError,
                              "Cannot connect to " + peer_ + ": " + ::gai_strerror(gai));
    }
    const std::unique_ptr<addrinfo, AddrInfoDeleter> list(found);
    const auto deadline = Clock::now() + connectTimeout;
    std::string why = "no address";
    for (const addrinfo* ai = list.get(); ai != nullptr && fd_ < 0; ai = ai->ai_next) {
        fd_ = connectOne(*ai, deadline, why);
    }
    if (fd_ < 0) throw InstrumentError(kTransportError, "Cannot connect to " + peer_ + ": " + why);
    const int one = 1;
    ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
    // From here on blocking calls with kernel timeouts: one system call per send or receive.
    ::fcntl(fd_, F_SETFL, ::fcntl(fd_, F_GETFL) & ~O_NONBLOCK);
    const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(ioTimeout);
    timeval tv{};
    tv.tv_sec = static_cast<time_t>(seconds.count());
    tv.tv_usec = static_cast<suseconds_t>(
        std::chrono::duration_cast<std::chrono::microseconds>(ioTimeout - seconds).count());
    if (tv.tv_sec == 0 && tv.tv_usec == 0) tv.tv_usec = 1000;  // zero would mean "wait forever"
    ::setsockopt(fd_, SOL_SOCKET, SO_RCVTIMEO, &tv, sizeof tv);
    ::setsockopt(fd_, SOL_SOCKET, SO_SNDTIMEO, &tv, sizeof tv);
}

RawSocketLink::~RawSocketLink() {
    if (fd_ >= 0) ::close(fd_);
}

void RawSocketLink::write(std::string_view text) {
    std::size_t sent = 0;
    while (sent < text.size()) {
        const ssize_t n = ::send(fd_, text.data() + sent, text.size() - sent, MSG_NOSIGNAL);
        if (n > 0) {
            sent += static_cast<std::size_t>(n);
        } else if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) {
            throw LinkFailure("write to " + peer_ + " timed out", true);
        } else if (n < 0 && errno != EINTR) {
            throw LinkFailure("write to " + peer_ + " failed: " + std::strerror(errno), false);
        }
    }
}

std::string RawSocketLink::read(std::size_t maxChars) {
    while (true) {
        const std::size_t available = in_.size() - head_;
        // Line feed within the first maxChars characters?
        const std::size_t limit = head_ + std::min(available, maxChars);
        if (scanned_ < head_) scanned_ = head_;
        const std::size_t lf = scanned_ < limit ? in_.find('\n', scanned_) : std::string::npos;
        std::size_t take = 0;
        if (lf != std::string::npos && lf < limit) {
            take = lf + 1 - head_;
        } else if (available >= maxChars) {
            take = maxChars;
        } else {
            scanned_ = in_.size();
        }
        if (take > 0 || maxChars == 0) {
            std::string reply = in_.substr(head_, take);
            head_ += take;
            if (head_ == in_.size()) {
                in_.clear();
                head_ = scanned_ = 0;
            } else if (head_ > kChunk && head_ * 2 > in_.size()) {
                in_.erase(0, head_);
                scanned_ -= std::min(scanned_, head_);
                head_ = 0;
            }
            return reply;
        }

        const ssize_t n = ::recv(fd_, chunk_.data(), chunk_.size(), 0);
        if (n > 0) {
            in_.append(chunk_.data(), static_cast<std::size_t>(n));
            continue;
        }
        if (n == 0) throw LinkFailure(peer_ + " closed the connection", false);
        if (errno == EINTR) continue;
        if (errno == EAGAIN || errno == EWOULDBLOCK) {
            throw LinkFailure("read from " + peer_ + " timed out", true);
        }
        throw LinkFailure("read from " + peer_ + " failed: " + std::strerror(errno), false);
    }
}

void RawSocketLink::clear() {
    in_.clear();
    head_ = scanned_ = 0;
    char scratch[4096];
    while (::recv(fd_, scratch, sizeof scratch, MSG_DONTWAIT) > 0) {
    }
}

}  // namespace zp::transport
