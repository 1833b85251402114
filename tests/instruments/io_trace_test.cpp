#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <thread>

#include <unistd.h>

#include "instruments/io_trace.h"

namespace zp {
namespace {

TEST(IoTraceTest, QuoteEscapesControlCharactersQuotesAndBackslashes) {
    EXPECT_EQ(IoTrace::quote("plain"), "\"plain\"");
    EXPECT_EQ(IoTrace::quote("a\nb\rc\td"), "\"a\\nb\\rc\\td\"");
    EXPECT_EQ(IoTrace::quote("say \"hi\" \\ there"), "\"say \\\"hi\\\" \\\\ there\"");
    EXPECT_EQ(IoTrace::quote(std::string("\x01", 1)), "\"\\x01\"");
}

TEST(IoTraceTest, LinesFollowTheDocumentedFormat) {
    IoTrace trace;
    trace.analyzerCall("CommandParser", "parse", IoTrace::quote("CALC32:PAR:CAT?"),
                       IoTrace::quote("\"CH1_S11_1,S11\"\n"));
    trace.analyzerCall("Channel[1]", "setIfBandwidth", "1000", "");
    trace.analyzerError("Channel[1]", "setIfBandwidth", "1000", "+143 Parameter conflict");
    trace.busEvent(11, "open");
    trace.busWrite(11, "*IDN?\n");
    trace.busRead(11, "X,Y\n");
    trace.busEvent(12, "timeout");
    trace.busEvent(12, "error line one\nline two");
    EXPECT_EQ(trace.lines(),
              (std::vector<std::string>{
                  "ANA CommandParser.parse(\"CALC32:PAR:CAT?\") -> \"\\\"CH1_S11_1,S11\\\"\\n\"",
                  "ANA Channel[1].setIfBandwidth(1000)",
                  "ANA Channel[1].setIfBandwidth(1000) !! +143 Parameter conflict",
                  "BUS 11 open",
                  "BUS 11 W \"*IDN?\\n\"",
                  "BUS 11 R \"X,Y\\n\"",
                  "BUS 12 timeout",
                  "BUS 12 error line one\\nline two",
              }));
    trace.clear();
    EXPECT_TRUE(trace.lines().empty());
}

TEST(IoTraceTest, FileReceivesEveryLineAsItIsWrittenOrRefusesAnUnwritablePath) {
    const auto path = std::filesystem::temp_directory_path() /
                      ("zp_trace_test_" + std::to_string(::getpid()) + ".log");
    IoTrace trace;
    trace.busEvent(11, "before");  // recorded before the file was opened: not in it
    trace.openFile(path.string());
    trace.busWrite(11, "A\n");
    {
        // Read while the trace is still open: the line must already be on disk.
        std::ifstream in(path);
        std::string line;
        ASSERT_TRUE(std::getline(in, line));
        EXPECT_EQ(line, "BUS 11 W \"A\\n\"");
        EXPECT_FALSE(std::getline(in, line));
    }
    EXPECT_FALSE(trace.fileFailed());
    std::filesystem::remove(path);
    EXPECT_THROW(IoTrace().openFile("/nonexistent-dir/zp/trace.log"), std::runtime_error);
    IoTrace full;
    EXPECT_FALSE(full.fileFailed()) << "no file, no failure";
    full.openFile("/dev/full");
    full.busEvent(11, "open");
    EXPECT_TRUE(full.fileFailed());
}

TEST(IoTraceTest, ConcurrentWritersLoseNoLines) {
    IoTrace trace;
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&trace, t] {
            for (int i = 0; i < 500; ++i) trace.busWrite(10 + t, "x");
        });
    }
    for (auto& th : threads) th.join();
    EXPECT_EQ(trace.lines().size(), 2000u);
}

}  // namespace
}  // namespace zp
