#include "transport/raw_socket_link.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <thread>

#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "transport/resource_bus.h"
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
using transport::LinkFailure;
using transport::RawSocketLink;

constexpr std::uint16_t kErr = InstrumentBus::kStatusError;
constexpr std::uint16_t kTimo = InstrumentBus::kStatusTimeout;

class RawSocketTest : public ::testing::Test {
  protected:
    LoopbackBench bench;
    RawSocketLink link11{"127.0.0.1", bench.server->port(11), 2s};
};

TEST_F(RawSocketTest, WriteThenQueryRoundTrip) {
    link11.write(":SOUR:FREQ 2500\n");
    link11.write(":SOUR:FREQ?\n");
    EXPECT_EQ(link11.read(100), "2500\n");
    link11.write("*IDN?\r\n");
    EXPECT_EQ(link11.read(100), "Veltrix,PG8102A,SIM11,1.0\n");
}

TEST_F(RawSocketTest, ReadsAreFramedOnLineFeedAndLimitedToTheBuffer) {
    link11.write("*OPC?\n*IDN?\n");  // two replies may arrive in one segment
    EXPECT_EQ(link11.read(100), "1\n");
    EXPECT_EQ(link11.read(8), "Veltrix,");
    EXPECT_EQ(link11.read(100), "PG8102A,SIM11,1.0\n");
}

TEST_F(RawSocketTest, FourMebibyteReplyArrivesIntact) {
    link11.write("BIG?\n");
    const std::string reply = link11.read(LoopbackBench::kBigSize + 100);
    ASSERT_EQ(reply.size(), LoopbackBench::kBigSize);
    EXPECT_EQ(reply, LoopbackBench::bigReply());
    // The stream is still in step afterwards.
    link11.write("*OPC?\n");
    EXPECT_EQ(link11.read(2), "1\n");
}

