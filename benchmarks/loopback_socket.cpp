#include "loopback_socket.h"

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <stdexcept>

namespace zp::benchmarks {

LoopbackSocket::LoopbackSocket(int port) : fd_(::socket(AF_INET, SOCK_STREAM, 0)) {
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_port = htons(static_cast<std::uint16_t>(port));
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    if (::connect(fd_, reinterpret_cast<sockaddr*>(&a), sizeof a) != 0) {
        ::close(fd_);
        throw std::runtime_error("connect");
    }
    const int one = 1;
    ::setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &one, sizeof one);
}

LoopbackSocket::~LoopbackSocket() {
    ::close(fd_);
}

void LoopbackSocket::send(std::string_view text) {
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t n = ::send(fd_, text.data() + done, text.size() - done, MSG_NOSIGNAL);
        if (n <= 0) throw std::runtime_error("send");
        done += static_cast<std::size_t>(n);
    }
}

std::size_t LoopbackSocket::receive(char* buffer, std::size_t size) {
    const ssize_t n = ::recv(fd_, buffer, size, 0);
    if (n <= 0) throw std::runtime_error("recv");
    return static_cast<std::size_t>(n);
}

}  // namespace zp::benchmarks
