#include "core/pulsed_module.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <span>
#include <string_view>

#include "core/numeric.h"
#include "core/text.h"

namespace zp {

namespace {

// Model and option codes are matched anywhere in the text, letter case ignored.
bool containsAny(std::string_view text, std::span<const std::string_view> codes) {
    return std::any_of(codes.begin(), codes.end(),
                       [&](std::string_view c) { return containsIgnoringCase(text, c); });
}

bool containsAny(std::string_view text, std::initializer_list<std::string_view> codes) {
    return containsAny(text, std::span(codes.begin(), codes.size()));
}

void setCapabilities(PulsedModule& s, const AnalyzerIdentity& id) {
    const std::string& options = id.optionText;
    if (!isListedModelText(id.modelText)) {
        s.HasInternalGates = toBool16(containsIgnoringCase(options, "J55"));
        s.UseInternalGates = kUnchecked;
        return;
    }
    s.IsListedModel = kTrue;
    s.UseInternalGates = kChecked;
    const int src = id.sourceCount;
    const int ports = id.portCount;
    s.Is2Port1Src = toBool16(src == 1 && ports == 2);
    s.Is2Port2Src = toBool16(src == 2 && ports == 2);
    s.Is4Port1Src = toBool16(src == 1 && ports == 4);
    s.Is4PortMultiSrc = toBool16((src == 2 || src == 3) && ports == 4);
    // "5.0" counts as 5; a value that is no number at all selects the slower clock.
    const auto hw = parseNumber(id.hardwareValue);
    s.HasClock100MHz = toBool16(hw.has_value() && *hw == 5.0);

    const bool pg = containsAny(options, {"K71", "K72"});
    s.HasInternalPG = toBool16(pg);
    s.UseInternalPG = pg ? kChecked : kUnchecked;

    const bool mod = containsAny(options, {"M81", "M82", "M83", "M84"});
    s.HasInternalMod = toBool16(mod);
    s.UseInternalMod = mod ? kChecked : kUnchecked;
    if (mod) {
        s.HasModSource1 = toBool16(containsAny(options, {"M81", "M83"}));
        s.HasModSource2 = toBool16(containsAny(options, {"M82", "M84"}));
    }
}

void fillTable(PulsedModule& s) {
    s.NumOutputs = s.isFourPort() ? 6 : 5;
    s.Table.resize(s.NumOutputs);
    for (int row = 0; row < s.NumOutputs; ++row) {
        s.Table.cell(row, GateOutput) = static_cast<std::int16_t>(row % 2 == 0 ? 1 : 2);
        // Kept as a double, as the start-up always stored it; the row reader rounds it back.
        s.Table.cell(row, GpibAddress) = 11.0 + static_cast<double>(row / 2);
        s.Table.cell(row, Master) = kFalse;
        s.Table.cell(row, Enabled) = kChecked;
        s.Table.cell(row, HighLevel) = 5.0f;
        s.Table.cell(row, LowLevel) = 0.0f;
        s.Table.cell(row, Complement) = kChecked;
        s.Table.cell(row, LoadImpedance) = std::int32_t{10000};
    }
    s.Table.cell(0, Master) = kTrue;
    for (int row = 0; row < s.NumOutputs; ++row) {
        s.Table.cell(row, IntPGOutput) = static_cast<std::int16_t>(row == 0 ? 1 : 2);
    }
}

void setRowLayout(PulsedModule& s) {
    if (s.isFourPort()) {
        s.ReceiverNames = {"A", "B", "C", "D", "R1", "R2", "R3", "R4"};
        s.OutputNames = {"PulseModDrive", "IFGateA",  "IFGateB",  "IFGateC", "IFGateD",
                         "IFGateR1",      "IFGateR2", "IFGateR3", "IFGateR4"};
        s.RxPathNames = {"NBFATNA",  "NBFATNB",  "NBFATNC",  "NBFATND",
                         "NBFATNR1", "NBFATNR2", "NBFATNR3", "NBFATNR4"};
        s.RxSolveValues.assign(8, 0);
        return;
    }
    s.ReceiverNames = {"A", "R1", "R2", "B"};
    if (isTrue(s.Is2Port1Src) || isTrue(s.Is2Port2Src)) {
        s.OutputNames = {"PulseModDrive", "IFGateA", "IFGateB", "IFGateR1", "IFGateR2"};
        s.RxPathNames = {"NBFATNA", "NBFATNB", "NBFATNR1", "NBFATNR2"};
        s.RxSolveValues.assign(4, 0);
    }
}

}  // namespace

bool isListedModelText(std::string_view modelText) {
    return containsAny(modelText, kListedModelCodes);
}

void fillAtStartup(PulsedModule& state, const AnalyzerIdentity& identity) {
    PulsedModule s;
    setCapabilities(s, identity);
    fillTable(s);

    s.FixedPRF = kTrue;
    s.ProfileStart = 0.0;
    s.ProfileStop = 1e-5;
    s.ProfileStep = 1e-7;
    s.ProfileCWFreq = 1e10;
    s.ProfileSrcPort = 0;
    s.ProfileParam = 0;
    s.ProfileCoupled = 0;
    s.ProfileFormat = 0;
    s.IntPGNames = {"Pulse1", "Pulse2", "Pulse3", "Pulse4"};
    s.GainTable = {30, 15, 0};
    s.GainOffCode = 3;

    setRowLayout(s);
    s.ReceiverGains.assign(s.ReceiverNames.size(), 3);
    s.NeedsCalculation = kTrue;
    // Built aside and moved in, so a failure part-way leaves the state as it was.
    state = std::move(s);
}

PulsedModule& pulsedModule() {
    static PulsedModule instance;
    return instance;
}

}  // namespace zp
