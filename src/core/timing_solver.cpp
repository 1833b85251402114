#include "core/timing_solver.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>
#include <stdexcept>

#include "core/numeric.h"

// Narrowband pulsed detection: the IF filter integrates over a whole number N of pulse periods,
// which puts its nulls on the PRF harmonics so that only the carrier line is measured. The model
// and the meaning of every result are in docs/timing-solver.md.

namespace zp {

namespace {

constexpr double kMinIFBW = 1.0;
constexpr double kMaxIFBW = 10000.0;
constexpr double kMinPRF = 0.001;
constexpr double kMaxPRF = 165e6;
constexpr double kMaxInt32 = std::numeric_limits<std::int32_t>::max();

bool prfInRange(double prf) {
    return std::isfinite(prf) && prf >= kMinPRF && prf <= kMaxPRF;
}
bool ifbwInRange(double ifbw) {
    return std::isfinite(ifbw) && ifbw >= kMinIFBW && ifbw <= kMaxIFBW;
}

// Pulse periods per IF reading; the callers have checked prf and ifbw.
std::int32_t periodsPerReading(double prf, double ifbw) {
    return static_cast<std::int32_t>(std::max(1.0, roundHalfEven(prf / ifbw)));
}

struct InternalSolution {
    double prf = 0.0;
    double ifbw = 0.0;
    std::int32_t ticks = 0;  // pulse clock ticks per period
    std::int32_t periods = 0;
};

std::optional<InternalSolution> solveOnClock(double prf, double ifbw, double clock, bool fixedPrf) {
    if (!prfInRange(prf) || !ifbwInRange(ifbw) || !std::isfinite(clock) || clock <= 0) {
        return std::nullopt;
    }
    InternalSolution s;
    s.periods = periodsPerReading(prf, ifbw);
    double ticks = 0.0;
    if (fixedPrf) {
        ticks = roundHalfEven(clock / prf);
        s.prf = prf;
        s.ifbw = roundHalfEven(prf / s.periods);
    } else {
        // The PRF goes to N x IFBW and then onto the clock grid; the IF bandwidth stays.
        ticks = roundHalfEven(clock / (s.periods * ifbw));
        s.prf = ticks >= 1 ? clock / ticks : 0.0;
        s.ifbw = ifbw;
    }
    // The period must be at least one tick and fit the generator's 32-bit period counter.
    if (ticks < 1 || ticks > kMaxInt32) return std::nullopt;
    if (!prfInRange(s.prf) || !ifbwInRange(s.ifbw)) return std::nullopt;
    s.ticks = static_cast<std::int32_t>(ticks);
    return s;
}

class DefaultSolver final : public TimingSolver {
  public:
    // `decade` and `flag` are not needed by this model: N follows from PRF / IFBW directly.
    void SolveExternal(double& prf, std::int32_t& ifCount, std::int32_t& ifbwHz, double& freqOffset,
                       double& converterDelay, std::int16_t, Bool16 fixedPrf, Bool16) override {
        // Synchronous detection needs no receiver offset; the converter delay is taken up by the
        // analyzer's IF timing (setIfTimeA), not by the frequency.
        freqOffset = 0.0;
        const double ifbw = ifbwHz;
        if (!prfInRange(prf) || !ifbwInRange(ifbw) || !std::isfinite(converterDelay) ||
            converterDelay < 0) {
            return noSolution(prf, ifCount);
        }
        const std::int32_t n = periodsPerReading(prf, ifbw);
        if (isTrue(fixedPrf)) {
            const double newIfbw = roundHalfEven(prf / n);
            if (!ifbwInRange(newIfbw)) return noSolution(prf, ifCount);
            ifbwHz = static_cast<std::int32_t>(newIfbw);
        } else {
            const double newPrf = n * ifbw;
            if (!prfInRange(newPrf)) return noSolution(prf, ifCount);
            prf = newPrf;
        }
        ifCount = n;
    }

