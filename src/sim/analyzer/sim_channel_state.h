#pragma once
// The settings of one simulated analyzer channel, as plain data.

#include <array>
#include <complex>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace zp::sim {

struct SimInternalGenerator {
    double width = 1e-6;     // s, on the pulse-clock grid
    double delay = 0.0;      // s
    double delayStep = 0.0;  // s, added per sweep point
    bool on = false;
};

struct SimPulseGenerators {
    double period = 1e-3;                            // s
    std::array<SimInternalGenerator, 5> generators;  // 0 works with the processing module
};

struct SimIfConfiguration {
    std::map<std::string, bool> receiverSwitch;
    std::map<std::string, int> receiverGain;
    bool ifSwitchA = false;
    bool ifSwitchB = false;
    bool internalGateSwitch = false;
    double ifTimeA = 0.0;
    int ifCountB = 0;
    int narrowbandSwitch = 0;
    double narrowbandValue = 0.0;
};

struct SimProcessingModule {
    std::string filterType = "RECT";
    std::map<std::string, double> filterParameters;
    int processingSwitch = 0;
    double processingRate = 0.0;
    std::vector<std::int32_t> coefficientsA;
    std::vector<std::int32_t> coefficientsB;
};

struct SimMeasurement {
    std::string name;       // "CH1_S11_1", "PIP_MEAS"
    std::string parameter;  // "S21", "A" ...
    int correctionType = 0;
    std::vector<std::complex<double>> data;  // one value per sweep point
};

struct SimChannel {
    int number = 1;
    bool inSetup = false;
    double ifBandwidth = 1e3;
    SimIfConfiguration ifConfiguration;
    std::map<std::string, std::string> pathElements;
    SimPulseGenerators pulse;
    SimProcessingModule processing;
    int frequencyOffsetState = 0;
    double frequencyOffsetFrequency = 0.0;
    std::map<int, int> alcMode;  // port -> mode number

    int sweepType = 1;
    double cwFrequency = 1e9;
    int points = 201;
    bool alternateSweep = false;
    bool autoSweepTime = true;
    double sweepTime = 0.02;
    std::string sweepMode = "CONT";
    int sourcePort = 1;
    bool correction = false;

    std::vector<SimMeasurement> measurements;
    std::string selected;  // name of the selected measurement, "" for none
    int nextPoint = 0;     // where the next triggered point goes

    SimMeasurement* findMeasurement(const std::string& name) {
        for (auto& m : measurements) {
            if (m.name == name) return &m;
        }
        return nullptr;
    }
};

}  // namespace zp::sim
