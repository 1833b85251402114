#include <gtest/gtest.h>

#include <algorithm>
#include <functional>

#include "instruments/instrument_error.h"
#include "sim/sim_analyzer_state.h"
#include "sim/sim_bench.h"

namespace zp::sim {
namespace {

std::string errorOf(const std::function<void()>& f, long* number = nullptr) {
    try {
        f();
    } catch (const InstrumentError& e) {
        if (number) *number = e.number();
        return e.description();
    }
    return "<no error>";
}

class SimAnalyzerTest : public ::testing::Test {
  protected:
    std::string parse(const std::string& command) { return app->commandParser()->parse(command); }
    SimBench bench{"kt622"};
    std::unique_ptr<AnalyzerApplication> app = bench.connectAnalyzer();
};

TEST(SimModelsTest, TableIsExactlyTheListedModels) {
    const auto& models = simModels();
    ASSERT_EQ(models.size(), 7u);
    struct Row {
        const char *name, *model, *options;
        int ports, sources;
        const char* hardware;
    };
    const Row expected[] = {{"kt622", "KT622A", "K71 M81", 2, 1, "5"},
                            {"kt633", "KT633A", "K72 M81 M82", 2, 2, "4"},
                            {"kt644", "KT644A", "K71", 4, 1, "5"},
                            {"kt655", "KT655A", "K71 M83 M84", 4, 3, "5.0"},
                            {"kt611", "KT611A", "", 2, 1, "4"},
                            {"zx20-j55", "ZX20", "J55", 2, 1, "4"},
                            {"zx20", "ZX20", "", 2, 1, "4"}};
    for (std::size_t i = 0; i < models.size(); ++i) {
        SCOPED_TRACE(expected[i].name);
        EXPECT_EQ(models[i].name, expected[i].name);
        EXPECT_EQ(models[i].modelText, expected[i].model);
        EXPECT_EQ(models[i].optionText, expected[i].options);
        EXPECT_EQ(models[i].ports, expected[i].ports);
        EXPECT_EQ(models[i].sources, expected[i].sources);
        EXPECT_EQ(models[i].hardwareValue, expected[i].hardware);
        EXPECT_LT(models[i].minFrequency, models[i].maxFrequency);
    }
    EXPECT_STREQ(kDefaultModel, "kt622");
    EXPECT_EQ(findSimModel("kt9"), nullptr);
}

TEST(SimBenchTest, DescribesItselfAndRejectsUnknownModels) {
    EXPECT_EQ(SimBench().describe(),
              "simulated KT622A (kt622), simulated generators at 11, 12, 13");
    SimBench bench("zx20-j55");
    bench.setBusFactory([] { return std::unique_ptr<InstrumentBus>(); }, "generators over LAN");
    EXPECT_EQ(bench.describe(), "simulated ZX20 (zx20-j55), generators over LAN");
    try {
        SimBench bad("x");
        FAIL() << "accepted an unknown model";
    } catch (const std::invalid_argument& e) {
        EXPECT_EQ(std::string(e.what()),
                  "unknown analyzer model 'x'; known: kt622, kt633, kt644, kt655, kt611, "
                  "zx20-j55, zx20");
    }
    EXPECT_THROW(SimBench("kt622", {}, {11, 11}), std::invalid_argument);
    EXPECT_NE(SimBench().generator(13), nullptr);
    EXPECT_EQ(SimBench().generator(14), nullptr);
}

TEST_F(SimAnalyzerTest, ApplicationReportsTheModel) {
    EXPECT_EQ(app->modelText(), "KT622A");
    EXPECT_EQ(app->optionText(), "K71 M81");
    const auto caps = app->hardwareInfo();
    EXPECT_EQ(caps->portCount(), 2);
    EXPECT_EQ(caps->sourceCount(), 1);
    EXPECT_EQ(caps->hardwareValue(), "5");
    EXPECT_EQ(app->currentChannel()->channelNumber(), 1);
    EXPECT_EQ(app->channels()->count(), 1);
}

TEST_F(SimAnalyzerTest, CatalogCommandsDefineSelectModifyAndDelete) {
    app->currentChannel()->copyToChannel(32);
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"CH32_S11_1,S11\"\n");
    EXPECT_EQ(parse("CALC32:PAR:DEF 'PIP_MEAS',S21"), "");
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"CH32_S11_1,S11,PIP_MEAS,S21\"\n");
    parse("CALC32:PAR:SEL 'PIP_MEAS'");
    parse("CALC32:PAR:MOD S12");
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"CH32_S11_1,S11,PIP_MEAS,S12\"\n");
    parse("SENS32:SWE:SRCP 2");
    parse("SENS32:CORR ON");
    parse("SENS32:SWE:MODE CONT");
    EXPECT_EQ(parse("SENS32:SWE:SRCP?"), "2\n");
    EXPECT_EQ(parse("SENS32:CORR?"), "1\n");
    parse("CALC32:PAR:DEL 'PIP_MEAS'");
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"CH32_S11_1,S11\"\n");
    // Channel 1 is untouched by all of it.
    EXPECT_EQ(parse("CALC1:PAR:CAT?"), "\"CH1_S11_1,S11\"\n");
    parse("CALC32:PAR:DEL 'CH32_S11_1'");
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"NO CATALOG\"\n");
}

