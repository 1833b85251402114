#include "sim/server/scpi_server.h"

#include <gtest/gtest.h>

#include <chrono>
#include <map>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "transport/raw_socket_link.h"
#include "transport_test_util.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;
using transport::LinkFailure;

TEST(ScpiServer, OnePortPerAddressEachWithItsGenerator) {
    LoopbackBench bench;
    EXPECT_NE(bench.server->port(11), bench.server->port(12));
    EXPECT_EQ(bench.server->port(13), -1);
    auto a = bench.link(11);
    auto b = bench.link(12);
    b.write("*IDN?\n");
    a.write("*IDN?\n");
    EXPECT_EQ(a.read(100), "Veltrix,PG8102A,SIM11,1.0\n");
    EXPECT_EQ(b.read(100), "Veltrix,PG8102A,SIM12,1.0\n");
    EXPECT_NE(bench.server->describe().find("11 on 127.0.0.1:"), std::string::npos);
}

TEST(ScpiServer, CommandsGetNoReplyAndErrorsQueueAsOnTheInstrument) {
    LoopbackBench bench;
    auto link = bench.link(11, 200ms);
    link.write(":OUTP1:STAT ON\r\n:NOPE\n");
    EXPECT_THROW(link.read(100), LinkFailure);  // nothing to read
    link.clear();                               // the timeout closed the link
    link.write(":SYST:ERR?\n:SYST:ERR?\n*O");
    link.write("PC?\n");  // a line split across writes is joined
    EXPECT_EQ(link.read(100), "-113,\"Undefined header\"\n");
    EXPECT_EQ(link.read(100), "+0,\"No error\"\n");
    EXPECT_EQ(link.read(100), "1\n");
}

TEST(ScpiServer, ClientsShareTheGeneratorAndAnOverlongLineDropsOnlyItsClient) {
    LoopbackBench bench;
    auto first = bench.link(12);
    auto second = bench.link(12);
    first.write(":SOUR:FREQ 12345\n*OPC?\n");
    EXPECT_EQ(first.read(10), "1\n");
    second.write(":SOUR:FREQ?\n");
    EXPECT_EQ(second.read(100), "12345\n");

    try {
        first.write(std::string((1u << 20) + 4096, 'x'));
        first.write("\n*OPC?\n");
        first.read(10);
        ADD_FAILURE() << "over-long line was served";
    } catch (const LinkFailure&) {
    }
    second.write("*OPC?\n");
    EXPECT_EQ(second.read(10), "1\n");
}

// Generators 11 and 12 served with the given limits; "MEG?" answers 1 MiB.
struct LimitedBench {
    static std::string meg() { return std::string((1u << 20) - 1, 'r') + "\n"; }

    explicit LimitedBench(sim::ScpiServerLimits limits) {
        generators[11] = std::make_unique<sim::SimGenerator>(11, "");
        generators[12] = std::make_unique<sim::SimGenerator>(12, "");
        server = std::make_unique<sim::ScpiServer>(
            std::map<int, int>{{11, 0}, {12, 0}},
            [forward = sim::ScpiServer::forGenerators(generators), big = meg()](
                int address, std::string_view line) -> std::optional<std::string> {
                return line == "MEG?" ? big : forward(address, line);
            },
            "127.0.0.1", limits);
    }
    transport::RawSocketLink link(int address, std::chrono::milliseconds timeout = 2s) const {
        return transport::RawSocketLink("127.0.0.1", server->port(address), timeout);
    }
    std::vector<std::unique_ptr<transport::RawSocketLink>> links(int address, int count) const {
        std::vector<std::unique_ptr<transport::RawSocketLink>> all;
        for (int i = 0; i < count; ++i) {
            all.push_back(
                std::make_unique<transport::RawSocketLink>("127.0.0.1", server->port(address), 3s));
        }
        return all;
    }

    std::map<int, std::unique_ptr<sim::SimGenerator>> generators;
    std::unique_ptr<sim::ScpiServer> server;
};

// The cap plus the reply being added, with room for the buffer's growth.
constexpr std::size_t kConnectionBound = sim::ScpiServer::kOutputCap + 2 * (1u << 20);

// Reads until the server closes the link; the bytes read.
std::size_t readUntilClosed(transport::RawSocketLink& link) {
    std::size_t total = 0;
    try {
        while (true) total += link.read(1u << 20).size();
    } catch (const LinkFailure& e) {
        EXPECT_FALSE(e.timedOut()) << e.what();
    }
    return total;
}

