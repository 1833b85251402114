#include "sim/server/scpi_server.h"

#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <limits>
#include <stdexcept>
#include <utility>
#include <vector>

namespace zp::sim {

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::size_t kChunk = 64 * 1024;
// An emptied buffer bigger than this is given back, so that clients at rest stay small.
constexpr std::size_t kKeptCapacity = 2 * kChunk;
// Newcomers taken from one port per turn of the loop: a storm of connections cannot starve the
// clients already served.
constexpr int kAcceptsPerTurn = 16;
constexpr int kBacklog = 128;
// Refused newcomers are kept this long (at most this many) so that their refusal line is not
// destroyed by a reset when they had already sent something we will never read.
constexpr std::size_t kMaxRefused = 64;
constexpr auto kRefusedLinger = std::chrono::seconds(1);
// Out of file descriptors: the port is left alone for a while instead of spinning on it.
constexpr auto kAcceptPause = std::chrono::milliseconds(100);

class Fd {
  public:
    Fd() = default;
    explicit Fd(int fd) : fd_(fd) {}
    ~Fd() { reset(); }
    Fd(Fd&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
    Fd& operator=(Fd&& other) noexcept {
        if (this != &other) {
            reset();
            fd_ = std::exchange(other.fd_, -1);
        }
        return *this;
    }
    int get() const { return fd_; }
    void reset() {
        if (fd_ >= 0) ::close(fd_);
        fd_ = -1;
    }

  private:
    int fd_ = -1;
};

struct Listener {
    Fd fd;
    int address;
    std::size_t clients = 0;
    Clock::time_point pausedUntil{};
};

struct Client {
    Fd fd;
    std::size_t listener;
    Clock::time_point lastActive;  // last line taken or reply byte sent
    std::string in;                // received, not yet run
    std::size_t scanned = 0;       // in[0, scanned) holds no LF of a line not yet run
    std::string out;
    std::size_t sent = 0;       // out[0, sent) is sent
    bool linesWaiting = false;  // in holds a complete line held back by the output cap
    bool peerClosed = false;
    bool done = false;
};

struct Refused {
    Fd fd;
    Clock::time_point until;
    bool done = false;
};

bool wouldBlock() {
    return errno == EAGAIN || errno == EWOULDBLOCK;
}

// Binds and listens; returns the socket and the port actually bound.
std::pair<Fd, int> listenOn(const std::string& host, int address, int port) {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    const std::string where =
        hostAndPort(host, port) + " for GPIB address " + std::to_string(address);
    const int gai = ::getaddrinfo(host.empty() ? nullptr : host.c_str(),
                                  std::to_string(port).c_str(), &hints, &found);
    if (gai != 0) throw std::runtime_error("Cannot listen on " + where + ": " + gai_strerror(gai));
    std::unique_ptr<addrinfo, void (*)(addrinfo*)> list(found, freeaddrinfo);
    Fd fd(::socket(found->ai_family, found->ai_socktype | SOCK_NONBLOCK | SOCK_CLOEXEC,
                   found->ai_protocol));
    const int one = 1;
    if (fd.get() < 0 || ::setsockopt(fd.get(), SOL_SOCKET, SO_REUSEADDR, &one, sizeof one) != 0 ||
        ::bind(fd.get(), found->ai_addr, found->ai_addrlen) != 0 ||
        ::listen(fd.get(), kBacklog) != 0) {
        throw std::runtime_error("Cannot listen on " + where + ": " + std::strerror(errno));
    }
    sockaddr_storage bound{};
    socklen_t length = sizeof bound;
    ::getsockname(fd.get(), reinterpret_cast<sockaddr*>(&bound), &length);
    const int actual = bound.ss_family == AF_INET6
                           ? ntohs(reinterpret_cast<sockaddr_in6*>(&bound)->sin6_port)
                           : ntohs(reinterpret_cast<sockaddr_in*>(&bound)->sin_port);
    return {std::move(fd), actual};
}

}  // namespace

class ScpiServer::Loop {
  public:
    Loop(Handler handler, std::mutex& mutex, ScpiServerLimits limits)
        : handler_(std::move(handler)), mutex_(mutex), limits_(limits) {
        int fds[2];
        if (::pipe2(fds, O_NONBLOCK | O_CLOEXEC) != 0) {
            throw std::runtime_error(std::string("pipe: ") + std::strerror(errno));
        }
        wakeRead_ = Fd(fds[0]);
        wakeWrite_ = Fd(fds[1]);
    }

    void addListener(Fd fd, int address) { listeners_.push_back({std::move(fd), address}); }

    void stop() {
        stopping_ = true;
        const char byte = 0;
        [[maybe_unused]] const auto n = ::write(wakeWrite_.get(), &byte, 1);
    }

    std::size_t peak() const { return peak_; }

