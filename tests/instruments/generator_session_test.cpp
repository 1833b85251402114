// The generator session on the simulated bench's generators.

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

#include "instruments/error_capture.h"
#include "instruments/generator_session.h"
#include "sim/sim_bench.h"

namespace zp {
namespace {

using testing_support::errorOf;

TEST(GeneratorSession, CommandsGetTheirLineFeedAndQueriesReturnTheReply) {
    sim::SimBench bench;
    GeneratorSession session(bench);
    const GeneratorDescriptor g = session.open(12);
    EXPECT_EQ(g.address, 12);
    session.checkIdentification(g);
    session.write(g, ":SOUR:FREQ 5000");
    EXPECT_EQ(session.query(g, ":SOUR:FREQ?"), "5000\n");
    session.checkErrorQueue(g);
    EXPECT_EQ(bench.trace()->lines(), (std::vector<std::string>{
                                          "BUS 12 open",
                                          "BUS 12 W \"*IDN?\\n\"",
                                          "BUS 12 R \"Veltrix,PG8102A,SIM12,1.0\\n\"",
                                          "BUS 12 W \":SOUR:FREQ 5000\\n\"",
                                          "BUS 12 W \":SOUR:FREQ?\\n\"",
                                          "BUS 12 R \"5000\\n\"",
                                          "BUS 12 W \":SYST:ERR?\\n\"",
                                          "BUS 12 R \"+0,\\\"No error\\\"\\n\"",
                                      }));
}

// The checks themselves are tested with generator_checks; here, that they get the address.
TEST(GeneratorSession, FailuresNameTheAddress) {
    sim::SimFaults faults;
    faults.add("timeout:12");
    faults.add("generror:13=-222,\"Data out of range\"");
    sim::SimBench bench("kt622", faults);
    GeneratorSession session(bench);
    long number = 0;
    EXPECT_EQ(errorOf([&] { session.query(session.open(12), "*OPC?"); }, &number),
              "Error reading from signal generator at address 12");
    EXPECT_EQ(number, kOwnCheckError);
    EXPECT_EQ(errorOf([&] { session.checkErrorQueue(session.open(13)); }),
              "Pulse Generator at address 13 generated the following error: -222,\"Data out of "
              "range\"\n");
}

TEST(GeneratorSession, BadCommandsAndMissingBus) {
    sim::SimBench bench;
    GeneratorSession session(bench);
    const GeneratorDescriptor g = session.open(11);
    for (const char* bad : {"*RST\n", ":OUTP1 ON\r", ""}) {
        EXPECT_THROW(session.write(g, bad), std::invalid_argument) << bad;
    }
    // A write is not checked on its own: nobody listens at 20, the read that follows fails.
    const GeneratorDescriptor nobody = session.open(20);
    EXPECT_NO_THROW(session.write(nobody, "*RST"));
    EXPECT_EQ(errorOf([&] { session.query(nobody, "*IDN?"); }),
              "Error reading from signal generator at address 20");
    EXPECT_EQ(errorOf([] { GeneratorSession none(std::unique_ptr<InstrumentBus>{}); }),
              "The generator bus cannot be created.");
}

}  // namespace
}  // namespace zp
