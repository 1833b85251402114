#include "core/timing_solver.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>
#include <stdexcept>
#include <utility>

#include "core/numeric.h"
#include "core/timing_limits.h"

// Narrowband pulsed detection: the IF filter integrates over a whole number N of pulse periods,
// which puts its nulls on the PRF harmonics so that only the carrier line is measured. The model
// and the meaning of every result are in docs/timing-solver.md.

namespace zp {

namespace {

constexpr double kMaxInt32 = std::numeric_limits<std::int32_t>::max();

bool prfInRange(double prf) {
    return std::isfinite(prf) && prf >= kPrfRangeHz.low && prf <= kPrfRangeHz.high;
}
bool ifbwInRange(double ifbw) {
    return std::isfinite(ifbw) && ifbw >= kIfbwRangeHz.low && ifbw <= kIfbwRangeHz.high;
}

// Pulse periods per IF reading; the callers have checked prf and ifbw.
std::int32_t periodsPerReading(double prf, double ifbw) {
    return static_cast<std::int32_t>(std::max(1.0, roundHalfEven(prf / ifbw)));
}

// The internal path on the pulse clock grid.
struct ClockSolution {
    double prf = 0.0;
    double ifbw = 0.0;
    std::int32_t ticks = 0;  // pulse clock ticks per period
    std::int32_t periods = 0;
};

std::optional<ClockSolution> solveOnClock(double prf, double ifbw, double clock, bool fixedPrf) {
    if (!prfInRange(prf) || !ifbwInRange(ifbw) || !std::isfinite(clock) || clock <= 0) {
        return std::nullopt;
    }
    ClockSolution s;
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

// No solution: PRF 0, the desired IF bandwidth and clock kept, every further result zero.
InternalSolution noInternalSolution(const InternalRequest& r) {
    InternalSolution out;
    out.ifbw = r.ifbw;
    out.pulseClockHz = r.pulseClockHz;
    return out;
}

InternalSolution internalSolution(const InternalRequest& r, const ClockSolution& s) {
    InternalSolution out;
    out.prf = s.prf;
    out.ifbw = s.ifbw;
    out.pulseClockHz = r.pulseClockHz;
    out.time1 = s.prf / s.periods;  // readings per second
    out.time2 = s.ifbw;
    out.list1 = {s.periods, 1};  // boxcar over N periods as (taps, weight)
    out.list2 = {1, 1};          // unity second stage
    out.list3 = {s.ticks, s.periods};
    return out;
}

class DefaultSolver final : public TimingSolver {
  public:
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
    // `decade` and `flag` are not needed by this model: N follows from PRF / IFBW directly.
    // Synchronous detection needs no receiver offset; the converter delay is taken up by the
    // analyzer's IF timing (setIfTimeA), not by the frequency.
    ExternalSolution external(const ExternalRequest& r) override {
        ExternalSolution out;
        out.ifbwHz = r.ifbwHz;
        out.converterDelay = r.converterDelay;
        const double ifbw = r.ifbwHz;
        if (!prfInRange(r.prf) || !ifbwInRange(ifbw) || !std::isfinite(r.converterDelay) ||
            r.converterDelay < 0) {
            return out;
        }
        const std::int32_t n = periodsPerReading(r.prf, ifbw);
        out.prf = r.prf;
        if (isTrue(r.fixedPrf)) {
            const double newIfbw = roundHalfEven(r.prf / n);
            if (!ifbwInRange(newIfbw)) return noExternalSolution(out);
            out.ifbwHz = static_cast<std::int32_t>(newIfbw);
        } else {
            out.prf = n * ifbw;
            if (!prfInRange(out.prf)) return noExternalSolution(out);
        }
        out.ifCount = n;
        return out;
    }

    InternalSolution internal(const InternalRequest& r) override {
        const auto s = solveOnClock(r.prf, r.ifbw, r.pulseClockHz, isTrue(r.fixedPrf));
        return s ? internalSolution(r, *s) : noInternalSolution(r);
    }

    InternalSolution internalGated(const InternalRequest& r, const GateWindow& gate) override {
        const auto s = solveOnClock(r.prf, r.ifbw, r.pulseClockHz, isTrue(r.fixedPrf));
        if (!s) return noInternalSolution(r);
        const double delay = gate.highestGateDelay;
        const double width = gate.widestGateWidth;
        const bool gateOk = std::isfinite(delay) && delay >= 0 && std::isfinite(width) && width > 0;
        // The software window must close within the pulse period it integrates.
        if (!gateOk || delay + width > 1.0 / s->prf) return noInternalSolution(r);
        const double ticks = std::max(1.0, roundHalfEven(width * r.pulseClockHz));
        if (ticks > kMaxInt32) return noInternalSolution(r);
        InternalSolution out = internalSolution(r, *s);
        out.gate = {delay, width, static_cast<std::int32_t>(ticks)};
        return out;
    }

    static ExternalSolution noExternalSolution(ExternalSolution out) {
        out.prf = 0.0;
        out.ifCount = 0;
        return out;
    }
};

}  // namespace

void TimingSolver::SolveExternal(double& prf, std::int32_t& ifCount, std::int32_t& ifbwHz,
                                 double& freqOffset, double& converterDelay, std::int16_t decade,
                                 Bool16 fixedPrf, Bool16 flag) {
    const ExternalSolution s = external({prf, ifbwHz, converterDelay, decade, fixedPrf, flag});
    prf = s.prf;
    ifCount = s.ifCount;
    ifbwHz = s.ifbwHz;
    freqOffset = s.freqOffset;
    converterDelay = s.converterDelay;
}

namespace {

void writeInternal(InternalSolution&& s, double& prf, double& ifbw, double& time2, double& time1,
                   double& pulseClockHz, std::vector<std::int32_t>& list1,
                   std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3) {
    prf = s.prf;
    ifbw = s.ifbw;
    time2 = s.time2;
    time1 = s.time1;
    pulseClockHz = s.pulseClockHz;
    list1 = std::move(s.list1);
    list2 = std::move(s.list2);
    list3 = std::move(s.list3);
}

}  // namespace

void TimingSolver::SolveInternal(double& prf, double& ifbw, double& time2, double& time1,
                                 double& pulseClockHz, std::vector<std::int32_t>& list1,
                                 std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                                 Bool16 fixedPrf) {
    writeInternal(internal({prf, ifbw, pulseClockHz, fixedPrf}), prf, ifbw, time2, time1,
                  pulseClockHz, list1, list2, list3);
}

void TimingSolver::SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                                      double& pulseClockHz, std::vector<std::int32_t>& list1,
                                      std::vector<std::int32_t>& list2,
                                      std::vector<std::int32_t>& list3, Bool16 fixedPrf,
                                      double highestGateDelay, double widestGateWidth,
                                      double& gatedTime1, double& gatedTime2,
                                      std::int32_t& gatedTicks) {
    InternalSolution s =
        internalGated({prf, ifbw, pulseClockHz, fixedPrf}, {highestGateDelay, widestGateWidth});
    gatedTime1 = s.gate.time1;
    gatedTime2 = s.gate.time2;
    gatedTicks = s.gate.ticks;
    writeInternal(std::move(s), prf, ifbw, time2, time1, pulseClockHz, list1, list2, list3);
}

std::unique_ptr<TimingSolver> makeDefaultSolver() {
    return std::make_unique<DefaultSolver>();
}

}  // namespace zp
