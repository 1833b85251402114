#include "sim/sim_gpib_bus.h"

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

TEST_F(SimGpibBusTest, QueryRoundTripIsTraced) {
    const auto d = open(11);
    EXPECT_GT(d, 0);
    EXPECT_EQ(bus.addressOf(d), 11);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(bus.status(), 0);
    EXPECT_EQ(read(d), "Veltrix,PG8102A,SIM11,1.0\n");
    EXPECT_EQ(bus.status(), 0);
    bus.clearDevice(d);
    const std::vector<std::string> expected = {"BUS 11 open", "BUS 11 W \"*IDN?\\n\"",
                                               "BUS 11 R \"Veltrix,PG8102A,SIM11,1.0\\n\"",
                                               "BUS 11 clear"};
    EXPECT_EQ(trace.lines(), expected);
}

TEST_F(SimGpibBusTest, DescriptorsAreDistinctSmallAndPositive) {
    const auto a = open(11);
    const auto b = open(12);
    const auto c = open(11);
    EXPECT_NE(a, b);
    EXPECT_NE(a, c);
    for (auto d : {a, b, c}) EXPECT_TRUE(d > 0 && d < 100);
    EXPECT_EQ(bus.addressOf(b), 12);
    EXPECT_EQ(bus.addressOf(999), -1);
}

TEST_F(SimGpibBusTest, ReadIsLimitedToTheBufferAndKeepsTheRest) {
    const auto d = open(11);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(read(d, 2), "Ve");
    EXPECT_EQ(read(d), "ltrix,PG8102A,SIM11,1.0\n");
    // Nothing left: the next read times out and leaves the buffer alone.
    std::string buffer(5, 'x');
    bus.readText(d, buffer);
    EXPECT_EQ(bus.status(), kErr | kTimo);
    EXPECT_EQ(buffer, "xxxxx");
}

TEST_F(SimGpibBusTest, OpcHandshakeFitsTwoCharacterBuffer) {
    const auto d = open(12);
    bus.writeText(d, ":SOUR:PULS:DEL1 2E-06\n");
    bus.writeText(d, "*OPC?\n");
    EXPECT_EQ(read(d, 2), "1\n");
    EXPECT_DOUBLE_EQ(generators[12]->state().outputs[0].delay, 2e-6);
}

TEST_F(SimGpibBusTest, NewQueryDiscardsUnreadReply) {
    const auto d = open(11);
    bus.writeText(d, "*IDN?\n");
    bus.writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "+0,\"No error\"\n");
}

TEST_F(SimGpibBusTest, NoListenerFailsTheFirstWrite) {
    const auto d = open(5);  // opens fine, as on a real board
    EXPECT_GT(d, 0);
    EXPECT_EQ(bus.status(), 0);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(bus.status(), kErr);
    std::string buffer(100, ' ');
    bus.readText(d, buffer);
    EXPECT_NE(bus.status() & kErr, 0);
    EXPECT_EQ(buffer, std::string(100, ' '));
    const auto lines = trace.lines();
    ASSERT_GE(lines.size(), 3u);
    EXPECT_EQ(lines[0], "BUS 5 open");
    EXPECT_EQ(lines[1], "BUS 5 W \"*IDN?\\n\"");
    EXPECT_EQ(lines[2], "BUS 5 error no listener");
}

TEST_F(SimGpibBusTest, SilentGeneratorTimesOutOnIdentificationOnly) {
    faults.silentGenerators.insert(11);
    const auto d = open(11);
    bus.writeText(d, "*IDN?\n");
    EXPECT_EQ(bus.status(), 0);
    read(d);
    EXPECT_EQ(bus.status(), kErr | kTimo);
    EXPECT_EQ(trace.lines().back(), "BUS 11 timeout");
    bus.writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "+0,\"No error\"\n");
}

TEST_F(SimGpibBusTest, TimeoutGeneratorTimesOutOnEveryRead) {
    faults.timeoutGenerators.insert(12);
    const auto d = open(12);
    for (const char* q : {"*IDN?\n", "*OPC?\n", ":SYST:ERR?\n"}) {
        bus.writeText(d, q);
        EXPECT_EQ(bus.status(), 0);
        read(d);
        EXPECT_EQ(bus.status(), kErr | kTimo) << q;
    }
    // Writes still reach the generator.
    bus.writeText(d, ":OUTP1:STAT ON\n");
    EXPECT_TRUE(generators[12]->state().outputs[0].on);
}

TEST_F(SimGpibBusTest, QueuedErrorIsPushedWhenTheDeviceOpens) {
    faults.generatorErrors[11] = "-222,\"Data out of range\"";
    EXPECT_TRUE(generators[11]->state().errorQueue.empty());
    const auto d = open(11);
    bus.writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "-222,\"Data out of range\"\n");
    bus.writeText(d, ":SYST:ERR?\n");
    EXPECT_EQ(read(d), "+0,\"No error\"\n");
    // Generator 12 is not affected.
    const auto d12 = open(12);
    bus.writeText(d12, ":SYST:ERR?\n");
    EXPECT_EQ(read(d12), "+0,\"No error\"\n");
}

TEST_F(SimGpibBusTest, BadBoardAddressAndDescriptor) {
    EXPECT_THROW(bus.openDevice(1, 11, 0, 13, 1, 0), InstrumentError);
    EXPECT_EQ(bus.openDevice(0, 31, 0, 13, 1, 0), -1);
    EXPECT_EQ(bus.status(), kErr);
    bus.writeText(77, "*IDN?\n");
    EXPECT_EQ(bus.status(), kErr);
    const auto d = open(11);
    bus.writeText(d, "*IDN?\n");
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
