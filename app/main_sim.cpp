// zentra-pulse-sim: serves simulated pulse generators as raw SCPI sockets, so that the program's
// socket transport (or any raw SCPI client) can be tried without instruments.

#include <signal.h>
#include <sys/resource.h>

#include <algorithm>
#include <cctype>
#include <charconv>
#include <chrono>
#include <cstdio>
#include <iostream>
#include <map>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"

namespace {

constexpr int kMaxIdleSeconds = 86400;

constexpr const char* kUsage =
    "Usage: zentra-pulse-sim --serve ADDRESS=PORT [ADDRESS=PORT ...] [--bind ADDR]\n"
    "                        [--idle-timeout SECONDS]\n"
    "\n"
    "Serves one simulated two-output pulse generator per GPIB ADDRESS (0..30) as a raw SCPI\n"
    "socket on TCP PORT (0 picks a free port), until SIGINT or SIGTERM. The first line printed\n"
    "names the ports bound: \"zentra-pulse-sim: serving 11 on 127.0.0.1:5025\" (an IPv6\n"
    "address in brackets, [::1]:5025).\n"
    "\n"
    "  --serve ADDRESS=PORT    generators to serve; entries separated by blanks or commas\n"
    "  --bind ADDR             address to listen on (default 127.0.0.1; an IPv6 address\n"
    "                          may be bracketed, [::1])\n"
    "  --idle-timeout SECONDS  close a client that for this long neither ends a command line\n"
    "                          nor takes any reply (0..86400, default 60, 0 never)\n"
    "  --help                  show this text\n"
    "\n"
    "Each port takes 64 clients; a newcomer beyond that gets one line starting \"ERROR:\"\n"
    "and is closed. A line longer than 1 MiB closes its client.\n"
    "\n"
    "Example: zentra-pulse-sim --serve 11=5025 12=5026\n"
    "then point the program at them with --bus 11=TCPIP0::127.0.0.1::5025::SOCKET,"
    "12=TCPIP0::127.0.0.1::5026::SOCKET\n";

struct Options {
    std::map<int, int> ports;
    std::string bind = "127.0.0.1";
    int idleSeconds = 60;
    bool help = false;
};

std::optional<int> number(std::string_view text) {
    int value = 0;
    const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (text.empty() || ec != std::errc{} || end != text.data() + text.size()) return std::nullopt;
    return value;
}

bool isSeparator(char c) {
    return c == ',' || std::isspace(static_cast<unsigned char>(c)) != 0;
}

void addServeEntries(std::string_view text, Options& options) {
    std::size_t pos = 0;
    while (pos < text.size()) {
        std::size_t end = pos;
        while (end < text.size() && !isSeparator(text[end])) ++end;
        const std::string_view entry = text.substr(pos, end - pos);
        pos = end + 1;
        if (entry.empty()) continue;
        const std::size_t eq = entry.find('=');
        const auto address = number(entry.substr(0, eq));
        const auto port =
            eq == std::string_view::npos ? std::nullopt : number(entry.substr(eq + 1));
        if (!address || *address < 0 || *address > 30 || !port || *port < 0 || *port > 65535) {
            throw std::invalid_argument("bad --serve entry \"" + std::string(entry) +
                                        "\" (expected ADDRESS=PORT, ADDRESS 0..30, PORT 0..65535)");
        }
        if (!options.ports.emplace(*address, *port).second) {
            throw std::invalid_argument("GPIB address " + std::to_string(*address) +
                                        " is served twice");
        }
    }
}

int idleSeconds(std::string_view text) {
    const auto seconds = number(text);
    if (!seconds || *seconds < 0 || *seconds > kMaxIdleSeconds) {
        throw std::invalid_argument("bad --idle-timeout \"" + std::string(text) +
                                    "\" (expected whole seconds 0.." +
                                    std::to_string(kMaxIdleSeconds) + ", 0 for never)");
    }
    return *seconds;
}

Options parseArguments(const std::vector<std::string>& args) {
    Options options;
    bool serving = false;
    for (std::size_t i = 0; i < args.size(); ++i) {
        const std::string& a = args[i];
        if (a == "--help" || a == "-h") {
            options.help = true;
        } else if (a == "--serve") {
            serving = true;
        } else if (a.rfind("--serve=", 0) == 0) {
            serving = true;
            addServeEntries(std::string_view(a).substr(8), options);
        } else if (a == "--bind") {
            if (i + 1 >= args.size()) throw std::invalid_argument("--bind needs an address");
            options.bind = args[++i];
            serving = false;
        } else if (a.rfind("--bind=", 0) == 0) {
            options.bind = a.substr(7);
            serving = false;
        } else if (a == "--idle-timeout") {
            if (i + 1 >= args.size()) throw std::invalid_argument("--idle-timeout needs seconds");
            options.idleSeconds = idleSeconds(args[++i]);
            serving = false;
        } else if (a.rfind("--idle-timeout=", 0) == 0) {
            options.idleSeconds = idleSeconds(std::string_view(a).substr(15));
            serving = false;
        } else if (serving && a.rfind("-", 0) != 0) {
            addServeEntries(a, options);
        } else {
            throw std::invalid_argument("unknown argument \"" + a + "\"");
        }
    }
    if (!options.help && options.ports.empty()) {
        throw std::invalid_argument("nothing to serve: give --serve ADDRESS=PORT");
    }
    // The serving line brackets an IPv6 address; a script may hand it back that way.
    if (options.bind.size() > 2 && options.bind.front() == '[' && options.bind.back() == ']') {
        options.bind = options.bind.substr(1, options.bind.size() - 2);
    }
    if (options.bind.empty()) throw std::invalid_argument("--bind needs an address");
    return options;
}

// Every port may hold its full share of clients; the soft limit on open files is often lower.
void raiseFileLimit(std::size_t sockets) {
    const rlim_t wanted = static_cast<rlim_t>(sockets) + 128;  // refused newcomers and the rest
    rlimit limit{};
    if (::getrlimit(RLIMIT_NOFILE, &limit) != 0 || limit.rlim_cur >= wanted) return;
    limit.rlim_cur = limit.rlim_max == RLIM_INFINITY ? wanted : std::min(wanted, limit.rlim_max);
    ::setrlimit(RLIMIT_NOFILE, &limit);
}

}  // namespace

