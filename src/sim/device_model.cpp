#include "sim/device_model.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace zp::sim {

namespace {

constexpr int kSamples = 128;

template <class F>
auto average(const PulseWindow& gate, double period, F&& f) -> decltype(f(0.0)) {
    const double start = gate.pulsed ? gate.delay : 0.0;
    const double span = gate.pulsed ? gate.width : period;
    if (span <= 0.0) return f(start);
    decltype(f(0.0)) sum{};
    for (int k = 0; k < kSamples; ++k) sum += f(start + span * (k + 0.5) / kSamples);
    return sum / static_cast<double>(kSamples);
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

std::complex<double> DeviceModel::response(double t, const PulseWindow& source) const {
    if (!source.pulsed) return 1.0;
    const auto whileOn = [](double tau) {
        const double omega = 2.0 * std::numbers::pi * kRingFrequency;
        const double step =
            1.0 - std::exp(-tau / kRiseTime) *
                      (std::cos(omega * tau) + std::sin(omega * tau) / (omega * kRiseTime));
        const double droop = std::max(0.5, 1.0 - kDroopPerSecond * tau);
        return step * droop * std::polar(1.0, kPhaseDriftPerSecond * tau);
    };
    const double tau = t - source.delay;
    if (tau < 0.0) return 0.0;
    if (tau <= source.width) return whileOn(tau);
    return whileOn(source.width) * std::exp(-(tau - source.width) / kFallTime);
}

double DeviceModel::incident(double t, const PulseWindow& source) const {
    if (!source.pulsed) return 1.0;
    const double tau = t - source.delay;
    if (tau < 0.0) return 0.0;
    const double top = 1.0 - std::exp(-std::min(tau, source.width) / kSourceEdge);
    if (tau <= source.width) return top;
    return top * std::exp(-(tau - source.width) / kSourceEdge);
}

std::complex<double> DeviceModel::gatedResponse(int measuredPort, int sourcePort,
                                                const PulseWindow& gate, const PulseWindow& source,
                                                double period) const {
    const auto mean = average(gate, period, [&](double t) { return response(t, source); });
    return gain(measuredPort, sourcePort) * mean + noise(gate, period, measuredPort);
}

std::complex<double> DeviceModel::gatedIncident(double scale, const PulseWindow& gate,
                                                const PulseWindow& source, double period,
                                                int salt) const {
    const double mean = average(gate, period, [&](double t) { return incident(t, source); });
    return scale * mean + noise(gate, period, salt);
}

std::complex<double> DeviceModel::noise(const PulseWindow& gate, double period, int salt) {
    const double seed =
        gate.pulsed ? gate.delay * 2.718281828e8 + gate.width * 1.618033989e8 : period * 1e3;
    const double angle = std::fmod(seed + salt * 0.7, 2.0 * std::numbers::pi);
    return std::polar(kNoiseFloor, angle);
}

}  // namespace zp::sim
