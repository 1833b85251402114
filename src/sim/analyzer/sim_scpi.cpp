// The analyzer's SCPI command parser: the catalog and data commands of channel 32 and the few
// others the program sends. Every failing command raises its SCPI error instead of queueing it.

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <optional>
#include <span>

#include "core/text.h"
#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/analyzer/sim_errors.h"
#include "sim/scpi_syntax.h"

namespace zp::sim {

namespace {

struct Context {
    SimAnalyzerState& state;
    bool query = false;
    std::optional<int> suffix;  // of CALCulate or SENSe: the channel
    std::vector<std::string> arguments;

    SimChannel& channel() { return state.channel(suffix.value_or(1)); }
};

// Arguments split on commas outside quotes; blanks around each are dropped.
std::vector<std::string> splitArguments(std::string_view rest) {
    std::vector<std::string> arguments;
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
            arguments.emplace_back(trim(current, kWhitespace));
            current.clear();
        } else {
            current += c;
        }
    }
    if (quote != 0) throw analyzerError(kStringDataError);
    if (!rest.empty()) arguments.emplace_back(trim(current, kWhitespace));
    return arguments;
}

const std::string& argument(const Context& c, std::size_t index) {
    if (index >= c.arguments.size() || c.arguments[index].empty()) {
        throw analyzerError(kMissingParameter);
    }
    return c.arguments[index];
}

void expectArguments(const Context& c, std::size_t count) {
    if (c.arguments.size() > count) throw analyzerError(kParameterNotAllowed);
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
        throw analyzerError(kDataTypeError);
    }
    if (used != text.size()) throw analyzerError(kDataTypeError);
    return value;
}

bool onOff(const std::string& text) {
    const std::string word = upper(text);
    if (word == "ON" || word == "1") return true;
    if (word == "OFF" || word == "0") return false;
    throw analyzerError(kIllegalParameterValue);
}

std::string helpFile(Context& c) {
    expectArguments(c, 0);
    return "\"" + c.state.helpFilePath() + "\"\n";
}

std::string catalog(Context& c) {
    expectArguments(c, 0);
    const SimChannel& ch = c.channel();
    if (ch.measurements.empty()) return "\"NO CATALOG\"\n";
    std::string reply = "\"";
    for (const auto& m : ch.measurements) {
        if (reply.size() > 1) reply += ',';
        reply += m.name + "," + m.parameter;
    }
    return reply + "\"\n";
}

std::string define(Context& c) {
    expectArguments(c, 2);
    SimChannel& ch = c.channel();
    const std::string name = unquote(argument(c, 0));
    const std::string parameter = upper(unquote(argument(c, 1)));
    if (name.empty()) throw analyzerError(kIllegalParameterValue);
    if (!isMeasurableParameter(parameter, c.state.model().ports)) {
        throw analyzerError(kIllegalParameterValue);
    }
    if (ch.findMeasurement(name) != nullptr) throw analyzerError(kSettingsConflict);
    ch.measurements.push_back({name, parameter, 0, {}});
    ch.measurements.back().data.assign(static_cast<std::size_t>(ch.points), {});
    return "";
}

std::string select(Context& c) {
    expectArguments(c, 1);
    SimChannel& ch = c.channel();
    const std::string name = unquote(argument(c, 0));
    if (ch.findMeasurement(name) == nullptr) throw analyzerError(kIllegalParameterValue);
    ch.selected = name;
    return "";
}

std::string modify(Context& c) {
    expectArguments(c, 1);
    SimChannel& ch = c.channel();
    const std::string parameter = upper(unquote(argument(c, 0)));
    if (!isMeasurableParameter(parameter, c.state.model().ports)) {
        throw analyzerError(kIllegalParameterValue);
    }
    SimMeasurement* m = ch.findMeasurement(ch.selected);
    if (m == nullptr) throw analyzerError(kSettingsConflict);
    m->parameter = parameter;
    m->data.assign(static_cast<std::size_t>(ch.points), {});
    return "";
}

