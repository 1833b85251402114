#include "child_process.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <stdexcept>

namespace zp::testing {
namespace {

using Clock = std::chrono::steady_clock;

pid_t spawn(const std::string& program, const std::vector<std::string>& args, const Env& env,
            int outFd, int errFd) {
    std::vector<std::string> argvStore{program};
    argvStore.insert(argvStore.end(), args.begin(), args.end());
    std::vector<char*> argv;
    for (std::string& a : argvStore) argv.push_back(a.data());
    argv.push_back(nullptr);
    const pid_t pid = fork();
    if (pid < 0) throw std::runtime_error("fork failed");
    if (pid == 0) {
        for (const auto& [name, value] : env) setenv(name.c_str(), value.c_str(), 1);
        const int devNull = open("/dev/null", O_RDWR);
        dup2(devNull, 0);
        dup2(outFd >= 0 ? outFd : devNull, 1);
        dup2(errFd >= 0 ? errFd : devNull, 2);
        execv(program.c_str(), argv.data());
        _exit(127);
    }
    return pid;
}

int statusOf(int raw) {
    return WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
}

bool readSome(int fd, std::string& into) {
    char buffer[4096];
    const ssize_t n = read(fd, buffer, sizeof buffer);
    if (n <= 0) return false;
    into.append(buffer, static_cast<std::size_t>(n));
    return true;
}

// Collects what the child prints on the pipes given (-1 for none) until both close or the time is
// up; a child still printing then is killed.
RunResult collect(pid_t pid, int outFd, int errFd, std::chrono::milliseconds timeout) {
    RunResult result;
    const auto deadline = Clock::now() + timeout;
    bool outOpen = outFd >= 0;
    bool errOpen = errFd >= 0;
    while ((outOpen || errOpen) && Clock::now() < deadline) {
        pollfd fds[2] = {{outOpen ? outFd : -1, POLLIN, 0}, {errOpen ? errFd : -1, POLLIN, 0}};
        if (poll(fds, 2, 100) <= 0) continue;
        if (fds[0].revents != 0) outOpen = readSome(outFd, result.out);
        if (fds[1].revents != 0) errOpen = readSome(errFd, result.err);
    }
    if (outFd >= 0) close(outFd);
    if (errFd >= 0) close(errFd);
    int raw = 0;
    if (outOpen || errOpen) {
        kill(pid, SIGKILL);
        waitpid(pid, &raw, 0);
        result.status = -1;
        return result;
    }
    waitpid(pid, &raw, 0);
    result.status = statusOf(raw);
    return result;
}

}  // namespace

RunResult runProgram(const std::string& program, const std::vector<std::string>& args,
                     const Env& env, std::chrono::milliseconds timeout) {
    int outPipe[2];
    int errPipe[2];
    if (pipe(outPipe) != 0 || pipe(errPipe) != 0) throw std::runtime_error("pipe failed");
    const pid_t pid = spawn(program, args, env, outPipe[1], errPipe[1]);
    close(outPipe[1]);
    close(errPipe[1]);
    return collect(pid, outPipe[0], errPipe[0], timeout);
}

RunResult runProgramWithStdout(const std::string& program, const std::vector<std::string>& args,
                               const std::string& outFile, std::chrono::milliseconds timeout) {
    const int outFd = open(outFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
    if (outFd < 0) throw std::runtime_error("cannot open " + outFile);
    int errPipe[2];
    if (pipe(errPipe) != 0) throw std::runtime_error("pipe failed");
    const pid_t pid = spawn(program, args, {}, outFd, errPipe[1]);
    close(outFd);
    close(errPipe[1]);
    return collect(pid, -1, errPipe[0], timeout);
}

RunningProgram::RunningProgram(const std::string& program, const std::vector<std::string>& args,
                               const Env& env, bool mergeOut) {
    int errPipe[2];
    if (pipe(errPipe) != 0) throw std::runtime_error("pipe failed");
    pid_ = spawn(program, args, env, mergeOut ? errPipe[1] : -1, errPipe[1]);
    close(errPipe[1]);
    errFd_ = errPipe[0];
}

RunningProgram::~RunningProgram() {
    stop();
    if (errFd_ >= 0) close(errFd_);
}

bool RunningProgram::waitForErr(const std::string& text, std::chrono::milliseconds timeout) {
    const auto deadline = Clock::now() + timeout;
    while (err_.find(text) == std::string::npos) {
        if (Clock::now() >= deadline) return false;
        pollfd fd{errFd_, POLLIN, 0};
        if (poll(&fd, 1, 100) > 0 && !readSome(errFd_, err_))
            return err_.find(text) != std::string::npos;
    }
    return true;
}

bool RunningProgram::running() {
    if (pid_ < 0) return false;
    int raw = 0;
    if (waitpid(pid_, &raw, WNOHANG) == 0) return true;
    pid_ = -1;  // reaped: never signal that number again
    return false;
}

int RunningProgram::stop() {
    if (pid_ < 0) return -1;
    kill(pid_, SIGTERM);
    int raw = 0;
    for (int i = 0; i < 50; ++i) {
        if (waitpid(pid_, &raw, WNOHANG) == pid_) {
            pid_ = -1;
            return statusOf(raw);
        }
        usleep(100000);
    }
    kill(pid_, SIGKILL);
    waitpid(pid_, &raw, 0);
    pid_ = -1;
    return -1;
}

}  // namespace zp::testing
