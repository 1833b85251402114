// zentra-pulse-sim as a real process: a free port announced on its first line, SCPI through the
// program's own socket link, a clean stop on SIGTERM, usage errors.

#include <gtest/gtest.h>
#include <sys/resource.h>

#include <charconv>
#include <chrono>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "child_process.h"
#include "transport/raw_socket_link.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;

const std::string kSim = ZP_SIM_PATH;
constexpr const char* kServing = "zentra-pulse-sim: serving 11 on 127.0.0.1:";

// The ports named by the first line, which must be `lead` and then a port, followed by ", " and
// `host:port` entries; empty when the line is not of that form.
std::vector<int> announcedPorts(RunningProgram& sim, const std::string& lead = kServing,
                                const std::string& next = "") {
    if (!sim.waitForErr("\n", 10s)) return {};
    const std::string& out = sim.err();
    if (out.rfind(lead, 0) != 0) return {};
    std::vector<int> ports;
    const char* at = out.data() + lead.size();
    while (true) {
        int port = 0;
        const auto [end, ec] = std::from_chars(at, out.data() + out.size(), port);
        if (ec != std::errc{}) return {};
        ports.push_back(port);
        if (*end == '\n') return ports;
        if (next.empty() || std::string_view(end).rfind(next, 0) != 0) return {};
        at = end + next.size();
    }
}

int announcedPort(RunningProgram& sim) {
    const auto ports = announcedPorts(sim);
    return ports.size() == 1 ? ports.front() : 0;
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

TEST(SimServerProgram, EntriesSplitOnBlanksAndAnIPv6PortIsBracketed) {
    RunningProgram two(kSim, {"--serve", "11=0 \t12=0"}, {}, true);
    const auto ports = announcedPorts(two, kServing, ", 12 on 127.0.0.1:");
    ASSERT_EQ(ports.size(), 2u) << two.err();
    transport::RawSocketLink link("127.0.0.1", ports[1], 5s);
    link.write("*IDN?\n");
    EXPECT_EQ(link.read(256), "Veltrix,PG8102A,SIM12,1.0\n");

    for (const char* bind : {"::1", "[::1]"}) {
        RunningProgram v6(kSim, {"--serve", "11=0", "--bind", bind}, {}, true);
        const auto v6Ports = announcedPorts(v6, "zentra-pulse-sim: serving 11 on [::1]:");
        if (v6Ports.empty() && v6.err().find("Cannot listen") != std::string::npos) {
            GTEST_SKIP() << "no IPv6 loopback: " << v6.err();
        }
        ASSERT_EQ(v6Ports.size(), 1u) << bind << ": " << v6.err();
        transport::RawSocketLink link6("::1", v6Ports[0], 5s);
        link6.write("*OPC?\n");
        EXPECT_EQ(link6.read(16), "1\n");
    }
}

TEST(SimServerProgram, IdleTimeoutClosesASilentClient) {
    RunningProgram sim(kSim, {"--idle-timeout", "1", "--serve", "11=0"}, {}, true);
    const int port = announcedPort(sim);
    ASSERT_GT(port, 0) << sim.err();
    const auto start = std::chrono::steady_clock::now();
    transport::RawSocketLink link("127.0.0.1", port, 5s);
    try {
        link.read(16);
        ADD_FAILURE() << "read something";
    } catch (const transport::LinkFailure& e) {
        EXPECT_FALSE(e.timedOut()) << e.what();
    }
    const auto closed = std::chrono::steady_clock::now() - start;
    EXPECT_GE(closed, 1s);
    EXPECT_LT(closed, 3s);
}

double childCpuSeconds() {
    rusage usage{};
    getrusage(RUSAGE_CHILDREN, &usage);
    return static_cast<double>(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) +
           static_cast<double>(usage.ru_utime.tv_usec + usage.ru_stime.tv_usec) / 1e6;
}

// Out of file descriptors with newcomers waiting: the clients it has are served and the server
// does not spin on the port it cannot accept from.
TEST(SimServerProgram, RunningOutOfFilesNeitherSpinsNorStopsService) {
    const double cpuBefore = childCpuSeconds();
#if defined(__SANITIZE_ADDRESS__)
    // The sanitizer runtimes open pipes of their own to check memory; out of descriptors they
    // report errors that are not there.
    GTEST_SKIP() << "needs spare file descriptors under the sanitizers";
#endif
    RunningProgram sim("/bin/sh", {"-c", "ulimit -n 24 && exec " + kSim + " --serve 11=0"}, {},
                       true);
    const int port = announcedPort(sim);
    ASSERT_GT(port, 0) << sim.err();
    transport::RawSocketLink first("127.0.0.1", port, 5s);
    std::vector<std::unique_ptr<transport::RawSocketLink>> waiting;
    for (int i = 0; i < 40; ++i) {
        waiting.push_back(std::make_unique<transport::RawSocketLink>("127.0.0.1", port, 5s));
    }
    std::this_thread::sleep_for(1s);
    first.write("*OPC?\n");
    EXPECT_EQ(first.read(16), "1\n");
    EXPECT_EQ(sim.stop(), 0);
    // Idle it takes about 0.02 s of processor time in that second; spinning, most of it.
    EXPECT_LT(childCpuSeconds() - cpuBefore, 0.15);
}

TEST(SimServerProgram, UsageNamesEveryOption) {
    const RunResult help = runProgram(kSim, {"--help"});
    EXPECT_EQ(help.status, 0);
    for (const char* option : {"--serve ADDRESS=PORT", "--bind ADDR", "--idle-timeout SECONDS",
                               "--help", "[::1]:5025", "64 clients"}) {
        EXPECT_NE(help.out.find(option), std::string::npos) << option;
    }
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
        {{"--serve", "11=0 11=0"}, "GPIB address 11 is served twice"},
        {{"--serve", "11=0 12"}, "bad --serve entry \"12\""},
        {{"--serve", "11=0", "--idle-timeout"}, "--idle-timeout needs seconds"},
        {{"--serve", "11=0", "--idle-timeout", "-1"}, "bad --idle-timeout \"-1\""},
        {{"--serve", "11=0", "--idle-timeout=86401"}, "bad --idle-timeout \"86401\""},
        {{"--serve", "11=0", "--idle-timeout", "1.5"}, "bad --idle-timeout \"1.5\""},
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
