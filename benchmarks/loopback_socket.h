#pragma once
// A plain blocking client on the loopback interface with Nagle off: what the benchmarks drive the
// generator server with, and the baseline the transport is measured against.

#include <cstddef>
#include <string_view>

namespace zp::benchmarks {

class LoopbackSocket {
  public:
    explicit LoopbackSocket(int port);  // throws std::runtime_error when it cannot connect
    ~LoopbackSocket();
    LoopbackSocket(const LoopbackSocket&) = delete;
    LoopbackSocket& operator=(const LoopbackSocket&) = delete;

    void send(std::string_view text);  // all of it, or throws
    // What one read returns: at least one byte, or throws.
    std::size_t receive(char* buffer, std::size_t size);

  private:
    int fd_;
};

}  // namespace zp::benchmarks
