#pragma once
// Serves instruments as raw SCPI sockets, one TCP port per GPIB address, on one background
// thread. Lines are framed on LF (a CR before it is dropped); a line whose handler returns no
// reply gets none, as on a real instrument. Several clients may be connected at once.
//
// Every client is bounded: a line longer than kMaxLine drops its client; once kOutputCap bytes
// of replies wait for a client, its further lines wait unread until it reads (so the kernel's
// socket buffers, not the server, hold what it sends ahead); a client that neither completes a
// line nor takes any reply for the idle timeout is closed; a port takes at most clientsPerPort
// clients, and a newcomer beyond that gets one line saying so before it is closed.

#include <chrono>
#include <cstddef>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "sim/generators/sim_generator.h"

namespace zp::sim {

struct ScpiServerLimits {
    std::size_t clientsPerPort = 64;
    std::chrono::milliseconds idleTimeout = std::chrono::seconds(60);  // 0: never
};

class ScpiServer {
  public:
    static constexpr std::size_t kMaxLine = 1 << 20;
    static constexpr std::size_t kOutputCap = 1 << 20;

    // Called on the server thread, one line at a time, with the server's lock held.
    using Handler = std::function<std::optional<std::string>(int address, std::string_view line)>;

    // ports: GPIB address -> TCP port (0 picks a free one). Listens before the constructor
    // returns; throws std::runtime_error naming the address and port when it cannot.
    ScpiServer(const std::map<int, int>& ports, Handler handler,
               const std::string& bindAddress = "127.0.0.1", ScpiServerLimits limits = {});
    ~ScpiServer();  // stops and joins
    ScpiServer(const ScpiServer&) = delete;
    ScpiServer& operator=(const ScpiServer&) = delete;

    // A handler that passes each line to the generator at that address (which must outlive it).
    static Handler forGenerators(std::map<int, std::unique_ptr<SimGenerator>>& generators);

    int port(int address) const;  // -1 when not served
    const std::string& bindAddress() const { return bindAddress_; }
    // "11 on 127.0.0.1:5025, 12 on 127.0.0.1:5026"; an IPv6 address is bracketed, [::1]:5025.
    std::string describe() const;

    // Runs f with the server's lock held, e.g. to look at generator state between requests.
    void withLock(const std::function<void()>& f);

    // The most bytes one connection has had allocated for its buffers since start.
    std::size_t peakConnectionBytes() const;

    void stop();

  private:
    class Loop;
    std::string bindAddress_;
    std::map<int, int> ports_;
    std::mutex mutex_;
    std::unique_ptr<Loop> loop_;
    std::thread thread_;
};

// "host:port", or "[host]:port" when host is an IPv6 address.
std::string hostAndPort(const std::string& host, int port);

}  // namespace zp::sim
