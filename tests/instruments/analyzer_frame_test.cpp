// The procedure frame on the simulated bench: the error rule and the clean-up on every way out,
// read from the I/O trace with the release of the application and bus objects marked in it.

#include <gtest/gtest.h>

#include <functional>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "instruments/analyzer_frame.h"
#include "instruments/apply_support.h"
#include "instruments/probe_bench.h"

namespace zp {
namespace {

using namespace testing_support;

const Lines kSteps = {
    "ANA Channel[1].setIfBandwidth(1000)", "ANA Channel[1].setCwFrequency(1000000000)",
    "ANA Application.setBusSwitch(true)", "BUS 11 open", "BUS 11 W \":OUTP1:STAT ON\\n\""};

// Two analyzer calls, the bus switched on and made, one generator command.
void procedure(AnalyzerFrame& f) {
    f.runStep([&] {
        f.channel().setIfBandwidth(1000);
        f.channel().setCwFrequency(1e9);
    });
    f.openGenerators();
    f.runStep([&] {
        GeneratorSession& g = f.generators();
        g.write(g.open(11), ":OUTP1:STAT ON");
    });
}

void fault(ProbeBench& bench, std::string operation, std::string description, int times = -1) {
    bench.sim().faults().analyzer.push_back({std::move(operation), std::move(description), times});
}

TEST(AnalyzerFrame, EveryWayOutCleansUpInTheFrameOrder) {
    struct Case {
        const char* name;
        std::function<void(ProbeBench&)> arrange;
        std::function<void(AnalyzerFrame&, ProbeBench&)> body;
        Lines timeline;
        std::optional<std::string> failure;
    };
    const auto plain = [](AnalyzerFrame& f, ProbeBench&) { procedure(f); };
    const auto throwInStep = [](AnalyzerFrame& f, ProbeBench&) {
        f.runStep([] { throw std::runtime_error("table row 3 has no address"); });
        procedure(f);
    };
    const Case cases[] = {
        {"normal end", [](ProbeBench&) {}, plain, join({kOpening, kSteps, kBusEnd}), {}},
        {"+143 ends its step only",
         [](ProbeBench& b) { fault(b, "Channel.setIfBandwidth", "+143 Parameter conflict"); },
         plain,
         join({kOpening,
               {"ANA Channel[1].setIfBandwidth(1000) !! +143 Parameter conflict"},
               Lines(kSteps.begin() + 2, kSteps.end()),
               kBusEnd}),
         {}},
        {"error in a step",
         [](ProbeBench& b) { fault(b, "Channel.setCwFrequency", "-222 Data out of range"); }, plain,
         join({kOpening,
               {"ANA Channel[1].setIfBandwidth(1000)",
                "ANA Channel[1].setCwFrequency(1000000000) !! -222 Data out of range"},
               {kBusEnd[0], kBusEnd[1], kBusEnd[3], kBusEnd[4]}}),
         "-222 Data out of range"},
        {"error that is no InstrumentError", [](ProbeBench&) {}, throwInStep,
         join({kOpening, {kBusEnd[0], kBusEnd[1], kBusEnd[3], kBusEnd[4]}}),
         "table row 3 has no address"},
        {"no connection",
         [](ProbeBench& b) { b.connectError.emplace(-5, "-5 No analyzer"); },
         plain,
         {},
         "-5 No analyzer"},
        {"setUpdateSwitch(false) fails",
         [](ProbeBench& b) { fault(b, "Application.setUpdateSwitch", "-200 Execution error", 1); },
         plain,
         {"ANA Application.setUpdateSwitch(false) !! -200 Execution error", kBusEnd[0], kBusEnd[3],
          kBusEnd[4]},
         "-200 Execution error"},
        {"beginChannelSetup fails",
         [](ProbeBench& b) { fault(b, "Channel.beginChannelSetup", "-221 Settings conflict"); },
         plain,
         {kOpening[0], kOpening[1],
          "ANA Channel[1].beginChannelSetup(true) !! -221 Settings conflict", kBusEnd[0],
          kBusEnd[1], kBusEnd[3], kBusEnd[4]},
         "-221 Settings conflict"},
        {"bus object cannot be made",
         [](ProbeBench& b) { b.busError.emplace(1, "GPIB board 0 does not exist"); }, plain,
         join({kOpening,
               Lines(kSteps.begin(), kSteps.begin() + 3),
               {kBusEnd[0], kBusEnd[1], kBusEnd[3], kBusEnd[4]}}),
         "GPIB board 0 does not exist"},
        {"failing setUpdateSwitch(true) on the error path is ignored",
         [](ProbeBench& b) { fault(b, "Channel.setIfBandwidth", "-222 Data out of range"); },
         [](AnalyzerFrame& f, ProbeBench& b) {
             fault(b, "Application.setUpdateSwitch", "-999 Display busy");
             procedure(f);
         },
         join({kOpening,
               {"ANA Channel[1].setIfBandwidth(1000) !! -222 Data out of range",
                "ANA Application.setUpdateSwitch(true) !! -999 Display busy"},
               {kBusEnd[1], kBusEnd[3], kBusEnd[4]}}),
         "-222 Data out of range"},
        {"failing setUpdateSwitch(true) at the normal end is the failure", [](ProbeBench&) {},
         [](AnalyzerFrame& f, ProbeBench& b) {
             procedure(f);
             fault(b, "Application.setUpdateSwitch", "-999 Display busy");
         },
         join({kOpening,
               kSteps,
               {"ANA Application.setUpdateSwitch(true) !! -999 Display busy", kBusEnd[1],
                kBusEnd[2], kBusEnd[3], kBusEnd[4]}}),
         "-999 Display busy"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ProbeBench bench;
        c.arrange(bench);
        std::optional<ProcedureFailure> failure;
        {
            AnalyzerFrame frame(bench, BusUse::Generators);
            c.body(frame, bench);
            failure = frame.finish();
        }
        EXPECT_EQ(bench.timeline(), c.timeline);
        EXPECT_EQ(failure ? std::optional(failure->description) : std::nullopt, c.failure);
    }
}

TEST(AnalyzerFrame, DestructorClosesWhenFinishIsMissingOrAnExceptionPasses) {
    ProbeBench left;
    {
        AnalyzerFrame frame(left);
        frame.runStep([&] { frame.channel().setIfBandwidth(1000); });
    }
    EXPECT_EQ(left.timeline(),
              join({kOpening, {kSteps[0], kBusEnd[0], kBusEnd[1], "release Application"}}));

    // While an exception passes, clean-up failures are ignored and it goes on to the end.
    ProbeBench thrown;
    fault(thrown, "Channel.endChannelSetup", "-200 Execution error");
    EXPECT_THROW(
        {
            AnalyzerFrame frame(thrown, BusUse::Generators);
            frame.openGenerators();
            throw std::out_of_range("row 9");
        },
        std::out_of_range);
    EXPECT_EQ(thrown.timeline(), join({kOpening,
                                       {kSteps[2], kBusEnd[0],
                                        "ANA Channel[1].endChannelSetup() !! -200 Execution error",
                                        kBusEnd[2], kBusEnd[3], kBusEnd[4]}}));
}

TEST(AnalyzerFrame, NothingRunsAfterTheFailure) {
    ProbeBench bench;
    fault(bench, "Channel.setIfBandwidth", "-113 Undefined header");
    AnalyzerFrame frame(bench);
    int ran = 0;
    EXPECT_TRUE(frame.runStep([&] { ++ran; }));
    EXPECT_FALSE(frame.runStep([&] { frame.channel().setIfBandwidth(1); }));
    EXPECT_FALSE(frame.runStep([&] { ++ran; }));
    EXPECT_EQ(ran, 1);
    ASSERT_TRUE(frame.failed());
    EXPECT_EQ(frame.failure()->number, -113);
    const std::size_t lines = bench.timeline().size();
    EXPECT_EQ(frame.finish()->description, "-113 Undefined header");
    EXPECT_GT(bench.timeline().size(), lines);
    EXPECT_EQ(frame.finish()->description, "-113 Undefined header");
    EXPECT_EQ(bench.timeline().size(), lines + 3) << "a second finish touches nothing";
    EXPECT_THROW(frame.runStep([] {}), std::logic_error);
    EXPECT_THROW(AnalyzerFrame(bench).openGenerators(), std::logic_error);
}

TEST(AnalyzerFrame, FailuresOtherThanAnalyzerErrorsHaveNumberZero) {
    const std::pair<std::function<void()>, std::string> cases[] = {
        {[] { throw std::runtime_error("row 3"); }, "row 3"},
        {[] { throw 42; }, "An unknown error ended the procedure."},
    };
    for (const auto& [step, text] : cases) {
        ProbeBench bench;
        AnalyzerFrame frame(bench);
        frame.runStep(step);
        ASSERT_TRUE(frame.failed());
        EXPECT_EQ(frame.failure()->number, 0);
        EXPECT_EQ(frame.failure()->description, text);
    }
}

}  // namespace
}  // namespace zp
