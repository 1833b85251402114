// Raw SCPI transport against the loopback server: query round trips and write-then-query pairs
// per second through the bus, beside a bare blocking-socket loop, and a 4 MiB reply.

#include <benchmark/benchmark.h>

#include <cstdint>
#include <initializer_list>
#include <map>
#include <memory>
#include <string>

#include "loopback_socket.h"
#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"
#include "transport/transport_factory.h"

namespace {

constexpr std::size_t kBigSize = 4u << 20;

struct Loopback {
    Loopback() {
        generators[11] = std::make_unique<zp::sim::SimGenerator>(11, "");
        auto forward = zp::sim::ScpiServer::forGenerators(generators);
        std::string big(kBigSize - 1, 'Z');
        big += '\n';
        server = std::make_unique<zp::sim::ScpiServer>(
            std::map<int, int>{{11, 0}},
            [forward, big](int address, std::string_view line) -> std::optional<std::string> {
                if (line == "BIG?") return big;
                return forward(address, line);
            });
    }
    std::map<int, std::unique_ptr<zp::sim::SimGenerator>> generators;
    std::unique_ptr<zp::sim::ScpiServer> server;
};

Loopback& loopback() {
    static Loopback instance;
    return instance;
}

// The baseline: what a plain blocking client with Nagle off achieves.
std::string readLine(zp::benchmarks::LoopbackSocket& socket) {
    std::string out;
    char buffer[256];
    while (out.empty() || out.back() != '\n') {
        out.append(buffer, socket.receive(buffer, sizeof buffer));
    }
    return out;
}

// Every command goes out in turn; the last one is the query whose one-line reply is read back.
using Commands = std::initializer_list<std::string_view>;

void bareRoundTrips(benchmark::State& state, Commands commands) {
    zp::benchmarks::LoopbackSocket s(loopback().server->port(11));
    for (auto _ : state) {
        for (const auto command : commands) s.send(command);
        benchmark::DoNotOptimize(readLine(s));
    }
    state.SetItemsProcessed(state.iterations());
}

struct LoopbackDevice {
    LoopbackDevice()
        : bus(zp::makeTransportBus(
              {{11,
                "TCPIP0::127.0.0.1::" + std::to_string(loopback().server->port(11)) + "::SOCKET"}},
              nullptr)),
          descriptor(bus->openDevice(0, 11, 0, 13, 1, 0)) {}
    std::unique_ptr<zp::InstrumentBus> bus;
    std::int16_t descriptor;
};

void transportRoundTrips(benchmark::State& state, Commands commands) {
    LoopbackDevice device;
    std::string buffer;
    for (auto _ : state) {
        for (const auto command : commands)
            device.bus->writeText(device.descriptor, std::string(command));
        buffer.assign(2, ' ');
        device.bus->readText(device.descriptor, buffer);
        if (device.bus->status() != 0) state.SkipWithError("bus error");
    }
    state.SetItemsProcessed(state.iterations());
}

void BM_BareSocketQuery(benchmark::State& state) {
    bareRoundTrips(state, {"*OPC?\n"});
}
BENCHMARK(BM_BareSocketQuery)->UseRealTime();

void BM_TransportQuery(benchmark::State& state) {
    transportRoundTrips(state, {"*OPC?\n"});
}
BENCHMARK(BM_TransportQuery)->UseRealTime();

void BM_BareSocketWriteThenQuery(benchmark::State& state) {
    bareRoundTrips(state, {":SOUR:PULS:DEL1 1E-06\n", "*OPC?\n"});
}
BENCHMARK(BM_BareSocketWriteThenQuery)->UseRealTime();

void BM_TransportWriteThenQuery(benchmark::State& state) {
    transportRoundTrips(state, {":SOUR:PULS:DEL1 1E-06\n", "*OPC?\n"});
}
BENCHMARK(BM_TransportWriteThenQuery)->UseRealTime();

void BM_TransportFourMebibyteReply(benchmark::State& state) {
    LoopbackDevice device;
    std::string buffer;
    for (auto _ : state) {
        device.bus->writeText(device.descriptor, "BIG?\n");
        buffer.assign(kBigSize + 16, ' ');
        device.bus->readText(device.descriptor, buffer);
        if (device.bus->status() != 0 || buffer.size() != kBigSize || buffer.back() != '\n' ||
            buffer.find_first_not_of('Z') != kBigSize - 1) {
            state.SkipWithError("reply damaged");
        }
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(kBigSize));
}
BENCHMARK(BM_TransportFourMebibyteReply)->UseRealTime()->Unit(benchmark::kMillisecond);

}  // namespace