    void run() {
        std::vector<pollfd> polls;
        while (!stopping_) {
            const auto now = Clock::now();
            polls.clear();
            polls.push_back({wakeRead_.get(), POLLIN, 0});
            for (const auto& l : listeners_) {
                polls.push_back({l.pausedUntil > now ? -1 : l.fd.get(), POLLIN, 0});
            }
            for (const auto& c : clients_) polls.push_back({c.fd.get(), events(c), 0});
            for (const auto& r : refused_) polls.push_back({r.fd.get(), POLLIN, 0});
            if (::poll(polls.data(), polls.size(), timeoutMs(now)) < 0) {
                if (errno == EINTR) continue;
                return;
            }
            if (stopping_) return;
            turn(polls, Clock::now());
        }
    }

  private:
    // One turn over what poll reported; entries added during the turn wait for the next.
    void turn(const std::vector<pollfd>& polls, Clock::time_point now) {
        std::size_t at = 1 + listeners_.size();
        for (auto& c : clients_) {
            c.done = !serve(c, polls[at++].revents, now) || idle(c, now);
            peak_ = std::max<std::size_t>(peak_, c.in.capacity() + c.out.capacity());
        }
        for (auto& r : refused_) r.done = !drain(r, polls[at++].revents, now);
        for (auto& c : clients_) {
            if (c.done) --listeners_[c.listener].clients;
        }
        std::erase_if(clients_, [](const Client& c) { return c.done; });
        std::erase_if(refused_, [](const Refused& r) { return r.done; });
        for (std::size_t i = 0; i < listeners_.size(); ++i) {
            if (polls[1 + i].revents != 0) accept(i, now);
        }
    }

    static short events(const Client& c) {
        short events = 0;
        if (wantsInput(c)) events |= POLLIN;
        if (c.sent < c.out.size()) events |= POLLOUT;
        return events;
    }

    static bool wantsInput(const Client& c) {
        return !c.peerClosed && !c.linesWaiting && c.out.size() < kOutputCap;
    }

    // Until the next deadline: an idle client, a refused one, a paused port. -1: none.
    int timeoutMs(Clock::time_point now) const {
        std::optional<Clock::time_point> next;
        const auto consider = [&next](Clock::time_point t) {
            if (!next || t < *next) next = t;
        };
        for (const auto& l : listeners_) {
            if (l.pausedUntil > now) consider(l.pausedUntil);
        }
        for (const auto& c : clients_) {
            if (c.linesWaiting && c.out.size() < kOutputCap) return 0;
            if (limits_.idleTimeout.count() > 0) consider(c.lastActive + limits_.idleTimeout);
        }
        for (const auto& r : refused_) consider(r.until);
        if (!next) return -1;
        if (*next <= now) return 0;
        const auto wait = std::chrono::ceil<std::chrono::milliseconds>(*next - now).count();
        return static_cast<int>(std::min<std::int64_t>(wait, std::numeric_limits<int>::max()));
    }

    bool idle(const Client& c, Clock::time_point now) const {
        return limits_.idleTimeout.count() > 0 && now - c.lastActive >= limits_.idleTimeout;
    }

