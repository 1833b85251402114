#include "transport/raw_socket_link.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <filesystem>
#include <iterator>
#include <memory>
#include <thread>

#include "instruments/error_capture.h"
#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "scripted_peer.h"
#include "transport/transport_factory.h"
#include "transport_test_util.h"

namespace zp::testing {

int unusedPort() {
    const int fd = ::socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in a{};
    a.sin_family = AF_INET;
    a.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    ::bind(fd, reinterpret_cast<sockaddr*>(&a), sizeof a);
    socklen_t length = sizeof a;
    ::getsockname(fd, reinterpret_cast<sockaddr*>(&a), &length);
    ::close(fd);
    return ntohs(a.sin_port);
}

namespace {

using namespace std::chrono_literals;
using testing_support::errorOf;
using transport::LinkFailure;
using transport::RawSocketLink;

constexpr std::uint16_t kErr = InstrumentBus::kStatusError;
constexpr std::uint16_t kTimo = InstrumentBus::kStatusTimeout;
using Lines = std::vector<std::string>;

// Sockets this process holds open.
std::size_t openDescriptors() {
    return static_cast<std::size_t>(
        std::distance(std::filesystem::directory_iterator("/proc/self/fd"),
                      std::filesystem::directory_iterator()));
}

TEST(RawSocket, RepliesAreFramedOnLineFeedAndLimitedToTheBuffer) {
    LoopbackBench bench;
    auto link = bench.link(11);
    link.write(":SOUR:FREQ 2500\n");
    link.write(":SOUR:FREQ?\n");
    EXPECT_EQ(link.read(100), "2500\n");
    link.write("*OPC?\r\n*IDN?\n");  // two replies may arrive in one segment
    EXPECT_EQ(link.read(100), "1\n");
    EXPECT_EQ(link.read(8), "Veltrix,");
    EXPECT_EQ(link.read(100), "PG8102A,SIM11,1.0\n");
}

TEST(RawSocket, FourMebibyteReplyArrivesIntact) {
    LoopbackBench bench;
    auto link = bench.link(11);
    link.write("BIG?\n");
    EXPECT_EQ(link.read(LoopbackBench::kBigSize + 100), LoopbackBench::bigReply());
    // The stream is still in step afterwards.
    link.write("*OPC?\n");
    EXPECT_EQ(link.read(2), "1\n");
}

TEST(RawSocket, ReadTimesOutWhenNoReplyComes) {
    LoopbackBench bench;
    auto link = bench.link(12, 150ms);
    link.write("SILENT?\n");
    const auto start = std::chrono::steady_clock::now();
    try {
        link.read(100);
        FAIL() << "no timeout";
    } catch (const LinkFailure& e) {
        EXPECT_TRUE(e.timedOut());
    }
    EXPECT_GE(std::chrono::steady_clock::now() - start, 140ms);
}

TEST(RawSocket, RefusedConnectNamesHostAndPortAndClosedPeerIsAnError) {
    const int port = unusedPort();
    const std::string refused = errorOf([&] { RawSocketLink("127.0.0.1", port, 1s); });
    EXPECT_NE(refused.find("127.0.0.1:" + std::to_string(port)), std::string::npos) << refused;
    EXPECT_NE(refused.find("refused"), std::string::npos) << refused;
    const std::size_t before = openDescriptors();
    for (int i = 0; i < 5; ++i) EXPECT_THROW(RawSocketLink("127.0.0.1", port, 1s), InstrumentError);
    EXPECT_EQ(openDescriptors(), before) << "a failed connect leaves its socket open";
    EXPECT_THROW(RawSocketLink("no-such-host.invalid", 5025, 1s, 2s), InstrumentError);
}

// A peer that closes or resets the connection: a failure of its own, not a timeout.
TEST(RawSocket, PeerClosingOrResettingIsNoTimeout) {
    const auto failure = [](auto call) -> std::string {
        try {
            call();
        } catch (const LinkFailure& e) {
            return (e.timedOut() ? "timeout: " : "") + std::string(e.what());
        }
        return "<no failure>";
    };
    for (const bool reset : {false, true}) {
        std::atomic<bool> accepted = false;
        auto peer = std::make_unique<ScriptedPeer>([&](ScriptedPeer& p, int fd) {
            const linger abort{1, 0};
            if (reset) ::setsockopt(fd, SOL_SOCKET, SO_LINGER, &abort, sizeof abort);
            if (!reset) ::shutdown(fd, SHUT_WR);
            accepted = true;
            while (p.pause(10ms)) {
            }
        });
        RawSocketLink link("127.0.0.1", peer->port(), 2s);
        const std::string name = link.peer();
        while (!accepted) std::this_thread::sleep_for(1ms);
        if (reset) peer.reset();  // closes with the linger of 0: a reset
        const std::string why = reset ? "read from " + name + " failed: Connection reset by peer"
                                      : name + " closed the connection";
        EXPECT_EQ(failure([&] { link.read(10); }), why);
        EXPECT_FALSE(link.isOpen());
        EXPECT_EQ(failure([&] { link.write("*IDN?\n"); }),
                  "the connection to " + name + " is closed (" + why +
                      "); clear the device or open it again");
    }
}

TEST(RawSocket, DestroyingTheLinkClosesTheConnection) {
    std::atomic<bool> closed = false;
    ScriptedPeer peer(
        [&](ScriptedPeer& p, int fd) { closed = p.readLine(fd).empty() && !p.stopping(); });
    { RawSocketLink link("127.0.0.1", peer.port(), 1s); }
    for (int i = 0; i < 200 && !closed; ++i) std::this_thread::sleep_for(10ms);
    EXPECT_TRUE(closed);
}

TEST(RawSocket, BracketedIpv6ResourceReachesTheLoopback) {
    ScriptedPeer peer(
        [](ScriptedPeer& p, int fd) {
            if (p.readLine(fd) == "*OPC?\n") p.sendText(fd, "1\n");
            p.pause(10s);
        },
        AF_INET6);
    if (!peer.listening()) GTEST_SKIP() << "this machine has no IPv6 loopback (::1)";
    auto bus = makeTransportBus(
        {{11, "TCPIP0::[::1]::" + std::to_string(peer.port()) + "::SOCKET"}}, nullptr);
    const auto d = bus->openDevice(0, 11, 0, 11, 1, 0);
    bus->writeText(d, "*OPC?\n");
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(buffer, "1\n");
    const int port = unusedPort();
    EXPECT_EQ(errorOf([&] { RawSocketLink("::1", port, 1s); }),
              "Cannot connect to [::1]:" + std::to_string(port) + ": Connection refused");
}

class TransportBusTest : public ::testing::Test {
  protected:
    LoopbackBench bench;
    IoTrace trace;
    std::unique_ptr<InstrumentBus> bus =
        makeTransportBus({{11, bench.resource(11)}, {12, bench.resource(12)}}, &trace);
    std::string read(std::int16_t d, std::size_t size = 100) {
        std::string buffer(size, ' ');
        bus->readText(d, buffer);
        return buffer;
    }
};

TEST_F(TransportBusTest, IdentificationAndProgrammingThroughTheBus) {
    const auto d = bus->openDevice(0, 12, 0, 13, 1, 0);
    EXPECT_EQ(bus->addressOf(d), 12);
    bus->writeText(d, "*IDN?\n");
    EXPECT_EQ(read(d), "Veltrix,PG8102A,SIM12,1.0\n");
    EXPECT_EQ(bus->status(), 0);
    bus->writeText(d, ":OUTP2:STAT ON\n");
    bus->writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "+0,\"No error\"\n");
    bool on = false;
    bench.server->withLock([&] { on = bench.generators[12]->state().outputs[1].on; });
    EXPECT_TRUE(on);
    EXPECT_EQ(trace.lines(), (std::vector<std::string>{
                                 "BUS 12 open",
                                 "BUS 12 W \"*IDN?\\n\"",
                                 "BUS 12 R \"Veltrix,PG8102A,SIM12,1.0\\n\"",
                                 "BUS 12 W \":OUTP2:STAT ON\\n\"",
                                 "BUS 12 W \":SYST:ERR?\\n\"",
                                 "BUS 12 R \"+0,\\\"No error\\\"\\n\"",
                             }));
}

TEST_F(TransportBusTest, TimeoutSetsErrAndTimoKeepsTheBufferAndClosesUntilCleared) {
    const auto d = bus->openDevice(0, 11, 0, 9, 1, 0);  // code 9: 100 ms
    bus->writeText(d, "SILENT?\n");
    EXPECT_EQ(read(d), std::string(100, ' '));
    EXPECT_EQ(bus->status(), kErr | kTimo);
    EXPECT_EQ(trace.lines().back(), "BUS 11 timeout");
    // A late reply must not pass for the next one: the link stays closed until cleared.
    bus->writeText(d, "*OPC?\n");
    EXPECT_EQ(bus->status(), kErr);
    bus->clearDevice(d);
    EXPECT_EQ(bus->status(), 0);
    bus->writeText(d, "*OPC?\n");
    EXPECT_EQ(read(d), "1\n");
    bus->writeText(42, "*IDN?\n");
    EXPECT_EQ(bus->status(), kErr);
    const auto lines = trace.lines();
    EXPECT_EQ(Lines(lines.end() - 3, lines.end()),
              (Lines{"BUS 11 R \"1\\n\"", "BUS -1 W \"*IDN?\\n\"",
                     "BUS -1 error invalid descriptor 42"}));
    EXPECT_EQ(bus->addressOf(42), -1);
}

TEST_F(TransportBusTest, OpeningAgainReconnectsALinkThatAFailureClosed) {
    const auto d = bus->openDevice(0, 12, 0, 9, 1, 0);
    bus->writeText(d, "SILENT?\n");
    read(d);
    const auto again = bus->openDevice(0, 12, 0, 9, 1, 0);
    bus->writeText(d, "*OPC?\n");  // the older descriptor uses the new connection too
    EXPECT_EQ(read(again), "1\n");
}

TEST_F(TransportBusTest, AddressWithoutResourceAndUnreachableResourceThrow) {
    EXPECT_EQ(errorOf([&] { bus->openDevice(0, 13, 0, 13, 1, 0); }),
              "No bus resource is given for GPIB address 13");
    EXPECT_EQ(trace.lines().back(), "BUS 13 error No bus resource is given for GPIB address 13");
    auto dead = makeTransportBus(
        {{11, "TCPIP0::127.0.0.1::" + std::to_string(unusedPort()) + "::SOCKET"}}, nullptr);
    EXPECT_THROW(dead->openDevice(0, 11, 0, 13, 1, 0), InstrumentError);
    EXPECT_THROW(bus->openDevice(1, 11, 0, 13, 1, 0), InstrumentError);
}

TEST_F(TransportBusTest, WriteThenQueryDoesNotWaitForDelayedAcks) {
    // With Nagle on, every query behind an unacknowledged write waits ~40 ms for the ACK.
    const auto d = bus->openDevice(0, 11, 0, 13, 1, 0);
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < 100; ++i) {
        bus->writeText(d, ":SOUR:PULS:DEL1 1E-06\n");
        bus->writeText(d, "*OPC?\n");
        ASSERT_EQ(read(d, 2), "1\n");
    }
    EXPECT_LT(std::chrono::steady_clock::now() - start, 2s);
}

TEST(TimeoutCodes, MatchTheBusLibrary) {
    for (const auto& [code, timeout] :
         {std::pair{13, 10000ms}, {11, 1000ms}, {9, 100ms}, {17, 1000000ms}, {99, 10000ms}}) {
        EXPECT_EQ(transport::timeoutForCode(code), timeout) << code;
    }
}

}  // namespace
}  // namespace zp::testing
