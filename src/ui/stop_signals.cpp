#include "ui/stop_signals.h"

#include <fcntl.h>
#include <unistd.h>

#include <QCoreApplication>
#include <QSocketNotifier>
#include <cerrno>
#include <stdexcept>

namespace zp::ui {
namespace {

// Where the handler writes: the only thing a signal handler can reach. Set while a StopSignals
// lives.
volatile std::sig_atomic_t wakeFd = -1;

extern "C" void onStopSignal(int signal) {
    const int savedErrno = errno;
    const auto byte = static_cast<unsigned char>(signal);
    // Nothing to do about a full pipe: a stop is already waiting in it.
    [[maybe_unused]] const ssize_t written = ::write(wakeFd, &byte, 1);
    errno = savedErrno;
}

}  // namespace

StopSignals::StopSignals(QObject* parent) : QObject(parent) {
    if (wakeFd != -1) throw std::logic_error("StopSignals: only one at a time");
    int fds[2];
    if (::pipe2(fds, O_CLOEXEC | O_NONBLOCK) != 0) {
        throw std::runtime_error("StopSignals: cannot make a pipe");
    }
    readFd_ = fds[0];
    writeFd_ = fds[1];
    wakeFd = writeFd_;
    notifier_ = std::make_unique<QSocketNotifier>(readFd_, QSocketNotifier::Read);
    connect(notifier_.get(), &QSocketNotifier::activated, this, &StopSignals::onReadable);

    struct sigaction action {};
    action.sa_handler = onStopSignal;
    sigemptyset(&action.sa_mask);
    action.sa_flags = SA_RESTART;
    sigaction(SIGTERM, &action, &previousTerm_);
    sigaction(SIGINT, &action, &previousInt_);
}

StopSignals::~StopSignals() {
    sigaction(SIGTERM, &previousTerm_, nullptr);
    sigaction(SIGINT, &previousInt_, nullptr);
    wakeFd = -1;
    notifier_.reset();
    ::close(readFd_);
    ::close(writeFd_);
}

void StopSignals::onReadable() {
    unsigned char byte = 0;
    while (::read(readFd_, &byte, 1) == 1) received_ = byte;
    QCoreApplication::quit();
}

}  // namespace zp::ui