TEST_F(SimAnalyzerTest, BadCommandsRaiseScpiErrors) {
    long number = 0;
    EXPECT_EQ(errorOf([&] { parse("FOO:BAR"); }, &number), "-113 Undefined header");
    EXPECT_EQ(number, -113);
    EXPECT_EQ(errorOf([&] { parse("CALC33:PAR:CAT?"); }), "-114 Header suffix out of range");
    EXPECT_EQ(errorOf([&] { parse("CALC1:PAR:DEL 'PIP_MEAS'"); }), "-224 Illegal parameter value");
    EXPECT_EQ(errorOf([&] { parse("CALC1:PAR:DEF 'X',S33"); }), "-224 Illegal parameter value");
    EXPECT_EQ(errorOf([&] { parse("CALC1:PAR:DEF 'CH1_S11_1',S21"); }), "-221 Settings conflict");
    EXPECT_EQ(errorOf([&] { parse("CALC1:PAR:DEF 'X'"); }), "-109 Missing parameter");
    EXPECT_EQ(errorOf([&] { parse("SENS1:SWE:SRCP 3"); }), "-222 Data out of range");
    EXPECT_EQ(errorOf([&] { parse("SENS1:SWE:SRCP x"); }), "-104 Data type error");
    EXPECT_EQ(errorOf([&] { parse("SENS1:CORR MAYBE"); }), "-224 Illegal parameter value");
    EXPECT_EQ(errorOf([&] { parse("CALC1:PAR:SEL 'open"); }), "-150 String data error");
    EXPECT_EQ(errorOf([&] { parse(""); }), "-113 Undefined header");
    EXPECT_EQ(parse("CALC1:PAR:CAT?"), "\"CH1_S11_1,S11\"\n") << "nothing changed";
    // Long forms and lower case are the same commands.
    EXPECT_EQ(parse("calculate1:parameter:catalog?"), "\"CH1_S11_1,S11\"\n");
}

TEST_F(SimAnalyzerTest, HelpFileIsTheQuotedManualPathWithLineFeed) {
    const std::string reply = parse("DIAG:HELP:FILE?");
    ASSERT_GE(reply.size(), 4u);
    EXPECT_EQ(reply.front(), '"');
    EXPECT_TRUE(reply.ends_with("/zentra-pulse.html\"\n")) << reply;
    EXPECT_EQ(std::count(reply.begin(), reply.end(), '"'), 2);
}