    void accept(std::size_t index, Clock::time_point now) {
        Listener& listener = listeners_[index];
        for (int i = 0; i < kAcceptsPerTurn; ++i) {
            Fd fd(::accept4(listener.fd.get(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
            if (fd.get() < 0) {
                if (errno == ECONNABORTED || errno == EPROTO || errno == EINTR) continue;
                if (errno == EMFILE || errno == ENFILE || errno == ENOBUFS || errno == ENOMEM) {
                    listener.pausedUntil = now + kAcceptPause;
                }
                return;
            }
            if (listener.clients >= limits_.clientsPerPort) {
                refuse(std::move(fd), now);
                continue;
            }
            const int one = 1;
            ::setsockopt(fd.get(), IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            Client client{};
            client.fd = std::move(fd);
            client.listener = index;
            client.lastActive = now;
            clients_.push_back(std::move(client));
            ++listener.clients;
        }
    }

    void refuse(Fd fd, Clock::time_point now) {
        const std::string text = "ERROR: too many clients on this port (" +
                                 std::to_string(limits_.clientsPerPort) + "); try again later\n";
        // A new connection's send buffer takes the line whole.
        [[maybe_unused]] const auto n = ::send(fd.get(), text.data(), text.size(), MSG_NOSIGNAL);
        ::shutdown(fd.get(), SHUT_WR);
        if (refused_.size() >= kMaxRefused) refused_.erase(refused_.begin());
        refused_.push_back({std::move(fd), now + kRefusedLinger});
    }

    // Reads and drops what a refused client sends; false when it is to be closed.
    static bool drain(Refused& r, short revents, Clock::time_point now) {
        if (now >= r.until) return false;
        if (revents == 0) return true;
        char scratch[4096];
        const ssize_t n = ::recv(r.fd.get(), scratch, sizeof scratch, 0);
        return n > 0 || (n < 0 && (wouldBlock() || errno == EINTR));
    }

    // False when the client is to be dropped.
    bool serve(Client& c, short revents, Clock::time_point now) {
        if ((revents & (POLLIN | POLLHUP | POLLERR)) != 0 && wantsInput(c)) {
            if (!receive(c)) return false;
        }
        if (!runLines(c, now) || !flush(c, now)) return false;
        return !(c.peerClosed && !c.linesWaiting && c.sent == c.out.size());
    }

    static bool receive(Client& c) {
        char buffer[kChunk];
        const ssize_t n = ::recv(c.fd.get(), buffer, sizeof buffer, 0);
        if (n < 0) return wouldBlock() || errno == EINTR;
        if (n == 0) {
            c.peerClosed = true;
        } else {
            c.in.append(buffer, static_cast<std::size_t>(n));
        }
        return true;
    }

    // Runs the complete lines received while the replies waiting stay under the cap; the rest
    // wait, unread, until the client has taken some.
    bool runLines(Client& c, Clock::time_point now) {
        std::size_t start = 0;
        std::size_t from = c.scanned;
        c.linesWaiting = false;
        while (true) {
            const std::size_t lf = c.in.find('\n', from);
            if (lf == std::string::npos) {
                from = c.in.size();
                break;
            }
            if (lf - start > kMaxLine) return false;
            if (c.out.size() >= kOutputCap) {
                c.linesWaiting = true;
                from = lf;
                break;
            }
            std::string_view line(c.in.data() + start, lf - start);
            if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
            std::optional<std::string> reply;
            {
                const std::lock_guard lock(mutex_);
                reply = handler_(listeners_[c.listener].address, line);
            }
            if (reply) c.out += *reply;
            c.lastActive = now;
            start = lf + 1;
            from = start;
        }
        c.in.erase(0, start);
        c.scanned = from - start;
        if (c.in.empty() && c.in.capacity() > kKeptCapacity) std::string().swap(c.in);
        return c.linesWaiting || c.in.size() <= kMaxLine;
    }

    static bool flush(Client& c, Clock::time_point now) {
        while (c.sent < c.out.size()) {
            const ssize_t n =
                ::send(c.fd.get(), c.out.data() + c.sent, c.out.size() - c.sent, MSG_NOSIGNAL);
            if (n < 0) {
                if (errno == EINTR) continue;
                if (!wouldBlock()) return false;
                break;
            }
            c.sent += static_cast<std::size_t>(n);
            c.lastActive = now;
        }
        if (c.sent == c.out.size()) {
            c.sent = 0;
            if (c.out.capacity() > kKeptCapacity) {
                std::string().swap(c.out);
            } else {
                c.out.clear();
            }
        } else if (c.sent >= c.out.size() / 2) {
            // Dropping the sent part only once it is half the buffer copies at most one byte
            // per byte sent.
            c.out.erase(0, c.sent);
            c.sent = 0;
        }
        return true;
    }

    Handler handler_;
    std::mutex& mutex_;
    const ScpiServerLimits limits_;
    std::atomic<bool> stopping_{false};
    Fd wakeRead_;
    Fd wakeWrite_;
    std::vector<Listener> listeners_;
    std::vector<Client> clients_;
    std::vector<Refused> refused_;
    std::atomic<std::size_t> peak_{0};
};

ScpiServer::ScpiServer(const std::map<int, int>& ports, Handler handler,
                       const std::string& bindAddress, ScpiServerLimits limits)
    : bindAddress_(bindAddress), loop_(std::make_unique<Loop>(std::move(handler), mutex_, limits)) {
    if (ports.empty()) throw std::runtime_error("No addresses to serve");
    for (const auto& [address, port] : ports) {
        if (port < 0 || port > 65535) {
            throw std::runtime_error("Port " + std::to_string(port) + " for GPIB address " +
                                     std::to_string(address) + " is not 0..65535");
        }
        auto [fd, actual] = listenOn(bindAddress, address, port);
        loop_->addListener(std::move(fd), address);
        ports_[address] = actual;
    }
    thread_ = std::thread([this] { loop_->run(); });
}

ScpiServer::~ScpiServer() {
    stop();
}

void ScpiServer::stop() {
    if (!thread_.joinable()) return;
    loop_->stop();
    thread_.join();
}

ScpiServer::Handler ScpiServer::forGenerators(
    std::map<int, std::unique_ptr<SimGenerator>>& generators) {
    return [&generators](int address, std::string_view line) -> std::optional<std::string> {
        const auto it = generators.find(address);
        if (it == generators.end()) return std::nullopt;
        return it->second->handle(line);
    };
}

int ScpiServer::port(int address) const {
    const auto it = ports_.find(address);
    return it == ports_.end() ? -1 : it->second;
}

std::string ScpiServer::describe() const {
    std::string text;
    for (const auto& [address, port] : ports_) {
        if (!text.empty()) text += ", ";
        text += std::to_string(address) + " on " + hostAndPort(bindAddress_, port);
    }
    return text;
}

std::size_t ScpiServer::peakConnectionBytes() const {
    return loop_->peak();
}

std::string hostAndPort(const std::string& host, int port) {
    const bool v6 = host.find(':') != std::string::npos;
    return (v6 ? "[" + host + "]" : host) + ":" + std::to_string(port);
}

void ScpiServer::withLock(const std::function<void()>& f) {
    const std::lock_guard lock(mutex_);
    f();
}

}  // namespace zp::sim
