#pragma once
// The pulsed device under test and what the receivers see of it through their IF gates.

#include <complex>

namespace zp::sim {

// A pulse train's "on" window within one period; a signal that is not pulsed is on all the time.
// A window running past the end of the period continues from its start, and a delay beyond the
// period counts from the period it falls in. A complementary window is on everywhere in the
// period except [delay, delay + width).
struct PulseWindow {
    bool pulsed = false;
    double delay = 0.0;  // s from the start of the period
    double width = 0.0;  // s, at most one period counts
    bool complement = false;
    double period = 1e-3;  // s
};

// The on part of a window as one stretch of the period seen as a circle: it starts at `start`
// (0 <= start < period) and lasts `length` (0..period), wrapping round the period's end.
struct OnSpan {
    double start = 0.0;
    double length = 0.0;
};
OnSpan onSpan(const PulseWindow& window);

class DeviceModel {
  public:
    // Complex gain of the path from source port j to the receiver of port i (steady state).
    std::complex<double> gain(int measuredPort, int sourcePort) const;

    // Envelope of the device's response at time t to the periodic source pulse (1 = steady
    // state): rise with overshoot, droop and a phase drift while the pulse is on, then the fall.
    std::complex<double> response(double t, const PulseWindow& source) const;
    // What a reference receiver sees: the source pulse itself with a short rise and fall.
    double incident(double t, const PulseWindow& source) const;

    // Averages over what the gate lets through; an open gate averages a whole period. A small
    // deterministic noise floor depends on the gate alone, so a fixed gate reads a fixed value.
    std::complex<double> gatedResponse(int measuredPort, int sourcePort, const PulseWindow& gate,
                                       const PulseWindow& source) const;
    std::complex<double> gatedIncident(double scale, const PulseWindow& gate,
                                       const PulseWindow& source, int salt) const;

    static std::complex<double> noise(const PulseWindow& gate, int salt);

    static constexpr double kRiseTime = 80e-9;             // s, time constant of the rise
    static constexpr double kRingFrequency = 4e6;          // Hz, of the overshoot
    static constexpr double kFallTime = 60e-9;             // s
    static constexpr double kDroopPerSecond = 2e4;         // relative amplitude lost per second on
    static constexpr double kPhaseDriftPerSecond = 8.7e4;  // rad/s (about 5 degrees per us)
    static constexpr double kSourceEdge = 5e-9;            // s, the source pulse's own edges
    static constexpr double kNoiseFloor = 1e-4;
};

}  // namespace zp::sim
