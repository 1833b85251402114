#include "transport/resource.h"

#include <arpa/inet.h>

#include <cctype>
#include <charconv>
#include <optional>
#include <vector>

#include "core/text.h"

namespace zp::transport {

namespace {

constexpr const char* kForms =
    "TCPIP0::host::port::SOCKET, TCPIP0::host::gpib0,N::INSTR, TCPIP0::host::INSTR or "
    "GPIB0::N::INSTR";

[[noreturn]] void reject(std::string_view text, std::string why) {
    throw BadResource(text, std::move(why));
}

std::string quoted(std::string_view text) {
    return "\"" + std::string(text) + "\"";
}

bool isDigit(char c) {
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}

// Fields are separated by "::", except inside the brackets of an IPv6 address.
std::vector<std::string_view> splitParts(std::string_view text) {
    std::vector<std::string_view> parts;
    std::size_t pos = 0;
    while (true) {
        std::size_t from = pos;
        if (pos < text.size() && text[pos] == '[') {
            const std::size_t close = text.find(']', pos);
            if (close != std::string_view::npos) from = close + 1;
        }
        const std::size_t sep = text.find("::", from);
        parts.push_back(text.substr(pos, sep == std::string_view::npos ? sep : sep - pos));
        if (sep == std::string_view::npos) break;
        pos = sep + 2;
    }
    return parts;
}

// Plain digits only: no sign, no blanks.
std::optional<int> number(std::string_view text) {
    if (text.empty()) return std::nullopt;
    for (char c : text) {
        if (!isDigit(c)) return std::nullopt;
    }
    int value = 0;
    const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (ec != std::errc{} || end != text.data() + text.size()) return std::nullopt;
    return value;
}

// "TCPIP0" -> 0, "TCPIP" -> 0; rejects "TCPIP-7" and "TCPIPx".
int boardOf(std::string_view text, std::string_view part, std::string_view name) {
    const std::string_view digits = part.substr(name.size());
    if (digits.empty()) return 0;
    const auto board = number(digits);
    if (!board) {
        reject(text, "the board number after " + std::string(name) + " must be digits, as in " +
                         std::string(name) + "0, not " + quoted(digits));
    }
    return *board;
}

bool isIpv6(std::string_view address) {
    const std::size_t zone = address.find('%');
    if (zone != std::string_view::npos) {
        const std::string_view id = address.substr(zone + 1);
        if (id.empty()) return false;
        for (char c : id) {
            if (std::isalnum(static_cast<unsigned char>(c)) == 0 && c != '_' && c != '-' &&
                c != '.') {
                return false;
            }
        }
    }
    in6_addr parsed{};
    return ::inet_pton(AF_INET6, std::string(address.substr(0, zone)).c_str(), &parsed) == 1;
}

// Returns the host without brackets.
std::string hostOf(std::string_view text, std::string_view host) {
    if (host.empty()) {
        reject(text,
               "the host is empty; expected a name, an IPv4 address or an IPv6 address in "
               "brackets ([::1])");
    }
    if (host.front() == '[') {
        if (host.size() < 2 || host.back() != ']' || !isIpv6(host.substr(1, host.size() - 2))) {
            reject(text,
                   "host " + quoted(host) + " is not an IPv6 address in brackets, as in [::1]");
        }
        return std::string(host.substr(1, host.size() - 2));
    }
    if (host.find(':') != std::string_view::npos) {
        reject(text,
               "an IPv6 address must be written in brackets, as in [::1], not " + quoted(host));
    }
    bool valid = host.size() <= 253;
    for (char c : host) {
        if (std::isalnum(static_cast<unsigned char>(c)) == 0 && c != '.' && c != '-' && c != '_') {
            valid = false;
        }
    }
    if (!valid) {
        reject(text, "host " + quoted(host) +
                         " must be a name or an IPv4 address (letters, digits, '.', '-', '_')");
    }
    return std::string(host);
}

// NAME, NAME,N or NAME,N,S ("inst0", "gpib0,12", "gpib0,12,3").
bool validDevice(std::string_view device) {
    std::size_t comma = device.find(',');
    const std::string_view name = device.substr(0, comma);
    if (name.empty()) return false;
    for (char c : name) {
        if (std::isalnum(static_cast<unsigned char>(c)) == 0 && c != '_') return false;
    }
    int numbers = 0;
    while (comma != std::string_view::npos) {
        const std::size_t next = device.find(',', comma + 1);
        const std::string_view field = device.substr(
            comma + 1, next == std::string_view::npos ? std::string_view::npos : next - comma - 1);
        if (!number(field) || ++numbers > 2) return false;
        comma = next;
    }
    return true;
}

Resource parseTcpip(std::string_view text, const std::vector<std::string_view>& parts,
                    const std::string& kind) {
    if (kind == "SOCKET") {
        const std::string host = hostOf(text, parts[1]);
        if (parts.size() != 4) {
            reject(text, "a socket needs host and port: TCPIP0::host::port::SOCKET");
        }
        const auto port = number(parts[2]);
        if (!port || *port < 1 || *port > 65535) {
            reject(text, "the port must be a number from 1 to 65535, not " + quoted(parts[2]));
        }
        return SocketResource{host, *port};
    }
    if (kind != "INSTR") reject(text, "a TCPIP resource must end in ::SOCKET or ::INSTR");
    if (parts.size() > 4) {
        reject(text,
               "too many fields; expected TCPIP0::host::INSTR or TCPIP0::host::device::INSTR");
    }
    const std::string host = hostOf(text, parts[1]);
    if (parts[1].front() == '[') {
        reject(text, "VXI-11 is reached over IPv4 only; give the host's IPv4 address or name");
    }
    if (parts.size() == 3) return Vxi11Resource{host, "inst0"};
    if (!validDevice(parts[2])) {
        reject(text, "device " + quoted(parts[2]) +
                         " must be NAME, NAME,N or NAME,N,S with numbers N and S (gpib0,12)");
    }
    return Vxi11Resource{host, std::string(parts[2])};
}

Resource parseGpib(std::string_view text, const std::vector<std::string_view>& parts,
                   const std::string& kind, int board) {
    if (kind != "INSTR") reject(text, "a GPIB resource must end in ::INSTR");
    if (parts.size() > 4)
        reject(text, "too many fields; expected GPIB0::N::INSTR or GPIB0::N::S::INSTR");
    GpibResource resource;
    resource.board = board;
    const auto primary = number(parts[1]);
    if (!primary || *primary > 30) {
        reject(text, "the GPIB address must be a number from 0 to 30, not " + quoted(parts[1]));
    }
    resource.primary = *primary;
    if (parts.size() == 4) {
        const auto secondary = number(parts[2]);
        if (!secondary || *secondary > 30) {
            reject(text,
                   "the secondary address must be a number from 0 to 30, not " + quoted(parts[2]));
        }
        resource.secondary = *secondary;
    }
    return resource;
}

}  // namespace

BadResource::BadResource(std::string_view text, std::string reason)
    : std::invalid_argument("Bad resource " + quoted(text) + ": " + reason),
      reason_(std::move(reason)) {}

Resource parseResource(std::string_view text) {
    const auto parts = splitParts(text);
    if (parts.size() < 3) reject(text, std::string("too few fields; expected ") + kForms);
    const std::string interface = upper(parts[0]);
    const std::string kind = upper(parts.back());
    if (interface.rfind("TCPIP", 0) == 0) {
        boardOf(text, parts[0], "TCPIP");
        return parseTcpip(text, parts, kind);
    }
    if (interface.rfind("GPIB", 0) == 0) {
        return parseGpib(text, parts, kind, boardOf(text, parts[0], "GPIB"));
    }
    reject(text, "unknown interface " + quoted(parts[0]) + "; expected " + kForms);
}

}  // namespace zp::transport
