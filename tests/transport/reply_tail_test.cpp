// A reply longer than the reader's buffer: its rest must not pass for the next reply.

#include <gtest/gtest.h>

#include <chrono>

#include "instruments/error_capture.h"
#include "instruments/instrument_bus.h"
#include "instruments/io_trace.h"
#include "scripted_peer.h"
#include "transport/raw_socket_link.h"
#include "transport/transport_factory.h"
#include "transport_test_util.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;
using testing_support::errorOf;
using transport::LinkFailure;
using transport::RawSocketLink;

TEST(ReplyTail, LongIdentificationIsDrainedAndTracedBeforeTheErrorQuery) {
    const std::string identity = "Veltrix,PG8102A,SIM11," + std::string(127, '7');  // 149 chars
    LoopbackBench bench(identity);
    IoTrace trace;
    auto bus = makeTransportBus({{11, bench.resource(11)}}, &trace);
    const auto d = openGenerator(*bus, 11);
    checkIdentification(*bus, d, 11);  // reads 100 of the 150 bytes
    EXPECT_EQ(errorOf([&] { checkInstrumentError(*bus, d, 11); }), "<no error>");
    EXPECT_EQ(trace.lines(), (std::vector<std::string>{
                                 "BUS 11 open",
                                 "BUS 11 W \"*IDN?\\n\"",
                                 "BUS 11 R \"" + identity.substr(0, 100) + "\"",
                                 "BUS 11 drained 50 bytes",
                                 "BUS 11 W \":SYST:ERR?\\n\"",
                                 "BUS 11 R \"+0,\\\"No error\\\"\\n\"",
                             }));
}

// Answers "*IDN?" in two parts 200 ms apart (100 bytes, then 50 with the line feed), "PAIR?"
// the same with the reply "1" behind the rest in one segment, "TWO?" two lines in one segment,
// "*OPC?" with "1".
void splitReplies(ScriptedPeer& peer, int fd) {
    while (!peer.stopping()) {
        const std::string line = peer.readLine(fd);
        if (line == "*IDN?\n" || line == "PAIR?\n") {
            peer.sendText(fd, std::string(100, 'A'));
            peer.pause(200ms);
            peer.sendText(fd, std::string(49, 'B') + (line == "PAIR?\n" ? "\n1\n" : "\n"));
        } else if (line == "TWO?\n") {
            peer.sendText(fd, "first\nsecond\n");
        } else if (line == "*OPC?\n") {
            peer.sendText(fd, "1\n");
        } else if (line.empty()) {
            return;
        }
    }
}

TEST(ReplyTail, WriteWaitsForARestStillOnItsWay) {
    ScriptedPeer peer(splitReplies);
    RawSocketLink link("127.0.0.1", peer.port(), 2s);
    link.write("*IDN?\n");
    EXPECT_EQ(link.read(100), std::string(100, 'A'));
    EXPECT_EQ(link.drainReplies(), 50u);
    link.write("*OPC?\n");
    EXPECT_EQ(link.read(100), "1\n");
    EXPECT_EQ(link.drainReplies(), 0u) << "a reply read to its end leaves nothing";
    // A whole reply that came with the rest answers a query of its own: it stays.
    link.write("PAIR?\n");
    EXPECT_EQ(link.read(100), std::string(100, 'A'));
    EXPECT_EQ(link.drainReplies(), 50u);
    EXPECT_EQ(link.read(100), "1\n");
}

// Clear drops the rest of a reply still on its way and whole replies already received.
TEST(ReplyTail, ReadAfterClearGetsNothingOfEarlierReplies) {
    for (const auto& [query, first] :
         {std::pair<std::string, std::string>{"*IDN?\n", std::string(100, 'A')},
          {"TWO?\n", "first\n"}}) {
        SCOPED_TRACE(query);
        ScriptedPeer peer(splitReplies);
        RawSocketLink link("127.0.0.1", peer.port(), 500ms);
        link.write(query);
        EXPECT_EQ(link.read(100), first);
        link.clear();
        try {
            const std::string text = link.read(100);
            ADD_FAILURE() << "nothing was asked since the clear, yet read \"" << text << "\"";
        } catch (const LinkFailure& e) {
            EXPECT_TRUE(e.timedOut()) << e.what();
        }
    }
}

}  // namespace
}  // namespace zp::testing