TEST_F(SimAnalyzerTest, CopyToChannelMakesTheCopyCurrentAndKeepsExistingMeasurements) {
    auto ch1 = app->currentChannel();
    ch1->setIfBandwidth(3000);
    ch1->pulseGenerator()->setDelay(2, 1.5e-6);
    ch1->copyToChannel(32);
    EXPECT_EQ(app->currentChannel()->channelNumber(), 32);
    const auto channels = app->channels();
    ASSERT_EQ(channels->count(), 2);
    EXPECT_EQ(channels->item(2)->channelNumber(), 32);
    EXPECT_THROW(channels->item(3), InstrumentError);
    EXPECT_DOUBLE_EQ(bench.analyzer().channel(32).ifBandwidth, 3000);
    EXPECT_DOUBLE_EQ(app->currentChannel()->pulseGenerator()->delay(2), 1.5e-6);

    // A measurement left on channel 32 survives the next copy, so it can be re-used.
    parse("CALC32:PAR:DEF 'PIP_MEAS',S21");
    ch1->setIfBandwidth(10);
    ch1->copyToChannel(32);
    EXPECT_EQ(parse("CALC32:PAR:CAT?"), "\"CH32_S11_1,S11,PIP_MEAS,S21\"\n");
    EXPECT_DOUBLE_EQ(bench.analyzer().channel(32).ifBandwidth, 10);
    EXPECT_THROW(ch1->copyToChannel(0), InstrumentError);
}

TEST_F(SimAnalyzerTest, SdataFieldsAreNineteenCharactersAtAPitchOfTwenty) {
    EXPECT_EQ(sdataField(0.123456789012), "+1.23456789012E-001");
    EXPECT_EQ(sdataField(-9.87654321098), "-9.87654321098E+000");
    EXPECT_EQ(sdataField(0.0), "+0.00000000000E+000");
    EXPECT_EQ(sdataField(-2.5e123), "-2.50000000000E+123");

    auto ch1 = app->currentChannel();
    ch1->copyToChannel(32);
    auto ch32 = app->currentChannel();
    ch32->setNumberOfPoints(7);
    parse("CALC32:PAR:DEF 'PIP_MEAS',S21");
    ch32->singleSweep(true);
    parse("CALC32:PAR:SEL 'PIP_MEAS'");
    const std::string reply = parse("CALC32:DATA? SDATA");
    ASSERT_EQ(reply.size(), 7u * 40u);
    EXPECT_EQ(reply.back(), '\n');
    const auto& data = bench.analyzer().channel(32).findMeasurement("PIP_MEAS")->data;
    ASSERT_EQ(data.size(), 7u);
    for (std::size_t i = 0; i < 7; ++i) {
        // Positions 40i+1 and 40i+21, counted from 1.
        const std::string re = reply.substr(40 * i, 19);
        const std::string im = reply.substr(40 * i + 20, 19);
        EXPECT_EQ(reply[40 * i + 19], ',');
        EXPECT_NEAR(std::stod(re), data[i].real(), 1e-11 * std::abs(data[i].real()) + 1e-300);
        EXPECT_NEAR(std::stod(im), data[i].imag(), 1e-11 * std::abs(data[i].imag()) + 1e-300);
    }
    EXPECT_EQ(errorOf([&] { parse("CALC32:DATA? FDATA"); }), "-224 Illegal parameter value");
    parse("CALC32:PAR:DEL 'PIP_MEAS'");
    EXPECT_EQ(errorOf([&] { parse("CALC32:DATA? SDATA"); }), "-221 Settings conflict");
}

