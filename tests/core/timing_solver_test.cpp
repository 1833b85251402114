#include <gtest/gtest.h>

#include <cmath>
#include <stdexcept>
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

TEST(DefaultSolverExternal, FixedPrfMovesTheIfBandwidth) {
    auto s = makeDefaultSolver();
    External e{5000, 3000, true};
    e.run(*s);
    EXPECT_EQ(e.prf, 5000.0);
    EXPECT_EQ(e.ifbwHz, 2500);
    EXPECT_EQ(e.ifCount, 2);
    EXPECT_EQ(e.freqOffset, 0.0);

    External d{5000, 500, true};
    d.run(*s);
    EXPECT_EQ(d.prf, 5000.0);
    EXPECT_EQ(d.ifbwHz, 500);
    EXPECT_EQ(d.ifCount, 10);

    External w{7000, 3000, true};  // 7000 / 2 = 3500, whole hertz
    w.run(*s);
    EXPECT_EQ(w.ifbwHz, 3500);
    External r{1001, 1000, true};  // N = 1, IFBW rounds to whole hertz
    r.run(*s);
    EXPECT_EQ(r.ifbwHz, 1001);
    EXPECT_EQ(r.prf, 1001.0);
}

TEST(DefaultSolverExternal, FreePrfMovesToAWholeNumberOfIfBandwidths) {
    auto s = makeDefaultSolver();
    External e{5000, 3000, false, 6.2e-6};
    e.run(*s);
    EXPECT_EQ(e.prf, 6000.0);
    EXPECT_EQ(e.ifbwHz, 3000);
    EXPECT_EQ(e.ifCount, 2);
    EXPECT_EQ(e.converterDelay, 6.2e-6);

    External low{100, 3000, false};  // at least one period per reading
    low.run(*s);
    EXPECT_EQ(low.prf, 3000.0);
    EXPECT_EQ(low.ifCount, 1);
}

TEST(DefaultSolverExternal, NoSolutionOutsideTheFieldRanges) {
    auto s = makeDefaultSolver();
    for (External e :
         {External{0, 500, true}, External{-5, 500, true}, External{std::nan(""), 500, true},
          External{200e6, 500, true}, External{5000, 0, true}, External{5000, 20000, false},
          External{0.4, 1, true},  // IF bandwidth would round to 0 Hz
          External{5000, 500, true, -1e-6}}) {
        const std::int32_t ifbwBefore = e.ifbwHz;
        e.run(*s);
        EXPECT_EQ(e.prf, 0.0);
        EXPECT_EQ(e.ifCount, 0);
        EXPECT_EQ(e.ifbwHz, ifbwBefore);
    }
    External high{164e6, 10000, false};  // N x IFBW = 164 MHz: fine
    high.run(*s);
    EXPECT_EQ(high.prf, 164e6);
}

TEST(DefaultSolverInternal, PeriodOnClockTicks) {
    auto s = makeDefaultSolver();
    Internal fixed{5000, 3000, true};
    fixed.run(*s);
    EXPECT_EQ(fixed.prf, 5000.0);
    EXPECT_EQ(fixed.ifbw, 2500.0);
    EXPECT_EQ(fixed.time1, 2500.0);
    EXPECT_EQ(fixed.time2, 2500.0);
    EXPECT_EQ(fixed.l1, (std::vector<std::int32_t>{2, 1}));
    EXPECT_EQ(fixed.l2, (std::vector<std::int32_t>{1, 1}));
    EXPECT_EQ(fixed.l3, (std::vector<std::int32_t>{20000, 2}));

    Internal free{7000, 3000, false, 60e6};
    free.run(*s);
    // N = 2: 6 kHz is 10000 ticks of 60 MHz.
    EXPECT_EQ(free.prf, 6000.0);
    EXPECT_EQ(free.ifbw, 3000.0);
    EXPECT_EQ(free.l3, (std::vector<std::int32_t>{10000, 2}));

    Internal grid{7000, 7000, false, 100e6};  // 100e6 / 7000 = 14285.7 -> 14286 ticks
    grid.run(*s);
    EXPECT_DOUBLE_EQ(grid.prf, 100e6 / 14286);
    EXPECT_EQ(grid.l3[0], 14286);
}

TEST(DefaultSolverInternal, NoSolutionClearsResults) {
    auto s = makeDefaultSolver();
    for (Internal in : {Internal{0, 500, true}, Internal{5000, 0.5, true},
                        Internal{5000, 500, true, 0.0}, Internal{150e6, 10000, true, 60e6},
                        Internal{0.001, 1, true, 100e6}}) {  // 1e11 ticks: too long a period
        in.run(*s);
        EXPECT_EQ(in.prf, 0.0);
        EXPECT_EQ(in.time1, 0.0);
        EXPECT_TRUE(in.l1.empty());
        EXPECT_TRUE(in.l3.empty());
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
    EXPECT_EQ(beyond.gated2, 0.0);

    Internal bad{5000, 500, true};
    bad.runGated(*s, -1e-6, 1e-6);
    EXPECT_EQ(bad.prf, 0.0);
}

TEST(DefaultSolverReceiver, AttenuationFollowsTheDutyCycle) {
    auto s = makeDefaultSolver();
    std::int16_t rx = -1;
    s->SolveReceiver(5000, 180e-6, rx);  // 90 %: close to CW
    EXPECT_EQ(rx, 30);
    s->SolveReceiver(5000, 20e-6, rx);  // 10 %: -20 dB
    EXPECT_EQ(rx, 15);
    s->SolveReceiver(5000, 1e-6, rx);  // 0.5 %: -46 dB
    EXPECT_EQ(rx, 0);
    s->SolveReceiver(5000, 1.0, rx);  // wider than the period counts as CW
    EXPECT_EQ(rx, 30);
    EXPECT_THROW(s->SolveReceiver(0, 1e-6, rx), std::invalid_argument);
    EXPECT_THROW(s->SolveReceiver(5000, 0, rx), std::invalid_argument);
}

TEST(PassThroughSolver, KeepsTheDesiredTimingAndZeroesTheRest) {
    auto s = makePassThroughSolver();
    External e{5000, 3000, false};
    e.run(*s);
    EXPECT_EQ(e.prf, 5000.0);
    EXPECT_EQ(e.ifbwHz, 3000);
    EXPECT_EQ(e.ifCount, 0);
    EXPECT_EQ(e.freqOffset, 0.0);

    Internal i{5000, 3000, true};
    i.runGated(*s, 1e-6, 1e-6);
    EXPECT_EQ(i.prf, 5000.0);
    EXPECT_EQ(i.ifbw, 3000.0);
    EXPECT_EQ(i.clock, 100e6);
    EXPECT_EQ(i.time1, 0.0);
    EXPECT_EQ(i.time2, 0.0);
    EXPECT_TRUE(i.l1.empty() && i.l2.empty() && i.l3.empty());
    EXPECT_EQ(i.gated1, 0.0);
    EXPECT_EQ(i.gated2, 0.0);
    EXPECT_EQ(i.ticks, 0);

    std::int16_t rx = 9;
    s->SolveReceiver(5000, 1e-6, rx);
    EXPECT_EQ(rx, 0);
}

}  // namespace
}  // namespace zp
