#include "sim/scpi_server.h"

#include <gtest/gtest.h>

#include <chrono>
#include <stdexcept>

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
