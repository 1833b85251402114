#include "transport/resource.h"

#include <cctype>
#include <charconv>
#include <optional>
#include <stdexcept>
#include <vector>

namespace zp::transport {

namespace {

constexpr const char* kForms =
    "expected TCPIP0::host::port::SOCKET, TCPIP0::host::gpib0,N::INSTR or GPIB0::N::INSTR";

[[noreturn]] void reject(std::string_view text, const std::string& why) {
    throw std::invalid_argument("Bad resource \"" + std::string(text) + "\": " + why + " (" +
                                kForms + ")");
}

std::string upper(std::string_view text) {
    std::string out(text);
    for (char& c : out) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

std::vector<std::string_view> splitParts(std::string_view text) {
    std::vector<std::string_view> parts;
    std::size_t pos = 0;
    while (true) {
        const std::size_t sep = text.find("::", pos);
        parts.push_back(text.substr(pos, sep == std::string_view::npos ? sep : sep - pos));
        if (sep == std::string_view::npos) break;
        pos = sep + 2;
    }
    return parts;
}

std::optional<int> number(std::string_view text) {
    int value = 0;
    if (text.empty()) return std::nullopt;
    const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (ec != std::errc{} || end != text.data() + text.size()) return std::nullopt;
    return value;
}

// "TCPIP0" -> 0, "TCPIP" -> 0, "TCPIPx" -> nullopt.
std::optional<int> interfaceBoard(std::string_view part, std::string_view name) {
    const std::string u = upper(part);
    if (u.rfind(name, 0) != 0) return std::nullopt;
    const std::string_view digits = std::string_view(part).substr(name.size());
    if (digits.empty()) return 0;
    return number(digits);
}

bool validHost(std::string_view host) {
    if (host.empty() || host.size() > 253) return false;
    for (char c : host) {
        if (std::isalnum(static_cast<unsigned char>(c)) == 0 && c != '.' && c != '-' && c != '_' &&
            c != ':') {
            return false;
        }
    }
    return true;
}

bool validDevice(std::string_view device) {
    if (device.empty()) return false;
    for (char c : device) {
        if (std::isalnum(static_cast<unsigned char>(c)) == 0 && c != ',' && c != '_') return false;
    }
    return true;
}

}  // namespace

Resource parseResource(std::string_view text) {
    const auto parts = splitParts(text);
    if (parts.size() < 3) reject(text, "too few fields");
    const std::string kind = upper(parts.back());

    if (interfaceBoard(parts[0], "TCPIP")) {
        const std::string_view host = parts[1];
        if (!validHost(host)) reject(text, "bad host name");
        if (kind == "SOCKET") {
            if (parts.size() != 4) reject(text, "a socket needs host and port");
            const auto port = number(parts[2]);
            if (!port || *port < 1 || *port > 65535) reject(text, "port must be 1..65535");
            return SocketResource{std::string(host), *port};
        }
        if (kind == "INSTR") {
            if (parts.size() == 3) return Vxi11Resource{std::string(host), "inst0"};
            if (parts.size() != 4 || !validDevice(parts[2])) reject(text, "bad device name");
            return Vxi11Resource{std::string(host), std::string(parts[2])};
        }
        reject(text, "must end in ::SOCKET or ::INSTR");
    }
    if (const auto board = interfaceBoard(parts[0], "GPIB")) {
        if (kind != "INSTR") reject(text, "must end in ::INSTR");
        if (parts.size() > 4) reject(text, "too many fields");
        GpibResource resource;
        resource.board = *board;
        const auto primary = number(parts[1]);
        if (!primary || *primary < 0 || *primary > 30) reject(text, "address must be 0..30");
        resource.primary = *primary;
        if (parts.size() == 4) {
            const auto secondary = number(parts[2]);
            if (!secondary || *secondary < 0 || *secondary > 30) {
                reject(text, "secondary address must be 0..30");
            }
            resource.secondary = *secondary;
        }
        return resource;
    }
    reject(text, "unknown interface");
}

}  // namespace zp::transport
