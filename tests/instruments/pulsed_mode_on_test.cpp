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

// Expected bus writes of one row, in the short form of busWrites.
Lines identified(const std::string& a) {
    return {a + " open", a + " *IDN?"};
}
Lines init(const std::string& a, const std::string& n, bool master) {
    Lines l = {a + " *CLS", a + " :OUTP" + n + ":POL NORM", a + " :HOLD VOLT",
               a + " :VOLT" + n + ":HIGH 2.5", a + " :VOLT" + n + ":LOW 0"};
    if (master) {
        return join({l,
                     {a + " :TRIG:SOUR INT2", a + " :ARM:SOUR IMM", a + " :SOUR:ROSC:SOUR EXT",
                      a + " :SOUR:ROSC:EXT:FREQ 10MHZ"}});
    }
    return join({l, {a + " :ARM:SOUR EXT"}});
}
Lines program(const std::string& a, const std::string& n, bool inverted = true) {
    Lines l = {a + " :VOLT" + n + ":HIGH 5", a + " :VOLT" + n + ":LOW 0",
               a + " :OUTP" + n + ":IMP:EXT 10000"};
    if (inverted) l.push_back(a + " :OUTP" + n + ":POL INV");
    return join(
        {l,
         {a + " :SOUR:FREQ 10000", a + " :SOUR:PULS:WIDT" + n + " 1E-06",
          a + " :SOUR:PULS:DEL" + n + " 0", a + " :OUTP" + n + ":STAT ON", a + " :SYST:ERR?"}});
}

TEST(PulsedModeOn, PresetMasterAndSlaveFollowTheTable) {
    struct Case {
        const char* name;
        std::function<void(ApplySnapshot&)> arrange;
        Lines bus;
        int rows;
    };
    const bool master = true, slave = false;
    const Case cases[] = {
        {"two rows on outputs 1 and 2 of one generator: one preset",
         [](ApplySnapshot& s) {
             setEnabled(s, {0, 1});
         },
         join({identified("11"),
               {"11 :SYST:PRES"},
               init("11", "1", master),
               program("11", "1"),
               identified("11"),
               init("11", "2", master),
               program("11", "2")}),
         2},
        {"disabled rows send nothing; without a master row every row is a slave",
         [](ApplySnapshot& s) {
             setEnabled(s, {2, 4});
             changeRow(s, 0, [](PGRow& r) { r.master = kFalse; });
         },
         join({identified("12"),
               {"12 :SYST:PRES"},
               init("12", "1", slave),
               program("12", "1"),
               identified("13"),
               {"13 :SYST:PRES"},
               init("13", "1", slave),
               program("13", "1")}),
         2},
        {"complement clear: no polarity command after the initialisation",
         [](ApplySnapshot& s) {
             setEnabled(s, {0});
             changeRow(s, 0, [](PGRow& r) { r.complement = kUnchecked; });
         },
         join({identified("11"),
               {"11 :SYST:PRES"},
               init("11", "1", master),
               program("11", "1", false)}),
         1},
        {"a master row after a slave row of the same generator",
         [](ApplySnapshot& s) {
             setEnabled(s, {0, 1});
             changeRow(s, 0, [](PGRow& r) { r.master = kFalse; });
             changeRow(s, 1, [](PGRow& r) { r.master = kTrue; });
         },
         join({identified("11"),
               {"11 :SYST:PRES"},
               init("11", "1", slave),
               program("11", "1"),
               identified("11"),
               init("11", "2", master),
               program("11", "2")}),
         2},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ApplySnapshot s = externalSnapshot();
        c.arrange(s);
        sim::SimBench bench;
        const ApplyResult result = SPulsedModeOn(bench, s);
        EXPECT_FALSE(result.failure);
        EXPECT_EQ(result.generatorRows, c.rows);
        EXPECT_EQ(busWrites(bench.trace()->lines()), c.bus);
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
