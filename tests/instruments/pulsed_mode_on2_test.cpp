// Pulsed mode on with the analyzer's internal hardware, read from the I/O trace.

#include <gtest/gtest.h>

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "instruments/apply_support.h"
#include "instruments/probe_bench.h"

namespace zp {
namespace {

using namespace testing_support;
using Calls = std::vector<std::pair<double, double>>;

ApplySnapshot withSolver(std::string_view model, Calls& calls) {
    ApplySnapshot s = snapshotFor(model);
    s.solver = [&calls] { return std::make_unique<RecordingSolver>(calls); };
    return s;
}

TEST(PulsedModeOn2, TwoPortWithModulatorAndSoftwareGating) {
    Calls calls;
    ApplySnapshot s = withSolver("kt622", calls);
    for (int r : {2, 3, 4})
        changeRow(s, r, [&](PGRow& row) { row.intPGOutput = std::min(r + 1, 4); });
    changeRow(s, 3, [](PGRow& row) { row.enabled = kUnchecked; });
    s.entries.widths = {1e-6, 1.234e-6, 5e-7, 6e-7, 8e-7};
    s.entries.delays = {0, 2e-7, 1e-7, 0, 0};
    s.state.ReceiverGains = {3, 3, 0, 1};  // A, R1, R2, B
    ProbeBench bench;
    const ApplyResult result = SPulsedModeOn2(bench, s);
    EXPECT_FALSE(result.failure);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_on2_two_port.txt"));
    EXPECT_EQ(result.acceptedWidths,
              (std::vector<std::optional<double>>{1e-6, 1.23e-6, 5e-7, std::nullopt, 8e-7}));
    EXPECT_EQ(calls, (Calls{{10000, 1.23e-6}, {10000, 6e-7}}));
    EXPECT_EQ(result.rxSolveValues, (std::vector<std::int16_t>{123, 0, 60, 0}));
}

TEST(PulsedModeOn2, ProcessingFilterFollowsGatingAndClock) {
    const Lines rect = {"setProcessingRate(2500)",
                        "setCoefficientsA({4, 1})",
                        "setFilterType(\"RECT\")",
                        "setFilterParameter(\"C\", 7)",
                        "PulseGenerator[1].setState(0, false)",
                        "setProcessingSwitch(1)"};
    struct Case {
        const char* model;
        bool noSWGating;
        double gatedTime2;
        Lines calls;
    };
    const Case cases[] = {
        {"kt622", true, 2e-6, rect},
        {"kt622", false, 0.0, rect},
        {"kt633",
         false,
         3e-6,  // 60 MHz clock: coefficients B, a generator 0 one tick wide
         {"setProcessingRate(2500)", "setCoefficientsA({4, 1})", "setCoefficientsB({3, 2})",
          "setFilterType(\"PWIN\")", "setFilterParameter(\"C\", 7)",
          "setFilterParameter(\"P\", 0.0001)", "setFilterParameter(\"D\", 1E-06)",
          "setFilterParameter(\"W\", 3E-06)", "setFilterParameter(\"R\", 200)",
          "PulseGenerator[1].setWidth(0, 1.66666666666667E-08)", "PulseGenerator[1].setDelay(0, 0)",
          "PulseGenerator[1].setState(0, true)", "setProcessingSwitch(1)"}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.model + std::string(c.noSWGating ? " no SW gating" : ""));
        ApplySnapshot s = snapshotFor(c.model);
        s.mode.noSWGating = c.noSWGating;
        s.state.GatedSolveTime2 = c.gatedTime2;
        s.state.PulseClockHz = isTrue(s.state.HasClock100MHz) ? 1e8 : 6e7;
        sim::SimBench bench(c.model);
        EXPECT_FALSE(SPulsedModeOn2(bench, s).failure);
        Lines got;
        for (std::string l :
             linesWith(bench.trace()->lines(), {"SignalProcessingModuleFour[1].set", "(0, "})) {
            const std::string module = "ANA SignalProcessingModuleFour[1].";
            got.push_back(l.rfind(module, 0) == 0 ? l.substr(module.size()) : l.substr(4));
        }
        EXPECT_EQ(got, c.calls);
    }
}

// Routing, attenuators, modulator enables and leveling differ by model.
TEST(PulsedModeOn2, EachModelGetsItsOwnRoutingAttenuatorsAndEnables) {
    struct Case {
        const char* name;
        const char* model;
        std::function<void(ApplySnapshot&)> arrange;
        Lines routing;  // "element=value", "element?" for a read
        Lines attenuators;
        Lines enables;
        int levelingPorts;
    };
    const Case cases[] = {
        {"four-port with modulators: reference gates copy the last row's routing",
         "kt655",
         [](ApplySnapshot& s) {
             s.state.ReceiverGains = {0, 1, 2, 3, 3, 0, 0, 0};  // R2 to R4 follow R1
             s.entries.widths = {1e-6, 1e-6, 1e-6, 1e-6, 4e-7, 5e-7};
         },
         {"PulseModDrive=Pulse1", "IFGateA=Pulse2", "IFGateB=Pulse2", "IFGateC=Pulse2",
          "IFGateD=Pulse2", "IFGateR1=Pulse2", "IFGateR1?", "IFGateR2=Pulse2", "IFGateR1?",
          "IFGateR3=Pulse2", "IFGateR1?", "IFGateR4=Pulse2"},
         {"NBFATNA=30", "NBFATNB=15", "NBFATNC=0", "NBFATND=40", "NBFATNR1=50", "NBFATNR2=50",
          "NBFATNR3=50", "NBFATNR4=50"},
         {"Src1Out1PulseModEnable=Enable", "Src2Out1PulseModEnable=Enable"},
         4},
        {"four-port without modulators, last row disabled",
         "kt644",
         [](ApplySnapshot& s) {
             changeRow(s, 5, [](PGRow& r) { r.enabled = kUnchecked; });
             s.state.ReceiverGains.assign(8, 2);
         },
         {"IFGateA=Pulse2", "IFGateB=Pulse2", "IFGateC=Pulse2", "IFGateD=Pulse2", "IFGateR1=ON",
          "IFGateR2=ON", "IFGateR3=ON", "IFGateR4=ON"},
         {"NBFATNA=0", "NBFATNB=0", "NBFATNC=0", "NBFATND=0", "NBFATNR1=0", "NBFATNR2=0",
          "NBFATNR3=0", "NBFATNR4=0"},
         {},
         4},
        {"two-port without internal modulators: the source element is left alone",
         "kt622",
         [](ApplySnapshot& s) {
             s.state.HasInternalMod = kFalse;
             s.state.ReceiverGains = {0, 0, 0, 1};  // a manual gain on B sets NBFATNB
         },
         {"IFGateA=Pulse2", "IFGateB=Pulse2", "IFGateR1=Pulse2", "IFGateR2=Pulse2"},
         {"NBFATNA=30", "NBFATNB=15", "NBFATNR1=30", "NBFATNR2=30"},
         {"Src1Out1PulseModEnable=Enable"},  // this analyzer has no Src2Out1PulseModEnable
         2},
        {"no pulse generators: no routing, the rest as usual",
         "kt622",
         [](ApplySnapshot& s) { s.mode.noPG = true; },
         {},
         {"NBFATNA=100", "NBFATNB=100", "NBFATNR1=100", "NBFATNR2=100"},
         {"Src1Out1PulseModEnable=Enable"},
         2},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Calls calls;
        ApplySnapshot s = withSolver(c.model, calls);
        c.arrange(s);
        sim::SimBench bench(c.model);
        EXPECT_FALSE(SPulsedModeOn2(bench, s).failure);
        const Lines settings = elementSettings(bench.trace()->lines());
        EXPECT_EQ(settingsOf(settings, {"IFGate", "PulseModDrive"}), c.routing);
        EXPECT_EQ(settingsOf(settings, {"NBFATN"}), c.attenuators);
        EXPECT_EQ(settingsOf(settings, {"PulseModEnable"}), c.enables);
        EXPECT_EQ(linesWith(bench.trace()->lines(), {"setALCLevelingMode"}).size(),
                  static_cast<std::size_t>(c.levelingPorts));
    }
}

TEST(PulsedModeOn2, ASkippedWidthReadKeepsTheEntryAndTheRestRuns) {
    ApplySnapshot s = snapshotFor("kt622");
    ProbeBench bench;
    bench.sim().faults().analyzer.push_back({"PulseGenerator.width", "+106 Query interrupted", 1});
    const ApplyResult result = SPulsedModeOn2(bench, s);
    EXPECT_FALSE(result.failure);
    EXPECT_EQ(result.acceptedWidths[0], std::nullopt);
    EXPECT_EQ(result.acceptedWidths[4], 1e-6);
    const Lines timeline = bench.timeline();
    EXPECT_EQ(Lines(timeline.end() - 3, timeline.end()), kEnd);
}

// A value outside its list stops the procedure where it is used, with a message naming it.
TEST(PulsedModeOn2, ValuesOutsideTheirListsStopTheProcedure) {
    struct Case {
        const char* procedure;
        std::function<void(ApplySnapshot&)> arrange;
        std::string failure;
        std::string lastCall;  // the last call before the frame's end
    };
    const Case cases[] = {
        {"on2", [](ApplySnapshot& s) { changeRow(s, 2, [](PGRow& r) { r.intPGOutput = 5; }); },
         "Table row 2 names internal pulse generator 5; the internal pulse generators are 1 to 4.",
         "ANA PulseGenerator[1].setState(2, true)"},
        {"on2", [](ApplySnapshot& s) { s.state.ReceiverGains[3] = 4; },
         "Receiver B has gain code 4; the gain codes are 0 (Low), 1 (Medium), 2 (High) and 3 "
         "(Auto).",
         "ANA PathElement[1:NBFATNA].setValue(\"100\")"},
        {"on", [](ApplySnapshot& s) { s.state.ReceiverGains[1] = -1; },
         "Receiver R1 has gain code -1; the gain codes are 0 (Low), 1 (Medium), 2 (High) and 3 "
         "(Auto).",
         "ANA IFConfiguration[1].setReceiverGain(\"A\", 1)"},
        {"off2", [](ApplySnapshot& s) { changeRow(s, 1, [](PGRow& r) { r.intPGOutput = 0; }); },
         "Table row 1 names internal pulse generator 0; the internal pulse generators are 1 to 4.",
         "ANA PathElement[1:PulseModDrive].setValue(\"ON\")"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.failure);
        Calls calls;
        ApplySnapshot s = withSolver("kt622", calls);
        s.mode.noPG = std::string(c.procedure) == "on";
        c.arrange(s);
        sim::SimBench bench;
        const std::string p = c.procedure;
        const ApplyResult result = p == "on"    ? SPulsedModeOn(bench, s)
                                   : p == "on2" ? SPulsedModeOn2(bench, s)
                                                : SPulsedModeOff2(bench, s);
        ASSERT_TRUE(result.failure);
        EXPECT_EQ(result.failure->number, kOwnCheckError);
        EXPECT_EQ(result.failure->description, c.failure);
        const Lines lines = bench.trace()->lines();
        const std::size_t endLines = p == "on" ? 3 : 2;
        ASSERT_GT(lines.size(), endLines);
        EXPECT_EQ(lines[lines.size() - endLines - 1], c.lastCall);
    }
}

}  // namespace
}  // namespace zp
