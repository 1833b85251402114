#include <gtest/gtest.h>

#include "instruments/error_capture.h"
#include "instruments/instrument_bus.h"
#include "instruments/instrument_error.h"
#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/sim_bench.h"

namespace zp::sim {
namespace {

using testing_support::errorOf;

TEST(SimFaultsTest, ParsesEveryAcceptedForm) {
    SimFaults f;
    f.add("analyzer:Channel.setIfBandwidth=+143 Parameter conflict");
    f.add("noidn:12");
    f.add("generror:13=-222,\"Data out of range\"");
    f.add("timeout:11");
    f.add("baddata");
    ASSERT_EQ(f.analyzer.size(), 1u);
    EXPECT_EQ(f.analyzer[0].operation, "Channel.setIfBandwidth");
    EXPECT_EQ(f.analyzer[0].description, "+143 Parameter conflict");
    EXPECT_EQ(f.analyzer[0].remaining, -1);
    EXPECT_EQ(f.silentGenerators, (std::set<int>{12}));
    EXPECT_EQ(f.generatorErrors.at(13), "-222,\"Data out of range\"");
    EXPECT_EQ(f.timeoutGenerators, (std::set<int>{11}));
    EXPECT_TRUE(f.malformedData);
}

TEST(SimFaultsTest, RejectsBadFaultsListingTheAcceptedForms) {
    for (const char* bad :
         {"", "bogus", "analyzer:", "analyzer:setIfBandwidth=x",
          "analyzer:Channel.set=", "analyzer:Channel[1].setIfBandwidth=x", "noidn:", "noidn:abc",
          "noidn:31", "timeout:-1", "generror:12", "generror:12=", "baddata:1", "noidn"}) {
        SimFaults f;
        try {
            f.add(bad);
            ADD_FAILURE() << "accepted '" << bad << "'";
        } catch (const std::invalid_argument& e) {
            EXPECT_NE(std::string(e.what()).find("analyzer:Object.operation=DESCRIPTION, "
                                                 "noidn:ADDR, generror:ADDR=ENTRY, "
                                                 "timeout:ADDR, baddata"),
                      std::string::npos)
                << e.what();
        }
        EXPECT_TRUE(f.analyzer.empty() && f.silentGenerators.empty() && !f.malformedData)
            << "a rejected fault changes nothing: " << bad;
    }
}

TEST(SimFaultsAppliedTest, AnalyzerOperationFailsWithTheGivenDescription) {
    SimBench bench;
    bench.faults().add("analyzer:Channel.setIfBandwidth=+143 Parameter conflict");
    auto ch = bench.connectAnalyzer()->currentChannel();
    long number = 0;
    EXPECT_EQ(errorOf([&] { ch->setIfBandwidth(500); }, &number), "+143 Parameter conflict");
    EXPECT_EQ(number, 143);
    EXPECT_DOUBLE_EQ(bench.analyzer().channel(1).ifBandwidth, 1e3) << "the failed call set nothing";
    EXPECT_EQ(bench.trace()->lines().back(),
              "ANA Channel[1].setIfBandwidth(500) !! +143 Parameter conflict");
    // Other operations of the object still work.
    EXPECT_NO_THROW(ch->setCwFrequency(1e9));

    // A fault with a count fails only so many calls.
    bench.faults().analyzer.push_back({"CommandParser.parse", "-200 Execution error", 1});
    auto parser = bench.connectAnalyzer()->commandParser();
    EXPECT_EQ(errorOf([&] { parser->parse("CALC1:PAR:CAT?"); }), "-200 Execution error");
    EXPECT_EQ(parser->parse("CALC1:PAR:CAT?"), "\"CH1_S11_1,S11\"\n");
}

TEST(SimFaultsAppliedTest, BadDataTruncatesAndGarblesTheDataReply) {
    SimBench bench;
    auto app = bench.connectAnalyzer();
    app->currentChannel()->copyToChannel(32);
    app->currentChannel()->setNumberOfPoints(11);
    auto parser = app->commandParser();
    parser->parse("CALC32:PAR:DEF 'PIP_MEAS',S21");
    parser->parse("CALC32:PAR:SEL 'PIP_MEAS'");
    ASSERT_EQ(parser->parse("CALC32:DATA? SDATA").size(), 440u);
    bench.faults().add("baddata");
    const std::string reply = parser->parse("CALC32:DATA? SDATA");
    EXPECT_LT(reply.size(), 440u);
    EXPECT_NE(reply.size() % 40, 0u) << "cut inside a field";
    EXPECT_EQ(reply[4], '#');
    EXPECT_EQ(reply.back(), '\n');
}

TEST(SimFaultsAppliedTest, GeneratorFaultsReachTheSimulatedBus) {
    SimBench bench;
    bench.faults().add("noidn:12");
    bench.faults().add("generror:13=-222,\"Data out of range\"");
    bench.faults().add("timeout:11");
    auto bus = bench.createBus();
    const auto check = [&](int address, bool identification) {
        const auto d = openGenerator(*bus, address);
        return errorOf([&] {
            identification ? checkIdentification(*bus, d, address)
                           : checkInstrumentError(*bus, d, address);
        });
    };
    EXPECT_EQ(check(12, true), "Error reading from signal generator at address 12");
    EXPECT_EQ(check(12, false), "<no error>");
    EXPECT_EQ(check(13, true), "<no error>");
    EXPECT_EQ(check(13, false),
              "Pulse Generator at address 13 generated the following error: "
              "-222,\"Data out of range\"\n");
    EXPECT_EQ(check(11, true), "Error reading from signal generator at address 11");
}

TEST(SimTraceTest, AnalyzerCallsAreTracedWithArgumentsAndReplies) {
    SimBench bench;
    auto app = bench.connectAnalyzer();
    bench.trace()->clear();
    auto ch = app->currentChannel();
    ch->setIfBandwidth(1000);
    ch->pulseGenerator()->setWidth(1, 1.5e-6);
    ch->pathConfiguration()->element("IFGateA")->setValue("Pulse2");
    ch->ifConfiguration()->setIfSwitchA(true);
    ch->signalProcessingModule()->setCoefficientsA({1, 2});
    app->messageArea()->setText("Pulsed IFBW setting is 1000 Hz");
    app->commandParser()->parse("CALC1:PAR:CAT?");
    app->hardwareInfo()->portCount();
    app->channels()->count();
    (void)ch->getSupportedALCModes(1);
    EXPECT_THROW(app->commandParser()->parse("BAD"), InstrumentError);
    EXPECT_EQ(bench.trace()->lines(),
              (std::vector<std::string>{
                  "ANA Application.currentChannel()",
                  "ANA Channel[1].setIfBandwidth(1000)",
                  "ANA Channel[1].pulseGenerator()",
                  "ANA PulseGenerator[1].setWidth(1, 1.5E-06)",
                  "ANA Channel[1].pathConfiguration()",
                  "ANA PathConfiguration[1].element(\"IFGateA\")",
                  "ANA PathElement[1:IFGateA].setValue(\"Pulse2\")",
                  "ANA Channel[1].ifConfiguration()",
                  "ANA IFConfiguration[1].setIfSwitchA(true)",
                  "ANA Channel[1].signalProcessingModule()",
                  "ANA SignalProcessingModuleFour[1].setCoefficientsA({1, 2})",
                  "ANA Application.messageArea()",
                  "ANA MessageArea.setText(\"Pulsed IFBW setting is 1000 Hz\")",
                  "ANA Application.commandParser()",
                  "ANA CommandParser.parse(\"CALC1:PAR:CAT?\") -> \"\\\"CH1_S11_1,S11\\\"\\n\"",
                  "ANA Application.hardwareInfo()",
                  "ANA Caps.portCount() -> 2",
                  "ANA Application.channels()",
                  "ANA Channels.count() -> 1",
                  "ANA Channel[1].getSupportedALCModes(1) -> {\"INTernal\", \"EXTernal\", "
                  "\"OPENloop\"}",
                  "ANA Application.commandParser()",
                  "ANA CommandParser.parse(\"BAD\") !! -113 Undefined header",
              }));
}

}  // namespace
}  // namespace zp::sim
