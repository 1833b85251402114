// Pulsed mode off on both paths, read from the I/O trace.

#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "instruments/apply_support.h"
#include "instruments/probe_bench.h"

namespace zp {
namespace {

using namespace testing_support;

TEST(PulsedModeOff, OnlyTheUsedOutputsGoOffThenTheIfGating) {
    ApplySnapshot s = snapshotFor("zx20-j55");  // internal gates: their switch goes off too
    changeRow(s, 3, [](PGRow& r) { r.enabled = kUnchecked; });
    ProbeBench bench("zx20-j55");
    const ApplyResult result = SPulsedModeOff(bench, s);
    EXPECT_FALSE(result.failure);
    EXPECT_EQ(result.generatorRows, 4);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_off_used_outputs.txt"));
}

TEST(PulsedModeOff, NoPGStillMakesAndReleasesTheBus) {
    ApplySnapshot s = snapshotFor("zx20-j55");
    s.mode.noPG = true;
    s.mode.converterMeas = true;
    ProbeBench bench("zx20-j55");
    EXPECT_FALSE(SPulsedModeOff(bench, s).failure);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_off_no_pg.txt"));
}

TEST(PulsedModeOff, AGeneratorErrorLeavesLaterRowsOnAndTheIfGating) {
    ApplySnapshot s = snapshotFor("kt622");
    ProbeBench bench;
    bench.sim().faults().generatorErrors[12] = "-222,\"Data out of range\"";
    const ApplyResult result = SPulsedModeOff(bench, s);
    ASSERT_TRUE(result.failure);
    EXPECT_EQ(result.failure->description,
              "Pulse Generator at address 12 generated the following error: -222,\"Data out of "
              "range\"\n");
    EXPECT_EQ(result.generatorRows, 2);
    EXPECT_EQ(linesWith(bench.timeline(), {"BUS 13", "IFConfiguration", "FrequencyOffset"}),
              Lines{});
}

TEST(PulsedModeOff2, EveryRowsGeneratorGoesOffAndTheHardwareBackToNormal) {
    ApplySnapshot s = snapshotFor("kt622");
    changeRow(s, 2, [](PGRow& r) { r.enabled = kUnchecked; });  // still switched off
    changeRow(s, 3, [](PGRow& r) { r.intPGOutput = 3; });
    s.state.HasModSource2 = kTrue;  // one source: no port 3 call all the same
    ProbeBench bench;
    EXPECT_FALSE(SPulsedModeOff2(bench, s).failure);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_off2_every_row.txt"));
}

TEST(PulsedModeOff2, GatesAndLevelingByModel) {
    struct Case {
        const char* name;
        const char* model;
        bool noPG;
        Lines gates;     // the IFGate and PulseModDrive values set
        Lines leveling;  // leveling modes and modulator enables
    };
    const Lines twoSources = {"setALCLevelingMode(1, 0)", "Src1Out1PulseModEnable=Disable",
                              "setALCLevelingMode(3, 0)", "Src2Out1PulseModEnable=Disable"};
    const Case cases[] = {
        {"two-port, two sources",
         "kt633",
         false,
         {"PulseModDrive=ON", "IFGateA=ON", "IFGateB=ON", "IFGateR1=ON", "IFGateR2=ON"},
         twoSources},
        {"four-port, three sources",
         "kt655",
         false,
         {"PulseModDrive=ON", "IFGateA=ON", "IFGateB=ON", "IFGateC=ON", "IFGateD=ON", "IFGateR1=ON",
          "IFGateR2=ON", "IFGateR3=ON", "IFGateR4=ON"},
         twoSources},
        {"four-port without modulators",
         "kt644",
         false,
         {"IFGateA=ON", "IFGateB=ON", "IFGateC=ON", "IFGateD=ON", "IFGateR1=ON", "IFGateR2=ON",
          "IFGateR3=ON", "IFGateR4=ON"},
         {}},
        {"no pulse generators", "kt633", true, {}, twoSources},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ApplySnapshot s = snapshotFor(c.model);
        s.mode.noPG = c.noPG;
        sim::SimBench bench(c.model);
        EXPECT_FALSE(SPulsedModeOff2(bench, s).failure);
        const Lines lines = bench.trace()->lines();
        const Lines settings = elementSettings(lines);
        Lines leveling;
        for (const std::string& l : lines) {
            if (l.find("setALCLevelingMode") != std::string::npos) {
                leveling.push_back(l.substr(l.find("].") + 2));
            } else if (l.find("PathElement[1:Src") != std::string::npos) {
                leveling.push_back(settingsOf(elementSettings({l}), {"Src"}).at(0));
            }
        }
        EXPECT_EQ(settingsOf(settings, {"IFGate", "PulseModDrive"}), c.gates);
        EXPECT_EQ(leveling, c.leveling);
        EXPECT_EQ(linesWith(lines, {"setState(1,", "setState(2,"}).empty(), c.noPG);
    }
}

}  // namespace
}  // namespace zp
