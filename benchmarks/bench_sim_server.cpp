// The generator server under clients that ask far ahead of what they read: 1 GiB of 1 MiB
// replies per iteration, and generator queries answered by the simulated generator. The
// counters are what must stay small while that passes: the most one connection held
// (peak_conn_MiB) and the process's peak resident size (VmHWM_MiB).

#include <benchmark/benchmark.h>

#include <cstdint>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "loopback_socket.h"
#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"

namespace {

constexpr double kMiB = 1024.0 * 1024.0;

// kB figure of one /proc/self/status line, e.g. "VmHWM:".
double statusMiB(const std::string& key) {
    std::ifstream status("/proc/self/status");
    std::string word;
    while (status >> word) {
        if (word == key) {
            double kb = 0;
            status >> kb;
            return kb / 1024.0;
        }
    }
    return 0;
}

// Reads into one 64 KiB buffer, as the program's links do.
class Client {
  public:
    explicit Client(int port) : socket_(port) {}
    void write(const std::string& text) { socket_.send(text); }
    // Reads at most one buffer; the byte count.
    std::size_t readSome() { return socket_.receive(buffer_.data(), buffer_.size()); }

  private:
    zp::benchmarks::LoopbackSocket socket_;
    std::vector<char> buffer_ = std::vector<char>(64 * 1024);
};

// Keeps `ahead` queries unanswered, asking one more per reply read, until `total` bytes came.
void askAhead(Client& client, const std::string& query, std::size_t replySize, int ahead,
              std::size_t total) {
    for (int i = 0; i < ahead; ++i) client.write(query);
    std::size_t asked = static_cast<std::size_t>(ahead) * replySize;
    std::size_t received = 0;
    while (received < total) {
        received += client.readSome();
        while (asked < total && asked < received + static_cast<std::size_t>(ahead) * replySize) {
            client.write(query);
            asked += replySize;
        }
    }
}

void report(benchmark::State& state, const zp::sim::ScpiServer& server, std::size_t perRun) {
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * perRun));
    state.counters["peak_conn_MiB"] = static_cast<double>(server.peakConnectionBytes()) / kMiB;
    state.counters["VmHWM_MiB"] = statusMiB("VmHWM:");
}

void BM_SimServerGibibyteToAClientAskingAhead(benchmark::State& state) {
    const std::string reply = std::string((1u << 20) - 1, 'r') + "\n";
    zp::sim::ScpiServer server({{11, 0}}, [&reply](int, std::string_view) { return reply; });
    constexpr std::size_t kTotal = std::size_t{1} << 30;
    for (auto _ : state) {
        Client client(server.port(11));
        askAhead(client, "MEG?\n", reply.size(), 64, kTotal);
    }
    report(state, server, kTotal);
}
BENCHMARK(BM_SimServerGibibyteToAClientAskingAhead)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_SimServerGeneratorQueriesAskedAhead(benchmark::State& state) {
    std::map<int, std::unique_ptr<zp::sim::SimGenerator>> generators;
    generators[11] = std::make_unique<zp::sim::SimGenerator>(11, "");
    zp::sim::ScpiServer server({{11, 0}}, zp::sim::ScpiServer::forGenerators(generators));
    const std::string reply = "Veltrix,PG8102A,SIM11,1.0\n";
    constexpr std::size_t kQueries = 1 << 16;
    for (auto _ : state) {
        Client client(server.port(11));
        askAhead(client, "*IDN?\n", reply.size(), 4096, kQueries * reply.size());
    }
    report(state, server, kQueries * reply.size());
    state.counters["queries/s"] = benchmark::Counter(
        static_cast<double>(state.iterations() * kQueries), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_SimServerGeneratorQueriesAskedAhead)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace
