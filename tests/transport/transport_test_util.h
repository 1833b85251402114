#pragma once
// Helpers shared by the transport tests: a loopback server with scripted answers.

#include <chrono>
#include <map>
#include <memory>
#include <string>

#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"
#include "transport/raw_socket_link.h"

namespace zp::testing {

// Generators 11 and 12 served on free ports; "BIG?" answers 4 MiB of pattern text and
// "SILENT?" nothing. Generator 11 may be given its own identification.
struct LoopbackBench {
    static constexpr std::size_t kBigSize = 4u << 20;
    static std::string bigReply() {
        std::string text(kBigSize, ' ');
        for (std::size_t i = 0; i < text.size(); ++i) text[i] = static_cast<char>('A' + i % 26);
        text.back() = '\n';
        return text;
    }

    explicit LoopbackBench(std::string identity11 = "") {
        generators[11] = std::make_unique<sim::SimGenerator>(11, std::move(identity11));
        generators[12] = std::make_unique<sim::SimGenerator>(12, "");
        auto forward = sim::ScpiServer::forGenerators(generators);
        server = std::make_unique<sim::ScpiServer>(
            std::map<int, int>{{11, 0}, {12, 0}},
            [forward, big = bigReply()](int address,
                                        std::string_view line) -> std::optional<std::string> {
                if (line == "BIG?") return big;
                if (line == "SILENT?") return std::nullopt;
                return forward(address, line);
            });
    }

    std::string resource(int address) const {
        return "TCPIP0::127.0.0.1::" + std::to_string(server->port(address)) + "::SOCKET";
    }
    transport::RawSocketLink link(
        int address, std::chrono::milliseconds timeout = std::chrono::seconds(2)) const {
        return transport::RawSocketLink("127.0.0.1", server->port(address), timeout);
    }

    std::map<int, std::unique_ptr<sim::SimGenerator>> generators;
    std::unique_ptr<sim::ScpiServer> server;
};

// A port with nothing listening on it (bound once, then released).
int unusedPort();

}  // namespace zp::testing
