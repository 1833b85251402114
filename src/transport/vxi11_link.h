#pragma once
// VXI-11 to an instrument or a LAN/GPIB gateway ("gpib0,N") through liblxi. liblxi bounds each
// RPC by the time it is given; a call that needs several RPCs passes on what is left.

#include <chrono>
#include <string>

#include "transport/device_link.h"

namespace zp::transport {

class Vxi11Link : public DeviceLink {
  public:
    // Connects and confirms the link with "*IDN?", each within the timeout; throws
    // InstrumentError naming device and host when either fails.
    Vxi11Link(const std::string& host, const std::string& device,
              std::chrono::milliseconds timeout);
    ~Vxi11Link() override;

    void write(std::string_view text) override;
    std::string read(std::size_t maxChars) override;
    // liblxi does not say whether a read ended the reply: a full buffer without a line feed is
    // taken as a reply that goes on, and the rest is read off here.
    std::size_t drainReplies() override;
    // liblxi offers no device clear: only the rest of a reply already begun is dropped.
    void clear() override { drainReplies(); }

  private:
    using Deadline = std::chrono::steady_clock::time_point;
    void send(std::string_view text, Deadline deadline);
    std::string receive(std::size_t maxChars, Deadline deadline);
    std::size_t drain(Deadline deadline);

    int device_ = -1;
    std::string name_;  // "gpib0,12 at host" for messages
    std::chrono::milliseconds timeout_;
    bool unfinished_ = false;
};

}  // namespace zp::transport