TEST_F(RawSocketTest, ReadTimesOutWhenNoReplyComes) {
    RawSocketLink link("127.0.0.1", bench.server->port(12), 150ms);
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

TEST(RawSocketConnect, RefusedConnectNamesHostAndPort) {
    const int port = unusedPort();
    try {
        RawSocketLink link("127.0.0.1", port, 1s);
        FAIL() << "connected";
    } catch (const InstrumentError& e) {
        EXPECT_NE(e.description().find("127.0.0.1:" + std::to_string(port)), std::string::npos)
            << e.description();
        EXPECT_NE(e.description().find("refused"), std::string::npos) << e.description();
    }
}

TEST(RawSocketConnect, UnknownHostFailsClearly) {
    EXPECT_THROW(RawSocketLink("no-such-host.invalid", 5025, 1s, 2s), InstrumentError);
}

TEST(RawSocketPeer, ClosedPeerIsAnErrorNotATimeoutOrSignal) {
    LoopbackBench bench;
    RawSocketLink link("127.0.0.1", bench.server->port(11), 2s);
    bench.server.reset();  // stops and closes every connection
    EXPECT_THROW(link.read(10), LinkFailure);
    try {
        for (int i = 0; i < 100; ++i) link.write("*IDN?\n");  // must not raise SIGPIPE
    } catch (const LinkFailure& e) {
        EXPECT_FALSE(e.timedOut());
    }
}

class TransportBusTest : public ::testing::Test {
  protected:
    std::unique_ptr<InstrumentBus> makeBus() {
        return makeTransportBus({{11, bench.resource(11)}, {12, bench.resource(12)}}, &trace);
    }
    LoopbackBench bench;
    IoTrace trace;
};

TEST_F(TransportBusTest, IdentificationAndProgrammingThroughTheBus) {
    auto bus = makeBus();
    const auto d = bus->openDevice(0, 12, 0, 13, 1, 0);
    EXPECT_EQ(bus->addressOf(d), 12);
    bus->writeText(d, "*IDN?\n");
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(bus->status(), 0);
    EXPECT_EQ(buffer, "Veltrix,PG8102A,SIM12,1.0\n");
    bus->writeText(d, ":OUTP2:STAT ON\n");
    bus->writeText(d, ":SYST:ERR?\n");
    buffer.assign(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(buffer, "+0,\"No error\"\n");
    bool on = false;
    bench.server->withLock([&] { on = bench.generators[12]->state().outputs[1].on; });
    EXPECT_TRUE(on);
    const std::vector<std::string> expected = {
        "BUS 12 open",
        "BUS 12 W \"*IDN?\\n\"",
        "BUS 12 R \"Veltrix,PG8102A,SIM12,1.0\\n\"",
        "BUS 12 W \":OUTP2:STAT ON\\n\"",
        "BUS 12 W \":SYST:ERR?\\n\"",
        "BUS 12 R \"+0,\\\"No error\\\"\\n\"",
    };
    EXPECT_EQ(trace.lines(), expected);
}

TEST_F(TransportBusTest, TimeoutSetsErrAndTimoAndKeepsTheBuffer) {
    auto bus = makeBus();
    const auto d = bus->openDevice(0, 11, 0, 9, 1, 0);  // code 9: 100 ms
    bus->writeText(d, "SILENT?\n");
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(bus->status(), kErr | kTimo);
    EXPECT_EQ(buffer, std::string(100, ' '));
    EXPECT_EQ(trace.lines().back(), "BUS 11 timeout");
    // The next good call clears the status.
    bus->writeText(d, "*OPC?\n");
    EXPECT_EQ(bus->status(), 0);
}

TEST_F(TransportBusTest, AddressWithoutResourceAndUnreachableResourceThrow) {
    auto bus = makeBus();
    try {
        bus->openDevice(0, 13, 0, 13, 1, 0);
        FAIL();
    } catch (const InstrumentError& e) {
        EXPECT_NE(e.description().find("GPIB address 13"), std::string::npos);
    }
    auto dead = makeTransportBus(
        {{11, "TCPIP0::127.0.0.1::" + std::to_string(unusedPort()) + "::SOCKET"}}, nullptr);
    EXPECT_THROW(dead->openDevice(0, 11, 0, 13, 1, 0), InstrumentError);
    EXPECT_THROW(bus->openDevice(1, 11, 0, 13, 1, 0), InstrumentError);
}

TEST_F(TransportBusTest, WriteThenQueryDoesNotWaitForDelayedAcks) {
    // With Nagle on, every query behind an unacknowledged write waits ~40 ms for the ACK.
    auto bus = makeBus();
    const auto d = bus->openDevice(0, 11, 0, 13, 1, 0);
    const auto start = std::chrono::steady_clock::now();
    std::string buffer;
    for (int i = 0; i < 100; ++i) {
        bus->writeText(d, ":SOUR:PULS:DEL1 1E-06\n");
        bus->writeText(d, "*OPC?\n");
        buffer.assign(2, ' ');
        bus->readText(d, buffer);
        ASSERT_EQ(buffer, "1\n");
    }
    EXPECT_LT(std::chrono::steady_clock::now() - start, 2s);
}

TEST_F(TransportBusTest, FailedOpenIsTraced) {
    auto bus = makeBus();
    EXPECT_THROW(bus->openDevice(0, 13, 0, 13, 1, 0), InstrumentError);
    EXPECT_EQ(trace.lines().back(), "BUS 13 error No bus resource is given for GPIB address 13");
}

TEST_F(TransportBusTest, InvalidDescriptorSetsErr) {
    auto bus = makeBus();
    bus->writeText(42, "*IDN?\n");
    EXPECT_EQ(bus->status(), kErr);
    EXPECT_EQ(bus->addressOf(42), -1);
}

TEST(TimeoutCodes, MatchTheBusLibrary) {
    EXPECT_EQ(transport::timeoutForCode(13), 10s);
    EXPECT_EQ(transport::timeoutForCode(11), 1s);
    EXPECT_EQ(transport::timeoutForCode(9), 100ms);
    EXPECT_EQ(transport::timeoutForCode(17), 1000s);
    EXPECT_EQ(transport::timeoutForCode(99), 10s);
}

}  // namespace
}  // namespace zp::testing
