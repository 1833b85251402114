#include "sim/generators/device_model.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <optional>

namespace zp::sim {

namespace {

constexpr int kSamples = 128;

template <class F>
auto average(const PulseWindow& gate, F&& f) -> decltype(f(0.0)) {
    const OnSpan on = onSpan(gate);
    if (on.length <= 0.0) return f(on.start);
    decltype(f(0.0)) sum{};
    for (int k = 0; k < kSamples; ++k) {
        double t = on.start + on.length * (k + 0.5) / kSamples;
        if (t >= gate.period) t -= gate.period;  // the part past the period's end
        sum += f(t);
    }
    return sum / static_cast<double>(kSamples);
}

// Time since the latest start of the periodic source pulse (the previous period's pulse when t
// comes before this period's), with the pulse's length; nothing when the source never goes off.
struct SinceStart {
    double tau;
    double length;
};

std::optional<SinceStart> sinceStart(double t, const PulseWindow& source) {
    if (!source.pulsed || source.period <= 0.0) return std::nullopt;
    const OnSpan on = onSpan(source);
    if (on.length >= source.period) return std::nullopt;
    double tau = std::fmod(t - on.start, source.period);
    if (tau < 0.0) tau += source.period;
    return SinceStart{tau, on.length};
}

std::complex<double> polarDeg(double magnitude, double degrees) {
    return std::polar(magnitude, degrees * std::numbers::pi / 180.0);
}

}  // namespace

std::complex<double> DeviceModel::gain(int measuredPort, int sourcePort) const {
    if (measuredPort == sourcePort) return polarDeg(0.3, 45.0);
    if ((measuredPort == 2 && sourcePort == 1) || (measuredPort == 4 && sourcePort == 3)) {
        return polarDeg(3.16, -60.0);  // the amplifier's forward path
    }
    if ((measuredPort == 1 && sourcePort == 2) || (measuredPort == 3 && sourcePort == 4)) {
        return polarDeg(0.02, 10.0);
    }
    return polarDeg(0.005, 0.0);
}

OnSpan onSpan(const PulseWindow& window) {
    const double period = std::max(window.period, 0.0);
    if (!window.pulsed || period <= 0.0) return {0.0, period};
    const double width = std::clamp(window.width, 0.0, period);
    const double start = std::fmod(std::max(window.delay, 0.0), period);
    if (!window.complement) return {start, width};
    const double end = start + width;
    return {end >= period ? end - period : end, period - width};
}

std::complex<double> DeviceModel::response(double t, const PulseWindow& source) const {
    const auto since = sinceStart(t, source);
    if (!since) return 1.0;
    const auto whileOn = [](double tau) {
        const double omega = 2.0 * std::numbers::pi * kRingFrequency;
        const double step =
            1.0 - std::exp(-tau / kRiseTime) *
                      (std::cos(omega * tau) + std::sin(omega * tau) / (omega * kRiseTime));
        const double droop = std::max(0.5, 1.0 - kDroopPerSecond * tau);
        return step * droop * std::polar(1.0, kPhaseDriftPerSecond * tau);
    };
    if (since->tau <= since->length) return whileOn(since->tau);
    return whileOn(since->length) * std::exp(-(since->tau - since->length) / kFallTime);
}

double DeviceModel::incident(double t, const PulseWindow& source) const {
    const auto since = sinceStart(t, source);
    if (!since) return 1.0;
    const double top = 1.0 - std::exp(-std::min(since->tau, since->length) / kSourceEdge);
    if (since->tau <= since->length) return top;
    return top * std::exp(-(since->tau - since->length) / kSourceEdge);
}

std::complex<double> DeviceModel::gatedResponse(int measuredPort, int sourcePort,
                                                const PulseWindow& gate,
                                                const PulseWindow& source) const {
    const auto mean = average(gate, [&](double t) { return response(t, source); });
    return gain(measuredPort, sourcePort) * mean + noise(gate, measuredPort);
}

std::complex<double> DeviceModel::gatedIncident(double scale, const PulseWindow& gate,
                                                const PulseWindow& source, int salt) const {
    const double mean = average(gate, [&](double t) { return incident(t, source); });
    return scale * mean + noise(gate, salt);
}

std::complex<double> DeviceModel::noise(const PulseWindow& gate, int salt) {
    const OnSpan on = onSpan(gate);
    const double seed =
        gate.pulsed ? on.start * 2.718281828e8 + on.length * 1.618033989e8 : gate.period * 1e3;
    const double angle = std::fmod(seed + salt * 0.7, 2.0 * std::numbers::pi);
    return std::polar(kNoiseFloor, angle);
}

}  // namespace zp::sim
