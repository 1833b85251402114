#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core/pulsed_module.h"

namespace zp {
namespace {

using Names = std::vector<std::string>;

PulsedModule filled(const AnalyzerIdentity& id) {
    PulsedModule s;
    fillAtStartup(s, id);
    return s;
}

TEST(FillAtStartup, TwoPortOneSourceListedModel) {
    const auto s = filled({"KT622A", "K71 M81", 1, 2, "5"});
    EXPECT_EQ(s.IsListedModel, kTrue);
    EXPECT_EQ(s.Is2Port1Src, kTrue);
    EXPECT_EQ(s.Is2Port2Src, kFalse);
    EXPECT_EQ(s.Is4Port1Src, kFalse);
    EXPECT_EQ(s.Is4PortMultiSrc, kFalse);
    EXPECT_EQ(s.HasClock100MHz, kTrue);
    EXPECT_EQ(s.HasInternalPG, kTrue);
    EXPECT_EQ(s.HasInternalMod, kTrue);
    EXPECT_EQ(s.HasModSource1, kTrue);
    EXPECT_EQ(s.HasModSource2, kFalse);
    EXPECT_EQ(s.HasInternalGates, kFalse);
    EXPECT_EQ(s.UseInternalGates, 1);
    EXPECT_EQ(s.UseInternalPG, 1);
    EXPECT_EQ(s.UseInternalMod, 1);

    ASSERT_EQ(s.NumOutputs, 5);
    ASSERT_EQ(s.Table.rows(), 5);
    const int addresses[] = {11, 11, 12, 12, 13};
    const int channels[] = {1, 2, 1, 2, 1};
    for (int row = 0; row < 5; ++row) {
        // Stored as a double, read back as a whole number.
        EXPECT_TRUE(std::holds_alternative<double>(s.Table.cell(row, GpibAddress)));
        const PGRow r = s.SReadRow(row);
        EXPECT_EQ(r.gpibAddress, addresses[row]) << row;
        EXPECT_EQ(r.gateOutput, channels[row]) << row;
        EXPECT_EQ(r.master, row == 0 ? kTrue : kFalse) << row;
        EXPECT_EQ(r.enabled, 1);
        EXPECT_EQ(r.highLevel, 5.0f);
        EXPECT_EQ(r.lowLevel, 0.0f);
        EXPECT_EQ(r.complement, 1);
        EXPECT_EQ(r.loadImpedance, 10000);
        EXPECT_EQ(r.intPGOutput, row == 0 ? 1 : 2) << row;
    }

    EXPECT_EQ(s.ReceiverNames, (Names{"A", "R1", "R2", "B"}));
    EXPECT_EQ(s.OutputNames,
              (Names{"PulseModDrive", "IFGateA", "IFGateB", "IFGateR1", "IFGateR2"}));
    EXPECT_EQ(s.RxPathNames, (Names{"NBFATNA", "NBFATNB", "NBFATNR1", "NBFATNR2"}));
    EXPECT_EQ(s.RxSolveValues, (std::vector<std::int16_t>(4, 0)));
    EXPECT_EQ(s.ReceiverGains, (std::vector<std::int16_t>(4, 3)));
    EXPECT_EQ(s.FixedPRF, kTrue);
    EXPECT_EQ(s.NeedsCalculation, kTrue);
    EXPECT_EQ(s.PRF, 0.0);  // the timing solution is left for the calculation
}

TEST(FillAtStartup, FourPortThreeSources) {
    const auto s = filled({"KT655A", "K71 M83 M84", 3, 4, "5.0"});
    EXPECT_EQ(s.Is4PortMultiSrc, kTrue);
    EXPECT_EQ(s.Is4Port1Src, kFalse);
    EXPECT_TRUE(s.isFourPort());
    EXPECT_EQ(s.HasClock100MHz, kTrue);  // "5.0" counts as 5
    EXPECT_EQ(s.HasModSource1, kTrue);
    EXPECT_EQ(s.HasModSource2, kTrue);
    EXPECT_EQ(s.NumOutputs, 6);
    EXPECT_EQ(s.Table.rows(), 6);
    EXPECT_EQ(s.SReadRow(5).gpibAddress, 13);
    EXPECT_EQ(s.SReadRow(5).gateOutput, 2);
    EXPECT_EQ(s.ReceiverNames, (Names{"A", "B", "C", "D", "R1", "R2", "R3", "R4"}));
    EXPECT_EQ(s.OutputNames.size(), 9u);
    EXPECT_EQ(s.OutputNames.back(), "IFGateR4");
    EXPECT_EQ(s.RxPathNames, (Names{"NBFATNA", "NBFATNB", "NBFATNC", "NBFATND", "NBFATNR1",
                                    "NBFATNR2", "NBFATNR3", "NBFATNR4"}));
    EXPECT_EQ(s.RxSolveValues.size(), 8u);
    EXPECT_EQ(s.ReceiverGains, (std::vector<std::int16_t>(8, 3)));
}

TEST(FillAtStartup, UnlistedModelWithInternalGates) {
    const auto s = filled({"ZX20", "J55", 1, 2, "5"});
    EXPECT_EQ(s.IsListedModel, kFalse);
    EXPECT_FALSE(s.hasKnownLayout());
    EXPECT_EQ(s.HasInternalGates, kTrue);
    EXPECT_TRUE(s.internalGatesAvailable());
    EXPECT_EQ(s.HasClock100MHz, kFalse);  // only read on listed models
    EXPECT_EQ(s.UseInternalGates, 0);
    EXPECT_EQ(s.UseInternalPG, 0);
    EXPECT_EQ(s.UseInternalMod, 0);
    EXPECT_EQ(s.NumOutputs, 5);
    EXPECT_EQ(s.ReceiverNames, (Names{"A", "R1", "R2", "B"}));
    EXPECT_TRUE(s.OutputNames.empty());
    EXPECT_TRUE(s.RxPathNames.empty());
    EXPECT_TRUE(s.RxSolveValues.empty());
    EXPECT_EQ(s.ReceiverGains.size(), 4u);
}

TEST(FillAtStartup, UnlistedModelWithoutOptions) {
    const auto s = filled({"ZX20", "", 2, 4, "5"});
    EXPECT_EQ(s.HasInternalGates, kFalse);
    EXPECT_FALSE(s.internalGatesAvailable());
    EXPECT_EQ(s.Is4PortMultiSrc, kFalse);  // port flags only for listed models
    EXPECT_EQ(s.NumOutputs, 5);
    EXPECT_EQ(s.HasInternalPG, kFalse);
    EXPECT_EQ(s.HasInternalMod, kFalse);
}

TEST(FillAtStartup, ListedModelOddCountsAndHardwareValues) {
    auto s = filled({"kt633a", "k72 m82", 3, 2, "abc"});
    EXPECT_EQ(s.IsListedModel, kTrue);  // letter case ignored
    EXPECT_FALSE(s.hasKnownLayout());
    EXPECT_EQ(s.HasClock100MHz, kFalse);
    EXPECT_EQ(s.HasInternalPG, kTrue);
    EXPECT_EQ(s.HasModSource1, kFalse);
    EXPECT_EQ(s.HasModSource2, kTrue);
    EXPECT_TRUE(s.OutputNames.empty());
    EXPECT_EQ(s.NumOutputs, 5);

    s = filled({"KT611", "", 1, 4, " 4.9 "});
    EXPECT_EQ(s.Is4Port1Src, kTrue);
    EXPECT_EQ(s.HasClock100MHz, kFalse);
    EXPECT_EQ(s.UseInternalPG, 0);
    EXPECT_EQ(s.UseInternalMod, 0);
    EXPECT_EQ(s.NumOutputs, 6);
}

TEST(FillAtStartup, ResetsEarlierState) {
    PulsedModule s;
    fillAtStartup(s, {"KT655A", "K71 M83", 1, 4, "5"});
    s.PRF = 1234.0;
    s.FixedPRF = kFalse;
    fillAtStartup(s, {"ZX20", "", 1, 2, "5"});
    EXPECT_EQ(s.PRF, 0.0);
    EXPECT_EQ(s.FixedPRF, kTrue);
    EXPECT_EQ(s.IsListedModel, kFalse);
    EXPECT_EQ(s.Is4Port1Src, kFalse);
    EXPECT_EQ(s.NumOutputs, 5);
    EXPECT_EQ(s.Table.rows(), 5);
}

TEST(ListedModel, CodesAnywhereIgnoringCase) {
    EXPECT_TRUE(isListedModelText("KT611"));
    EXPECT_TRUE(isListedModelText("Veltrix kt644B"));
    EXPECT_TRUE(isListedModelText("xKT655"));
    EXPECT_FALSE(isListedModelText("KT66"));
    EXPECT_FALSE(isListedModelText("KT 611"));
    EXPECT_FALSE(isListedModelText(""));
}

TEST(PulsedModuleInstance, IsOneProgramWideRecord) {
    EXPECT_EQ(&pulsedModule(), &pulsedModule());
}

}  // namespace
}  // namespace zp
