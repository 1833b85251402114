#pragma once
// VISA-style resource texts of the generator transports.

#include <string>
#include <string_view>
#include <variant>

namespace zp::transport {

struct SocketResource {  // TCPIP[board]::host::port::SOCKET
    std::string host;
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

// Keywords are case-insensitive. Throws std::invalid_argument naming the text and the accepted
// forms.
Resource parseResource(std::string_view text);

}  // namespace zp::transport
