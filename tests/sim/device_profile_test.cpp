#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <tuple>

#include "core/numeric.h"
#include "sim/sim_analyzer_state.h"
#include "sim/sim_bench.h"

namespace zp::sim {
namespace {

using Data = std::vector<std::complex<double>>;

const Data& pipData(SimBench& bench) {
    return bench.analyzer().channel(32).findMeasurement("PIP_MEAS")->data;
}

// Internal hardware: source pulse from 1 us to 3 us, a 100 ns gate for B stepping from 0 in 100 ns
// steps, the R1 gate fixed inside the pulse.
class InternalProfileTest : public ::testing::Test {
  protected:
    void SetUp() override {
        auto ch = app->currentChannel();
        auto pg = ch->pulseGenerator();
        pg->setPeriod(1e-4);
        // Generator, width, delay.
        for (const auto& [n, width, delay] :
             {std::tuple{1, 2e-6, 1e-6}, {2, 1e-7, 0.0}, {3, 1e-7, 2e-6}}) {
            pg->setWidth(n, width);
            pg->setDelay(n, delay);
            pg->setState(n, true);
        }
        auto path = ch->pathConfiguration();
        path->element("PulseModDrive")->setValue("Pulse1");
        path->element("IFGateB")->setValue("Pulse2");
        path->element("IFGateR1")->setValue("Pulse3");
        ch->copyToChannel(32);
        app->currentChannel()->setNumberOfPoints(50);
        app->commandParser()->parse("CALC32:PAR:DEF 'PIP_MEAS',B");
    }
    void sweep(double step, const char* parameter = "B") {
        app->commandParser()->parse("CALC32:PAR:SEL 'PIP_MEAS'");
        app->commandParser()->parse(std::string("CALC32:PAR:MOD ") + parameter);
        auto ch32 = app->channels()->item(2);
        ch32->pulseGenerator()->setDelayStep(2, step);
        ch32->singleSweep(true);
    }
    SimBench bench{"kt622"};
    std::unique_ptr<AnalyzerApplication> app = bench.connectAnalyzer();
};

TEST_F(InternalProfileTest, ProfileRisesAndFallsWhereTheSourcePulseIs) {
    sweep(1e-7);
    const Data& d = pipData(bench);
    ASSERT_EQ(d.size(), 50u);
    // Point i gates 100 ns starting at i x 100 ns: before 1 us, during 1.3..2.9 us, after 3.3 us.
    for (int i = 0; i < 10; ++i) EXPECT_LT(std::abs(d[i]), 1e-3) << i;
    for (int i = 14; i < 29; ++i) EXPECT_GT(std::abs(d[i]), 2.0) << i;
    for (int i = 34; i < 50; ++i) EXPECT_LT(std::abs(d[i]), 0.05) << i;
    // Rising edge in between, and the overshoot peaks above the droop-settled level.
    EXPECT_LT(std::abs(d[10]), std::abs(d[12]));
    double peak = 0;
    for (int i = 10; i < 30; ++i) peak = std::max(peak, std::abs(d[i]));
    EXPECT_GT(peak, 3.16 * 1.05);
    // Droop: late in the pulse lower than early; phase drifts across the pulse.
    EXPECT_LT(std::abs(d[28]), std::abs(d[16]));
    EXPECT_GT(std::abs(std::arg(d[28] / d[16])), 0.05);
}

TEST_F(InternalProfileTest, AFixedGateMeasuresAFlatProfile) {
    sweep(0.0);
    const Data& d = pipData(bench);
    for (const auto& v : d) EXPECT_EQ(v, d[0]);
}

TEST_F(InternalProfileTest, SParameterDividesByTheReferenceReceiver) {
    sweep(1e-7, "S21");
    const Data s21 = pipData(bench);
    sweep(1e-7, "B");
    const Data b = pipData(bench);
    sweep(1e-7, "R1");
    const Data r1 = pipData(bench);
    ASSERT_EQ(s21.size(), 50u);
    for (std::size_t i = 0; i < 50; ++i) {
        EXPECT_NEAR(std::abs(s21[i] - b[i] / r1[i]), 0.0, 1e-9 * std::abs(s21[i]) + 1e-12);
    }
    EXPECT_GT(std::abs(r1[0]), 0.9) << "the fixed reference gate sits inside the pulse";
}

// External generators: the zx20 reads every gate from the wired generator outputs at each point.
TEST(ExternalProfileTest, AcquirePointReadsTheGeneratorsAtThatMoment) {
    SimBench bench("zx20");
    auto app = bench.connectAnalyzer();
    auto gen = [&](int address, const std::string& line) {
        bench.generator(address)->handle(line);
    };
    gen(11, ":SOUR:FREQ 10000");
    gen(11, ":SOUR:PULS:WIDT1 2e-6");  // row 0: source modulation
    gen(11, ":SOUR:PULS:DEL1 1e-6");
    gen(11, ":OUTP1:STAT ON");
    gen(12, ":SOUR:FREQ 10000");
    gen(12, ":SOUR:PULS:WIDT1 1e-7");  // row 2: gate B
    gen(12, ":OUTP1:STAT ON");
    app->currentChannel()->copyToChannel(32);
    app->currentChannel()->setNumberOfPoints(40);
    app->commandParser()->parse("CALC32:PAR:DEF 'PIP_MEAS',B");
    for (int i = 0; i < 40; ++i) {
        gen(12, ":SOUR:PULS:DEL1 " + generalText(i * 1e-7));
        app->acquirePoint(true, true);
    }
    const Data& d = pipData(bench);
    for (int i = 0; i < 10; ++i) EXPECT_LT(std::abs(d[i]), 1e-3) << i;
    for (int i = 14; i < 29; ++i) EXPECT_GT(std::abs(d[i]), 2.0) << i;
    for (int i = 34; i < 40; ++i) EXPECT_LT(std::abs(d[i]), 0.05) << i;

    // A second pass wraps round and overwrites the same points.
    const Data first = d;
    for (int i = 0; i < 40; ++i) {
        gen(12, ":SOUR:PULS:DEL1 1.5e-6");
        app->acquirePoint(true, true);
    }
    for (const auto& v : d) EXPECT_EQ(v, d[0]) << "fixed gate: flat";
    EXPECT_NE(d[0], first[0]);
}

TEST(WiringTest, DefaultTableAndGateRows) {
    const Wiring two = Wiring::defaultTable(2);
    ASSERT_EQ(two.rowCount(), 5);
    for (const auto& [row, address, output] : {std::tuple{0, 11, 1}, {3, 12, 2}, {4, 13, 1}}) {
        EXPECT_EQ(two.row(row).address, address) << row;
        EXPECT_EQ(two.row(row).output, output) << row;
    }
    EXPECT_THROW(two.row(5), std::out_of_range);
    EXPECT_EQ(Wiring::defaultTable(4).rowCount(), 6);
    EXPECT_EQ(Wiring::gateRow("R2", 2), 4);
    EXPECT_EQ(Wiring::gateRow("C", 2), -1);
    EXPECT_EQ(Wiring::gateRow("R3", 4), 5);
    Wiring w = two;
    EXPECT_THROW(w.setRow(1, {12, 3}), std::invalid_argument);
}

}  // namespace
}  // namespace zp::sim
