// Bus resource texts as given on the command line: "TCPIP0::host::5025::SOCKET" and friends.

#include <algorithm>
#include <stdexcept>
#include <string>
#include <variant>

#include "fuzz_check.h"
#include "transport/resource.h"

namespace {

// Host and device names reach a socket or an RPC call as they are: nothing blank, no brackets
// (an IPv6 host is kept without them), no control characters.
bool plainWord(const std::string& s) {
    return !s.empty() && std::none_of(s.begin(), s.end(), [](char c) {
        return c == ' ' || c == '[' || c == ']' || static_cast<unsigned char>(c) < 0x20 ||
               c == 0x7f;
    });
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using zp::fuzz::require;
    const std::string_view text = zp::fuzz::text(data, size);
    zp::transport::Resource resource;
    try {
        resource = zp::transport::parseResource(text);
    } catch (const std::invalid_argument& e) {
        // what() is a C string, so only a text without NUL can show in it whole.
        require(text.find('\0') != std::string_view::npos ||
                    std::string_view(e.what()).find(text) != std::string_view::npos,
                "a message naming the text", text);
        return 0;
    }
    if (const auto* s = std::get_if<zp::transport::SocketResource>(&resource)) {
        require(plainWord(s->host), "a host without blanks, brackets or control characters", text);
        require(s->port >= 1 && s->port <= 65535, "a port 1..65535", text);
    } else if (const auto* v = std::get_if<zp::transport::Vxi11Resource>(&resource)) {
        require(plainWord(v->host), "a host without blanks, brackets or control characters", text);
        require(plainWord(v->device) && v->device.find("::") == std::string::npos,
                "a device name without blanks or ::", text);
    } else {
        const auto& g = std::get<zp::transport::GpibResource>(resource);
        require(g.board >= 0, "a board number >= 0", text);
        require(g.primary >= 0 && g.primary <= 30, "a primary address 0..30", text);
        require(g.secondary >= -1 && g.secondary <= 30, "no secondary, or 0..30", text);
    }
    return 0;
}
