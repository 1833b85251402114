#pragma once
// What the widget tests share: the application object, a bench with its window, typing.

#include <QApplication>
#include <QDir>
#include <QFileInfo>
#include <QKeyEvent>
#include <QLineEdit>
#include <memory>

#include "core/pulsed_module.h"
#include "forms/main_form.h"
#include "sim/sim_bench.h"
#include "ui/main_window.h"
#include "ui/qt_interaction.h"

namespace zp::ui::testing {

// The application object lives from the start to the end of the test run (qt_environment.cpp), so
// that it goes before Qt's own statics do.
inline QApplication& application() {
    return *qApp;
}

// The manual in the source tree: from ZP_SOURCE_DIR, else from where this file lies.
inline QString manualFolder() {
    const QString source = qEnvironmentVariable("ZP_SOURCE_DIR");
    if (!source.isEmpty()) return source + QStringLiteral("/docs/help");
    const QDir here = QFileInfo(QStringLiteral(__FILE__)).absoluteDir();
    return here.exists() ? QDir::cleanPath(here.absoluteFilePath(QStringLiteral("../../docs/help")))
                         : QString();
}

struct Window {
    explicit Window(const std::string& model, sim::SimFaults faults = {})
        : bench(model, std::move(faults)), ui(QStringList{manualFolder()}) {
        application();
        ui.setUnattended(true);
        form = std::make_unique<MainForm>(pulsedModule(), bench, ui);
        form->Form_Load();
        window = std::make_unique<MainWindow>(*form, ui);
        form->onChanged([this] { ++changes; });
    }
    template <class T>
    T* find(const QString& name) const {
        return window->findChild<T*>(name);
    }

    sim::SimBench bench;
    QtInteraction ui;
    std::unique_ptr<MainForm> form;
    std::unique_ptr<MainWindow> window;
    int changes = 0;
};

inline void key(QWidget* w, int k, const QString& text = {}) {
    QKeyEvent press(QEvent::KeyPress, k, Qt::NoModifier, text);
    QApplication::sendEvent(w, &press);
    QKeyEvent release(QEvent::KeyRelease, k, Qt::NoModifier, text);
    QApplication::sendEvent(w, &release);
}

// Types the text as key presses (so the box counts as edited) and presses Enter.
inline void typeAndEnter(QLineEdit* w, const QString& text) {
    w->selectAll();
    for (QChar c : text) key(w, 0, QString(c));
    key(w, Qt::Key_Return);
}

}  // namespace zp::ui::testing
