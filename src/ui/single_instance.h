#pragma once
// One running program per user and display: the first start listens on a local socket named
// after both, a second start tells it to come to the front and ends. The socket file goes when this
// object does; one left by a crashed run is taken over.

#include <QObject>
#include <QString>

class QLocalServer;

namespace zp::ui {

class SingleInstance : public QObject {
    Q_OBJECT
  public:
    enum class Role { Primary, Secondary };

    // `key`: the socket name; see defaultKey().
    explicit SingleInstance(QString key, QObject* parent = nullptr);
    ~SingleInstance() override;

    // Hands over to a running instance (Secondary: the caller ends at once) or starts listening
    // (Primary). A listening failure leaves this start running on its own.
    Role start();
    // True once start() made this the instance a second start hands over to.
    bool listening() const;

    // "zentra-pulse-<user>-<platform>[-<display>]", the display from $DISPLAY or
    // $WAYLAND_DISPLAY; ZP_INSTANCE_KEY replaces it (tests run side by side). Needs the
    // application object.
    static QString defaultKey();

    static constexpr const char* kRaiseMessage = "raise\n";

  signals:
    // A second start asked this instance to come to the front.
    void raiseRequested();

  private:
    void onNewConnection();

    QString key_;
    QLocalServer* server_ = nullptr;
};

}  // namespace zp::ui
