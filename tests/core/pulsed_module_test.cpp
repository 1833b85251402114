#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core/pulsed_module.h"

namespace zp {
namespace {

using Names = std::vector<std::string>;
using Values = std::vector<std::int16_t>;

// Port and source counts only go in as Ports and Sources, in that order.
template <class P, class S>
constexpr bool identityFrom = requires(P p, S s) {
    AnalyzerIdentity{"", "", p, s, ""};
};
template <class T>
constexpr bool identityFromBracedNumbers = requires {
    T{"", "", {2}, {1}, ""};
};
static_assert(identityFrom<Ports, Sources>);
static_assert(!identityFrom<Sources, Ports>);
static_assert(!identityFrom<int, int>);
static_assert(!identityFromBracedNumbers<AnalyzerIdentity>);

PulsedModule filled(const AnalyzerIdentity& id) {
    PulsedModule s;
    fillAtStartup(s, id);
    return s;
}

TEST(FillAtStartup, TwoPortOneSourceListedModel) {
    const auto s = filled({"KT622A", "K71 M81", Ports{2}, Sources{1}, "5"});
    EXPECT_EQ(s.IsListedModel, kTrue);
    EXPECT_EQ(s.Is2Port1Src, kTrue);
    EXPECT_EQ(s.Is4PortMultiSrc, kFalse);
    EXPECT_EQ(s.HasClock100MHz, kTrue);
    EXPECT_EQ(s.HasInternalPG, kTrue);
    EXPECT_EQ(s.HasModSource1, kTrue);
    EXPECT_EQ(s.HasModSource2, kFalse);
    EXPECT_EQ(s.HasInternalGates, kFalse);
    EXPECT_EQ(s.UseInternalGates + s.UseInternalPG + s.UseInternalMod, 3);

    ASSERT_EQ(s.NumOutputs, 5);
    ASSERT_EQ(s.Table.rows(), 5);
    const int addresses[] = {11, 11, 12, 12, 13};
    for (int row = 0; row < 5; ++row) {
        SCOPED_TRACE(row);
        // Stored as a double, read back as a whole number.
        EXPECT_TRUE(std::holds_alternative<double>(s.Table.cell(row, GpibAddress)));
        const PGRow r = s.SReadRow(row);
        EXPECT_EQ(r.gpibAddress, addresses[row]);
        EXPECT_EQ(r.gateOutput, row % 2 + 1);
        EXPECT_EQ(r.master, row == 0 ? kTrue : kFalse);
        EXPECT_EQ(r.intPGOutput, row == 0 ? 1 : 2);
        EXPECT_EQ(r.enabled, 1);
        EXPECT_EQ(r.highLevel, 5.0f);
        EXPECT_EQ(r.lowLevel, 0.0f);
        EXPECT_EQ(r.complement, 1);
        EXPECT_EQ(r.loadImpedance, 10000);
    }
    EXPECT_EQ(s.ReceiverNames, (Names{"A", "R1", "R2", "B"}));
    EXPECT_EQ(s.OutputNames,
              (Names{"PulseModDrive", "IFGateA", "IFGateB", "IFGateR1", "IFGateR2"}));
    EXPECT_EQ(s.RxPathNames, (Names{"NBFATNA", "NBFATNB", "NBFATNR1", "NBFATNR2"}));
    EXPECT_EQ(s.RxSolveValues, Values(4, 0));
    EXPECT_EQ(s.ReceiverGains, Values(4, 3));
    EXPECT_EQ(s.FixedPRF, kTrue);
    EXPECT_EQ(s.NeedsCalculation, kTrue);
    EXPECT_EQ(s.PRF, 0.0);  // the timing solution is left for the calculation
}

TEST(FillAtStartup, FourPortThreeSources) {
    const auto s = filled({"KT655A", "K71 M83 M84", Ports{4}, Sources{3}, "5.0"});
    EXPECT_EQ(s.Is4PortMultiSrc, kTrue);
    EXPECT_EQ(s.Is4Port1Src, kFalse);
    EXPECT_EQ(s.HasClock100MHz, kTrue);  // "5.0" counts as 5
    EXPECT_EQ(s.HasModSource2, kTrue);
    EXPECT_EQ(s.NumOutputs, 6);
    EXPECT_EQ(s.SReadRow(5).gpibAddress, 13);
    EXPECT_EQ(s.SReadRow(5).gateOutput, 2);
    EXPECT_EQ(s.ReceiverNames, (Names{"A", "B", "C", "D", "R1", "R2", "R3", "R4"}));
    EXPECT_EQ(s.OutputNames.size(), 9u);
    EXPECT_EQ(s.OutputNames.back(), "IFGateR4");
    EXPECT_EQ(s.RxPathNames.back(), "NBFATNR4");
    EXPECT_EQ(s.ReceiverGains, Values(8, 3));
}

TEST(FillAtStartup, UnlistedModels) {
    auto s = filled({"ZX20", "J55", Ports{2}, Sources{1}, "5"});
    EXPECT_EQ(s.IsListedModel, kFalse);
    EXPECT_EQ(s.HasInternalGates, kTrue);
    EXPECT_TRUE(s.internalGatesAvailable());
    EXPECT_EQ(s.HasClock100MHz, kFalse);  // only read on listed models
    EXPECT_EQ(s.UseInternalGates + s.UseInternalPG + s.UseInternalMod, 0);
    EXPECT_EQ(s.NumOutputs, 5);
    EXPECT_EQ(s.ReceiverNames, (Names{"A", "R1", "R2", "B"}));
    EXPECT_TRUE(s.OutputNames.empty() && s.RxPathNames.empty() && s.RxSolveValues.empty());
    EXPECT_EQ(s.ReceiverGains.size(), 4u);

    s = filled({"ZX20", "", Ports{4}, Sources{2}, "5"});
    EXPECT_FALSE(s.internalGatesAvailable());
    EXPECT_EQ(s.Is4PortMultiSrc, kFalse);  // port flags only for listed models
    EXPECT_EQ(s.NumOutputs, 5);
    EXPECT_EQ(s.HasInternalPG, kFalse);
}

TEST(FillAtStartup, ListedModelOddCountsAndHardwareValues) {
    auto s = filled({"kt633a", "k72 m82", Ports{2}, Sources{3}, "abc"});
    EXPECT_EQ(s.IsListedModel, kTrue);  // letter case ignored
    EXPECT_FALSE(s.hasKnownLayout());
    EXPECT_EQ(s.HasClock100MHz, kFalse);
    EXPECT_EQ(s.HasModSource1, kFalse);
    EXPECT_EQ(s.HasModSource2, kTrue);
    EXPECT_TRUE(s.OutputNames.empty());

    s = filled({"KT611", "", Ports{4}, Sources{1}, " 4.9 "});
    EXPECT_EQ(s.Is4Port1Src, kTrue);
    EXPECT_EQ(s.HasClock100MHz, kFalse);
    EXPECT_EQ(s.NumOutputs, 6);
    // A later fill starts from scratch.
    s.PRF = 1234.0;
    s.FixedPRF = kFalse;
    fillAtStartup(s, {"ZX20", "", Ports{2}, Sources{1}, "5"});
    EXPECT_EQ(s.PRF, 0.0);
    EXPECT_EQ(s.FixedPRF, kTrue);
    EXPECT_EQ(s.Is4Port1Src, kFalse);
    EXPECT_EQ(s.Table.rows(), 5);
}

TEST(ListedModel, CodesAnywhereIgnoringCase) {
    for (const char* yes : {"KT611", "Veltrix kt644B", "xKT655"}) {
        EXPECT_TRUE(isListedModelText(yes)) << yes;
    }
    for (const char* no : {"KT66", "KT 611", ""}) EXPECT_FALSE(isListedModelText(no)) << no;
}

}  // namespace
}  // namespace zp
