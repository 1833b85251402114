#pragma once
// VXI-11 to an instrument or a LAN/GPIB gateway ("gpib0,N") through liblxi.

#include <chrono>
#include <string>

#include "transport/device_link.h"

namespace zp::transport {

class Vxi11Link : public DeviceLink {
  public:
    // Connects and confirms the link with "*IDN?"; throws InstrumentError naming device and host
    // when either fails.
    Vxi11Link(const std::string& host, const std::string& device,
              std::chrono::milliseconds timeout);
    ~Vxi11Link() override;

    void write(std::string_view text) override;
    std::string read(std::size_t maxChars) override;
    // liblxi offers no device clear; unread replies are left to the gateway.
    void clear() override {}

  private:
    int device_ = -1;
    std::string name_;  // "gpib0,12 at host" for messages
    int timeoutMs_;
};

}  // namespace zp::transport
