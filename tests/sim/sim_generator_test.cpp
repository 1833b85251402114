#include "sim/sim_generator.h"

#include <gtest/gtest.h>

#include <string>

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

TEST_F(SimGeneratorTest, CommandsNeverReply) {
    for (const char* command :
         {"*CLS", "*RST", ":SYST:PRES", ":OUTP1:POL NORM", ":HOLD VOLT", ":VOLT1:HIGH 2.5",
          ":VOLT1:LOW 0", ":OUTP1:IMP:EXT 50", ":SOUR:FREQ 1000", ":SOUR:PULS:WIDT1 1E-06",
          ":SOUR:PULS:DEL1 0", ":OUTP1:STAT ON", ":TRIG:SOUR INT2", ":ARM:SOUR IMM",
          ":SOUR:ROSC:SOUR EXT", ":SOUR:ROSC:EXT:FREQ 10MHZ", "DISP OFF", ":ARM:SOUR EXT"}) {
        EXPECT_FALSE(gen.handle(command).has_value()) << command;
    }
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
}

TEST_F(SimGeneratorTest, MasterSequenceSetsEveryField) {
    for (const char* command :
         {":SYST:PRES", "*CLS", ":OUTP2:POL NORM", ":HOLD VOLT", ":VOLT2:HIGH 2.5", ":VOLT2:LOW 0",
          ":TRIG:SOUR INT2", ":ARM:SOUR IMM", ":SOUR:ROSC:SOUR EXT", ":SOUR:ROSC:EXT:FREQ 10MHZ",
          ":VOLT2:HIGH 3.3", ":VOLT2:LOW -0.5", ":OUTP2:IMP:EXT 1000000", ":OUTP2:POL INV",
          ":SOUR:FREQ 10000", ":SOUR:PULS:WIDT2 2.5e-05", ":SOUR:PULS:DEL2 1.5E-06",
          ":OUTP2:STAT ON", "DISP OFF"}) {
        gen.handle(command);
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
    EXPECT_EQ(query(":OUTP1:POL?"), "NORM\n");
}

TEST_F(SimGeneratorTest, UnknownHeadersAndJunkAreQueuedInOrder) {
    EXPECT_FALSE(gen.handle(":SOUR:FREQUENC 5").has_value());  // neither short nor long form
    gen.handle(":FOO:BAR 1");
    gen.handle("*XYZ");
    gen.handle(":SOUR:FREQ 1.2.3");
    gen.handle(":SOUR:FREQ abc");
    gen.handle("::OUTP1:STAT ON");
    gen.handle(":OUTP3:STAT ON");
    gen.handle(":OUTP1:POL SIDEWAYS");
    gen.handle(":SOUR:PULS:WIDT1 5 V");
    gen.handle(":SOUR:FREQ");
    gen.handle(":OUTP1:STAT ON,OFF");
    gen.handle(":SYST:PRES 1");
    gen.handle(":SYST:ERR");  // the error queue is query-only
    EXPECT_EQ(nextError(), "-113,\"Undefined header\"\n");
    EXPECT_EQ(nextError(), "-113,\"Undefined header\"\n");
    EXPECT_EQ(nextError(), "-113,\"Undefined header\"\n");
    EXPECT_EQ(nextError(), "-102,\"Syntax error\"\n");
    EXPECT_EQ(nextError(), "-102,\"Syntax error\"\n");
    EXPECT_EQ(nextError(), "-102,\"Syntax error\"\n");
    EXPECT_EQ(nextError(), "-114,\"Header suffix out of range\"\n");
    EXPECT_EQ(nextError(), "-224,\"Illegal parameter value\"\n");
    EXPECT_EQ(nextError(), "-131,\"Invalid suffix\"\n");
    EXPECT_EQ(nextError(), "-109,\"Missing parameter\"\n");
    EXPECT_EQ(nextError(), "-108,\"Parameter not allowed\"\n");
    EXPECT_EQ(nextError(), "-108,\"Parameter not allowed\"\n");
    EXPECT_EQ(nextError(), "-113,\"Undefined header\"\n");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
    // Nothing was changed by the bad commands.
    EXPECT_DOUBLE_EQ(gen.state().frequency, 1e3);
    EXPECT_FALSE(out(1).on);
    EXPECT_FALSE(out(1).inverted);
}

TEST_F(SimGeneratorTest, ValuesOutOfRangeAreRejectedAndKeepTheOldValue) {
    gen.handle(":SOUR:FREQ 1000");  // period 1 ms
    const struct {
        const char* command;
    } cases[] = {
        {":VOLT1:HIGH 10.5"},         {":VOLT1:LOW -11"},         {":SOUR:FREQ 166E6"},
        {":SOUR:FREQ 0.0001"},        {":SOUR:PULS:WIDT1 1.1MS"}, {":SOUR:PULS:WIDT1 -1E-9"},
        {":SOUR:PULS:DEL1 -1NS"},     {":SOUR:PULS:DEL1 1001"},   {":OUTP1:IMP:EXT 0.1"},
        {":SOUR:ROSC:EXT:FREQ 7MHZ"}, {":SOUR:FREQ 1E400"}};
    for (const auto& c : cases) {
        gen.handle(c.command);
        EXPECT_EQ(nextError(), "-222,\"Data out of range\"\n") << c.command;
    }
    EXPECT_DOUBLE_EQ(out(1).high, 5.0);
    EXPECT_DOUBLE_EQ(out(1).low, 0.0);
    EXPECT_DOUBLE_EQ(out(1).width, 1e-6);
    EXPECT_DOUBLE_EQ(gen.state().frequency, 1e3);
    // Boundaries are inside.
    gen.handle(":VOLT1:HIGH 10;:VOLT1:LOW -10;:SOUR:PULS:WIDT1 1MS;:SOUR:FREQ 165MHZ");
    EXPECT_EQ(nextError(), "+0,\"No error\"\n");
    EXPECT_DOUBLE_EQ(out(1).width, 1e-3);
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
