#pragma once
// The program-wide pulse setup state. One instance lives for the whole run (see pulsedModule());
// windows read and write its fields directly.

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "core/bool16.h"
#include "core/pg_table.h"

namespace zp {

// Port and source counts as distinct types, so that the two can never change places silently.
struct Ports {
    explicit constexpr Ports(int n) : count(n) {}
    int count;
};
struct Sources {
    explicit constexpr Sources(int n) : count(n) {}
    int count;
};

// What start-up learns from the analyzer before it fills the state. Built by name (members one by
// one) or through the constructor; plain numbers in the place of Ports and Sources do not compile.
struct AnalyzerIdentity {
    AnalyzerIdentity() = default;
    AnalyzerIdentity(std::string model, std::string options, Ports ports, Sources sources,
                     std::string hardware)
        : modelText(std::move(model)),
          optionText(std::move(options)),
          portCount(ports.count),
          sourceCount(sources.count),
          hardwareValue(std::move(hardware)) {}

    std::string modelText;
    std::string optionText;
    int portCount = 0;
    int sourceCount = 0;
    std::string hardwareValue;  // its number 5 selects the 100 MHz pulse clock
};

struct PulsedModule {
    // Model and capability flags.
    Bool16 IsListedModel = kFalse;
    Bool16 Is2Port1Src = kFalse;
    Bool16 Is2Port2Src = kFalse;
    Bool16 Is4Port1Src = kFalse;
    Bool16 Is4PortMultiSrc = kFalse;
    Bool16 HasClock100MHz = kFalse;
    Bool16 HasInternalPG = kFalse;
    Bool16 HasInternalMod = kFalse;
    Bool16 HasModSource1 = kFalse;
    Bool16 HasModSource2 = kFalse;
    Bool16 HasInternalGates = kFalse;

    // Use of the internal hardware (check values).
    Check16 UseInternalGates = kUnchecked;
    Check16 UseInternalPG = kUnchecked;
    Check16 UseInternalMod = kUnchecked;

    // Pulse timing flags.
    Bool16 FixedPRF = kFalse;
    Bool16 NeedsCalculation = kFalse;

    // Timing solution.
    double PRF = 0.0;
    double IFBW = 0.0;
    std::int32_t IFBWHz = 0;
    double ConverterDelay = 0.0;
    double SolvedFreqOffset = 0.0;
    std::int32_t SolvedIFCount = 0;
    double PulseClockHz = 0.0;
    double IntSolveTime1 = 0.0;
    double IntSolveTime2 = 0.0;
    std::vector<std::int32_t> IntSolveList1;
    std::vector<std::int32_t> IntSolveList2;
    std::vector<std::int32_t> IntSolveList3;
    double GatedSolveTime1 = 0.0;
    double GatedSolveTime2 = 0.0;
    std::int32_t GatedSolveTicks = 0;

    // Pulse-generator output table.
    std::int16_t NumOutputs = 0;
    PGTable Table;
    std::vector<std::string> IntPGNames;

    // Analyzer path names and receiver gains.
    std::vector<std::string> ReceiverNames;
    std::vector<std::string> OutputNames;
    std::vector<std::string> RxPathNames;
    std::vector<std::int16_t> RxSolveValues;
    std::vector<std::int16_t> ReceiverGains;
    std::vector<std::int16_t> GainTable;
    std::int16_t GainOffCode = 0;

    // Profile window settings kept between openings.
    double ProfileStart = 0.0;
    double ProfileStop = 0.0;
    double ProfileStep = 0.0;
    double ProfileCWFreq = 0.0;
    std::int16_t ProfileSrcPort = 0;
    std::int16_t ProfileParam = 0;
    std::int16_t ProfileCoupled = 0;
    std::int16_t ProfileFormat = 0;

    // Four-port means either four-port flag; a known listed-model layout means any port flag.
    bool isFourPort() const { return isTrue(Is4Port1Src) || isTrue(Is4PortMultiSrc); }
    bool hasKnownLayout() const {
        return isTrue(Is2Port1Src) || isTrue(Is2Port2Src) || isFourPort();
    }
    bool internalGatesAvailable() const {
        return isTrue(IsListedModel) || isTrue(HasInternalGates);
    }

    // Row writer and reader of the output table (rows 0 .. NumOutputs - 1).
    void SWriteRow(int row, const PGRow& values) { Table.writeRow(row, values); }
    PGRow SReadRow(int row) const { return Table.readRow(row); }
};

// The start-up fill from the analyzer's identity: capability flags, use values, NumOutputs and the
// table's start-up rows, FixedPRF, profile settings, fixed lists, the row layout lists, receiver
// gains and NeedsCalculation, in that order. Resets every other field to its start value first.
void fillAtStartup(PulsedModule& state, const AnalyzerIdentity& identity);

// The analyzer models the program knows by name; others get the generic receiver layout.
inline constexpr std::string_view kListedModelCodes[] = {"KT611", "KT622", "KT633", "KT644",
                                                         "KT655"};

// True when the text contains one of the listed model codes (letter case ignored).
bool isListedModelText(std::string_view modelText);

// The one program-wide instance.
PulsedModule& pulsedModule();

}  // namespace zp
