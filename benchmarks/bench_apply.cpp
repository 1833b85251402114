// Apply on the external path with five enabled rows, the generators reached through the raw
// socket transport from an in-process server of simulated generators, next to the same bus
// traffic as bare-socket write-then-query round trips. The ratio bare / Apply shows how much of
// an Apply is the program's own work (target 0.8 or better).
//
// The bare loop replays what one Apply wrote and read, taken from its I/O trace: the same texts
// to the same generators, each query's reply read before the next text is sent. Apply connects
// to each generator anew (it makes its bus at its start); BM_BareSocketApplyTraffic/1 does the
// same, /0 keeps its connections.

#include <benchmark/benchmark.h>

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "core/pulsed_module.h"
#include "forms/interaction.h"
#include "forms/main_form.h"
#include "instruments/io_trace.h"
#include "instruments/wired_bench.h"
#include "loopback_socket.h"
#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"
#include "sim/sim_bench.h"
#include "transport/transport_factory.h"

namespace {

const std::vector<int> kAddresses = {11, 12, 13};

// Simulated generators at 11, 12 and 13 served on free loopback ports.
struct GeneratorServer {
    GeneratorServer() {
        std::map<int, int> ports;
        for (int address : kAddresses) {
            generators[address] = std::make_unique<zp::sim::SimGenerator>(address, "");
            ports[address] = 0;
        }
        server = std::make_unique<zp::sim::ScpiServer>(
            ports, zp::sim::ScpiServer::forGenerators(generators));
    }
    std::map<int, std::unique_ptr<zp::sim::SimGenerator>> generators;
    std::unique_ptr<zp::sim::ScpiServer> server;
};

GeneratorServer& generatorServer() {
    static GeneratorServer instance;
    return instance;
}

class LoopbackBus : public zp::BusSource {
  public:
    explicit LoopbackBus(zp::IoTrace& trace) : trace_(trace) {
        for (int address : kAddresses) {
            resources_[address] =
                "TCPIP0::127.0.0.1::" + std::to_string(generatorServer().server->port(address)) +
                "::SOCKET";
        }
    }
    std::unique_ptr<zp::InstrumentBus> createBus() override {
        return zp::makeTransportBus(resources_, &trace_);
    }
    std::string describe() const override { return "loopback generators"; }

