#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
#include <utility>
#include <vector>

#include "core/timing_solver.h"

namespace zp {
namespace {

struct External {
    double prf;
    std::int32_t ifbwHz;
    bool fixed;
    double converterDelay = 0.0;
    std::int32_t ifCount = -1;
    double freqOffset = -1.0;

    void run(TimingSolver& s) {
        s.SolveExternal(prf, ifCount, ifbwHz, freqOffset, converterDelay, 0, toBool16(fixed),
                        kTrue);
    }
};

struct Internal {
    double prf;
    double ifbw;
    bool fixed;
    double clock = 100e6;
    double time1 = -1, time2 = -1;
    std::vector<std::int32_t> l1{7}, l2{7}, l3{7};
    double gated1 = -1, gated2 = -1;
    std::int32_t ticks = -1;

    void run(TimingSolver& s) {
        s.SolveInternal(prf, ifbw, time2, time1, clock, l1, l2, l3, toBool16(fixed));
    }
    void runGated(TimingSolver& s, double delay, double width) {
        s.SolveInternalGated(prf, ifbw, time2, time1, clock, l1, l2, l3, toBool16(fixed), delay,
                             width, gated1, gated2, ticks);
    }
};

template <class Request>
Request solvedBy(TimingSolver& solver, Request request) {
    request.run(solver);
    return request;
}

TEST(DefaultSolverExternal, FixedPrfMovesTheIfBandwidthFreePrfMovesThePrf) {
    auto s = makeDefaultSolver();
    const struct {
        External in;
        double prf;
        std::int32_t ifbwHz, ifCount;
    } cases[] = {
        {{5000, 3000, true}, 5000, 2500, 2},          {{5000, 500, true}, 5000, 500, 10},
        {{7000, 3000, true}, 7000, 3500, 2},   // 7000 / 2, whole hertz
        {{1001, 1000, true}, 1001, 1001, 1},   // N = 1, IFBW rounds to whole hertz
        {{5000, 3000, false}, 6000, 3000, 2},  // a whole number of IF bandwidths
        {{100, 3000, false}, 3000, 3000, 1},   // at least one period per reading
        {{164e6, 10000, false}, 164e6, 10000, 16400},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c.in.prf << " Hz, " << c.in.ifbwHz << " Hz");
        const External out = solvedBy(*s, c.in);
        EXPECT_EQ(out.prf, c.prf);
        EXPECT_EQ(out.ifbwHz, c.ifbwHz);
        EXPECT_EQ(out.ifCount, c.ifCount);
        EXPECT_EQ(out.freqOffset, 0.0);
    }
    EXPECT_EQ(solvedBy(*s, External{5000, 3000, false, 6.2e-6}).converterDelay, 6.2e-6);
}

TEST(DefaultSolverExternal, NoSolutionOutsideTheFieldRanges) {
    auto s = makeDefaultSolver();
    for (const External& in :
         {External{0, 500, true}, External{-5, 500, true}, External{std::nan(""), 500, true},
          External{200e6, 500, true}, External{5000, 0, true}, External{5000, 20000, false},
          External{0.4, 1, true},  // IF bandwidth would round to 0 Hz
          External{5000, 500, true, -1e-6}}) {
        const External out = solvedBy(*s, in);
        EXPECT_EQ(out.prf, 0.0);
        EXPECT_EQ(out.ifCount, 0);
        EXPECT_EQ(out.ifbwHz, in.ifbwHz);
    }
}

TEST(DefaultSolverInternal, PeriodOnClockTicks) {
    auto s = makeDefaultSolver();
    const Internal fixed = solvedBy(*s, Internal{5000, 3000, true});
    EXPECT_EQ(fixed.prf, 5000.0);
    EXPECT_EQ(fixed.ifbw, 2500.0);
    EXPECT_EQ(fixed.time1, 2500.0);
    EXPECT_EQ(fixed.time2, 2500.0);
    EXPECT_EQ(fixed.l1, (std::vector<std::int32_t>{2, 1}));
    EXPECT_EQ(fixed.l2, (std::vector<std::int32_t>{1, 1}));
    EXPECT_EQ(fixed.l3, (std::vector<std::int32_t>{20000, 2}));

    // N = 2: 6 kHz is 10000 ticks of 60 MHz.
    const Internal free = solvedBy(*s, Internal{7000, 3000, false, 60e6});
    EXPECT_EQ(free.prf, 6000.0);
    EXPECT_EQ(free.l3, (std::vector<std::int32_t>{10000, 2}));
    // 100e6 / 7000 = 14285.7 -> 14286 ticks
    EXPECT_DOUBLE_EQ(solvedBy(*s, Internal{7000, 7000, false}).prf, 100e6 / 14286);

    for (const Internal& in : {Internal{0, 500, true}, Internal{5000, 0.5, true},
                               Internal{5000, 500, true, 0.0}, Internal{150e6, 10000, true, 60e6},
                               Internal{0.001, 1, true}}) {  // 1e11 ticks: too long a period
        const Internal out = solvedBy(*s, in);
        EXPECT_EQ(out.prf, 0.0);
        EXPECT_EQ(out.time1, 0.0);
        EXPECT_TRUE(out.l1.empty() && out.l3.empty());
    }
}

TEST(DefaultSolverInternal, GatedWindow) {
    auto s = makeDefaultSolver();
    Internal g{5000, 500, true};
    g.runGated(*s, 2e-6, 1e-6);
    EXPECT_EQ(g.prf, 5000.0);
    EXPECT_EQ(g.gated1, 2e-6);
    EXPECT_EQ(g.gated2, 1e-6);
    EXPECT_EQ(g.ticks, 100);
    EXPECT_EQ(g.l3, (std::vector<std::int32_t>{20000, 10}));

    Internal narrow{5000, 500, true, 60e6};
    narrow.runGated(*s, 0, 3.4e-9);  // shorter than a tick: one tick
    EXPECT_EQ(narrow.ticks, 1);

    Internal beyond{5000, 500, true};  // 150 us + 60 us does not fit a 200 us period
    beyond.runGated(*s, 150e-6, 60e-6);
    EXPECT_EQ(beyond.prf, 0.0);
    EXPECT_EQ(beyond.ticks, 0);
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

TEST(PassThroughSolver, KeepsTheDesiredTimingAndZeroesTheRest) {
    auto s = makePassThroughSolver();
    const External e = solvedBy(*s, External{5000, 3000, false});
    EXPECT_EQ(e.prf, 5000.0);
    EXPECT_EQ(e.ifbwHz, 3000);
    EXPECT_EQ(e.ifCount, 0);

    Internal i{5000, 3000, true};
    i.runGated(*s, 1e-6, 1e-6);
    EXPECT_EQ(i.prf, 5000.0);
    EXPECT_EQ(i.ifbw, 3000.0);
    EXPECT_EQ(i.time1 + i.time2 + i.gated1 + i.gated2 + i.ticks, 0.0);
    EXPECT_TRUE(i.l1.empty() && i.l2.empty() && i.l3.empty());
    std::int16_t rx = 9;
    s->SolveReceiver(5000, 1e-6, rx);
    EXPECT_EQ(rx, 0);
}

}  // namespace
}  // namespace zp