TEST(SimPulseGeneratorTest, WidthLandsOnThePulseClockGrid) {
    {
        SimBench bench("kt622");  // hardware value 5: 100 MHz
        auto pg = bench.connectAnalyzer()->currentChannel()->pulseGenerator();
        pg->setWidth(1, 1.234e-6);
        EXPECT_NEAR(pg->width(1), 1.23e-6, 1e-15);
        pg->setWidth(2, 1e-12);
        EXPECT_NEAR(pg->width(2), 1e-8, 1e-18) << "at least one tick";
        EXPECT_THROW(pg->setWidth(5, 1e-6), InstrumentError);
        EXPECT_THROW(pg->setWidth(1, -1e-6), InstrumentError);
        EXPECT_NEAR(pg->width(1), 1.23e-6, 1e-15) << "a refused width changes nothing";
    }
    {
        SimBench bench("kt633");  // hardware value 4: 60 MHz
        auto pg = bench.connectAnalyzer()->currentChannel()->pulseGenerator();
        pg->setWidth(1, 1.01e-6);
        EXPECT_NEAR(pg->width(1), 61.0 / 60e6, 1e-15);
    }
    {
        SimBench bench("kt655");  // "5.0" reads as 5
        auto pg = bench.connectAnalyzer()->currentChannel()->pulseGenerator();
        pg->setWidth(3, 1.234e-6);
        EXPECT_NEAR(pg->width(3), 1.23e-6, 1e-15);
        pg->setPeriod(2e-4);
        pg->setDelay(3, 1e-6);
        pg->setDelayStep(3, 1e-8);
        pg->setState(3, true);
        EXPECT_DOUBLE_EQ(pg->period(), 2e-4);
        EXPECT_DOUBLE_EQ(pg->delay(3), 1e-6);
        EXPECT_DOUBLE_EQ(pg->delayStep(3), 1e-8);
        EXPECT_TRUE(pg->state(3));
        EXPECT_FALSE(pg->state(0));
    }
}

std::vector<std::string> elementNames(const char* model) {
    SimBench bench(model);
    return bench.connectAnalyzer()->currentChannel()->pathConfiguration()->elementNames();
}

bool has(const std::vector<std::string>& names, const std::string& name) {
    return std::find(names.begin(), names.end(), name) != names.end();
}

TEST(SimPathConfigurationTest, ElementsFollowTheModel) {
    const auto kt622 = elementNames("kt622");
    EXPECT_TRUE(has(kt622, "Src1Out1PulseModEnable"));
    EXPECT_FALSE(has(kt622, "Src2Out1PulseModEnable"));
    for (const char* name :
         {"PulseModDrive", "IFGateA", "IFGateB", "IFGateR1", "IFGateR2", "NBFATNA", "NBFATNB",
          "NBFATNR1", "NBFATNR2", "IFSigPathAll", "IFAntiAliasFilter"}) {
        EXPECT_TRUE(has(kt622, name)) << name;
    }
    EXPECT_FALSE(has(kt622, "IFGateC"));

    const auto kt633 = elementNames("kt633");
    EXPECT_TRUE(has(kt633, "Src1Out1PulseModEnable"));
    EXPECT_TRUE(has(kt633, "Src2Out1PulseModEnable"));

    const auto kt655 = elementNames("kt655");
    for (const char* name : {"IFGateC", "IFGateD", "IFGateR3", "IFGateR4", "NBFATND",
                             "Src1Out1PulseModEnable", "Src2Out1PulseModEnable"}) {
        EXPECT_TRUE(has(kt655, name)) << name;
    }
    const auto kt644 = elementNames("kt644");
    EXPECT_FALSE(has(kt644, "PulseModDrive"));
    EXPECT_FALSE(has(kt644, "Src1Out1PulseModEnable"));
    EXPECT_TRUE(has(kt644, "IFGateR4"));
    EXPECT_FALSE(has(elementNames("zx20"), "IFGateA"));
}

