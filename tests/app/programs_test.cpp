// The programs as real processes: exit statuses, what they print, the second-start hand-over.

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>

#include "child_process.h"
#include "common/bench_options.h"

namespace zp::testing {
namespace {

using namespace std::chrono_literals;
namespace fs = std::filesystem;

const std::string kCli = ZP_CLI_PATH;
const std::string kGui = ZP_GUI_PATH;
const char* kUnreachable = "analyzer:Application.modelText=-999 Analyzer not responding";
const char* kListening = "zentra-pulse: listening for a second start\n";

bool haveGui() {
    return fs::exists(kGui);
}

fs::path scratch(const std::string& name) {
    return fs::temp_directory_path() / ("zp-app-test-" + std::to_string(getpid()) + "-" + name);
}

// A fresh instance key every time: a repeated test in the same process, or a reused process id,
// must never meet an instance or socket file of an earlier run.
std::string uniqueKey() {
    static int serial = 0;
    return "zp-test-" + std::to_string(getpid()) + "-" + std::to_string(++serial) + "-" +
           std::to_string(std::chrono::system_clock::now().time_since_epoch().count() % 1000000007);
}

// Where the window program's instance socket lies (Qt puts it in the temporary folder).
fs::path instanceSocket(const std::string& key) {
    const char* tmp = std::getenv("TMPDIR");
    return fs::path(tmp && *tmp ? tmp : "/tmp") / key;
}

Env guiEnv(const std::string& key) {
    return {{"QT_QPA_PLATFORM", "offscreen"}, {"ZP_INSTANCE_KEY", key}};
}

TEST(CliProgram, SetsCalculatesAndShowsOnAFourPortAnalyzer) {
    RunResult r =
        runProgram(kCli, {"--analyzer", "sim:kt655", "set", "prf", "12345", "calculate", "show"});
    ASSERT_EQ(r.status, 0) << r.err;
    EXPECT_NE(r.out.find("set prf 12345 -> 12340 Hz\n"), std::string::npos) << r.out;
    const auto json = r.out.find('{');
    ASSERT_NE(json, std::string::npos);
    const std::string body = r.out.substr(json);
    const auto prf = body.find("\"VexoEdit_prf\"");
    ASSERT_NE(prf, std::string::npos);
    EXPECT_NE(body.find("12340", prf), std::string::npos);
    EXPECT_NE(body.find("\"NumOutputs\": 6"), std::string::npos) << "six rows on kt655";
    EXPECT_NE(body.find("R IF Gate :"), std::string::npos);
}

TEST(CliProgram, FailuresEndWithStatusOneAndAReasonOnStderr) {
    RunResult refused = runProgram(kCli, {"set", "prf", "1G", "show"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_NE(refused.err.find("zentra-pulse-cli: set prf 1G: "), std::string::npos) << refused.err;
    EXPECT_EQ(refused.out.find('{'), std::string::npos) << "show must not run after a failure";

    // With --keep-going the rest still runs, so the state after the refusal can be shown.
    RunResult going = runProgram(kCli, {"--keep-going", "set", "prf", "1G", "apply", "show"});
    EXPECT_EQ(going.status, 1);
    EXPECT_EQ(going.err,
              "zentra-pulse-cli: set prf 1G: 1 GHz is outside 0.001 Hz to 165 MHz\n"
              "zentra-pulse-cli: apply: Apply is disabled\n");
    EXPECT_EQ(going.out.rfind("{\n \"f_PulsedZentra\"", 0), 0u) << going.out;
}

TEST(CliProgram, ListsModelsAndRefusesABadCommandLineWithStatusTwo) {
    RunResult r = runProgram(kCli, {"--list-models"});
    ASSERT_EQ(r.status, 0);
    EXPECT_EQ(r.out, zp::app::modelListText());
    // arguments -> the reason line; the usage hint follows it, nothing runs
    const std::pair<std::vector<std::string>, std::string> cases[] = {
        {{"--analyzer", "sim:kt999", "show"}, "unknown analyzer model 'kt999' (see --list-models)"},
        {{"frobnicate"},
         "unknown action 'frobnicate' (actions: set, step, calculate, apply, show, help)"},
        {{"show", "set", "prf"}, "set prf: missing value"},
    };
    for (const auto& [args, reason] : cases) {
        const RunResult bad = runProgram(kCli, args);
        EXPECT_EQ(bad.status, 2) << reason;
        EXPECT_EQ(bad.err, "zentra-pulse-cli: " + reason + "\nTry 'zentra-pulse-cli --help'.\n");
        EXPECT_EQ(bad.out, "");
    }
}

TEST(CliProgram, AnalyzerFailuresAreReportedOnOneLineWithTheAnalyzersWords) {
    struct Case {
        std::vector<std::string> args;
        std::string out;
        std::string err;
    };
    const Case cases[] = {
        {{"--fault", kUnreachable, "show"},
         "",
         "zentra-pulse-cli: the analyzer cannot be reached: -999 Analyzer not responding\n"},
        // Line breaks in the analyzer's description must not break the one line scripts read.
        {{"--fault", "analyzer:Application.modelText=-999 Analyzer\nnot\r\nresponding", "show"},
         "",
         "zentra-pulse-cli: the analyzer cannot be reached: -999 Analyzer not responding\n"},
        // The help query failing says why, not that no file was named.
        {{"--fault", "analyzer:CommandParser.parse=-113 Undefined header", "help"},
         "message: -113 Undefined header\n",
         "zentra-pulse-cli: help: -113 Undefined header\n"},
    };
    for (const Case& c : cases) {
        const RunResult r = runProgram(kCli, c.args);
        EXPECT_EQ(r.status, 1) << c.err;
        EXPECT_EQ(r.err, c.err);
        EXPECT_EQ(r.out, c.out);
    }
}

TEST(CliProgram, OutputThatCannotBeWrittenIsAFailure) {
    if (!fs::exists("/dev/full")) GTEST_SKIP() << "no /dev/full here";
    const RunResult out = runProgramWithStdout(kCli, {"show"}, "/dev/full");
    EXPECT_EQ(out.status, 1);
    EXPECT_EQ(out.err, "zentra-pulse-cli: show: cannot write the output\n");

    // The trace fails while the window starts, so no action runs without it.
    const RunResult trace = runProgram(kCli, {"--trace-io", "/dev/full", "show"});
    EXPECT_EQ(trace.status, 1);
    EXPECT_EQ(trace.err, "zentra-pulse-cli: start-up: cannot write the I/O trace file\n");
    EXPECT_EQ(trace.out, "");
}

TEST(GuiProgram, SecondStartHandsOverToTheRunningOneAndEnds) {
    if (!haveGui()) GTEST_SKIP() << "built without the window program";
    const std::string key = uniqueKey();
    RunningProgram first(kGui, {}, guiEnv(key));
    ASSERT_TRUE(first.waitForErr(kListening, 20s)) << first.err();

    const auto started = std::chrono::steady_clock::now();
    RunResult second = runProgram(kGui, {}, guiEnv(key), 10s);
    EXPECT_EQ(second.status, 0) << second.err;
    EXPECT_LT(std::chrono::steady_clock::now() - started, 5s);
    EXPECT_EQ(second.err.find(kListening), std::string::npos) << second.err;
    EXPECT_NE(
        second.err.find("zentra-pulse: already running on this display; brought it to the front\n"),
        std::string::npos)
        << second.err;
    EXPECT_TRUE(first.waitForErr("zentra-pulse: raised by a second start", 10s)) << first.err();
    EXPECT_TRUE(first.running());
    // SIGTERM closes it cleanly, and its socket file goes with it.
    EXPECT_EQ(first.stop(), 0) << first.err();
    EXPECT_FALSE(fs::exists(instanceSocket(key)));
}

TEST(GuiProgram, AStartOnAnotherDisplayOpensAWindowThere) {
    if (!haveGui()) GTEST_SKIP() << "built without the window program";
    // The per-user key, not a test key: the display is what tells the two apart.
    const std::string display = ":" + uniqueKey();
    const auto onDisplay = [&](const std::string& suffix) {
        return Env{{"QT_QPA_PLATFORM", "offscreen"},
                   {"ZP_INSTANCE_KEY", ""},
                   {"WAYLAND_DISPLAY", ""},
                   {"DISPLAY", display + suffix}};
    };
    RunningProgram first(kGui, {}, onDisplay("a"));
    ASSERT_TRUE(first.waitForErr(kListening, 20s)) << first.err();
    RunningProgram second(kGui, {}, onDisplay("b"));
    EXPECT_TRUE(second.waitForErr(kListening, 20s)) << second.err();
    EXPECT_EQ(second.stop(), 0);
    EXPECT_EQ(first.err().find("raised by a second start"), std::string::npos) << first.err();
    EXPECT_EQ(first.stop(), 0);
}

TEST(GuiProgram, ASocketFileLeftByACrashedRunDoesNotBlockANewStart) {
    if (!haveGui()) GTEST_SKIP() << "built without the window program";
    const std::string key = uniqueKey();
    // A bound socket closed without unlinking: what a killed instance leaves behind.
    {
        const int fd = socket(AF_UNIX, SOCK_STREAM, 0);
        ASSERT_GE(fd, 0);
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        const std::string path = instanceSocket(key).string();
        ASSERT_LT(path.size(), sizeof address.sun_path);
        path.copy(address.sun_path, path.size());
        ASSERT_EQ(bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
        close(fd);
        ASSERT_TRUE(fs::exists(path));
    }
    RunningProgram first(kGui, {}, guiEnv(key));
    ASSERT_TRUE(first.waitForErr(kListening, 20s)) << first.err();
    EXPECT_EQ(runProgram(kGui, {}, guiEnv(key), 10s).status, 0);
    EXPECT_TRUE(first.waitForErr("zentra-pulse: raised by a second start", 10s)) << first.err();
    EXPECT_EQ(first.stop(), 0);
    EXPECT_FALSE(fs::exists(instanceSocket(key)));
}

TEST(GuiProgram, UnreachableAnalyzerEndsWithStatusOne) {
    if (!haveGui()) GTEST_SKIP() << "built without the window program";
    const fs::path png = scratch("never.png");
    // The screenshot run is unattended: its message goes to stderr instead of a box.
    RunResult r = runProgram(kGui, {"--screenshot", png.string(), "--fault", kUnreachable},
                             guiEnv(uniqueKey()));
    EXPECT_EQ(r.status, 1);
    EXPECT_NE(r.err.find("The analyzer cannot be reached: -999 Analyzer not responding"),
              std::string::npos)
        << r.err;
    EXPECT_FALSE(fs::exists(png));
}

}  // namespace
}  // namespace zp::testing
