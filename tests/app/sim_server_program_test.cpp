// zentra-pulse-sim as a real process: a free port announced on its first line, SCPI through the
// program's own socket link, a clean stop on SIGTERM, usage errors.

#include <gtest/gtest.h>

#include <charconv>
#include <cstring>
#include <string>
#include <vector>

#include "child_process.h"
#include "transport/raw_socket_link.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;

const std::string kSim = ZP_SIM_PATH;
constexpr const char* kServing = "zentra-pulse-sim: serving 11 on 127.0.0.1:";

// The port named by the first line, 0 when the line is not the expected one.
int announcedPort(RunningProgram& sim) {
    if (!sim.waitForErr("\n", 10s)) return 0;
    const std::string& out = sim.err();
    if (out.rfind(kServing, 0) != 0) return 0;
    int port = 0;
    const char* first = out.data() + std::strlen(kServing);
    const auto [end, ec] = std::from_chars(first, out.data() + out.size(), port);
    return ec == std::errc{} && *end == '\n' ? port : 0;
}

TEST(SimServerProgram, PortZeroServesAFreePortUntilSigterm) {
    RunningProgram sim(kSim, {"--serve", "11=0"}, {}, true);
    const int port = announcedPort(sim);
    ASSERT_GT(port, 0) << sim.err();
    {
        transport::RawSocketLink link("127.0.0.1", port, 5s);
        link.write("*IDN?\n");
        EXPECT_EQ(link.read(256), "Veltrix,PG8102A,SIM11,1.0\n");
        link.write(":SOUR:FREQ 1E9\n");  // above the generator's range: refused, nothing sent back
        link.write(":SYST:ERR?\n");
        EXPECT_EQ(link.read(256), "-222,\"Data out of range\"\n");
        link.write(":SYST:ERR?\n");
        EXPECT_EQ(link.read(256), "+0,\"No error\"\n");
    }
    // The port is taken while it runs: a second server says so and fails.
    const RunResult clash = runProgram(kSim, {"--serve", "12=" + std::to_string(port)});
    EXPECT_EQ(clash.status, 1);
    EXPECT_NE(clash.err.find("Cannot listen on 127.0.0.1:" + std::to_string(port)),
              std::string::npos)
        << clash.err;

    EXPECT_EQ(sim.stop(), 0);
    EXPECT_TRUE(sim.waitForErr("zentra-pulse-sim: stopped\n", 2s)) << sim.err();
}

TEST(SimServerProgram, BadArgumentsEndWithStatusTwoAndTheUsage) {
    // arguments -> what stderr must name
    const std::vector<std::pair<std::vector<std::string>, std::string>> cases = {
        {{}, "nothing to serve"},
        {{"--frobnicate"}, "unknown argument \"--frobnicate\""},
        {{"--serve", "31=5025"}, "bad --serve entry \"31=5025\""},
        {{"--serve", "11=65536"}, "bad --serve entry \"11=65536\""},
        {{"--serve", "11"}, "bad --serve entry \"11\""},
        {{"--serve", "11=0,11=0"}, "GPIB address 11 is served twice"},
        {{"--serve", "11=0", "--bind"}, "--bind needs an address"},
    };
    for (const auto& [args, message] : cases) {
        const RunResult r = runProgram(kSim, args);
        EXPECT_EQ(r.status, 2) << message;
        EXPECT_NE(r.err.find("zentra-pulse-sim: " + message), std::string::npos) << r.err;
        EXPECT_NE(r.err.find("Usage: zentra-pulse-sim --serve"), std::string::npos) << message;
        EXPECT_TRUE(r.out.empty()) << message;
    }
}

}  // namespace
}  // namespace zp::testing
