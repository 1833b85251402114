#include "ui/single_instance.h"

#include <QDir>
#include <QGuiApplication>
#include <QHash>
#include <QLocalServer>
#include <QLocalSocket>
#include <QRegularExpression>

namespace zp::ui {

SingleInstance::SingleInstance(QString key, QObject* parent)
    : QObject(parent), key_(std::move(key)) {}

SingleInstance::~SingleInstance() = default;

QString SingleInstance::defaultKey() {
    const QString override = qEnvironmentVariable("ZP_INSTANCE_KEY");
    if (!override.isEmpty()) return override;
    QString user = qEnvironmentVariable("USER");
    if (user.isEmpty()) user = qEnvironmentVariable("USERNAME");
    if (user.isEmpty()) user = QDir::home().dirName();
    // One instance per display: a start on another display opens a window there. The platform's
    // own display variable counts first (an X program on Wayland has both).
    const QString platform = QGuiApplication::platformName();
    const bool wayland = platform.startsWith(QStringLiteral("wayland"));
    QString display = qEnvironmentVariable(wayland ? "WAYLAND_DISPLAY" : "DISPLAY");
    if (display.isEmpty()) display = qEnvironmentVariable(wayland ? "DISPLAY" : "WAYLAND_DISPLAY");
    // A display given as a long socket path would not fit into a socket name.
    if (display.size() > 32) display = QString::number(qHash(display), 16);
    QString key = QStringLiteral("zentra-pulse-%1-%2").arg(user, platform);
    if (!display.isEmpty()) key += QLatin1Char('-') + display;
    // The key becomes a file name: keep it to harmless characters.
    key.replace(QRegularExpression(QStringLiteral("[^A-Za-z0-9_.-]")), QStringLiteral("_"));
    return key;
}

SingleInstance::Role SingleInstance::start() {
    {
        QLocalSocket probe;
        probe.connectToServer(key_);
        if (probe.waitForConnected(1000)) {
            probe.write(kRaiseMessage);
            probe.waitForBytesWritten(1000);
            probe.disconnectFromServer();
            if (probe.state() != QLocalSocket::UnconnectedState) probe.waitForDisconnected(1000);
            return Role::Secondary;
        }
    }
    // Nobody answered: a socket left by a crashed run is stale and goes.
    QLocalServer::removeServer(key_);
    server_ = new QLocalServer(this);
    server_->setSocketOptions(QLocalServer::UserAccessOption);
    if (!server_->listen(key_)) {
        qWarning("zentra-pulse: cannot listen for a second start: %s",
                 qPrintable(server_->errorString()));
        return Role::Primary;
    }
    connect(server_, &QLocalServer::newConnection, this, &SingleInstance::onNewConnection);
    return Role::Primary;
}

bool SingleInstance::listening() const {
    return server_ != nullptr && server_->isListening();
}

void SingleInstance::onNewConnection() {
    while (QLocalSocket* socket = server_->nextPendingConnection()) {
        // Only the one known message counts; anything else is dropped unread.
        auto drain = [this, socket] {
            while (socket->canReadLine()) {
                if (socket->readLine(64) == kRaiseMessage) emit raiseRequested();
            }
            if (socket->bytesAvailable() > 64) socket->abort();
        };
        connect(socket, &QLocalSocket::readyRead, this, drain);
        connect(socket, &QLocalSocket::disconnected, this, [socket, drain] {
            drain();
            socket->deleteLater();
        });
    }
}

}  // namespace zp::ui
