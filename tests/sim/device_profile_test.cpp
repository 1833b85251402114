#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <complex>
#include <tuple>
#include <utility>
#include <vector>

#include "core/numeric.h"
#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/generators/wiring.h"
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

// External generators on a zx20: the source on generator 11 output 1 (row 0), the 100 ns gate
// for B on generator 12 output 1 (row 2); each point reads the gate as set at that moment.
struct ExternalBench {
    struct Setup {
        double frequency;
        double sourceDelay;
        const char* sourcePolarity;  // "INV" (as the program sets it), "NORM"
        const char* gatePolarity;    // "INV", "NORM", or "OFF": the gate output left off
        double gateStep;
    };
    explicit ExternalBench(const Setup& s) {
        for (int address : {11, 12}) gen(address, ":SOUR:FREQ " + generalText(s.frequency));
        gen(11, ":SOUR:PULS:WIDT1 2e-6");
        gen(11, ":SOUR:PULS:DEL1 " + generalText(s.sourceDelay));
        gen(11, std::string(":OUTP1:POL ") + s.sourcePolarity);
        gen(11, ":OUTP1:STAT ON");
        gen(12, ":SOUR:PULS:WIDT1 1e-7");
        if (std::string(s.gatePolarity) != "OFF") {
            gen(12, std::string(":OUTP1:POL ") + s.gatePolarity);
            gen(12, ":OUTP1:STAT ON");
        }
        app->currentChannel()->copyToChannel(32);
        app->currentChannel()->setNumberOfPoints(40);
        app->commandParser()->parse("CALC32:PAR:DEF 'PIP_MEAS',B");
    }
    void gen(int address, const std::string& line) { bench.generator(address)->handle(line); }
    const Data& profile(double step, double first = 0.0) {
        for (int i = 0; i < 40; ++i) {
            gen(12, ":SOUR:PULS:DEL1 " + generalText(first + i * step));
            app->acquirePoint(true, true);
        }
        return pipData(bench);
    }
    SimBench bench{"zx20"};
    std::unique_ptr<AnalyzerApplication> app = bench.connectAnalyzer();
};

TEST(ExternalProfileTest, PolarityAndWrapDecideWhereTheProfileRises) {
    struct Band {
        int first, last;
        double low, high;  // |B| limits over points first..last
    };
    struct Case {
        const char* name;
        ExternalBench::Setup setup;
        std::vector<Band> bands;
        bool flat;
    };
    // Period 100 us, source 1..3 us unless said otherwise; point i gates i x step.
    const std::vector<Case> cases = {
        {"both inverted: on during the pulse",
         {1e4, 1e-6, "INV", "INV", 1e-7},
         {{0, 9, 0, 1e-3}, {14, 28, 2.0, 10}, {34, 39, 0, 0.05}},
         false},
        {"normal source: modulated off during the pulse",
         {1e4, 1e-6, "NORM", "INV", 1e-7},
         {{0, 9, 1.0, 10}, {14, 28, 0, 0.05}, {34, 39, 2.0, 10}},
         false},
        {"normal gate: open all but 100 ns",
         {1e4, 1e-6, "INV", "NORM", 1e-7},
         {{0, 39, 0.01, 0.2}},
         false},
        {"gate output off: open, not pulsed",
         {1e4, 1e-6, "INV", "OFF", 1e-7},
         {{0, 39, 0.01, 0.2}},
         true},
        {"period 10 us, source 9..11 us wraps to 0..1 us",
         {1e5, 9e-6, "INV", "INV", 2.5e-7},
         {{0, 3, 2.0, 10}, {6, 34, 0, 1e-3}, {37, 39, 2.0, 10}},
         false},
        {"source delay beyond the period counts from its own period",
         {1e5, 29e-6, "INV", "INV", 2.5e-7},
         {{0, 3, 2.0, 10}, {6, 34, 0, 1e-3}, {37, 39, 2.0, 10}},
         false},
    };
    for (const Case& c : cases) {
        ExternalBench b(c.setup);
        const Data& d = b.profile(c.setup.gateStep);
        ASSERT_EQ(d.size(), 40u) << c.name;
        for (const Band& band : c.bands) {
            for (int i = band.first; i <= band.last; ++i) {
                EXPECT_GE(std::abs(d[i]), band.low) << c.name << " point " << i;
                EXPECT_LE(std::abs(d[i]), band.high) << c.name << " point " << i;
            }
        }
        EXPECT_EQ(std::all_of(d.begin(), d.end(), [&](auto v) { return v == d[0]; }), c.flat)
            << c.name;
    }
}

TEST(ExternalProfileTest, AFixedGateReadsTheSameOnEveryPassPoint) {
    ExternalBench b({1e4, 1e-6, "INV", "INV", 1e-7});
    const Data first = b.profile(1e-7);
    // A second pass wraps round and overwrites the same points.
    const Data& d = b.profile(0.0, 1.5e-6);
    for (const auto& v : d) EXPECT_EQ(v, d[0]) << "fixed gate: flat";
    EXPECT_NE(d[0], first[0]);
}

