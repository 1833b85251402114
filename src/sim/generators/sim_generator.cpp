#include "sim/generators/sim_generator.h"

#include <array>
#include <cctype>
#include <cstdio>
#include <utility>
#include <vector>

#include "sim/scpi_syntax.h"

namespace zp::sim {

namespace {

constexpr std::size_t kErrorQueueCapacity = 30;
constexpr const char* kNoError = "+0,\"No error\"";

constexpr double kMinFrequency = 1e-3;
constexpr double kMaxFrequency = 165e6;
constexpr double kMaxDelay = 1000.0;
constexpr double kMinLevel = -10.0;
constexpr double kMaxLevel = 10.0;
constexpr double kMinImpedance = 0.3;
constexpr double kMaxImpedance = 1e6;

struct Context {
    SimGenerator& generator;
    SimGeneratorState& state;
    std::size_t output = 0;  // 0-based output from the header suffix
    bool query = false;
    std::vector<std::string> params;
    std::string reply;

    SimGeneratorOutput& out() { return state.outputs[output]; }
};

const std::string& single(const Context& c) {
    if (c.params.empty()) throw ScpiFailure{kMissingParameter};
    if (c.params.size() > 1) throw ScpiFailure{kParameterNotAllowed};
    return c.params.front();
}

std::string formatNumber(double value) {
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), "%.15g", value);
    return text.data();
}

double inRange(double value, double low, double high) {
    if (value < low || value > high) throw ScpiFailure{kDataOutOfRange};
    return value;
}

// "VOLTage" -> "VOLT".
std::string shortForm(std::string_view mnemonic) {
    std::string text;
    for (char k : mnemonic) {
        if (std::isupper(static_cast<unsigned char>(k)) == 0) break;
        text += k;
    }
    return text;
}

// Picks the keyword that the parameter names and returns its short form (with its digit, as in
// INT2), or fails with -224.
std::string enumeration(const std::string& param,
                        std::initializer_list<std::string_view> keywords) {
    const std::string word(trim(param));
    const auto digitsOf = [](std::string_view text) {
        std::size_t i = text.size();
        while (i > 0 && std::isdigit(static_cast<unsigned char>(text[i - 1])) != 0) --i;
        return i;
    };
    const std::size_t wordDigits = digitsOf(word);
    for (std::string_view keyword : keywords) {
        const std::size_t keyDigits = digitsOf(keyword);
        if (word.substr(wordDigits) != keyword.substr(keyDigits)) continue;
        const std::string_view mnemonic = keyword.substr(0, keyDigits);
        if (!matchesKeyword(std::string_view(word).substr(0, wordDigits), mnemonic)) continue;
        return shortForm(mnemonic) + std::string(keyword.substr(keyDigits));
    }
    throw ScpiFailure{kIllegalParameterValue};
}

// A setting that is both a command and a query.
template <typename Get, typename Set>
void setting(Context& c, Get get, Set set) {
    if (c.query) {
        if (!c.params.empty()) throw ScpiFailure{kParameterNotAllowed};
        c.reply = get();
    } else {
        set(single(c));
    }
}

// A setting with two named states kept as a flag; a query answers the short form.
void twoWay(Context& c, bool& flag, std::string_view whenSet, std::string_view whenClear) {
    setting(
        c, [&] { return shortForm(flag ? whenSet : whenClear); },
        [&](const std::string& p) {
            flag = enumeration(p, {whenSet, whenClear}) == shortForm(whenSet);
        });
}

void numeric(Context& c, double& value, ScpiUnit unit, double low, double high) {
    setting(
        c, [&] { return formatNumber(value); },
        [&](const std::string& p) {
            const double number = inRange(parseNumber(p, unit), low, high);
            value = number == 0.0 ? 0.0 : number;  // "-0" would read back as "-0"
        });
}

void onOff(Context& c, bool& flag) {
    setting(
        c, [&] { return std::string(flag ? "1" : "0"); },
        [&](const std::string& p) { flag = parseBoolean(p); });
}

void commandOnly(const Context& c) {
    if (c.query) throw ScpiFailure{kUndefinedHeader};
    if (!c.params.empty()) throw ScpiFailure{kParameterNotAllowed};
}

void systemPreset(Context& c) {
    commandOnly(c);
    c.generator.preset();
}

