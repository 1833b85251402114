#include "scripted_peer.h"

#include <netinet/in.h>
#include <poll.h>
#include <unistd.h>

namespace zp::testing {

namespace {

bool waitReadable(int fd, const ScriptedPeer& peer) {
    while (!peer.stopping()) {
        pollfd p{fd, POLLIN, 0};
        if (::poll(&p, 1, 20) > 0) return true;
    }
    return false;
}

}  // namespace

ScriptedPeer::ScriptedPeer(Script script, int family, int backlog) {
    const int fd = ::socket(family, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) return;
    sockaddr_storage address{};
    socklen_t length = 0;
    if (family == AF_INET6) {
        auto& a = reinterpret_cast<sockaddr_in6&>(address);
        a.sin6_family = AF_INET6;
        a.sin6_addr = in6addr_loopback;
        length = sizeof a;
    } else {
        auto& a = reinterpret_cast<sockaddr_in&>(address);
        a.sin_family = AF_INET;
        a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        length = sizeof a;
    }
    if (::bind(fd, reinterpret_cast<sockaddr*>(&address), length) != 0 ||
        ::listen(fd, backlog) != 0 ||
        ::getsockname(fd, reinterpret_cast<sockaddr*>(&address), &length) != 0) {
        ::close(fd);
        return;
    }
    listener_ = fd;
    port_ = ntohs(family == AF_INET6 ? reinterpret_cast<sockaddr_in6&>(address).sin6_port
                                     : reinterpret_cast<sockaddr_in&>(address).sin_port);
    if (!script) return;
    thread_ = std::thread([this, script = std::move(script)] {
        if (!waitReadable(listener_, *this)) return;
        const int client = ::accept4(listener_, nullptr, nullptr, SOCK_CLOEXEC);
        if (client < 0) return;
        client_ = client;
        script(*this, client);
    });
}

ScriptedPeer::~ScriptedPeer() {
    stopping_ = true;
    if (thread_.joinable()) thread_.join();
    if (client_ >= 0) ::close(client_);
    if (listener_ >= 0) ::close(listener_);
}

std::string ScriptedPeer::readLine(int fd) {
    std::string line;
    char c = 0;
    while (waitReadable(fd, *this) && ::recv(fd, &c, 1, 0) == 1) {
        line += c;
        if (c == '\n') break;
    }
    return line;
}

bool ScriptedPeer::sendText(int fd, std::string_view text) {
    return !stopping_ && ::send(fd, text.data(), text.size(), MSG_NOSIGNAL | MSG_DONTWAIT) ==
                             static_cast<ssize_t>(text.size());
}

bool ScriptedPeer::pause(std::chrono::milliseconds time) {
    const auto end = std::chrono::steady_clock::now() + time;
    while (!stopping_ && std::chrono::steady_clock::now() < end) {
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return !stopping_;
}

}  // namespace zp::testing
