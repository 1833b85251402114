#include "transport/raw_socket_link.h"

#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
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

// Rounded up: a poll that wakes a fraction of a millisecond early would give up too soon.
int remainingMs(Clock::time_point deadline) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0) return 0;
    return left.count() > 1'000'000'000 ? 1'000'000'000 : static_cast<int>(left.count());
}

enum class Wait { Ready, TimedOut, Failed };  // Failed leaves the reason in errno

Wait waitFor(int fd, short events, Clock::time_point deadline) {
    while (true) {
        pollfd p{fd, events, 0};
        const int n = ::poll(&p, 1, remainingMs(deadline));
        if (n > 0) return Wait::Ready;
        if (n == 0) {
            if (Clock::now() >= deadline) return Wait::TimedOut;
            continue;
        }
        if (errno != EINTR) return Wait::Failed;
    }
}

// Connects one address; returns the socket or -1 with the reason in `why`.
int connectOne(const addrinfo& ai, Clock::time_point deadline, std::string& why) {
    const int fd =
        ::socket(ai.ai_family, ai.ai_socktype | SOCK_CLOEXEC | SOCK_NONBLOCK, ai.ai_protocol);
    if (fd < 0) {
        why = std::strerror(errno);
        return -1;
    }
    int rc = ::connect(fd, ai.ai_addr, ai.ai_addrlen);
    if (rc != 0 && errno == EINPROGRESS) {
        const Wait wait = waitFor(fd, POLLOUT, deadline);
        if (wait != Wait::Ready) {
            why = wait == Wait::TimedOut ? "connection timed out" : std::strerror(errno);
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

std::string peerText(const std::string& host, int port) {
    const bool ipv6 = host.find(':') != std::string::npos;
    return (ipv6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

}  // namespace

RawSocketLink::RawSocketLink(const std::string& host, int port, std::chrono::milliseconds ioTimeout,
                             std::chrono::milliseconds connectTimeout)
    : host_(host),
      port_(port),
      // Zero would make every call fail before it could move a byte.
      ioTimeout_(std::max(ioTimeout, std::chrono::milliseconds(1))),
      connectTimeout_(connectTimeout),
      peer_(peerText(host, port)) {
    connect();
}

RawSocketLink::~RawSocketLink() {
    if (fd_ >= 0) ::close(fd_);
}

void RawSocketLink::connect() {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_NUMERICSERV;
    addrinfo* found = nullptr;
    const int gai = ::getaddrinfo(host_.c_str(), std::to_string(port_).c_str(), &hints, &found);
    if (gai != 0) {
        throw InstrumentError(kTransportError,
                              "Cannot connect to " + peer_ + ": " + ::gai_strerror(gai));
    }
    const std::unique_ptr<addrinfo, AddrInfoDeleter> list(found);
    // One deadline for every address the name has.
    const auto deadline = Clock::now() + connectTimeout_;
    std::string why = "no address";
    int fd = -1;
    for (const addrinfo* ai = list.get(); ai != nullptr && fd < 0; ai = ai->ai_next) {
        fd = connectOne(*ai, deadline, why);
    }
    if (fd < 0) throw InstrumentError(kTransportError, "Cannot connect to " + peer_ + ": " + why);
    const int one = 1;
    ::setsockopt(fd, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
    // The socket stays non-blocking: every wait is a poll bounded by the call's deadline.
    fd_ = fd;
    in_.clear();
    head_ = scanned_ = 0;
    midReply_ = false;
    closedBy_.clear();
}

void RawSocketLink::ensureOpen() const {
    if (fd_ < 0) {
        throw LinkFailure("the connection to " + peer_ + " is closed (" + closedBy_ +
                              "); clear the device or open it again",
                          false);
    }
}

void RawSocketLink::fail(std::string reason, bool timedOut) {
    if (fd_ >= 0) ::close(fd_);
    fd_ = -1;
    in_.clear();
    head_ = scanned_ = 0;
    midReply_ = false;
    closedBy_ = reason;
    throw LinkFailure(std::move(reason), timedOut);
}

bool RawSocketLink::receiveAvailable() {
    while (true) {
        const ssize_t n = ::recv(fd_, chunk_.data(), chunk_.size(), MSG_DONTWAIT);
        if (n > 0) {
            in_.append(chunk_.data(), static_cast<std::size_t>(n));
            return true;
        }
        if (n == 0) fail(peer_ + " closed the connection", false);
        if (errno == EINTR) continue;
        if (errno == EAGAIN || errno == EWOULDBLOCK) return false;
        fail("read from " + peer_ + " failed: " + std::strerror(errno), false);
    }
}

void RawSocketLink::awaitInput(Deadline deadline, const char* what) {
    switch (waitFor(fd_, POLLIN, deadline)) {
        case Wait::Ready:
            return;
        case Wait::TimedOut:
            fail(std::string(what) + peer_ + " timed out", true);
        case Wait::Failed:
            fail(std::string(what) + peer_ + " failed: " + std::strerror(errno), false);
    }
}

std::size_t RawSocketLink::dropInput() {
    const std::size_t dropped = in_.size() - head_;
    if (dropped > 0) midReply_ = in_.back() != '\n';
    in_.clear();
    head_ = scanned_ = 0;
    return dropped;
}

std::size_t RawSocketLink::drainTail(Deadline deadline) {
    std::size_t dropped = 0;
    while (midReply_) {
        const std::size_t lf = in_.find('\n', head_);
        if (lf != std::string::npos) {
            // Whole replies behind it answer queries of their own; they stay.
            dropped += lf + 1 - head_;
            head_ = lf + 1;
            midReply_ = false;
            if (head_ == in_.size()) dropInput();
            break;
        }
        dropped += dropInput();
        if (Clock::now() >= deadline) {
            fail("dropping the rest of an earlier reply from " + peer_ + " timed out", true);
        }
        if (!receiveAvailable())
            awaitInput(deadline, "dropping the rest of an earlier reply from ");
    }
    return dropped;
}

std::size_t RawSocketLink::drainReplies() {
    ensureOpen();
    return drainTail(deadline());
}

void RawSocketLink::write(std::string_view text) {
    ensureOpen();
    const Deadline until = deadline();
    drainTail(until);
    std::size_t sent = 0;
    while (sent < text.size()) {
        const ssize_t n =
            ::send(fd_, text.data() + sent, text.size() - sent, MSG_NOSIGNAL | MSG_DONTWAIT);
        if (n > 0) {
            sent += static_cast<std::size_t>(n);
            continue;
        }
        if (n < 0 && errno == EINTR) continue;
        if (n < 0 && errno != EAGAIN && errno != EWOULDBLOCK) {
            fail("write to " + peer_ + " failed: " + std::strerror(errno), false);
        }
        switch (waitFor(fd_, POLLOUT, until)) {
            case Wait::Ready:
                break;
            case Wait::TimedOut:
                fail("write to " + peer_ + " timed out", true);
            case Wait::Failed:
                fail("write to " + peer_ + " failed: " + std::strerror(errno), false);
        }
    }
}

std::string RawSocketLink::read(std::size_t maxChars) {
    ensureOpen();
    const Deadline until = deadline();
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
            if (!reply.empty()) midReply_ = reply.back() != '\n';
            return reply;
        }
        // Wait before receiving: right after a query the reply is rarely there yet, and a receive
        // that finds nothing costs a system call on every query.
        awaitInput(until, "read from ");
        receiveAvailable();
    }
}

void RawSocketLink::clear() {
    if (fd_ >= 0) {
        const Deadline until = deadline();
        do {
            dropInput();
            if (Clock::now() >= until) fail("clear of " + peer_ + " timed out", true);
        } while (receiveAvailable());
        drainTail(until);
        return;
    }
    try {
        connect();
    } catch (const InstrumentError& e) {
        throw LinkFailure(e.description(), false);
    }
}

}  // namespace zp::transport
