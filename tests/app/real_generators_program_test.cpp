// Apply through real generator connections: zentra-pulse-cli programs generators that
// zentra-pulse-sim serves over raw SCPI sockets, and the bus texts are exactly those of the
// in-process simulated generators.

#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <regex>
#include <string>
#include <vector>

#include "child_process.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;
namespace fs = std::filesystem;

const std::string kCli = ZP_CLI_PATH;
const std::string kSim = ZP_SIM_PATH;

// "11=TCPIP0::127.0.0.1::PORT::SOCKET,..." from the server's first line, or "" when it is not
// "zentra-pulse-sim: serving 11 on 127.0.0.1:PORT, 12 on ...".
std::string busFromServingLine(RunningProgram& sim) {
    if (!sim.waitForErr("\n", 10s)) return {};
    const std::string line = sim.err().substr(0, sim.err().find('\n'));
    if (line.rfind("zentra-pulse-sim: serving ", 0) != 0) return {};
    static const std::regex entry(R"((\d+) on 127\.0\.0\.1:(\d+))");
    std::string bus;
    for (std::sregex_iterator it(line.begin(), line.end(), entry), end; it != end; ++it) {
        bus += (bus.empty() ? "" : ",") + (*it)[1].str() + "=TCPIP0::127.0.0.1::" + (*it)[2].str() +
               "::SOCKET";
    }
    return bus;
}

std::vector<std::string> busLines(const fs::path& trace) {
    std::ifstream in(trace);
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) {
        if (line.rfind("BUS ", 0) == 0) lines.push_back(line);
    }
    return lines;
}

TEST(RealGenerators, ApplyWritesTheSameBusTextsAsTheSimulatedGenerators) {
    RunningProgram sim(kSim, {"--serve", "11=0 12=0 13=0"}, {}, true);
    const std::string bus = busFromServingLine(sim);
    ASSERT_EQ(std::count(bus.begin(), bus.end(), '='), 3) << sim.err();

    const fs::path dir = fs::temp_directory_path() / ("zp-real-gen-" + std::to_string(getpid()));
    fs::create_directories(dir);
    // kt611 is listed and has no internal generators: Apply takes the external path, on and off.
    const std::vector<std::string> actions = {"set",   "prf", "20k",    "set", "width", "1",
                                              "2us",   "set", "delay",  "2",   "500ns", "calculate",
                                              "apply", "set", "pulsed", "off", "apply"};
    const auto runWith = [&](const std::vector<std::string>& busOption, const fs::path& trace) {
        std::vector<std::string> args = {"--analyzer", "sim:kt611", "--trace-io", trace.string()};
        args.insert(args.end(), busOption.begin(), busOption.end());
        args.insert(args.end(), actions.begin(), actions.end());
        return runProgram(kCli, args);
    };
    const RunResult simulated = runWith({}, dir / "simulated.log");
    const RunResult real = runWith({"--bus", bus}, dir / "real.log");
    ASSERT_EQ(simulated.status, 0) << simulated.err;
    ASSERT_EQ(real.status, 0) << real.err;
    EXPECT_EQ(real.out, simulated.out);
    EXPECT_NE(real.out.find("apply -> SPulsedModeOn, generator rows programmed: 5\n"),
              std::string::npos)
        << real.out;

    const std::vector<std::string> expected = busLines(dir / "simulated.log");
    ASSERT_GT(expected.size(), 100u);
    EXPECT_EQ(busLines(dir / "real.log"), expected);
    fs::remove_all(dir);
    EXPECT_EQ(sim.stop(), 0);
}

}  // namespace
}  // namespace zp::testing
