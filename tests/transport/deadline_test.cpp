// Every bus call has one deadline, however slowly the peer moves data.

#include <gtest/gtest.h>

#include <chrono>
#include <vector>

#include "instruments/error_capture.h"
#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "scripted_peer.h"
#include "transport/raw_socket_link.h"
#include "transport/transport_factory.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;
using testing_support::errorOf;
using transport::LinkFailure;
using transport::RawSocketLink;

// Room for a loaded build machine; the overshoot itself is a few milliseconds.
constexpr auto kMargin = 400ms;

long long millis(Clock::duration d) {
    return std::chrono::duration_cast<std::chrono::milliseconds>(d).count();
}

std::string socketResource(int port) {
    return "TCPIP0::127.0.0.1::" + std::to_string(port) + "::SOCKET";
}

TEST(Deadlines, TrickledReplyTimesOutAtTheDeadlineAndClosesTheLink) {
    // One byte every 150 ms never completes a line; each byte used to restart the wait.
    ScriptedPeer peer([](ScriptedPeer& p, int fd) {
        p.readLine(fd);
        for (int i = 0; i < 40 && p.sendText(fd, "x") && p.pause(150ms); ++i) {
        }
    });
    IoTrace trace;
    auto bus = makeTransportBus({{11, socketResource(peer.port())}}, &trace);
    const auto d = bus->openDevice(0, 11, 0, 11, 1, 0);  // code 11: 1 s
    bus->writeText(d, "*IDN?\n");
    std::string buffer(100, ' ');
    const auto start = Clock::now();
    bus->readText(d, buffer);
    const auto took = Clock::now() - start;
    EXPECT_EQ(bus->status(), InstrumentBus::kStatusError | InstrumentBus::kStatusTimeout);
    EXPECT_EQ(buffer, std::string(100, ' '));
    EXPECT_GE(took, 1s);
    EXPECT_LT(took, 1s + kMargin) << millis(took) << " ms";
    RecordProperty("overshoot_ms", std::to_string(millis(took - 1s)));

    // The bytes that did come are not kept for a later read: the link is closed.
    bus->writeText(d, "*IDN?\n");
    EXPECT_EQ(bus->status(), InstrumentBus::kStatusError);
    const std::string peerText = "127.0.0.1:" + std::to_string(peer.port());
    EXPECT_EQ(trace.lines().back(), "BUS 11 error the connection to " + peerText +
                                        " is closed (read from " + peerText +
                                        " timed out); clear the device or open it again");
}

TEST(Deadlines, WriteToAPeerThatReadsSlowlyTimesOutAtTheDeadline) {
    // Reads 64 KiB every 100 ms for 3 s, then nothing: each read used to restart the wait.
    ScriptedPeer peer([](ScriptedPeer& p, int fd) {
        std::vector<char> sink(64 * 1024);
        for (int i = 0; i < 30 && p.pause(100ms); ++i) {
            ::recv(fd, sink.data(), sink.size(), MSG_DONTWAIT);
        }
    });
    RawSocketLink link("127.0.0.1", peer.port(), 1s);
    const std::string big(32u << 20, 'x');  // more than both socket buffers hold
    const auto start = Clock::now();
    try {
        link.write(big);
        ADD_FAILURE() << "32 MiB written to a peer that hardly reads";
    } catch (const LinkFailure& e) {
        EXPECT_TRUE(e.timedOut()) << e.what();
    }
    const auto took = Clock::now() - start;
    EXPECT_GE(took, 1s);
    EXPECT_LT(took, 1s + kMargin) << millis(took) << " ms";
    RecordProperty("overshoot_ms", std::to_string(millis(took - 1s)));
    EXPECT_FALSE(link.isOpen()) << "half a text was sent; the stream cannot be used any more";
}

TEST(Deadlines, ConnectGivesUpAtItsDeadline) {
    ScriptedPeer full(nullptr, AF_INET, 0);
    ASSERT_TRUE(full.listening());
    RawSocketLink filler("127.0.0.1", full.port(), 1s);  // takes the only place in the queue
    const auto start = Clock::now();
    const std::string error = errorOf([&] { RawSocketLink("127.0.0.1", full.port(), 10s, 300ms); });
    const auto took = Clock::now() - start;
    EXPECT_EQ(error, "Cannot connect to 127.0.0.1:" + std::to_string(full.port()) +
                         ": connection timed out");
    EXPECT_GE(took, 300ms);
    EXPECT_LT(took, 300ms + kMargin) << millis(took) << " ms";
    RecordProperty("overshoot_ms", std::to_string(millis(took - 300ms)));
}

}  // namespace
}  // namespace zp::testing
