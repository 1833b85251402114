#pragma once
// Raw SCPI over TCP (port 5025 by convention): line-feed framed replies, Nagle off so a write
// followed by a query does not stall, no SIGPIPE on a peer that went away.

#include <chrono>
#include <string>
#include <vector>

#include "transport/device_link.h"

namespace zp::transport {

class RawSocketLink : public DeviceLink {
  public:
    // Connects within connectTimeout; a later write or read gives up when no data could be
    // moved for ioTimeout.
    // Throws InstrumentError naming host:port when the connection cannot be made.
    RawSocketLink(const std::string& host, int port, std::chrono::milliseconds ioTimeout,
                  std::chrono::milliseconds connectTimeout = std::chrono::seconds(5));
    ~RawSocketLink() override;

    void write(std::string_view text) override;
    // Waits until a line feed arrived or maxChars characters are buffered.
    std::string read(std::size_t maxChars) override;
    // A raw socket has no device clear; input that already arrived is dropped.
    void clear() override;

    const std::string& peer() const { return peer_; }

  private:
    int fd_ = -1;
    std::string peer_;                                        // "host:port" for messages
    std::vector<char> chunk_ = std::vector<char>(64 * 1024);  // receive buffer
    std::string in_;                                          // received, not yet delivered
    std::size_t head_ = 0;                                    // start of undelivered data in in_
    std::size_t scanned_ = 0;  // in_[head_, scanned_) holds no line feed
};

}  // namespace zp::transport
