#include "sim/scpi_server.h"

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
#include <cstring>
#include <stdexcept>
#include <utility>
#include <vector>

namespace zp::sim {

namespace {

constexpr std::size_t kMaxLine = 1 << 20;
constexpr std::size_t kMaxPendingOutput = 16 << 20;
constexpr std::size_t kMaxClients = 64;
constexpr std::size_t kChunk = 64 * 1024;

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
};

struct Client {
    Fd fd;
    int address;
    std::string in;
    std::size_t scanned = 0;
    std::string out;
    std::size_t sent = 0;
    bool peerClosed = false;
};

// Binds and listens; returns the socket and the port actually bound.
std::pair<Fd, int> listenOn(const std::string& host, int address, int port) {
    addrinfo hints{};
    hints.ai_family = AF_UNSPEC;
    hints.ai_socktype = SOCK_STREAM;
    hints.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
    addrinfo* found = nullptr;
    const std::string where =
        host + ":" + std::to_string(port) + " for GPIB address " + std::to_string(address);
    const int gai = ::getaddrinfo(host.empty() ? nullptr : host.c_str(),
                                  std::to_string(port).c_str(), &hints, &found);
    if (gai != 0) throw std::runtime_error("Cannot listen on " + where + ": " + gai_strerror(gai));
    std::unique_ptr<addrinfo, void (*)(addrinfo*)> list(found, freeaddrinfo);
    Fd fd(::socket(found->ai_family, found->ai_socktype | SOCK_NONBLOCK | SOCK_CLOEXEC,
                   found->ai_protocol));
    const int one = 1;
    if (fd.get() < 0 || ::setsockopt(fd.get(), SOL_SOCKET, SO_REUSEADDR, &one, sizeof one) != 0 ||
        ::bind(fd.get(), found->ai_addr, found->ai_addrlen) != 0 || ::listen(fd.get(), 16) != 0) {
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
    Loop(Handler handler, std::mutex& mutex) : handler_(std::move(handler)), mutex_(mutex) {
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

    void run() {
        std::vector<pollfd> polls;
        while (!stopping_) {
            polls.clear();
            polls.push_back({wakeRead_.get(), POLLIN, 0});
            for (const auto& l : listeners_) polls.push_back({l.fd.get(), POLLIN, 0});
            for (const auto& c : clients_) {
                short events = 0;
                if (!c.peerClosed && c.out.size() - c.sent < kMaxPendingOutput) events |= POLLIN;
                if (c.sent < c.out.size()) events |= POLLOUT;
                polls.push_back({c.fd.get(), events, 0});
            }
            if (::poll(polls.data(), polls.size(), -1) < 0) {
                if (errno == EINTR) continue;
                return;
            }
            if (stopping_) return;
            for (std::size_t i = 0; i < listeners_.size(); ++i) {
                if (polls[1 + i].revents != 0) accept(listeners_[i]);
            }
            const std::size_t firstClient = 1 + listeners_.size();
            // Clients accepted just now are not in polls; only the older ones are served.
            const std::size_t polled = polls.size() - firstClient;
            std::vector<bool> drop(clients_.size(), false);
            for (std::size_t i = 0; i < polled; ++i) {
                drop[i] = !serve(clients_[i], polls[firstClient + i].revents);
            }
            for (std::size_t i = clients_.size(); i-- > 0;) {
                if (drop[i]) clients_.erase(clients_.begin() + static_cast<std::ptrdiff_t>(i));
            }
        }
    }

  private:
    void accept(Listener& listener) {
        while (true) {
            Fd fd(::accept4(listener.fd.get(), nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC));
            if (fd.get() < 0) return;
            if (clients_.size() >= kMaxClients) continue;  // refused: closed at once
            const int one = 1;
            ::setsockopt(fd.get(), IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
            clients_.push_back(Client{std::move(fd), listener.address, {}, 0, {}, 0, false});
        }
    }

    // False when the client is to be dropped.
    bool serve(Client& c, short revents) {
        if ((revents & (POLLIN | POLLHUP | POLLERR)) != 0 && !c.peerClosed) {
            if (!receive(c)) return false;
        }
        if (!flush(c)) return false;
        return !(c.peerClosed && c.sent == c.out.size());
    }

    bool receive(Client& c) {
        char buffer[kChunk];
        const ssize_t n = ::recv(c.fd.get(), buffer, sizeof buffer, 0);
        if (n < 0) return errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR;
        if (n == 0) {
            c.peerClosed = true;
        } else {
            c.in.append(buffer, static_cast<std::size_t>(n));
        }
        std::size_t start = 0;
        while (true) {
            const std::size_t lf = c.in.find('\n', std::max(start, c.scanned));
            if (lf == std::string::npos) break;
            if (lf - start > kMaxLine) return false;
            std::string_view line(c.in.data() + start, lf - start);
            if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
            std::optional<std::string> reply;
            {
                const std::lock_guard lock(mutex_);
                reply = handler_(c.address, line);
            }
            if (reply) c.out += *reply;
            start = lf + 1;
        }
        c.in.erase(0, start);
        c.scanned = c.in.size();
        return c.in.size() <= kMaxLine;
    }

    bool flush(Client& c) {
        while (c.sent < c.out.size()) {
            const ssize_t n =
                ::send(c.fd.get(), c.out.data() + c.sent, c.out.size() - c.sent, MSG_NOSIGNAL);
            if (n < 0) return errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR;
            c.sent += static_cast<std::size_t>(n);
        }
        c.out.clear();
        c.sent = 0;
        return true;
    }

    Handler handler_;
    std::mutex& mutex_;
    std::atomic<bool> stopping_{false};
    Fd wakeRead_;
    Fd wakeWrite_;
    std::vector<Listener> listeners_;
    std::vector<Client> clients_;
};

ScpiServer::ScpiServer(const std::map<int, int>& ports, Handler handler,
                       const std::string& bindAddress)
    : bindAddress_(bindAddress), loop_(std::make_unique<Loop>(std::move(handler), mutex_)) {
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
        text += std::to_string(address) + " on " + bindAddress_ + ":" + std::to_string(port);
    }
    return text;
}

void ScpiServer::withLock(const std::function<void()>& f) {
    const std::lock_guard lock(mutex_);
    f();
}

}  // namespace zp::sim