std::string remove(Context& c) {
    expectArguments(c, 1);
    SimChannel& ch = c.channel();
    const std::string name = unquote(argument(c, 0));
    const auto it = std::find_if(ch.measurements.begin(), ch.measurements.end(),
                                 [&](const SimMeasurement& m) { return m.name == name; });
    if (it == ch.measurements.end()) throw analyzerError(kIllegalParameterValue);
    ch.measurements.erase(it);
    if (ch.selected == name) ch.selected.clear();
    return "";
}

std::string data(Context& c) {
    expectArguments(c, 1);
    if (upper(argument(c, 0)) != "SDATA") throw analyzerError(kIllegalParameterValue);
    const SimChannel& ch = c.channel();
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
    if (c.state.malformedData()) {
        // A block cut short in the middle of a field, with a garbled character in it.
        reply.resize(std::max<std::size_t>(reply.size() / 2, 9) - 3);
        if (reply.size() > 4) reply[4] = '#';
    }
    return reply + "\n";
}

std::string sourcePort(Context& c) {
    SimChannel& ch = c.channel();
    if (c.query) return std::to_string(ch.sourcePort) + "\n";
    expectArguments(c, 1);
    const int port = wholeNumber(argument(c, 0));
    if (port < 1 || port > c.state.model().ports) throw analyzerError(kDataOutOfRange);
    ch.sourcePort = port;
    return "";
}

std::string correction(Context& c) {
    SimChannel& ch = c.channel();
    if (c.query) return ch.correction ? "1\n" : "0\n";
    expectArguments(c, 1);
    ch.correction = onOff(argument(c, 0));
    return "";
}

std::string sweepMode(Context& c) {
    SimChannel& ch = c.channel();
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
    throw analyzerError(kIllegalParameterValue);
}

enum class Form { Query, Command, Both };

// The "#" node takes the channel number (1 when not written).
struct CommandSpec {
    std::vector<const char*> pattern;
    Form form;
    std::string (*action)(Context&);
};

const std::vector<CommandSpec>& commandTable() {
    static const std::vector<CommandSpec> table = {
        {{"DIAGnostic", "HELP", "FILE"}, Form::Query, helpFile},
        {{"CALCulate#", "PARameter", "CATalog"}, Form::Query, catalog},
        {{"CALCulate#", "PARameter", "DEFine"}, Form::Command, define},
        {{"CALCulate#", "PARameter", "SELect"}, Form::Command, select},
        {{"CALCulate#", "PARameter", "MODify"}, Form::Command, modify},
        {{"CALCulate#", "PARameter", "DELete"}, Form::Command, remove},
        {{"CALCulate#", "DATA"}, Form::Query, data},
        {{"SENSe#", "SWEep", "SRCPort"}, Form::Both, sourcePort},
        {{"SENSe#", "CORRection", "[STATe]"}, Form::Both, correction},
        {{"SENSe#", "SWEep", "MODE"}, Form::Both, sweepMode},
    };
    return table;
}

bool takes(Form form, bool query) {
    return form == Form::Both || (form == Form::Query) == query;
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
    const std::string_view line = trim(text, kWhitespace);
    const std::size_t blank = line.find_first_of(" \t");
    const std::string_view header = line.substr(0, blank);
    const std::string_view rest =
        blank == std::string_view::npos ? "" : trim(line.substr(blank), kWhitespace);

    // The one common command the program sends.
    if (!header.empty() && header.front() == '*') {
        splitArguments(rest);
        if (upper(header) == "*IDN?") return "Korvex," + model_.modelText + ",SIM000001,A.01.00\n";
        throw analyzerError(kUndefinedHeader);
    }
    ProgramHeader parsed;
    try {
        parsed = parseHeader(header);
    } catch (const ScpiFailure&) {
        throw analyzerError(kUndefinedHeader);
    }
    Context context{*this, parsed.query, std::nullopt, splitArguments(rest)};
    for (const CommandSpec& entry : commandTable()) {
        context.suffix.reset();
        if (takes(entry.form, parsed.query) &&
            matchesPattern(entry.pattern, parsed.nodes, context.suffix)) {
            return entry.action(context);
        }
    }
    throw analyzerError(kUndefinedHeader);
}

}  // namespace zp::sim