void systemError(Context& c) {
    if (!c.query) throw ScpiFailure{kUndefinedHeader};
    if (!c.params.empty()) throw ScpiFailure{kParameterNotAllowed};
    auto& queue = c.state.errorQueue;
    if (queue.empty()) {
        c.reply = kNoError;
    } else {
        c.reply = queue.front();
        queue.pop_front();
    }
}

void outputPolarity(Context& c) {
    twoWay(c, c.out().inverted, "INVerted", "NORMal");
}

void outputImpedance(Context& c) {
    numeric(c, c.out().loadImpedance, ScpiUnit::ohm, kMinImpedance, kMaxImpedance);
}

void outputState(Context& c) {
    onOff(c, c.out().on);
}

void hold(Context& c) {
    twoWay(c, c.state.holdVoltage, "VOLTage", "CURRent");
}

void levelHigh(Context& c) {
    numeric(c, c.out().high, ScpiUnit::volt, kMinLevel, kMaxLevel);
}

void levelLow(Context& c) {
    numeric(c, c.out().low, ScpiUnit::volt, kMinLevel, kMaxLevel);
}

// The frequency is taken even when its period is shorter than a width, which is kept; the
// conflict is queued, as an instrument does for coupled settings it cannot both honour.
void frequency(Context& c) {
    numeric(c, c.state.frequency, ScpiUnit::hertz, kMinFrequency, kMaxFrequency);
    if (c.query) return;
    const double period = 1.0 / c.state.frequency;
    for (const auto& output : c.state.outputs) {
        if (output.width > period) {
            c.generator.pushError(errorEntry(kSettingsConflict));
            return;
        }
    }
}

void pulseWidth(Context& c) {
    numeric(c, c.out().width, ScpiUnit::second, 0.0, 1.0 / c.state.frequency);
}

void pulseDelay(Context& c) {
    numeric(c, c.out().delay, ScpiUnit::second, 0.0, kMaxDelay);
}

void triggerSource(Context& c) {
    setting(
        c, [&] { return c.state.triggerSource; },
        [&](const std::string& p) {
            std::string source = enumeration(
                p, {"IMMediate", "INTernal", "INTernal1", "INTernal2", "EXTernal", "MANual"});
            c.state.triggerSource = source == "INT1" ? "INT" : source;
        });
}

void armSource(Context& c) {
    setting(
        c, [&] { return c.state.armSource; },
        [&](const std::string& p) {
            c.state.armSource = enumeration(p, {"IMMediate", "EXTernal", "MANual"});
        });
}

void referenceSource(Context& c) {
    twoWay(c, c.state.externalReference, "EXTernal", "INTernal");
}

void referenceFrequency(Context& c) {
    setting(
        c, [&] { return formatNumber(c.state.referenceFrequency); },
        [&](const std::string& p) {
            const double value = parseNumber(p, ScpiUnit::hertz);
            // The reference input locks to 5 MHz or 10 MHz only.
            if (value != 5e6 && value != 10e6) throw ScpiFailure{kDataOutOfRange};
            c.state.referenceFrequency = value;
        });
}

void display(Context& c) {
    onOff(c, c.state.displayOn);
}

// The pattern's "#" node takes the output suffix 1 or 2.
struct CommandSpec {
    std::vector<const char*> pattern;
    void (*action)(Context&);
};

const std::vector<CommandSpec>& commandTable() {
    static const std::vector<CommandSpec> table = {
        {{"SYSTem", "PRESet"}, systemPreset},
        {{"SYSTem", "ERRor", "[NEXT]"}, systemError},
        {{"OUTPut#", "POLarity"}, outputPolarity},
        {{"OUTPut#", "IMPedance", "EXTernal"}, outputImpedance},
        {{"OUTPut#", "[STATe]"}, outputState},
        {{"HOLD"}, hold},
        {{"[SOURce]", "VOLTage#", "[LEVel]", "[IMMediate]", "HIGH"}, levelHigh},
        {{"[SOURce]", "VOLTage#", "[LEVel]", "[IMMediate]", "LOW"}, levelLow},
        {{"[SOURce]", "FREQuency", "[CW]"}, frequency},
        {{"[SOURce]", "PULSe", "WIDTh#"}, pulseWidth},
        {{"[SOURce]", "PULSe", "DELay#"}, pulseDelay},
        {{"TRIGger", "[SEQuence]", "SOURce"}, triggerSource},
        {{"ARM", "[SEQuence]", "SOURce"}, armSource},
        {{"[SOURce]", "ROSCillator", "SOURce"}, referenceSource},
        {{"[SOURce]", "ROSCillator", "EXTernal", "FREQuency"}, referenceFrequency},
        {{"DISPlay", "[WINDow]", "[STATe]"}, display},
    };
    return table;
}

