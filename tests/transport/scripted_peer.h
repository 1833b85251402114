#pragma once
// A loopback peer that misbehaves on purpose: it accepts one client and runs a script on that
// connection on its own thread (trickle a reply, never read, split a reply in two ...).

#include <sys/socket.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <string>
#include <string_view>
#include <thread>

namespace zp::testing {

class ScriptedPeer {
  public:
    // The script gets the connection and must return soon after stopping() turns true.
    using Script = std::function<void(ScriptedPeer& peer, int fd)>;

    // Listens on 127.0.0.1 (or ::1 for AF_INET6) on a free port. backlog 0 and no script: the
    // peer never accepts, so once one client fills the queue later connects hang.
    explicit ScriptedPeer(Script script, int family = AF_INET, int backlog = 4);
    ~ScriptedPeer();
    ScriptedPeer(const ScriptedPeer&) = delete;
    ScriptedPeer& operator=(const ScriptedPeer&) = delete;

    bool listening() const { return listener_ >= 0; }  // false when the family is unavailable
    int port() const { return port_; }
    bool stopping() const { return stopping_; }

    // Script helpers; both give up when stopping() turns true or the client goes away.
    std::string readLine(int fd);
    bool sendText(int fd, std::string_view text);
    // Sleeps in small steps; false when stopping() turned true meanwhile.
    bool pause(std::chrono::milliseconds time);

  private:
    int listener_ = -1;
    int port_ = -1;
    std::atomic<bool> stopping_{false};
    std::atomic<int> client_{-1};
    std::thread thread_;
};

}  // namespace zp::testing