    void SolveInternal(double& prf, double& ifbw, double& time2, double& time1,
                       double& pulseClockHz, std::vector<std::int32_t>& list1,
                       std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                       Bool16 fixedPrf) override {
        const auto s = solveOnClock(prf, ifbw, pulseClockHz, isTrue(fixedPrf));
        if (!s) {
            prf = 0.0;
            clearInternal(time2, time1, list1, list2, list3);
            return;
        }
        writeInternal(*s, prf, ifbw, time2, time1, list1, list2, list3);
    }

    void SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                            double& pulseClockHz, std::vector<std::int32_t>& list1,
                            std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                            Bool16 fixedPrf, double highestGateDelay, double widestGateWidth,
                            double& gatedTime1, double& gatedTime2,
                            std::int32_t& gatedTicks) override {
        auto s = solveOnClock(prf, ifbw, pulseClockHz, isTrue(fixedPrf));
        double ticks = 0.0;
        if (s) {
            const bool gateOk = std::isfinite(highestGateDelay) && highestGateDelay >= 0 &&
                                std::isfinite(widestGateWidth) && widestGateWidth > 0;
            // The software window must close within the pulse period it integrates.
            if (!gateOk || highestGateDelay + widestGateWidth > 1.0 / s->prf) s.reset();
        }
        if (s) {
            ticks = std::max(1.0, roundHalfEven(widestGateWidth * pulseClockHz));
            if (ticks > kMaxInt32) s.reset();
        }
        if (!s) {
            prf = 0.0;
            clearInternal(time2, time1, list1, list2, list3);
            gatedTime1 = 0.0;
            gatedTime2 = 0.0;
            gatedTicks = 0;
            return;
        }
        writeInternal(*s, prf, ifbw, time2, time1, list1, list2, list3);
        gatedTime1 = highestGateDelay;
        gatedTime2 = widestGateWidth;
        gatedTicks = static_cast<std::int32_t>(ticks);
    }

    // The narrowband attenuator setting for a receiver on "Auto": the pulsed IF level is
    // 20 log10(duty cycle) below the CW level, so less attenuation is needed the narrower the
    // gate. The result is the nearest of the three gain-table settings 30, 15 and 0 dB.
    void SolveReceiver(double prf, double gateWidth, std::int16_t& rxValue) override {
        if (!std::isfinite(prf) || prf <= 0 || !std::isfinite(gateWidth) || gateWidth <= 0) {
            throw std::invalid_argument(
                "the receiver solution needs a positive PRF and gate width");
        }
        const double duty = std::min(1.0, prf * gateWidth);
        const double desensitisation = -20.0 * std::log10(duty);
        if (desensitisation <= 7.5) {
            rxValue = 30;
        } else if (desensitisation <= 22.5) {
            rxValue = 15;
        } else {
            rxValue = 0;
        }
    }

  private:
    static void noSolution(double& prf, std::int32_t& ifCount) {
        prf = 0.0;
        ifCount = 0;
    }

    static void clearInternal(double& time2, double& time1, std::vector<std::int32_t>& list1,
                              std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3) {
        time1 = 0.0;
        time2 = 0.0;
        list1.clear();
        list2.clear();
        list3.clear();
    }

    static void writeInternal(const InternalSolution& s, double& prf, double& ifbw, double& time2,
                              double& time1, std::vector<std::int32_t>& list1,
                              std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3) {
        prf = s.prf;
        ifbw = s.ifbw;
        time1 = s.prf / s.periods;  // readings per second
        time2 = s.ifbw;
        list1 = {s.periods, 1};  // boxcar over N periods as (taps, weight)
        list2 = {1, 1};          // unity second stage
        list3 = {s.ticks, s.periods};
    }
};

}  // namespace

std::unique_ptr<TimingSolver> makeDefaultSolver() {
    return std::make_unique<DefaultSolver>();
}

}  // namespace zp
