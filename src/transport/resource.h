#pragma once
// VISA-style resource texts of the generator transports.

#include <stdexcept>
#include <string>
#include <string_view>
#include <variant>

namespace zp::transport {

struct SocketResource {  // TCPIP[board]::host::port::SOCKET, host may be [IPv6]
    std::string host;    // without brackets
    int port = 0;
};

struct Vxi11Resource {  // TCPIP[board]::host[::device]::INSTR, device "inst0" when absent
    std::string host;
    std::string device;  // e.g. "gpib0,12"
};

struct GpibResource {  // GPIB[board]::primary[::secondary]::INSTR
    int board = 0;
    int primary = 0;
    int secondary = -1;  // -1 = none, else 0..30
};

using Resource = std::variant<SocketResource, Vxi11Resource, GpibResource>;

// A refused resource text; reason() says what is wrong and what was expected, what() adds the
// text itself.
class BadResource : public std::invalid_argument {
  public:
    BadResource(std::string_view text, std::string reason);
    const std::string& reason() const { return reason_; }

  private:
    std::string reason_;
};

// Keywords are case-insensitive. Throws BadResource.
Resource parseResource(std::string_view text);

}  // namespace zp::transport
