#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <tuple>
#include <utility>
#include <vector>

#include "core/timing_solver.h"

namespace zp {
namespace {

using List = std::vector<std::int32_t>;

ExternalRequest external(double prf, std::int32_t ifbwHz, bool fixed, double converterDelay = 0) {
    return {.prf = prf,
            .ifbwHz = ifbwHz,
            .converterDelay = converterDelay,
            .fixedPrf = toBool16(fixed)};
}

InternalRequest internal(double prf, double ifbw, bool fixed, double clock = 100e6) {
    return {.prf = prf, .ifbw = ifbw, .pulseClockHz = clock, .fixedPrf = toBool16(fixed)};
}

TEST(DefaultSolverExternal, FixedPrfMovesTheIfBandwidthFreePrfMovesThePrf) {
    auto s = makeDefaultSolver();
    const struct {
        ExternalRequest in;
        double prf;
        std::int32_t ifbwHz, ifCount;
    } cases[] = {
        {external(5000, 3000, true), 5000, 2500, 2},
        {external(5000, 500, true), 5000, 500, 10},
        {external(7000, 3000, true), 7000, 3500, 2},   // 7000 / 2, whole hertz
        {external(1001, 1000, true), 1001, 1001, 1},   // N = 1, IFBW rounds to whole hertz
        {external(5000, 3000, false), 6000, 3000, 2},  // a whole number of IF bandwidths
        {external(100, 3000, false), 3000, 3000, 1},   // at least one period per reading
        {external(164e6, 10000, false), 164e6, 10000, 16400},
        // The ends of the PRF range are solutions.
        {external(0.001, 1, false), 1, 1, 1},
        {external(165e6, 10000, true), 165e6, 10000, 16500},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c.in.prf << " Hz, " << c.in.ifbwHz << " Hz");
        const ExternalSolution out = s->SolveExternal(c.in);
        EXPECT_EQ(out.prf, c.prf);
        EXPECT_EQ(out.ifbwHz, c.ifbwHz);
        EXPECT_EQ(out.ifCount, c.ifCount);
        EXPECT_EQ(out.freqOffset, 0.0);
    }
    EXPECT_EQ(s->SolveExternal(external(5000, 3000, false, 6.2e-6)).converterDelay, 6.2e-6);
}

TEST(DefaultSolverExternal, NoSolutionOutsideTheFieldRanges) {
    auto s = makeDefaultSolver();
    for (const ExternalRequest& in :
         {external(0, 500, true), external(-5, 500, true), external(std::nan(""), 500, true),
          external(200e6, 500, true), external(5000, 0, true), external(5000, 20000, false),
          external(0.4, 1, true),  // IF bandwidth would round to 0 Hz
          external(5000, 500, true, -1e-6)}) {
        const ExternalSolution out = s->SolveExternal(in);
        EXPECT_EQ(out.prf, 0.0);
        EXPECT_EQ(out.ifCount, 0);
        EXPECT_EQ(out.ifbwHz, in.ifbwHz);
    }
}

TEST(DefaultSolverInternal, PeriodOnClockTicks) {
    auto s = makeDefaultSolver();
    const InternalSolution fixed = s->SolveInternal(internal(5000, 3000, true));
    EXPECT_EQ(fixed.prf, 5000.0);
    EXPECT_EQ(fixed.ifbw, 2500.0);
    EXPECT_EQ(fixed.time1, 2500.0);
    EXPECT_EQ(fixed.time2, 2500.0);
    EXPECT_EQ(fixed.pulseClockHz, 100e6);
    EXPECT_EQ(fixed.list1, (List{2, 1}));
    EXPECT_EQ(fixed.list2, (List{1, 1}));
    EXPECT_EQ(fixed.list3, (List{20000, 2}));

    // N = 2: 6 kHz is 10000 ticks of 60 MHz.
    const InternalSolution free = s->SolveInternal(internal(7000, 3000, false, 60e6));
    EXPECT_EQ(free.prf, 6000.0);
    EXPECT_EQ(free.list3, (List{10000, 2}));
    // 100e6 / 7000 = 14285.7 -> 14286 ticks
    EXPECT_DOUBLE_EQ(s->SolveInternal(internal(7000, 7000, false)).prf, 100e6 / 14286);
    // A one-tick period is the shortest there is.
    EXPECT_EQ(s->SolveInternal(internal(1e6, 10000, true, 1e6)).list3, (List{1, 100}));

    for (const InternalRequest& in :
         {internal(0, 500, true), internal(5000, 0.5, true), internal(5000, 500, true, 0.0),
          internal(150e6, 10000, true, 60e6),
          internal(0.001, 1, true)}) {  // 1e11 ticks: too long a period
        const InternalSolution out = s->SolveInternal(in);
        EXPECT_EQ(out.prf, 0.0);
        EXPECT_EQ(out.ifbw, in.ifbw);
        EXPECT_EQ(out.time1, 0.0);
        EXPECT_TRUE(out.list1.empty() && out.list3.empty());
    }
}

TEST(DefaultSolverInternal, GatedWindow) {
    auto s = makeDefaultSolver();
    const InternalSolution g = s->SolveInternalGated(internal(5000, 500, true), {2e-6, 1e-6});
    EXPECT_EQ(g.prf, 5000.0);
    EXPECT_EQ(g.gate.time1, 2e-6);
    EXPECT_EQ(g.gate.time2, 1e-6);
    EXPECT_EQ(g.gate.ticks, 100);
    EXPECT_EQ(g.list3, (List{20000, 10}));

    // Shorter than a tick: one tick.
    EXPECT_EQ(s->SolveInternalGated(internal(5000, 500, true, 60e6), {0, 3.4e-9}).gate.ticks, 1);

    // 150 us + 60 us does not fit a 200 us period; a negative delay or no width is no window.
    for (const GateWindow& gate : {GateWindow{150e-6, 60e-6}, {-1e-6, 1e-6}, {0, 0}}) {
        const InternalSolution out = s->SolveInternalGated(internal(5000, 500, true), gate);
        EXPECT_EQ(out.prf, 0.0);
        EXPECT_EQ(out.gate.ticks, 0);
        EXPECT_TRUE(out.list1.empty());
    }
}

// The out-parameter forms write every result, also the ones a caller passed in stale.
TEST(TimingSolverAdapters, OutParameterFormsWriteTheValueFormsResults) {
    auto s = makeDefaultSolver();
    double prf = 5000, offset = -1, delay = 6.2e-6;
    std::int32_t ifCount = -1, ifbwHz = 3000;
    s->SolveExternal(prf, ifCount, ifbwHz, offset, delay, 0, kTrue, kTrue);
    EXPECT_EQ(std::tuple(prf, ifCount, ifbwHz, offset, delay),
              std::tuple(5000.0, 2, 2500, 0.0, 6.2e-6));

    double ifbw = 500, time1 = -1, time2 = -1, clock = 100e6, gated1 = -1, gated2 = -1;
    std::int32_t ticks = -1;
    List l1{7}, l2{7}, l3{7};
    s->SolveInternalGated(prf, ifbw, time2, time1, clock, l1, l2, l3, kTrue, 2e-6, 1e-6, gated1,
                          gated2, ticks);
    EXPECT_EQ(std::tuple(prf, ifbw, time1, time2, clock),
              std::tuple(5000.0, 500.0, 500.0, 500.0, 100e6));
    EXPECT_EQ(std::tuple(l1, l2, l3), std::tuple(List{10, 1}, List{1, 1}, List{20000, 10}));
    EXPECT_EQ(std::tuple(gated1, gated2, ticks), std::tuple(2e-6, 1e-6, 100));

    prf = 0;  // no solution: every further result cleared, the IF bandwidth kept
    s->SolveInternal(prf, ifbw, time2, time1, clock, l1, l2, l3, kTrue);
    EXPECT_EQ(std::tuple(prf, ifbw, time1, time2), std::tuple(0.0, 500.0, 0.0, 0.0));
    EXPECT_TRUE(l1.empty() && l2.empty() && l3.empty());
}

TEST(DefaultSolverReceiver, AttenuationFollowsTheDutyCycle) {
    auto s = makeDefaultSolver();
    std::int16_t rx = -1;
    // 90 % is close to CW, 10 % is -20 dB, 0.5 % is -46 dB; wider than the period counts as CW.
    for (const auto& [width, expected] :
         {std::pair{180e-6, 30}, {20e-6, 15}, {1e-6, 0}, {1.0, 30}}) {
        s->SolveReceiver(5000, width, rx);
        EXPECT_EQ(rx, expected) << width;
    }
    EXPECT_THROW(s->SolveReceiver(0, 1e-6, rx), std::invalid_argument);
    EXPECT_THROW(s->SolveReceiver(5000, 0, rx), std::invalid_argument);
}

}  // namespace
}  // namespace zp