int main(int argc, char** argv) {
    Options options;
    try {
        options = parseArguments(std::vector<std::string>(argv + 1, argv + argc));
    } catch (const std::invalid_argument& e) {
        std::cerr << "zentra-pulse-sim: " << e.what() << "\n" << kUsage;
        return 2;
    }
    if (options.help) {
        std::cout << kUsage;
        return 0;
    }

    // Block the stop signals before the server thread starts so that only sigwait sees them.
    sigset_t stopSignals;
    sigemptyset(&stopSignals);
    sigaddset(&stopSignals, SIGINT);
    sigaddset(&stopSignals, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &stopSignals, nullptr);
    signal(SIGPIPE, SIG_IGN);

    std::map<int, std::unique_ptr<zp::sim::SimGenerator>> generators;
    for (const auto& [address, port] : options.ports) {
        generators[address] = std::make_unique<zp::sim::SimGenerator>(address, "");
    }
    try {
        zp::sim::ScpiServerLimits limits;
        limits.idleTimeout = std::chrono::seconds(options.idleSeconds);
        raiseFileLimit(options.ports.size() * (limits.clientsPerPort + 1));
        zp::sim::ScpiServer server(options.ports, zp::sim::ScpiServer::forGenerators(generators),
                                   options.bind, limits);
        std::cout << "zentra-pulse-sim: serving " << server.describe() << std::endl;
        int received = 0;
        sigwait(&stopSignals, &received);
        std::cout << "zentra-pulse-sim: stopped" << std::endl;
    } catch (const std::exception& e) {
        std::cerr << "zentra-pulse-sim: " << e.what() << "\n";
        return 1;
    }
    return 0;
}
