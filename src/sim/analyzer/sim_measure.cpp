// What a measurement reads at one sweep point: the gates and the source pulse as routed right now
// (internal generators by the path configuration, otherwise the wired external generators).

#include <optional>

#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/analyzer/sim_errors.h"
#include "sim/generators/sim_generator.h"

namespace zp::sim {

namespace {

enum class Kind { TestReceiver, ReferenceReceiver, SParameter };

struct Parameter {
    Kind kind;
    int port;        // measured port (A = 1 ...) or reference port (0: the source port's)
    int sourcePort;  // S-parameters only
};

std::optional<Parameter> parseParameter(std::string_view text, int ports) {
    const auto digit = [&](char c) { return c >= '1' && c <= '0' + ports ? c - '0' : 0; };
    if (text.size() == 1 && text[0] >= 'A' && text[0] < 'A' + ports) {
        return Parameter{Kind::TestReceiver, text[0] - 'A' + 1, 0};
    }
    if (text == "R" && ports == 4) return Parameter{Kind::ReferenceReceiver, 0, 0};
    if (text.size() == 2 && text[0] == 'R' && digit(text[1]) != 0) {
        return Parameter{Kind::ReferenceReceiver, digit(text[1]), 0};
    }
    if (text.size() == 3 && text[0] == 'S' && digit(text[1]) != 0 && digit(text[2]) != 0) {
        return Parameter{Kind::SParameter, digit(text[1]), digit(text[2])};
    }
    return std::nullopt;
}

// Internal generator "PulseN" when the element routes one, else the wired external output.
PulseWindow signalOf(const SimChannel& ch, const std::string& element, int row, int point,
                     const GeneratorMap* generators, const Wiring& wiring) {
    const auto it = ch.pathElements.find(element);
    if (it != ch.pathElements.end() && it->second.size() == 6 &&
        it->second.rfind("Pulse", 0) == 0 && it->second[5] >= '1' && it->second[5] <= '4') {
        const auto& g = ch.pulse.generators[static_cast<std::size_t>(it->second[5] - '0')];
        // Wired inside with the right sense: on during [delay, delay + width).
        PulseWindow window{.pulsed = g.on, .period = ch.pulse.period};
        if (g.on) {
            window.delay = g.delay + point * g.delayStep;
            window.width = g.width;
        }
        return window;
    }
    if (generators == nullptr || row < 0 || row >= wiring.rowCount()) return {};
    const WiredOutput& wired = wiring.row(row);
    const auto gen = generators->find(wired.address);
    if (gen == generators->end() || gen->second == nullptr) return {};
    return Wiring::inputWindow(gen->second->state(), wired.output);
}

}  // namespace

bool isMeasurableParameter(std::string_view parameter, int ports) {
    return parseParameter(parameter, ports).has_value();
}

std::complex<double> SimAnalyzerState::measure(const SimChannel& ch, const std::string& parameter,
                                               int point) const {
    const auto p = parseParameter(parameter, model_.ports);
    if (!p) throw analyzerError(kIllegalParameterValue);
    const int sourcePort = p->kind == Kind::SParameter ? p->sourcePort : ch.sourcePort;
    const PulseWindow source = signalOf(ch, Wiring::kSourceElement, 0, point, generators_, wiring_);

    const auto test = [&](int port) {
        const std::string receiver(1, static_cast<char>('A' + port - 1));
        const PulseWindow gate =
            signalOf(ch, Wiring::gateElement(receiver), Wiring::gateRow(receiver, model_.ports),
                     point, generators_, wiring_);
        return device_.gatedResponse(port, sourcePort, gate, source);
    };
    const auto reference = [&](int port) {
        const std::string receiver = "R" + std::to_string(port);
        const PulseWindow gate =
            signalOf(ch, Wiring::gateElement(receiver), Wiring::gateRow(receiver, model_.ports),
                     point, generators_, wiring_);
        const double leak = port == sourcePort ? 1.0 : 1e-3;
        return device_.gatedIncident(leak, gate, source, 10 + port);
    };

    switch (p->kind) {
        case Kind::TestReceiver:
            return test(p->port);
        case Kind::ReferenceReceiver:
            return reference(p->port == 0 ? sourcePort : p->port);
        case Kind::SParameter:
            return test(p->port) / reference(p->sourcePort);
    }
    return {};
}

}  // namespace zp::sim