TEST(SimPathConfigurationTest, ValuesRoundTripAndBadInputChangesNothing) {
    SimBench bench("kt622");
    auto path = bench.connectAnalyzer()->currentChannel()->pathConfiguration();
    auto gate = path->element("IFGateA");
    EXPECT_EQ(gate->value(), "ON");
    gate->setValue("Pulse2");
    EXPECT_EQ(path->element("IFGateA")->value(), "Pulse2");
    EXPECT_EQ(errorOf([&] { gate->setValue("Pulse9"); }), "-224 Illegal parameter value");
    EXPECT_EQ(gate->value(), "Pulse2");
    path->element("NBFATNB")->setValue("30");
    EXPECT_EQ(path->element("NBFATNB")->value(), "30");
    EXPECT_THROW(path->element("NBFATNB")->setValue("-5"), InstrumentError);
    path->element("Src1Out1PulseModEnable")->setValue("Enable");
    EXPECT_EQ(path->element("Src1Out1PulseModEnable")->value(), "Enable");
    EXPECT_EQ(errorOf([&] { path->element("Src2Out1PulseModEnable"); }),
              "-224 Illegal parameter value");
}

TEST(SimChannelTest, AlcModesOfferOpenLoopOnEveryPort) {
    SimBench bench("kt644");
    auto ch = bench.connectAnalyzer()->currentChannel();
    for (int port = 1; port <= 4; ++port) {
        const auto modes = ch->getSupportedALCModes(port);
        EXPECT_TRUE(has(modes, "OPENloop"));
        EXPECT_EQ(modes[2], "OPENloop") << "mode number 2 is open loop";
        ch->setALCLevelingMode(port, 2);
        EXPECT_EQ(bench.analyzer().channel(1).alcMode[port], 2);
    }
    EXPECT_THROW(ch->getSupportedALCModes(5), InstrumentError);
    EXPECT_THROW(ch->setALCLevelingMode(1, 3), InstrumentError);
    EXPECT_EQ(bench.analyzer().channel(1).alcMode[1], 2);
}

TEST(SimChannelTest, SettingsAreKeptAndCheckedAgainstTheModel) {
    SimBench bench("kt622");
    auto app = bench.connectAnalyzer();
    auto ch = app->currentChannel();
    auto& state = bench.analyzer().channel(1);
    ch->setCwFrequency(1e10);
    EXPECT_THROW(ch->setCwFrequency(30e9), InstrumentError);
    EXPECT_DOUBLE_EQ(state.cwFrequency, 1e10);
    EXPECT_THROW(ch->setNumberOfPoints(0), InstrumentError);
    EXPECT_THROW(ch->setIfBandwidth(0), InstrumentError);
    auto ifc = ch->ifConfiguration();
    ifc->setReceiverGain("R2", 1);
    EXPECT_THROW(ifc->setReceiverGain("C", 1), InstrumentError);
    EXPECT_THROW(ifc->setReceiverGain("A", 4), InstrumentError);
    ifc->setIfCountB(12);
    ifc->setReceiverSwitch("ALL", true);
    EXPECT_EQ(state.ifConfiguration.receiverGain["R2"], 1);
    EXPECT_EQ(state.ifConfiguration.ifCountB, 12);
    EXPECT_TRUE(state.ifConfiguration.receiverSwitch["ALL"]);
    auto spm = ch->signalProcessingModule();
    spm->setFilterType("PWIN");
    spm->setFilterParameter("D", 2e-6);
    spm->setCoefficientsA({1, -2, 3});
    spm->setProcessingSwitch(1);
    EXPECT_TRUE(spm->state());
    EXPECT_EQ(state.processing.coefficientsA, (std::vector<std::int32_t>{1, -2, 3}));
    EXPECT_THROW(spm->setFilterType("KAISER"), InstrumentError);
    EXPECT_EQ(state.processing.filterType, "PWIN");

    auto measurement = app->activeMeasurement();
    EXPECT_FALSE(measurement->correctionOn());
    EXPECT_EQ(measurement->correctionType(), 0);
    app->commandParser()->parse("CALC1:PAR:DEL 'CH1_S11_1'");
    EXPECT_THROW(measurement->activate(), InstrumentError);
    EXPECT_THROW(app->activeMeasurement(), InstrumentError);
}

}  // namespace
}  // namespace zp::sim
