// The analyzer's SCPI command parser: the catalog and data commands of channel 32 and the few
// others the program sends. Every failing command raises its SCPI error instead of queueing it.

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdio>
#include <optional>

#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/analyzer/sim_errors.h"

namespace zp::sim {

namespace {

struct Node {
    std::string word;  // upper case, without its suffix
    std::optional<int> suffix;
};

struct Command {
    std::vector<Node> nodes;
    bool query = false;
    std::vector<std::string> arguments;
};

std::string upper(std::string_view text) {
    std::string out(text);
    for (auto& c : out) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return out;
}

std::string_view trim(std::string_view text) {
    const auto blank = [](char c) { return std::isspace(static_cast<unsigned char>(c)) != 0; };
    while (!text.empty() && blank(text.front())) text.remove_prefix(1);
    while (!text.empty() && blank(text.back())) text.remove_suffix(1);
    return text;
}

// "CALCulate" matches CALC and CALCULATE.
bool is(const Node& node, std::string_view keyword) {
    std::string shortForm;
    for (const char c : keyword) {
        if (std::isupper(static_cast<unsigned char>(c))) shortForm += c;
    }
    return node.word == shortForm || node.word == upper(keyword);
}

Command split(std::string_view text) {
    text = trim(text);
    const auto space = text.find_first_of(" \t");
    std::string_view header = text.substr(0, space);
    const std::string_view rest = space == std::string_view::npos ? "" : trim(text.substr(space));

    Command command;
    if (!header.empty() && header.back() == '?') {
        command.query = true;
        header.remove_suffix(1);
    }
    if (!header.empty() && header.front() == ':') header.remove_prefix(1);
    if (header.empty()) throw analyzerError(kUndefinedHeader);
    std::size_t start = 0;
    while (start <= header.size()) {
        const auto colon = header.find(':', start);
        const std::string_view part = header.substr(start, colon - start);
        auto digits = part.find_first_of("0123456789");
        Node node;
        node.word = upper(part.substr(0, digits));
        if (node.word.empty()) throw analyzerError(kUndefinedHeader);
        if (digits != std::string_view::npos) {
            int value = 0;
            for (const char c : part.substr(digits)) {
                if (!std::isdigit(static_cast<unsigned char>(c)) || value > 100000) {
                    throw analyzerError(kUndefinedHeader);
                }
                value = value * 10 + (c - '0');
            }
            node.suffix = value;
        }
        command.nodes.push_back(std::move(node));
        if (colon == std::string_view::npos) break;
        start = colon + 1;
    }

    std::string current;
    char quote = 0;
    for (const char c : rest) {
        if (quote != 0) {
            if (c == quote) quote = 0;
            current += c;
        } else if (c == '\'' || c == '"') {
            quote = c;
            current += c;
        } else if (c == ',') {
            command.arguments.emplace_back(trim(current));
            current.clear();
        } else {
            current += c;
        }
    }
    if (quote != 0) throw analyzerError("-150 String data error");
    if (!rest.empty()) command.arguments.emplace_back(trim(current));
    return command;
}

bool matches(const Command& c, std::initializer_list<std::string_view> keywords) {
    if (c.nodes.size() != keywords.size()) return false;
    std::size_t i = 0;
    for (const auto keyword : keywords) {
        if (!is(c.nodes[i++], keyword)) return false;
    }
    return true;
}

const std::string& argument(const Command& c, std::size_t index) {
    if (index >= c.arguments.size() || c.arguments[index].empty()) {
        throw analyzerError(kMissingParameter);
    }
    return c.arguments[index];
}

void expectArguments(const Command& c, std::size_t count) {
    if (c.arguments.size() > count) throw analyzerError("-108 Parameter not allowed");
    if (c.arguments.size() < count) throw analyzerError(kMissingParameter);
}

std::string unquote(const std::string& text) {
    if (text.size() >= 2 && (text.front() == '\'' || text.front() == '"') &&
        text.back() == text.front()) {
        return text.substr(1, text.size() - 2);
    }
    return text;
}

int wholeNumber(const std::string& text) {
    std::size_t used = 0;
    int value = 0;
    try {
        value = std::stoi(text, &used);
    } catch (const std::exception&) {
        throw analyzerError("-104 Data type error");
    }
    if (used != text.size()) throw analyzerError("-104 Data type error");
    return value;
}

bool onOff(const std::string& text) {
    const std::string word = upper(text);
    if (word == "ON" || word == "1") return true;
    if (word == "OFF" || word == "0") return false;
    throw analyzerError(kIllegalValue);
}

std::string catalog(const SimChannel& ch) {
    if (ch.measurements.empty()) return "\"NO CATALOG\"\n";
    std::string reply = "\"";
    for (const auto& m : ch.measurements) {
        if (reply.size() > 1) reply += ',';
        reply += m.name + "," + m.parameter;
    }
    return reply + "\"\n";
}

std::string sdata(const SimChannel& ch, bool malformed) {
    const SimMeasurement* m = nullptr;
    for (const auto& candidate : ch.measurements) {
        if (candidate.name == ch.selected) m = &candidate;
    }
    if (m == nullptr) throw analyzerError(kSettingsConflict);
    std::string reply;
    reply.reserve(m->data.size() * 40);
    for (const auto& value : m->data) {
        if (!reply.empty()) reply += ',';
        reply += sdataField(value.real()) + "," + sdataField(value.imag());
    }
    if (malformed) {
        // A block cut short in the middle of a field, with a garbled character in it.
        reply.resize(std::max<std::size_t>(reply.size() / 2, 9) - 3);
        if (reply.size() > 4) reply[4] = '#';
    }
    return reply + "\n";
}

}  // namespace

std::string sdataField(double value) {
    if (!std::isfinite(value)) value = 9.91e37;  // the analyzer's "not a number"
    char text[40];
    std::snprintf(text, sizeof text, "%+.11E", value);
    std::string field(text);
    const auto e = field.find('E');
    std::string exponent = field.substr(e + 2);
    while (exponent.size() < 3) exponent.insert(0, "0");
    return field.substr(0, e + 2) + exponent;
}

std::string SimAnalyzerState::parse(const std::string& text) {
    const Command c = split(text);
    const auto channelOf = [&]() -> SimChannel& { return channel(c.nodes[0].suffix.value_or(1)); };

    if (matches(c, {"*IDN"}) && c.query) {
        return "Korvex," + model_.modelText + ",SIM000001,A.01.00\n";
    }
    if (matches(c, {"DIAGnostic", "HELP", "FILE"}) && c.query) {
        expectArguments(c, 0);
        return "\"" + helpFilePath() + "\"\n";
    }
    if (matches(c, {"CALCulate", "PARameter", "CATalog"}) && c.query) {
        expectArguments(c, 0);
        return catalog(channelOf());
    }
    if (matches(c, {"CALCulate", "PARameter", "DEFine"}) && !c.query) {
        expectArguments(c, 2);
        SimChannel& ch = channelOf();
        const std::string name = unquote(argument(c, 0));
        const std::string parameter = upper(unquote(argument(c, 1)));
        if (name.empty()) throw analyzerError(kIllegalValue);
        if (!isMeasurableParameter(parameter, model_.ports)) throw analyzerError(kIllegalValue);
        if (ch.findMeasurement(name) != nullptr) throw analyzerError(kSettingsConflict);
        ch.measurements.push_back({name, parameter, 0, {}});
        ch.measurements.back().data.assign(static_cast<std::size_t>(ch.points), {});
        return "";
    }
    if (matches(c, {"CALCulate", "PARameter", "SELect"}) && !c.query) {
        expectArguments(c, 1);
        SimChannel& ch = channelOf();
        const std::string name = unquote(argument(c, 0));
        if (ch.findMeasurement(name) == nullptr) throw analyzerError(kIllegalValue);
        ch.selected = name;
        return "";
    }
    if (matches(c, {"CALCulate", "PARameter", "MODify"}) && !c.query) {
        expectArguments(c, 1);
        SimChannel& ch = channelOf();
        const std::string parameter = upper(unquote(argument(c, 0)));
        if (!isMeasurableParameter(parameter, model_.ports)) throw analyzerError(kIllegalValue);
        SimMeasurement* m = ch.findMeasurement(ch.selected);
        if (m == nullptr) throw analyzerError(kSettingsConflict);
        m->parameter = parameter;
        m->data.assign(static_cast<std::size_t>(ch.points), {});
        return "";
    }
    if (matches(c, {"CALCulate", "PARameter", "DELete"}) && !c.query) {
        expectArguments(c, 1);
        SimChannel& ch = channelOf();
        const std::string name = unquote(argument(c, 0));
        const auto it = std::find_if(ch.measurements.begin(), ch.measurements.end(),
                                     [&](const SimMeasurement& m) { return m.name == name; });
        if (it == ch.measurements.end()) throw analyzerError(kIllegalValue);
        ch.measurements.erase(it);
        if (ch.selected == name) ch.selected.clear();
        return "";
    }
    if (matches(c, {"CALCulate", "DATA"}) && c.query) {
        expectArguments(c, 1);
        if (upper(argument(c, 0)) != "SDATA") throw analyzerError(kIllegalValue);
        return sdata(channelOf(), malformedData());
    }
    if (matches(c, {"SENSe", "SWEep", "SRCPort"})) {
        SimChannel& ch = channelOf();
        if (c.query) return std::to_string(ch.sourcePort) + "\n";
        expectArguments(c, 1);
        const int port = wholeNumber(argument(c, 0));
        if (port < 1 || port > model_.ports) throw analyzerError(kDataOutOfRange);
        ch.sourcePort = port;
        return "";
    }
    if (matches(c, {"SENSe", "CORRection"}) || matches(c, {"SENSe", "CORRection", "STATe"})) {
        SimChannel& ch = channelOf();
        if (c.query) return ch.correction ? "1\n" : "0\n";
        expectArguments(c, 1);
        ch.correction = onOff(argument(c, 0));
        return "";
    }
    if (matches(c, {"SENSe", "SWEep", "MODE"})) {
        SimChannel& ch = channelOf();
        if (c.query) return ch.sweepMode + "\n";
        expectArguments(c, 1);
        const std::string mode = upper(argument(c, 0));
        const std::pair<const char*, const char*> modes[] = {
            {"CONT", "CONTINUOUS"}, {"HOLD", "HOLD"}, {"SING", "SINGLE"}, {"GRO", "GROUPS"}};
        for (const auto& [shortForm, longForm] : modes) {
            if (mode == shortForm || mode == longForm) {
                ch.sweepMode = shortForm;
                return "";
            }
        }
        throw analyzerError(kIllegalValue);
    }
    throw analyzerError(kUndefinedHeader);
}

}  // namespace zp::sim