std::vector<std::string> splitParameters(std::string_view text) {
    std::vector<std::string> params;
    const std::string all(trim(text));
    if (all.empty()) return params;
    std::size_t pos = 0;
    while (true) {
        const std::size_t comma = all.find(',', pos);
        std::string param(trim(std::string_view(all).substr(
            pos, comma == std::string::npos ? std::string::npos : comma - pos)));
        if (param.empty()) throw ScpiFailure{kSyntaxError};
        params.push_back(std::move(param));
        if (comma == std::string::npos) break;
        pos = comma + 1;
    }
    return params;
}

// Splits a program message on ";" outside quoted strings.
std::vector<std::string_view> splitMessage(std::string_view line) {
    std::vector<std::string_view> units;
    char quote = 0;
    std::size_t start = 0;
    for (std::size_t i = 0; i < line.size(); ++i) {
        const char ch = line[i];
        if (quote != 0) {
            if (ch == quote) quote = 0;
        } else if (ch == '"' || ch == '\'') {
            quote = ch;
        } else if (ch == ';') {
            units.push_back(line.substr(start, i - start));
            start = i + 1;
        }
    }
    units.push_back(line.substr(start));
    return units;
}

}  // namespace

SimGenerator::SimGenerator(int address, std::string identity)
    : address_(address), identity_(std::move(identity)) {
    if (identity_.empty()) identity_ = "Veltrix,PG8102A,SIM" + std::to_string(address) + ",1.0";
}

void SimGenerator::pushError(const std::string& entry) {
    auto& queue = state_.errorQueue;
    if (queue.size() < kErrorQueueCapacity) {
        queue.push_back(entry);
    } else {
        // A full queue keeps its oldest entries and reports the loss in its last one.
        queue.back() = errorEntry(kQueueOverflow);
    }
}

void SimGenerator::preset() {
    auto queue = std::move(state_.errorQueue);
    state_ = SimGeneratorState{};
    state_.errorQueue = std::move(queue);
}

std::optional<std::string> SimGenerator::handle(std::string_view line) {
    std::vector<std::string> replies;
    for (std::string_view unit : splitMessage(line)) {
        const std::string text(trim(unit));
        if (text.empty()) continue;
        try {
            std::size_t blank = 0;
            while (blank < text.size() && text[blank] != ' ' && text[blank] != '\t') ++blank;
            const std::string header = text.substr(0, blank);
            Context context{*this, state_, 0, false, splitParameters(text.substr(blank)), {}};

            if (header.front() == '*') {
                const std::string common = upper(header);
                if (!context.params.empty()) throw ScpiFailure{kParameterNotAllowed};
                if (common == "*IDN?") {
                    context.reply = identity_;
                } else if (common == "*OPC?") {
                    context.reply = "1";
                } else if (common == "*ESR?" || common == "*STB?" || common == "*TST?") {
                    context.reply = "0";
                } else if (common == "*CLS") {
                    state_.errorQueue.clear();
                } else if (common == "*RST") {
                    preset();
                } else if (common != "*OPC" && common != "*WAI") {
                    throw ScpiFailure{kUndefinedHeader};
                }
            } else {
                const ProgramHeader parsed = parseHeader(header);
                context.query = parsed.query;
                const CommandSpec* found = nullptr;
                std::optional<int> suffix;
                for (const auto& entry : commandTable()) {
                    suffix.reset();
                    if (matchesPattern(entry.pattern, parsed.nodes, suffix)) {
                        found = &entry;
                        break;
                    }
                }
                if (found == nullptr) throw ScpiFailure{kUndefinedHeader};
                if (suffix && (*suffix < 1 || *suffix > 2)) {
                    throw ScpiFailure{kHeaderSuffixOutOfRange};
                }
                context.output = static_cast<std::size_t>(suffix.value_or(1) - 1);
                found->action(context);
            }
            if (context.query || !context.reply.empty())
                replies.push_back(std::move(context.reply));
        } catch (const ScpiFailure& failure) {
            pushError(errorEntry(failure.error));
        }
    }
    if (replies.empty()) return std::nullopt;
    std::string reply;
    for (std::size_t i = 0; i < replies.size(); ++i) {
        if (i > 0) reply += ';';
        reply += replies[i];
    }
    reply += '\n';
    return reply;
}

}  // namespace zp::sim
