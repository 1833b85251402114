#pragma once
// SIGTERM and SIGINT end the event loop instead of the process, so that destructors run: the
// single-instance socket file goes with the program instead of staying behind.

#include <QObject>
#include <csignal>
#include <memory>

class QSocketNotifier;

namespace zp::ui {

class StopSignals : public QObject {
    Q_OBJECT
  public:
    // Installs the handlers; the previous ones come back at destruction. One object at a time:
    // a signal handler has nowhere to find more than one.
    explicit StopSignals(QObject* parent = nullptr);
    ~StopSignals() override;
    StopSignals(const StopSignals&) = delete;
    StopSignals& operator=(const StopSignals&) = delete;

    // The last stop signal seen by the event loop, 0 for none. QCoreApplication::quit() does
    // nothing before exec(), so a stop taken while starting up is only known from here.
    int received() const { return received_; }

  private:
    void onReadable();

    int readFd_ = -1;
    int writeFd_ = -1;
    std::unique_ptr<QSocketNotifier> notifier_;
    int received_ = 0;
    struct sigaction previousTerm_ {};
    struct sigaction previousInt_ {};
};

}  // namespace zp::ui
