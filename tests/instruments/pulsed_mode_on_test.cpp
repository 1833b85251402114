// Pulsed mode on with external generators, read from the I/O trace of the simulated bench.

#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "instruments/apply_support.h"
#include "instruments/probe_bench.h"
#include "sim/analyzer/sim_analyzer_state.h"

namespace zp {
namespace {

using namespace testing_support;

ApplySnapshot externalSnapshot() {
    ApplySnapshot s = snapshotFor("kt622");
    s.state.ReceiverGains = {3, 0, 2, 1};  // A on Auto, which stands for 1 here
    return s;
}

TEST(PulsedModeOn, AFirstMasterRowOnOutputOneFromIdentificationToErrorQueue) {
    ApplySnapshot s = externalSnapshot();
    setEnabled(s, {0});
    changeRow(s, 0, [](PGRow& r) {
        r.highLevel = 3.3f;  // single precision: 7 digits, not 3.29999995231628
        r.lowLevel = -0.7f;
        r.loadImpedance = 50;
    });
    s.entries.prf = 12345.678;
    s.entries.widths[0] = 1.23456789012345e-6;
    s.entries.delays[0] = 2.5e-6;
    ProbeBench bench;
    const ApplyResult result = SPulsedModeOn(bench, s);
    EXPECT_FALSE(result.failure);
    EXPECT_EQ(result.generatorRows, 1);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_on_first_master_row.txt"));
}

TEST(PulsedModeOn, PresetMasterAndSlaveFollowTheTable) {
    struct Case {
        const char* name;
        std::function<void(ApplySnapshot&)> arrange;
        const char* bus;  // expected bus writes, in the short form of busWrites
        int rows;
    };
    const Case cases[] = {
        {"two rows on outputs 1 and 2 of one generator: one preset",
         [](ApplySnapshot& s) {
             setEnabled(s, {0, 1});
         },
         "pulsed_mode_on_two_outputs.txt", 2},
        {"disabled rows send nothing; without a master row every row is a slave",
         [](ApplySnapshot& s) {
             setEnabled(s, {2, 4});
             changeRow(s, 0, [](PGRow& r) { r.master = kFalse; });
         },
         "pulsed_mode_on_slaves_only.txt", 2},
        {"complement clear: no polarity command after the initialisation",
         [](ApplySnapshot& s) {
             setEnabled(s, {0});
             changeRow(s, 0, [](PGRow& r) { r.complement = kUnchecked; });
         },
         "pulsed_mode_on_no_complement.txt", 1},
        {"a master row after a slave row of the same generator",
         [](ApplySnapshot& s) {
             setEnabled(s, {0, 1});
             changeRow(s, 0, [](PGRow& r) { r.master = kFalse; });
             changeRow(s, 1, [](PGRow& r) { r.master = kTrue; });
         },
         "pulsed_mode_on_master_after_slave.txt", 2},
        {"a generator at address 1",
         [](ApplySnapshot& s) {
             setEnabled(s, {0});
             changeRow(s, 0, [](PGRow& r) { r.gpibAddress = 1; });
         },
         "pulsed_mode_on_address_one.txt", 1},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ApplySnapshot s = externalSnapshot();
        c.arrange(s);
        sim::SimBench bench("kt622", {}, {1, 11, 12, 13});
        const ApplyResult result = SPulsedModeOn(bench, s);
        EXPECT_FALSE(result.failure);
        EXPECT_EQ(result.generatorRows, c.rows);
        EXPECT_EQ(busWrites(bench.trace()->lines()), expectedLines(c.bus));
    }
}

TEST(PulsedModeOn, NoPGProgramsTheAnalyzerOnlyAndASkippableErrorEndsOnlyItsStep) {
    ApplySnapshot s = externalSnapshot();
    s.mode.noPG = true;
    s.mode.converterMeas = true;
    ProbeBench bench;
    bench.sim().faults().analyzer.push_back(
        {"IFConfiguration.setIfTimeA", "+143 Parameter conflict", -1});
    const ApplyResult result = SPulsedModeOn(bench, s);
    EXPECT_FALSE(result.failure);
    EXPECT_EQ(result.generatorRows, 0);
    EXPECT_EQ(bench.timeline(), expectedLines("pulsed_mode_on_no_pg.txt"));
}

TEST(PulsedModeOn, AFailedIdentificationStopsTheProcedure) {
    ApplySnapshot s = externalSnapshot();
    ProbeBench bench;
    bench.sim().faults().silentGenerators.insert(12);
    const ApplyResult result = SPulsedModeOn(bench, s);
    ASSERT_TRUE(result.failure);
    EXPECT_EQ(result.failure->number, kOwnCheckError);
    EXPECT_EQ(result.failure->description, "Error reading from signal generator at address 12");
    EXPECT_EQ(result.generatorRows, 2);
    const Lines timeline = bench.timeline();
    EXPECT_EQ(Lines(timeline.end() - 8, timeline.end()),
              join({{"BUS 12 open", "BUS 12 W \"*IDN?\\n\"", "BUS 12 timeout"}, kBusEnd}));
    EXPECT_EQ(linesWith(timeline, {"BUS 13", "MessageArea", "IFConfiguration"}), Lines{});
    EXPECT_TRUE(bench.sim().analyzer().updateSwitch);
    EXPECT_FALSE(bench.sim().analyzer().busSwitch);
}

}  // namespace
}  // namespace zp
