#include "sim/generators/sim_gpib_bus.h"

#include <gtest/gtest.h>

#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "sim/faults.h"

namespace zp::sim {
namespace {

constexpr std::uint16_t kErr = InstrumentBus::kStatusError;
constexpr std::uint16_t kTimo = InstrumentBus::kStatusTimeout;

class SimGpibBusTest : public ::testing::Test {
  protected:
    SimGpibBusTest() {
        generators[11] = std::make_unique<SimGenerator>(11, "");
        generators[12] = std::make_unique<SimGenerator>(12, "");
    }

    std::int16_t open(int address) { return bus.openDevice(0, address, 0, 13, 1, 0); }
    std::string read(std::int16_t d, std::size_t size = 100) {
        std::string buffer(size, ' ');
        bus.readText(d, buffer);
        return buffer;
    }

    std::map<int, std::unique_ptr<SimGenerator>> generators;
    IoTrace trace;
    SimFaults faults;
    SimGpibBus bus{generators, &trace, &faults};
};

TEST_F(SimGpibBusTest, QueryRoundTripIsTracedOnDistinctDescriptors) {
    const auto d = open(11);
    const auto d12 = open(12);
    const auto again = open(11);
    for (auto x : {d, d12, again}) EXPECT_TRUE(x > 0 && x < 100);
    EXPECT_TRUE(d != d12 && d != again);
    EXPECT_EQ(bus.addressOf(d12), 12);
    EXPECT_EQ(bus.addressOf(999), -1);
    trace.clear();
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(bus.status(), 0);
    EXPECT_EQ(read(d), "Veltrix,PG8102A,SIM11,1.0\n");
    EXPECT_EQ(bus.status(), 0);
    bus.clearDevice(d);
    EXPECT_EQ(trace.lines(), (std::vector<std::string>{"BUS 11 W \"*IDN?\\n\"",
                                                       "BUS 11 R \"Veltrix,PG8102A,SIM11,1.0\\n\"",
                                                       "BUS 11 clear"}));
}

TEST_F(SimGpibBusTest, ReadIsLimitedToTheBufferAndKeepsTheRest) {
    const auto d = open(11);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(read(d, 2), "Ve");
    EXPECT_EQ(read(d), "ltrix,PG8102A,SIM11,1.0\n");
    // Nothing left: the next read times out and leaves the buffer alone.
    EXPECT_EQ(read(d, 5), "     ");
    EXPECT_EQ(bus.status(), kErr | kTimo);
    // A new query drops an unread reply; "*OPC?" fits a two-character buffer.
    bus.writeText(d, "*IDN?\n");
    bus.writeText(d, ":SOUR:PULS:DEL1 2E-06\n");
    bus.writeText(d, "*OPC?\n");
    EXPECT_EQ(read(d, 2), "1\n");
    EXPECT_DOUBLE_EQ(generators[11]->state().outputs[0].delay, 2e-6);
}

TEST_F(SimGpibBusTest, NoListenerFailsTheFirstWrite) {
    const auto d = open(5);  // opens fine, as on a real board
    EXPECT_GT(d, 0);
    EXPECT_EQ(bus.status(), 0);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(bus.status(), kErr);
    EXPECT_EQ(read(d), std::string(100, ' '));
    EXPECT_NE(bus.status() & kErr, 0);
    EXPECT_EQ(trace.lines().at(2), "BUS 5 error no listener");
}

TEST_F(SimGpibBusTest, BadBoardAddressAndDescriptor) {
    EXPECT_THROW(bus.openDevice(1, 11, 0, 13, 1, 0), InstrumentError);
    EXPECT_EQ(bus.openDevice(0, 31, 0, 13, 1, 0), -1);
    EXPECT_EQ(bus.status(), kErr);
    bus.writeText(77, "*IDN?\n");
    EXPECT_EQ(bus.status(), kErr);
    bus.writeText(open(11), "*IDN?\n");
    EXPECT_EQ(bus.status(), 0);  // a good call clears the error
}

TEST_F(SimGpibBusTest, ClearDiscardsPendingReplyButNotErrorQueue) {
    const auto d = open(11);
    bus.writeText(d, ":BOGUS\n*IDN?\n");  // two messages in one write
    bus.clearDevice(d);
    EXPECT_EQ(bus.status(), 0);
    read(d);
    EXPECT_EQ(bus.status(), kErr | kTimo);
    bus.writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "-113,\"Undefined header\"\n");
}

TEST_F(SimGpibBusTest, GeneratorFaultsShowOnTheirAddressOnly) {
    faults.silentGenerators.insert(11);
    faults.timeoutGenerators.insert(12);
    faults.generatorErrors[11] = "-222,\"Data out of range\"";
    const auto d11 = open(11);
    const auto d12 = open(12);
    const auto query = [&](std::int16_t d, const char* text) {
        bus.writeText(d, text);
        EXPECT_EQ(bus.status(), 0) << text;
        const std::string reply = read(d);
        return bus.status() == (kErr | kTimo) ? "timeout" : reply.substr(0, reply.find('\n'));
    };
    // The silent generator times out on identification only; its queued error is there at once.
    EXPECT_EQ(query(d11, "*IDN?\n"), "timeout");
    EXPECT_EQ(trace.lines().back(), "BUS 11 timeout");
    EXPECT_EQ(query(d11, ":SYST:ERR?\n"), "-222,\"Data out of range\"");
    EXPECT_EQ(query(d11, ":SYST:ERR?\n"), "+0,\"No error\"");
    for (const char* q : {"*IDN?\n", "*OPC?\n", ":SYST:ERR?\n"})
        EXPECT_EQ(query(d12, q), "timeout");
    // Writes still reach a timing-out generator.
    bus.writeText(d12, ":OUTP1:STAT ON\n");
    EXPECT_TRUE(generators[12]->state().outputs[0].on);
}

TEST(SimGpibBusUntraced, WorksWithoutTraceOrFaults) {
    std::map<int, std::unique_ptr<SimGenerator>> generators;
    generators[3] = std::make_unique<SimGenerator>(3, "");
    SimGpibBus bus(generators);
    const auto d = bus.openDevice(0, 3, 0, 13, 1, 0);
    bus.writeText(d, "*OPC?\n");
    std::string buffer(100, ' ');
    bus.readText(d, buffer);
    EXPECT_EQ(buffer, "1\n");
}

}  // namespace
}  // namespace zp::sim
