#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "instruments/error_capture.h"
#include "instruments/instrument_error.h"
#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/sim_bench.h"

namespace zp::sim {
namespace {

using testing_support::errorOf;

class SimAnalyzerTest : public ::testing::Test {
  protected:
    std::string parse(const std::string& command) { return app->commandParser()->parse(command); }
    SimBench bench{"kt622"};
    std::unique_ptr<AnalyzerApplication> app = bench.connectAnalyzer();
};

TEST(SimModelsTest, TableIsExactlyTheListedModels) {
    std::vector<std::string> rows;
    for (const auto& m : simModels()) {
        EXPECT_LT(m.minFrequency, m.maxFrequency);
        rows.push_back(m.name + "|" + m.modelText + "|" + m.optionText + "|" +
                       std::to_string(m.ports) + "|" + std::to_string(m.sources) + "|" +
                       m.hardwareValue);
    }
    EXPECT_EQ(rows, (std::vector<std::string>{
                        "kt622|KT622A|K71 M81|2|1|5", "kt633|KT633A|K72 M81 M82|2|2|4",
                        "kt644|KT644A|K71|4|1|5", "kt655|KT655A|K71 M83 M84|4|3|5.0",
                        "kt611|KT611A||2|1|4", "zx20-j55|ZX20|J55|2|1|4", "zx20|ZX20||2|1|4"}));
    EXPECT_STREQ(kDefaultModel, "kt622");
    EXPECT_EQ(findSimModel("kt9"), nullptr);
}

TEST(SimBenchTest, DescribesItselfAndRejectsUnknownModels) {
    EXPECT_EQ(SimBench().describe(),
              "simulated KT622A (kt622), simulated generators at 11, 12, 13");
    EXPECT_EQ(SimBench("zx20-j55", {}, {}).describe(), "simulated ZX20 (zx20-j55), no generators");
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
    EXPECT_EQ(app->hardwareInfo()->portCount(), 2);
    EXPECT_EQ(app->hardwareInfo()->hardwareValue(), "5");
    EXPECT_EQ(app->currentChannel()->channelNumber(), 1);
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

TEST_F(SimAnalyzerTest, BadCommandsRaiseScpiErrorsAndChangeNothing) {
    const std::pair<const char*, const char*> cases[] = {
        {"FOO:BAR", "-113 Undefined header"},
        {"", "-113 Undefined header"},
        {"CALC33:PAR:CAT?", "-114 Header suffix out of range"},
        {"CALC1:PAR:DEL 'PIP_MEAS'", "-224 Illegal parameter value"},
        {"CALC1:PAR:DEF 'X',S33", "-224 Illegal parameter value"},
        {"CALC1:PAR:DEF 'CH1_S11_1',S21", "-221 Settings conflict"},
        {"CALC1:PAR:DEF 'X'", "-109 Missing parameter"},
        {"SENS1:SWE:SRCP 3", "-222 Data out of range"},
        {"SENS1:SWE:SRCP x", "-104 Data type error"},
        {"CALC1:PAR:SEL 'open", "-150 String data error"},
        // A query-only command sent as a setting, a suffix on a node that takes none, a common
        // command the analyzer lacks and a node that is no keyword.
        {"CALC1:PAR:CAT", "-113 Undefined header"},
        {"CALC1:PAR2:CAT?", "-113 Undefined header"},
        {"*RST", "-113 Undefined header"},
        {"CALC1:PAR:C-T?", "-113 Undefined header"},
    };
    for (const auto& [command, error] : cases) {
        long number = 0;
        EXPECT_EQ(errorOf([&] { parse(command); }, &number), error) << command;
        EXPECT_EQ(number, std::stol(error)) << command;
    }
    EXPECT_EQ(parse("CALC1:PAR:CAT?"), "\"CH1_S11_1,S11\"\n") << "nothing changed";
    // Long forms and lower case are the same commands.
    EXPECT_EQ(parse("calculate1:parameter:catalog?"), "\"CH1_S11_1,S11\"\n");
    // The channel defaults to 1; STATe may be left out.
    EXPECT_EQ(parse(":CALC:PAR:CAT?"), "\"CH1_S11_1,S11\"\n");
    EXPECT_EQ(parse("SENS:CORR:STAT OFF"), "");
    EXPECT_EQ(parse("SENS1:CORR?"), "0\n");
    EXPECT_EQ(parse("*idn?"), "Korvex,KT622A,SIM000001,A.01.00\n");
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
    // Hardware value 5 (also "5.0") is a 100 MHz pulse clock, 4 is 60 MHz.
    for (const auto& [model, asked, width] : {std::tuple{"kt622", 1.234e-6, 1.23e-6},
                                              {"kt622", 1e-12, 1e-8},
                                              {"kt655", 1.234e-6, 1.23e-6},
                                              {"kt633", 1.01e-6, 61.0 / 60e6}}) {
        SimBench bench(model);
        auto pg = bench.connectAnalyzer()->currentChannel()->pulseGenerator();
        pg->setWidth(1, asked);
        EXPECT_NEAR(pg->width(1), width, 1e-15) << model << " " << asked;
        EXPECT_THROW(pg->setWidth(5, 1e-6), InstrumentError);
        EXPECT_THROW(pg->setWidth(1, -1e-6), InstrumentError);
        EXPECT_NEAR(pg->width(1), width, 1e-15) << "a refused width changes nothing";
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
    const std::tuple<const char*, std::vector<std::string>, std::vector<std::string>> cases[] = {
        {"kt622",
         {"PulseModDrive", "IFGateA", "IFGateR2", "NBFATNR2", "IFSigPathAll", "IFAntiAliasFilter",
          "Src1Out1PulseModEnable"},
         {"Src2Out1PulseModEnable", "IFGateC"}},
        {"kt633", {"Src1Out1PulseModEnable", "Src2Out1PulseModEnable"}, {}},
        {"kt655", {"IFGateD", "IFGateR4", "NBFATND", "Src2Out1PulseModEnable"}, {}},
        {"kt644", {"IFGateR4"}, {"PulseModDrive", "Src1Out1PulseModEnable"}},
        {"zx20", {}, {"IFGateA"}},
    };
    for (const auto& [model, present, absent] : cases) {
        const auto names = elementNames(model);
        for (const auto& name : present) EXPECT_TRUE(has(names, name)) << model << " " << name;
        for (const auto& name : absent) EXPECT_FALSE(has(names, name)) << model << " " << name;
    }
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

TEST(SimChannelTest, RefusedSettingsChangeNothing) {
    SimBench bench("kt622");
    auto app = bench.connectAnalyzer();
    auto ch = app->currentChannel();
    const auto& state = bench.analyzer().channel(1);
    ch->setCwFrequency(1e10);
    EXPECT_THROW(ch->setCwFrequency(30e9), InstrumentError);  // above the model's range
    EXPECT_DOUBLE_EQ(state.cwFrequency, 1e10);
    EXPECT_THROW(ch->setNumberOfPoints(0), InstrumentError);
    auto ifc = ch->ifConfiguration();
    ifc->setReceiverGain("R2", 1);
    EXPECT_THROW(ifc->setReceiverGain("C", 1), InstrumentError);  // a four-port receiver
    EXPECT_THROW(ifc->setReceiverGain("R2", 4), InstrumentError);
    EXPECT_EQ(state.ifConfiguration.receiverGain.at("R2"), 1);
    auto spm = ch->signalProcessingModule();
    spm->setFilterType("PWIN");
    EXPECT_EQ(errorOf([&] { spm->setFilterType("KAISER"); }), "-224 Illegal parameter value");
    EXPECT_EQ(state.processing.filterType, "PWIN");

    auto measurement = app->activeMeasurement();
    app->commandParser()->parse("CALC1:PAR:DEL 'CH1_S11_1'");
    EXPECT_THROW(measurement->activate(), InstrumentError);
    EXPECT_THROW(app->activeMeasurement(), InstrumentError);
}

}  // namespace
}  // namespace zp::sim
