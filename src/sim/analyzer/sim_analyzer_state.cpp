#include "sim/analyzer/sim_analyzer_state.h"

#include <algorithm>
#include <cmath>
#include <filesystem>

#include "core/pulsed_module.h"
#include "sim/analyzer/sim_errors.h"

namespace zp::sim {

namespace {

constexpr int kMaxChannel = 200;
constexpr int kMaxPoints = 32001;

bool contains(const std::string& text, std::string_view part) {
    return text.find(part) != std::string::npos;
}

}  // namespace

SimAnalyzerState::SimAnalyzerState(SimModel model, SimFaults* faults, IoTrace* trace,
                                   const GeneratorMap* generators)
    : model_(std::move(model)),
      faults_(faults),
      trace_(trace),
      generators_(generators),
      wiring_(Wiring::defaultTable(model_.ports)) {
    SimChannel first = makeChannel(1);
    first.measurements.push_back({"CH1_S11_1", "S11", 0, {}});
    first.measurements.back().data.assign(static_cast<std::size_t>(first.points), {});
    first.selected = "CH1_S11_1";
    channels_.emplace(1, std::move(first));
}

bool SimAnalyzerState::isListedModel() const {
    return isListedModelText(model_.modelText);
}

bool SimAnalyzerState::hasSourceModulator(int source) const {
    if (!isListedModel()) return false;
    const std::string& options = model_.optionText;
    if (source == 1) return contains(options, "M81") || contains(options, "M83");
    if (source == 2) return contains(options, "M82") || contains(options, "M84");
    return false;
}

double SimAnalyzerState::pulseClockHz() const {
    char* end = nullptr;
    const double value = std::strtod(model_.hardwareValue.c_str(), &end);
    const bool five = end != model_.hardwareValue.c_str() && value == 5.0;
    return five ? 100e6 : 60e6;
}

std::optional<std::string> SimAnalyzerState::takeFault(std::string_view objectOperation) {
    if (faults_ == nullptr) return std::nullopt;
    for (auto& fault : faults_->analyzer) {
        if (fault.operation != objectOperation || fault.remaining == 0) continue;
        if (fault.remaining > 0) --fault.remaining;
        return fault.description;
    }
    return std::nullopt;
}

bool SimAnalyzerState::malformedData() const {
    return faults_ != nullptr && faults_->malformedData;
}

SimChannel SimAnalyzerState::makeChannel(int number) const {
    SimChannel channel;
    channel.number = number;
    auto& elements = channel.pathElements;
    elements["IFSigPathAll"] = "WBF";
    elements["IFAntiAliasFilter"] = "AUTO";
    if (isListedModel()) {
        const bool four = model_.ports == 4;
        const std::vector<std::string> receivers =
            four ? std::vector<std::string>{"A", "B", "C", "D", "R1", "R2", "R3", "R4"}
                 : std::vector<std::string>{"A", "B", "R1", "R2"};
        for (const auto& r : receivers) {
            elements[Wiring::gateElement(r)] = "ON";
            elements["NBFATN" + r] = "3";
        }
        if (hasSourceModulator(1) || hasSourceModulator(2)) elements[Wiring::kSourceElement] = "ON";
        if (hasSourceModulator(1)) elements["Src1Out1PulseModEnable"] = "Disable";
        if (hasSourceModulator(2)) elements["Src2Out1PulseModEnable"] = "Disable";
    }
    for (int port = 1; port <= model_.ports; ++port) channel.alcMode[port] = 0;
    return channel;
}

SimChannel& SimAnalyzerState::channel(int number) {
    SimChannel* found = findChannel(number);
    if (found == nullptr) throw analyzerError(kHeaderSuffixOutOfRange);
    return *found;
}

SimChannel* SimAnalyzerState::findChannel(int number) {
    const auto it = channels_.find(number);
    return it == channels_.end() ? nullptr : &it->second;
}

std::vector<int> SimAnalyzerState::channelNumbers() const {
    std::vector<int> numbers;
    for (const auto& [number, channel] : channels_) numbers.push_back(number);
    return numbers;
}

void SimAnalyzerState::copyChannel(int from, int to) {
    if (to < 1 || to > kMaxChannel) throw analyzerError(kHeaderSuffixOutOfRange);
    SimChannel copy = channel(from);
    copy.number = to;
    copy.inSetup = false;
    copy.nextPoint = 0;
    if (SimChannel* existing = findChannel(to); existing != nullptr) {
        copy.measurements = std::move(existing->measurements);
        copy.selected = existing->selected;
    } else {
        const std::string oldPrefix = "CH" + std::to_string(from) + "_";
        const std::string newPrefix = "CH" + std::to_string(to) + "_";
        for (auto& m : copy.measurements) {
            if (m.name.rfind(oldPrefix, 0) == 0)
                m.name = newPrefix + m.name.substr(oldPrefix.size());
        }
        if (copy.selected.rfind(oldPrefix, 0) == 0) {
            copy.selected = newPrefix + copy.selected.substr(oldPrefix.size());
        }
    }
    for (auto& m : copy.measurements) m.data.assign(static_cast<std::size_t>(copy.points), {});
    channels_[to] = std::move(copy);
    current_ = to;
}

std::vector<std::string> SimAnalyzerState::alcModes(int port) const {
    // A two-port analyzer's second source comes out as port 3.
    const int lastPort = model_.ports == 2 && model_.sources >= 2 ? 3 : model_.ports;
    if (port < 1 || port > lastPort) throw analyzerError(kDataOutOfRange);
    return {"INTernal", "EXTernal", "OPENloop"};
}

void SimAnalyzerState::setInternalWidth(SimChannel& channel, int generator, double seconds) {
    if (generator < 0 || generator > 4 || !(seconds > 0.0) || seconds > 1.0) {
        throw analyzerError(kDataOutOfRange);
    }
    const double clock = pulseClockHz();
    const double ticks = std::max(1.0, std::nearbyint(seconds * clock));
    channel.pulse.generators[static_cast<std::size_t>(generator)].width = ticks / clock;
}

void SimAnalyzerState::setPoints(SimChannel& channel, int points) {
    if (points < 1 || points > kMaxPoints) throw analyzerError(kDataOutOfRange);
    channel.points = points;
    channel.nextPoint = 0;
    for (auto& m : channel.measurements) m.data.assign(static_cast<std::size_t>(points), {});
}

void SimAnalyzerState::acquirePoint() {
    SimChannel& ch = channel(current_);
    const int index = ch.nextPoint % std::max(ch.points, 1);
    for (auto& m : ch.measurements) {
        m.data.resize(static_cast<std::size_t>(ch.points));
        m.data[static_cast<std::size_t>(index)] = measure(ch, m.parameter, index);
    }
    ch.nextPoint = (index + 1) % std::max(ch.points, 1);
}

void SimAnalyzerState::singleSweep(int number) {
    SimChannel& ch = channel(number);
    for (auto& m : ch.measurements) {
        m.data.assign(static_cast<std::size_t>(ch.points), {});
        for (int i = 0; i < ch.points; ++i) {
            m.data[static_cast<std::size_t>(i)] = measure(ch, m.parameter, i);
        }
    }
    ch.nextPoint = 0;
}

std::string SimAnalyzerState::helpFilePath() const {
    const std::string installed = ZP_HELP_DIR_INSTALL;
    std::error_code ec;
    const std::string file = "/zentra-pulse.html";
    if (std::filesystem::exists(installed + file, ec)) return installed + file;
    return ZP_HELP_DIR_BUILD + file;
}

}  // namespace zp::sim
