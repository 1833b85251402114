#pragma once
// Runs the programs under test as real processes and collects what they print.

#include <sys/types.h>

#include <chrono>
#include <string>
#include <utility>
#include <vector>

namespace zp::testing {

struct RunResult {
    int status = -1;  // exit status, or -1 when killed / timed out
    std::string out;
    std::string err;
};

using Env = std::vector<std::pair<std::string, std::string>>;

// Runs `program args...` with extra environment, waits up to `timeout`.
RunResult runProgram(const std::string& program, const std::vector<std::string>& args,
                     const Env& env = {},
                     std::chrono::milliseconds timeout = std::chrono::seconds(30));

// The same with stdout written to `outFile` (e.g. /dev/full) instead of collected.
RunResult runProgramWithStdout(const std::string& program, const std::vector<std::string>& args,
                               const std::string& outFile,
                               std::chrono::milliseconds timeout = std::chrono::seconds(30));

// A program left running; its stderr can be read while it runs. Killed at destruction.
class RunningProgram {
  public:
    // mergeOut: stdout goes to the same pipe as stderr, so waitForErr sees both.
    RunningProgram(const std::string& program, const std::vector<std::string>& args,
                   const Env& env = {}, bool mergeOut = false);
    ~RunningProgram();
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;

    // Reads stderr until `text` appears or the time is up; true when it appeared.
    bool waitForErr(const std::string& text, std::chrono::milliseconds timeout);
    const std::string& err() const { return err_; }
    bool running();
    // SIGTERM, then the exit status (-1 if it had to be killed).
    int stop();

  private:
    pid_t pid_ = -1;
    int errFd_ = -1;
    std::string err_;
};

}  // namespace zp::testing
