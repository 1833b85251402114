// Apply's choice of procedure, and what the simulated bench holds after a procedure ran.

#include <gtest/gtest.h>

#include <complex>
#include <string>

#include "instruments/apply_support.h"
#include "sim/analyzer/sim_analyzer_state.h"

namespace zp {
namespace {

using namespace testing_support;

TEST(RunApply, TheCheckBoxAndUseInternalPGChooseTheProcedure) {
    struct Case {
        bool pulsed;
        std::int16_t useInternalPG;
        ApplyProcedure procedure;
        const char* name;
    };
    const Case cases[] = {
        {true, 0, ApplyProcedure::PulsedModeOn, "SPulsedModeOn"},
        {true, 1, ApplyProcedure::PulsedModeOn2, "SPulsedModeOn2"},
        {true, -1, ApplyProcedure::PulsedModeOn2, "SPulsedModeOn2"},
        {false, 0, ApplyProcedure::PulsedModeOff, "SPulsedModeOff"},
        {false, 1, ApplyProcedure::PulsedModeOff2, "SPulsedModeOff2"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(applyProcedureFor(c.pulsed, c.useInternalPG), c.procedure);
        ApplySnapshot s = snapshotFor("kt622");
        s.pulsedChecked = c.pulsed;
        s.state.UseInternalPG = c.useInternalPG;
        sim::SimBench bench;
        const ApplyResult result = runApply(bench, s);
        EXPECT_EQ(result.procedure, c.procedure);
        EXPECT_STREQ(procedureName(result.procedure), c.name);
        EXPECT_FALSE(result.failure);
    }
}

std::complex<double> gatedA(sim::SimBench& bench) {
    sim::SimAnalyzerState& analyzer = bench.analyzer();
    return analyzer.measure(analyzer.channel(1), "A", 0);
}

TEST(ApplyOnTheBench, ExternalGeneratorsHoldWhatWasProgrammedUntilSwitchedOff) {
    ApplySnapshot s = snapshotFor("kt622");
    s.entries.widths = {5e-6, 1e-6, 2e-6, 3e-6, 4e-6};
    s.entries.delays = {0, 1e-6, 2e-6, 3e-6, 4e-6};
    sim::SimBench bench;
    const std::complex<double> unpulsed = gatedA(bench);
    ASSERT_FALSE(SPulsedModeOn(bench, s).failure);
    for (int row = 0; row < 5; ++row) {
        SCOPED_TRACE(row);
        const sim::SimGeneratorState& g = bench.generator(11 + row / 2)->state();
        const sim::SimGeneratorOutput& out = g.outputs[static_cast<std::size_t>(row % 2)];
        EXPECT_TRUE(out.on);
        EXPECT_TRUE(out.inverted);
        EXPECT_EQ(out.width, s.entries.widths[static_cast<std::size_t>(row)]);
        EXPECT_EQ(out.delay, s.entries.delays[static_cast<std::size_t>(row)]);
        EXPECT_EQ(g.frequency, 10000);
        EXPECT_EQ(g.armSource, row < 2 ? "IMM" : "EXT");
    }
    // The gate of A now sees the device's pulse through the programmed window.
    EXPECT_GT(std::abs(gatedA(bench) - unpulsed), 1e-2);

    ASSERT_FALSE(SPulsedModeOff(bench, s).failure);
    for (int address : {11, 12, 13}) {
        for (const auto& out : bench.generator(address)->state().outputs) EXPECT_FALSE(out.on);
    }
    // Open again; only the noise floor moves with the generators' new period.
    EXPECT_LT(std::abs(gatedA(bench) - unpulsed), 1e-3);
}

TEST(ApplyOnTheBench, InternalGeneratorsHoldWhatWasProgrammedUntilSwitchedOff) {
    ApplySnapshot s = snapshotFor("kt622");
    s.entries.widths = {5e-6, 1.234e-6, 1.234e-6, 1.234e-6, 1.234e-6};
    s.entries.delays = {0, 1e-6, 1e-6, 1e-6, 1e-6};
    sim::SimBench bench;
    const std::complex<double> unpulsed = gatedA(bench);
    ASSERT_FALSE(SPulsedModeOn2(bench, s).failure);
    const sim::SimChannel& ch = bench.analyzer().channel(1);
    EXPECT_EQ(ch.pathElements.at("PulseModDrive"), "Pulse1");
    EXPECT_EQ(ch.pathElements.at("IFGateA"), "Pulse2");
    EXPECT_EQ(ch.pathElements.at("IFSigPathAll"), "NBF");
    EXPECT_EQ(ch.pulse.period, 1e-4);
    EXPECT_TRUE(ch.pulse.generators[1].on);
    EXPECT_EQ(ch.pulse.generators[1].width, 5e-6);
    EXPECT_TRUE(ch.pulse.generators[2].on);
    EXPECT_EQ(ch.pulse.generators[2].width, 1.23e-6);
    EXPECT_EQ(ch.pulse.generators[2].delay, 1e-6);
    EXPECT_GT(std::abs(gatedA(bench) - unpulsed), 1e-2);

    ASSERT_FALSE(SPulsedModeOff2(bench, s).failure);
    EXPECT_FALSE(ch.pulse.generators[1].on);
    EXPECT_FALSE(ch.pulse.generators[2].on);
    EXPECT_EQ(ch.pathElements.at("IFGateA"), "ON");
    EXPECT_EQ(ch.pathElements.at("IFSigPathAll"), "WBF");
    EXPECT_EQ(gatedA(bench), unpulsed);
}

}  // namespace
}  // namespace zp