// Asking far ahead of reading: 1 GiB of 1 MiB replies passes through while the connection holds
// no more than the output cap and one reply.
TEST(ScpiServer, AClientAskingAheadOfReadingKeepsTheServerSmall) {
    LimitedBench bench({});
    auto link = bench.link(11, 10s);
    constexpr int kReplies = 1024;
    constexpr int kAhead = 64;
    int asked = 0;
    for (; asked < kAhead; ++asked) link.write("MEG?\n");
    std::size_t received = 0;
    for (int got = 0; got < kReplies; ++got) {
        received += link.read(2u << 20).size();
        if (asked < kReplies) {
            link.write("MEG?\n");
            ++asked;
        }
    }
    EXPECT_EQ(received, std::size_t{1} << 30);
    EXPECT_LE(bench.server->peakConnectionBytes(), kConnectionBound);
}

TEST(ScpiServer, AClientThatNeverReadsIsHeldAtTheCapThenClosedAsIdle) {
    constexpr auto kIdle = 300ms;
    LimitedBench bench({64, kIdle});
    auto link = bench.link(11);
    std::string asks;
    for (int i = 0; i < 256; ++i) asks += "MEG?\n";
    link.write(asks);
    std::this_thread::sleep_for(kIdle + 500ms);
    // What was sent before the close: the cap and what the sockets buffer, not 256 MiB.
    EXPECT_LT(readUntilClosed(link), 64u << 20);
    EXPECT_LE(bench.server->peakConnectionBytes(), kConnectionBound);
}

TEST(ScpiServer, ClientsAreCountedPerPortAndARefusedOneIsToldWhy) {
    LimitedBench bench({64, 0ms});
    const auto full = bench.links(11, 64);
    auto other = bench.link(12);
    other.write("*IDN?\n");
    EXPECT_EQ(other.read(100), "Veltrix,PG8102A,SIM12,1.0\n");
    // Even a newcomer that speaks first gets the line rather than a reset.
    auto refused = bench.link(11);
    refused.write("*IDN?\n");
    EXPECT_EQ(refused.read(200), "ERROR: too many clients on this port (64); try again later\n");
    EXPECT_EQ(readUntilClosed(refused), 0u);
    full.back()->write("*OPC?\n");
    EXPECT_EQ(full.back()->read(10), "1\n");
}

TEST(ScpiServer, IdleClientsAreClosedSoThatNewcomersAreServed) {
    constexpr auto kIdle = 400ms;
    LimitedBench bench({64, kIdle});
    const auto start = std::chrono::steady_clock::now();
    const auto idle = bench.links(11, 64);
    EXPECT_EQ(bench.link(11).read(200),
              "ERROR: too many clients on this port (64); try again later\n");
    // Trickling bytes without ever ending a line does not keep a client.
    bool trickleStopped = false;
    while (!trickleStopped && std::chrono::steady_clock::now() - start < 3s) {
        try {
            idle.front()->write("*");
        } catch (const LinkFailure&) {
            trickleStopped = true;
        }
        std::this_thread::sleep_for(50ms);
    }
    EXPECT_TRUE(trickleStopped);
    for (std::size_t i = 1; i < idle.size(); ++i) readUntilClosed(*idle[i]);
    const auto closed = std::chrono::steady_clock::now() - start;
    EXPECT_GE(closed, kIdle);
    EXPECT_LT(closed, kIdle + 1s);

    // Whole lines keep a client however long it stays.
    auto active = bench.link(11);
    for (int i = 0; i < 5; ++i) {
        std::this_thread::sleep_for(kIdle / 2);
        active.write("*OPC?\n");
        EXPECT_EQ(active.read(10), "1\n");
    }
}

TEST(ScpiServer, BusyPortIsReportedAndStopIsIdempotent) {
    LoopbackBench bench;
    const int taken = bench.server->port(11);
    try {
        sim::ScpiServer clash({{11, taken}}, [](int, std::string_view) { return std::nullopt; });
        FAIL() << "bound a busy port";
    } catch (const std::runtime_error& e) {
        EXPECT_NE(std::string(e.what()).find(std::to_string(taken)), std::string::npos);
    }
    EXPECT_THROW(sim::ScpiServer({{11, 70000}}, nullptr), std::runtime_error);
    bench.server->stop();
    bench.server->stop();
}

}  // namespace
}  // namespace zp::testing