  private:
    zp::BusResources resources_;
    zp::IoTrace& trace_;
};

class Unattended : public zp::Interaction {
  public:
    void message(const std::string& text, zp::MessageKind) override { messages.push_back(text); }
    bool ask(const std::string&) override { return false; }
    std::optional<std::string> chooseOpenFile(const std::string&) override { return {}; }
    std::optional<std::string> chooseSaveFile(const std::string&) override { return {}; }
    void processEvents() override {}
    void setPointer(zp::Pointer) override {}
    bool showHelp(const zp::HelpRequest&) override { return false; }
    std::vector<std::string> messages;
};

// The main window on a listed analyzer without internal generators, started and calculated.
struct ApplyWindow {
    ApplyWindow() {
        bench.wire(std::make_unique<zp::sim::SimInstruments>(*bench.trace(), "kt611"),
                   std::make_unique<LoopbackBus>(*bench.trace()));
        form.Form_Load();
        form.b_calculate_Click();
    }
    zp::WiredBench bench;
    zp::PulsedModule state;
    Unattended ui;
    zp::MainForm form{state, bench, ui};
};

// One text of the bus traffic: sent to `address`, and a reply read after it when `query`.
struct Exchange {
    int address;
    std::string text;
    bool query;
};

// "BUS 11 W \":SOUR:FREQ 20000\\n\"" -> the text. Nothing for a line that is no write.
std::optional<std::string> writtenText(const std::string& line, int& address) {
    std::size_t end = 0;
    if (line.rfind("BUS ", 0) != 0) return std::nullopt;
    address = std::stoi(line.substr(4), &end);
    const std::string rest = line.substr(4 + end);
    if (rest.rfind(" W \"", 0) != 0 || rest.back() != '"') return std::nullopt;
    std::string text;
    for (std::size_t i = 4; i + 1 < rest.size(); ++i) {
        char c = rest[i];
        if (c == '\\') {
            c = rest[++i];
            if (c == 'n') c = '\n';
        }
        text += c;
    }
    return text;
}

std::vector<Exchange> trafficOf(const std::vector<std::string>& trace) {
    std::vector<Exchange> traffic;
    for (const std::string& line : trace) {
        int address = 0;
        if (auto text = writtenText(line, address)) {
            traffic.push_back({address, std::move(*text), false});
        } else if (line.rfind("BUS ", 0) == 0 && line.find(" R \"") != std::string::npos) {
            if (!traffic.empty()) traffic.back().query = true;
        }
    }
    return traffic;
}

void BM_ApplyExternalFiveRowsThroughSockets(benchmark::State& state) {
    ApplyWindow w;
    std::size_t writes = 0;
    std::size_t queries = 0;
    for (auto _ : state) {
        w.bench.trace()->clear();
        w.form.b_Apply_Click();
        if (!w.ui.messages.empty()) {
            state.SkipWithError(w.ui.messages.front().c_str());
            break;
        }
    }
    for (const Exchange& e : trafficOf(w.bench.trace()->lines())) ++(e.query ? queries : writes);
    state.counters["bus_writes"] = static_cast<double>(writes);
    state.counters["bus_queries"] = static_cast<double>(queries);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_ApplyExternalFiveRowsThroughSockets)->UseRealTime()->Unit(benchmark::kMicrosecond);

// The same Apply on the in-process simulated generators: the program's own work (and the
// simulator's) without a socket.
void BM_ApplyExternalFiveRowsSimulatedBus(benchmark::State& state) {
    zp::sim::SimBench bench("kt611");
    zp::PulsedModule moduleState;
    Unattended ui;
    zp::MainForm form{moduleState, bench, ui};
    form.Form_Load();
    form.b_calculate_Click();
    for (auto _ : state) {
        bench.trace()->clear();
        form.b_Apply_Click();
        if (!ui.messages.empty()) {
            state.SkipWithError(ui.messages.front().c_str());
            break;
        }
    }
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_ApplyExternalFiveRowsSimulatedBus)->UseRealTime()->Unit(benchmark::kMicrosecond);

// What one Apply sends, replayed over bare sockets: arg 0 keeps the connections, 1 makes them
// anew each time as Apply does.
void BM_BareSocketApplyTraffic(benchmark::State& state) {
    std::vector<Exchange> traffic;
    {
        ApplyWindow w;
        w.bench.trace()->clear();
        w.form.b_Apply_Click();
        traffic = trafficOf(w.bench.trace()->lines());
    }
    const bool reconnect = state.range(0) != 0;
    std::map<int, std::unique_ptr<zp::benchmarks::LoopbackSocket>> sockets;
    char buffer[256];
    for (auto _ : state) {
        if (reconnect || sockets.empty()) {
            sockets.clear();
            for (int address : kAddresses) {
                sockets[address] = std::make_unique<zp::benchmarks::LoopbackSocket>(
                    generatorServer().server->port(address));
            }
        }
        for (const Exchange& e : traffic) {
            zp::benchmarks::LoopbackSocket& s = *sockets.at(e.address);
            s.send(e.text);
            if (!e.query) continue;
            std::size_t got = 0;
            do {
                got = s.receive(buffer, sizeof buffer);
            } while (buffer[got - 1] != '\n');
        }
    }
    std::size_t queries = 0;
    for (const Exchange& e : traffic) queries += e.query ? 1 : 0;
    state.counters["bus_writes"] = static_cast<double>(traffic.size() - queries);
    state.counters["bus_queries"] = static_cast<double>(queries);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_BareSocketApplyTraffic)->Arg(0)->Arg(1)->UseRealTime()->Unit(benchmark::kMicrosecond);

}  // namespace
