#include "ui/qt_interaction.h"

#include <QApplication>
#include <QCoreApplication>
#include <QCursor>
#include <QFileDialog>
#include <QMessageBox>
#include <QWidget>
#include <iostream>

namespace zp::ui {
namespace {

// Instrument replies and file contents reach these boxes: they are shown as written, never as
// markup (a reply holding <img src=...> must not load anything).
QMessageBox::StandardButton showBox(QWidget* parent, QMessageBox::Icon icon, const QString& text,
                                    QMessageBox::StandardButtons buttons) {
    QMessageBox box(icon, QString::fromUtf8(kAppTitle), text, buttons, parent);
    box.setTextFormat(Qt::PlainText);
    return static_cast<QMessageBox::StandardButton>(box.exec());
}

}  // namespace

QString qtFileFilter(const std::string& filter) {
    const QStringList parts = QString::fromStdString(filter).split(QLatin1Char('|'));
    QStringList entries;
    for (qsizetype i = 0; i < parts.size(); i += 2) {
        const QString description = parts[i].trimmed();
        const QString patterns = i + 1 < parts.size() ? parts[i + 1].trimmed().replace(
                                                            QLatin1Char(';'), QLatin1Char(' '))
                                                      : QString();
        if (description.isEmpty() && patterns.isEmpty()) continue;
        // Qt takes the patterns from the parentheses, so a description that names them already
        // is used as it is.
        if (patterns.isEmpty() || description.contains(QLatin1Char('('))) {
            entries << description;
        } else {
            entries << QStringLiteral("%1 (%2)").arg(description, patterns);
        }
    }
    return entries.join(QStringLiteral(";;"));
}

QtInteraction::QtInteraction(QStringList manualFolders)
    : manualFolders_(std::move(manualFolders)) {}

QtInteraction::~QtInteraction() {
    if (pointer_ != Pointer::Normal) QApplication::restoreOverrideCursor();
}

void QtInteraction::message(const std::string& text, MessageKind kind) {
    lastMessage_ = QString::fromStdString(text);
    lastKind_ = kind;
    if (unattended_) {
        std::cerr << "zentra-pulse: message: " << text << std::endl;
        return;
    }
    // The person must be able to read it: the busy pointer gives way while the box is up.
    const Pointer saved = pointer_;
    setPointer(Pointer::Normal);
    showBox(window_, kind == MessageKind::Warning ? QMessageBox::Warning : QMessageBox::Information,
            lastMessage_, QMessageBox::Ok);
    setPointer(saved);
}

bool QtInteraction::ask(const std::string& text) {
    if (unattended_) {
        std::cerr << "zentra-pulse: question: " << text << " -> no" << std::endl;
        return false;
    }
    const Pointer saved = pointer_;
    setPointer(Pointer::Normal);
    const QMessageBox::StandardButton answer =
        showBox(window_, QMessageBox::Question, QString::fromStdString(text),
                QMessageBox::Yes | QMessageBox::No);
    setPointer(saved);
    return answer == QMessageBox::Yes;
}

std::optional<std::string> QtInteraction::chooseOpenFile(const std::string& filter) {
    return chooseFile(filter, FileDialog::Open);
}

std::optional<std::string> QtInteraction::chooseSaveFile(const std::string& filter) {
    return chooseFile(filter, FileDialog::Save);
}

std::optional<std::string> QtInteraction::chooseFile(const std::string& filter, FileDialog kind) {
    if (unattended_) return std::nullopt;
    const auto choose =
        kind == FileDialog::Open ? &QFileDialog::getOpenFileName : &QFileDialog::getSaveFileName;
    const QString file =
        choose(window_, QString::fromUtf8(kAppTitle), QCoreApplication::applicationDirPath(),
               qtFileFilter(filter), nullptr, QFileDialog::Options());
    if (file.isEmpty()) return std::nullopt;
    return file.toStdString();
}

void QtInteraction::processEvents() {
    QCoreApplication::processEvents();
}

void QtInteraction::setPointer(Pointer p) {
    if (p == pointer_) return;
    // One override at most is ours, so that nesting can never leave a stuck hourglass.
    if (p == Pointer::Normal) {
        QApplication::restoreOverrideCursor();
    } else if (pointer_ == Pointer::Normal) {
        QApplication::setOverrideCursor(QCursor(Qt::WaitCursor));
    } else {
        QApplication::changeOverrideCursor(QCursor(Qt::WaitCursor));
    }
    pointer_ = p;
}

bool QtInteraction::showHelp(const HelpRequest& request) {
    // When the manual is ours, one line above it says why the analyzer's is not shown.
    QString reason;
    HelpFileCheck check;
    if (request.analyzerError) {
        reason = QObject::tr("The analyzer named no help file (%1).")
                     .arg(QString::fromStdString(*request.analyzerError).simplified());
    } else {
        check = checkHelpFile(QString::fromStdString(request.file), manualFolders_);
        reason = check.error;
    }
    QString note;
    if (!reason.isEmpty()) {
        check = ownManual(manualFolders_);
        if (!check.ok()) {
            message((reason + QLatin1Char(' ') + check.error).toStdString(), MessageKind::Warning);
            return false;
        }
        note = reason + QObject::tr(" This is the Zentra Pulse manual.");
    }
    if (!helpViewer_) helpViewer_ = std::make_unique<HelpViewer>(nullptr);
    helpViewer_->showTopic(check.path, request.topic, note);
    helpViewer_->show();
    helpViewer_->raise();
    helpViewer_->activateWindow();
    return true;
}

}  // namespace zp::ui
