#include "sim/generators/sim_generator.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>

namespace zp::sim {
namespace {

class SimGeneratorTest : public ::testing::Test {
  protected:
    SimGenerator gen{11, ""};

    std::string query(std::string_view line) { return gen.handle(line).value_or("<none>"); }
    std::string nextError() { return query(":SYST:ERR?"); }
    const SimGeneratorOutput& out(int n) const { return gen.state().outputs[n - 1]; }
};

TEST_F(SimGeneratorTest, CommonQueriesReplyWithLineFeed) {
    EXPECT_EQ(query("*IDN?"), "Veltrix,PG8102A,SIM11,1.0\n");
    EXPECT_EQ(query("*OPC?"), "1\n");
    EXPECT_EQ(query(":SYST:ERR?"), "+0,\"No error\"\n");
    EXPECT_EQ(SimGenerator(12, "Acme,X,1,2").handle("*idn?"), "Acme,X,1,2\n");
}

TEST_F(SimGeneratorTest, MasterSequenceSetsEveryFieldWithoutReplies) {
    for (const char* command :
         {":SYST:PRES", "*CLS", "*RST", ":OUTP2:POL NORM", ":HOLD VOLT", ":VOLT2:HIGH 2.5",
          ":TRIG:SOUR INT2", ":ARM:SOUR IMM", ":SOUR:ROSC:SOUR EXT", ":SOUR:ROSC:EXT:FREQ 10MHZ",
          ":VOLT2:HIGH 3.3", ":VOLT2:LOW -0.5", ":OUTP2:IMP:EXT 1000000", ":OUTP2:POL INV",
          ":SOUR:FREQ 10000", ":SOUR:PULS:WIDT2 2.5e-05", ":SOUR:PULS:DEL2 1.5E-06",
          ":OUTP2:STAT ON", "DISP OFF"}) {
        EXPECT_FALSE(gen.handle(command).has_value()) << command;
    }
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
    const auto& s = gen.state();
    EXPECT_EQ(s.triggerSource, "INT2");
    EXPECT_EQ(s.armSource, "IMM");
    EXPECT_TRUE(s.externalReference);
    EXPECT_DOUBLE_EQ(s.referenceFrequency, 10e6);
    EXPECT_TRUE(s.holdVoltage);
    EXPECT_FALSE(s.displayOn);
    EXPECT_DOUBLE_EQ(s.frequency, 1e4);
    EXPECT_DOUBLE_EQ(out(2).high, 3.3);
    EXPECT_DOUBLE_EQ(out(2).low, -0.5);
    EXPECT_DOUBLE_EQ(out(2).loadImpedance, 1e6);
    EXPECT_TRUE(out(2).inverted);
    EXPECT_DOUBLE_EQ(out(2).width, 25e-6);
    EXPECT_DOUBLE_EQ(out(2).delay, 1.5e-6);
    EXPECT_TRUE(out(2).on);
    EXPECT_FALSE(out(1).on);  // output 1 untouched
    EXPECT_DOUBLE_EQ(out(1).high, 5.0);
}

TEST_F(SimGeneratorTest, LongShortCaseRootAndSuffixForms) {
    gen.handle("source:pulse:width2 3us");
    EXPECT_DOUBLE_EQ(out(2).width, 3e-6);
    gen.handle("PULSe:DELay 100NS");  // no root, no suffix = output 1
    EXPECT_DOUBLE_EQ(out(1).delay, 100e-9);
    gen.handle(":OUTPut2:STATe 1");
    EXPECT_TRUE(out(2).on);
    gen.handle("OUTP2 OFF");
    EXPECT_FALSE(out(2).on);
    gen.handle(":SOURce:VOLTage1:LEVel:IMMediate:HIGH 1200 MV");
    EXPECT_DOUBLE_EQ(out(1).high, 1.2);
    gen.handle(":FREQ:CW 2.5 kHz");
    EXPECT_DOUBLE_EQ(gen.state().frequency, 2500.0);
    gen.handle(":OUTPUT1:POLARITY inverted");
    EXPECT_TRUE(out(1).inverted);
    gen.handle(":TRIGger:SEQuence:SOURce internal2");
    EXPECT_EQ(gen.state().triggerSource, "INT2");
    gen.handle(":DISPlay:WINDow:STATe ON");
    EXPECT_TRUE(gen.state().displayOn);
    EXPECT_EQ(query("SYSTEM:ERROR:NEXT?"), "+0,\"No error\"\n");
}

TEST_F(SimGeneratorTest, NumberFormsTheProgramMaySend) {
    const struct {
        const char* text;
        double seconds;
    } cases[] = {{"1E-06", 1e-6}, {"1e-6", 1e-6},  {"1.5E-06", 1.5e-6}, {".5us", 0.5e-6},
                 {"5.", 5.0},     {"+2E-4", 2e-4}, {"0", 0.0},          {"250 ns", 250e-9},
                 {"3PS", 3e-12},  {"7ms", 7e-3}};
    gen.handle(":SOUR:FREQ 0.1");  // 10 s period leaves room for every width
    for (const auto& c : cases) {
        gen.handle(std::string(":SOUR:PULS:WIDT1 ") + c.text);
        EXPECT_DOUBLE_EQ(out(1).width, c.seconds) << c.text;
        EXPECT_EQ(nextError(), "+0,\"No error\"\n") << c.text;
    }
    for (const char* junk : {"1E", "E5", "--1", "1,5", "NAN", "1e5x7"}) {
        gen.handle(std::string(":SOUR:PULS:WIDT1 ") + junk);
        EXPECT_NE(nextError(), "+0,\"No error\"\n") << junk;
    }
}

TEST_F(SimGeneratorTest, QueriesReportSettingsAndJoinWithSemicolons) {
    gen.handle(":SOUR:FREQ 1.5E+03;:OUTP1:STAT ON");
    EXPECT_EQ(query(":SOUR:FREQ?;:OUTP1:STAT?;*OPC?"), "1500;1;1\n");
    EXPECT_EQ(query(":OUTP1:POL?;:HOLD?;:SOUR:ROSC:SOUR?;:OUTP2:IMP:EXT?;DISP?"),
              "NORM;CURR;INT;50;1\n");
    gen.handle(":OUTP2:POL INV;:HOLD VOLT;:SOUR:ROSC:SOUR EXT;:OUTP2:IMP:EXT 1E6;DISP OFF");
    EXPECT_EQ(query(":OUTP2:POL?;:OUTP1:POL?;:HOLD?;:SOUR:ROSC:SOUR?;:OUTP2:IMP:EXT?;DISP?"),
              "INV;NORM;VOLT;EXT;1000000;0\n");
}

TEST_F(SimGeneratorTest, UnknownHeadersAndJunkAreQueuedInOrder) {
    const std::pair<const char*, const char*> cases[] = {
        {":SOUR:FREQUENC 5", "-113,\"Undefined header\""},  // neither short nor long form
        {":FOO:BAR 1", "-113,\"Undefined header\""},
        {"*XYZ", "-113,\"Undefined header\""},
        {":SOUR:FREQ 1.2.3", "-102,\"Syntax error\""},
        {":SOUR:FREQ abc", "-102,\"Syntax error\""},
        {"::OUTP1:STAT ON", "-102,\"Syntax error\""},
        {":OUTP3:STAT ON", "-114,\"Header suffix out of range\""},
        {":OUTP1:POL SIDEWAYS", "-224,\"Illegal parameter value\""},
        {":SOUR:PULS:WIDT1 5 V", "-131,\"Invalid suffix\""},
        {":SOUR:FREQ", "-109,\"Missing parameter\""},
        {":OUTP1:STAT ON,OFF", "-108,\"Parameter not allowed\""},
        {":SYST:PRES 1", "-108,\"Parameter not allowed\""},
        {":SYST:ERR", "-113,\"Undefined header\""},  // the error queue is query-only
    };
    for (const auto& c : cases) EXPECT_FALSE(gen.handle(c.first).has_value()) << c.first;
    for (const auto& c : cases) EXPECT_EQ(nextError(), std::string(c.second) + "\n") << c.first;
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
    // Nothing was changed by the bad commands.
    EXPECT_DOUBLE_EQ(gen.state().frequency, 1e3);
    EXPECT_FALSE(out(1).on);
    EXPECT_FALSE(out(1).inverted);
}

TEST_F(SimGeneratorTest, ValuesOutOfRangeAreRejectedAndKeepTheOldValue) {
    gen.handle(":SOUR:FREQ 1000");  // period 1 ms
    for (const char* command :
         {":VOLT1:HIGH 10.5", ":VOLT1:LOW -11", ":SOUR:FREQ 166E6", ":SOUR:FREQ 0.0001",
          ":SOUR:PULS:WIDT1 1.1MS", ":SOUR:PULS:WIDT1 -1E-9", ":SOUR:PULS:DEL1 -1NS",
          ":SOUR:PULS:DEL1 1001", ":OUTP1:IMP:EXT 0.1", ":SOUR:ROSC:EXT:FREQ 7MHZ",
          ":SOUR:FREQ 1E400"}) {
        gen.handle(command);
        EXPECT_EQ(nextError(), "-222,\"Data out of range\"\n") << command;
    }
    EXPECT_DOUBLE_EQ(out(1).high, 5.0);
    EXPECT_DOUBLE_EQ(out(1).low, 0.0);
    EXPECT_DOUBLE_EQ(out(1).width, 1e-6);
    EXPECT_DOUBLE_EQ(gen.state().frequency, 1e3);
    // Boundaries are inside.
    gen.handle(":VOLT1:HIGH 10;:VOLT1:LOW -10;:SOUR:PULS:WIDT1 1MS;:SOUR:PULS:WIDT2 0");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
    EXPECT_DOUBLE_EQ(out(1).width, 1e-3);
    gen.handle(":SOUR:FREQ 165MHZ");  // taken, though width 1 no longer fits
    EXPECT_EQ(nextError(), "-221,\"Settings conflict\"\n");
    EXPECT_DOUBLE_EQ(gen.state().frequency, 165e6);
}

TEST_F(SimGeneratorTest, NegativeZeroReadsBackAsZero) {
    for (const char* setting :
         {":SOUR:PULS:WIDT1", ":SOUR:PULS:DEL2", ":VOLT1:LOW", ":VOLT2:HIGH"}) {
        for (const char* zero : {"-0", "-0.0E+3", "-.0"}) {
            gen.handle(std::string(setting) + " " + zero);
            EXPECT_EQ(query(std::string(setting) + "?"), "0\n") << setting << " " << zero;
        }
    }
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
}

TEST_F(SimGeneratorTest, APeriodShorterThanAWidthIsTakenWithASettingsConflict) {
    gen.handle(":SOUR:PULS:WIDT2 4E-4;:SOUR:PULS:WIDT1 2E-4");  // period 1 ms
    // frequency -> entries queued (a period equal to the width fits; two outputs too wide, one)
    const std::pair<const char*, int> cases[] = {
        {"2500", 0}, {"2501", 1}, {"1E6;:FREQ 1E5;:FREQ 1E3", 2}, {"1E4", 1}};
    for (const auto& [frequency, conflicts] : cases) {
        gen.handle(std::string(":SOUR:FREQ ") + frequency);
        for (int i = 0; i < conflicts; ++i) {
            EXPECT_EQ(nextError(), "-221,\"Settings conflict\"\n") << frequency;
        }
        EXPECT_EQ(nextError(), "+0,\"No error\"\n") << frequency;
    }
    EXPECT_EQ(query(":SOUR:FREQ?;:PULS:WIDT2?;:PULS:WIDT1?"), "10000;0.0004;0.0002\n");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");  // the query queued nothing
}

TEST_F(SimGeneratorTest, ErrorQueueIsBoundedWithOverflowLast) {
    for (int i = 0; i < 40; ++i) gen.handle(":BAD");
    EXPECT_EQ(gen.state().errorQueue.size(), 30u);
    for (int i = 0; i < 29; ++i) EXPECT_EQ(nextError(), "-113,\"Undefined header\"\n");
    EXPECT_EQ(nextError(), "-350,\"Queue overflow\"\n");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
}

TEST_F(SimGeneratorTest, ClsEmptiesQueuePresetKeepsItAndResetsSettings) {
    gen.pushError("-222,\"Data out of range\"");
    gen.handle(":OUTP1:STAT ON;:SOUR:FREQ 5000;:SYST:PRES");
    EXPECT_FALSE(out(1).on);
    EXPECT_DOUBLE_EQ(gen.state().frequency, 1e3);
    EXPECT_EQ(gen.state().errorQueue.size(), 1u);
    gen.handle("*CLS");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
}

}  // namespace
}  // namespace zp::sim
