#include <gtest/gtest.h>

#include <unistd.h>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "common/bench_wiring.h"
#include "instruments/io_trace.h"
#include "sim/generators/sim_generator.h"
#include "sim/server/scpi_server.h"

namespace zp::app {
namespace {

std::vector<std::string> fileLines(const std::string& path) {
    std::ifstream in(path);
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
}

// The simulated analyzer with a real generator behind a socket: the bench's one trace holds the
// analyzer calls and the bus texts in the order they happened, and so does the trace file.
TEST(BenchWiring, SimulatedAnalyzerAndRealGeneratorsShareOneTrace) {
    std::map<int, std::unique_ptr<sim::SimGenerator>> generators;
    generators[11] = std::make_unique<sim::SimGenerator>(11, "Veltrix,PG8102A,REAL11,1.0");
    sim::ScpiServer server({{11, 0}}, sim::ScpiServer::forGenerators(generators));
    const std::string bus = "11=TCPIP0::127.0.0.1::" + std::to_string(server.port(11)) + "::SOCKET";
    const std::string file =
        (std::filesystem::temp_directory_path() / ("zp-wiring-" + std::to_string(::getpid())))
            .string();

    BenchOptions options;
    options.bus = bus;
    options.traceFile = file;
    const std::unique_ptr<Bench> bench = makeBench(options);
    EXPECT_EQ(bench->describe(), "simulated KT622A (kt622), generators on " + bus);

    const auto analyzer = bench->connectAnalyzer();
    analyzer->commandParser()->parse("*IDN?");
    const auto generatorBus = bench->createBus();
    const std::int16_t device = generatorBus->openDevice(0, 11, 0, 13, 1, 0);
    generatorBus->writeText(device, "*IDN?\n");
    std::string reply(100, ' ');
    generatorBus->readText(device, reply);
    analyzer->commandParser()->parse("SENS:SWE:MODE?");

    const std::vector<std::string> expected = {
        "ANA Application.commandParser()",
        R"(ANA CommandParser.parse("*IDN?") -> "Korvex,KT622A,SIM000001,A.01.00\n")",
        "BUS 11 open",
        R"(BUS 11 W "*IDN?\n")",
        R"(BUS 11 R "Veltrix,PG8102A,REAL11,1.0\n")",
        "ANA Application.commandParser()",
        R"(ANA CommandParser.parse("SENS:SWE:MODE?") -> "CONT\n")",
    };
    EXPECT_EQ(bench->trace()->lines(), expected);
    EXPECT_EQ(fileLines(file), expected);
    std::filesystem::remove(file);
}

}  // namespace
}  // namespace zp::app