TEST(PulseWindowTest, OnSpanWrapsAndComplements) {
    constexpr double P = 1e-5;
    // delay, width, complement -> start, length of the on part.
    for (const auto& [delay, width, complement, start, length] :
         {std::tuple{1e-6, 2e-6, false, 1e-6, 2e-6},
          {9e-6, 2e-6, false, 9e-6, 2e-6},   // runs on into the next period
          {1e-6, 2e-6, true, 3e-6, 8e-6},    // everything but 1..3 us
          {9e-6, 2e-6, true, 1e-6, 8e-6},    // everything but 9..11 us
          {8e-6, 2e-6, true, 0.0, 8e-6},     // ends exactly at the period's end
          {12e-6, 1e-6, false, 2e-6, 1e-6},  // delay past the period
          {0.0, 3e-5, false, 0.0, P},        // wider than the period: on throughout
          {0.0, 3e-5, true, 0.0, 0.0}}) {
        const OnSpan on = onSpan({true, delay, width, complement, P});
        const double apart = std::abs(on.start - start);  // on the circle: P - 1e-21 is 0
        EXPECT_LT(std::min(apart, P - apart), 1e-15) << delay << " " << width << " " << complement;
        EXPECT_NEAR(on.length, length, 1e-15) << delay << " " << width << " " << complement;
    }
    const OnSpan open = onSpan({false, 1e-6, 2e-6, false, P});
    EXPECT_EQ(open.start, 0.0);
    EXPECT_EQ(open.length, P);
}

TEST(PulseWindowTest, WrappedWindowsReadAsTheSameWindowsShiftedIntoThePeriod) {
    constexpr double P = 1e-5;
    const DeviceModel device;
    // Source and gate delays; shifting both by the same time must not change what the gate sees.
    for (const auto& [sourceDelay, gateDelay, gateWidth, complement] :
         {std::tuple{9e-6, 9.9e-6, 4e-7, false},  // gate wraps into the pulse's second part
          {9e-6, 5e-7, 1e-7, false},              // gate inside the wrapped part
          {9e-6, 1.5e-6, 1e-7, false},            // the fall after the wrapped pulse
          {9e-6, 9.5e-6, 2e-6, true},             // complementary gate
          {9.5e-6, 0.0, 1e-7, false}}) {
        const PulseWindow source{true, sourceDelay, 2e-6, false, P};
        const PulseWindow gate{true, gateDelay, gateWidth, complement, P};
        const auto shift = [&](double t) { return std::fmod(t + 2e-6, P); };
        const PulseWindow source2{true, shift(sourceDelay), 2e-6, false, P};
        const PulseWindow gate2{true, shift(gateDelay), gateWidth, complement, P};
        const auto clean = [&](const PulseWindow& g, const PulseWindow& s) {
            return device.gatedResponse(2, 1, g, s) - DeviceModel::noise(g, 2);
        };
        EXPECT_NEAR(std::abs(clean(gate, source) - clean(gate2, source2)), 0.0, 1e-9)
            << sourceDelay << " " << gateDelay;
    }
    // A gate on the pulse reads it; the complementary gate mostly misses it.
    const PulseWindow source{true, 9e-6, 2e-6, false, P};
    const auto onPulse = device.gatedResponse(2, 1, {true, 9.5e-6, 1e-6, false, P}, source);
    const auto offPulse = device.gatedResponse(2, 1, {true, 9e-6, 2e-6, true, P}, source);
    EXPECT_GT(std::abs(onPulse), 2.0);
    EXPECT_LT(std::abs(offPulse), 0.1);
    // A source on throughout is the steady state.
    EXPECT_EQ(device.response(3e-6, {true, 1e-6, 0.0, true, P}), std::complex<double>(1.0));
    EXPECT_EQ(device.incident(3e-6, {true, 1e-6, 0.0, true, P}), 1.0);
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

TEST(WiringTest, ActiveLowInputsSeeInvertedOutputsAsTheirPulse) {
    SimGeneratorState g;
    g.frequency = 2e5;
    g.outputs[1] = {.on = true, .inverted = true, .width = 1e-6, .delay = 2e-6};
    // output 2 on/inverted -> pulsed, complement
    for (const auto& [on, inverted, pulsed, complement] : {std::tuple{true, true, true, false},
                                                           {true, false, true, true},
                                                           {false, true, false, false},
                                                           {false, false, false, false}}) {
        g.outputs[1].on = on;
        g.outputs[1].inverted = inverted;
        const PulseWindow w = Wiring::inputWindow(g, 2);
        EXPECT_EQ(w.pulsed, pulsed) << on << inverted;
        EXPECT_EQ(w.complement, complement) << on << inverted;
        EXPECT_EQ(w.period, 5e-6);
        if (pulsed) {
            EXPECT_EQ(std::pair(w.delay, w.width), std::pair(2e-6, 1e-6));
        }
    }
    EXPECT_FALSE(Wiring::inputWindow(g, 1).pulsed) << "output 1 is still off";
}

}  // namespace
}  // namespace zp::sim
