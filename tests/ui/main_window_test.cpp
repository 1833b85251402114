// The main window on the simulated bench: every control of the table under its name, one refresh
// per change, the wheel, refused entries, the status line, messages and help.

#include <gtest/gtest.h>

#include <QAction>
#include <QCheckBox>
#include <QFocusEvent>
#include <QGroupBox>
#include <QLabel>
#include <QMenu>
#include <QPointer>
#include <QPushButton>
#include <QStatusBar>
#include <QTextBrowser>
#include <QWheelEvent>
#include <functional>

#include "forms/form_fixture.h"
#include "ui/numeric_entry.h"
#include "ui_test_support.h"

namespace zp::ui::testing {
namespace {

// The caption a widget shows, by its kind.
QString shownCaption(QObject* o) {
    if (auto* b = qobject_cast<QPushButton*>(o)) return b->text();
    if (auto* l = qobject_cast<QLabel*>(o)) return l->text();
    if (auto* g = qobject_cast<QGroupBox*>(o)) return g->title();
    if (auto* c = qobject_cast<QCheckBox*>(o)) return c->text();
    if (auto* a = qobject_cast<QAction*>(o)) return a->text();
    if (auto* m = qobject_cast<QMenu*>(o)) return m->title();
    return QStringLiteral("(no caption)");
}

// One notch up; true when the field took it (an ignored wheel goes on to the parent, which
// scrolls).
bool wheel(QWidget* w) {
    QWheelEvent event(QPointF(5, 5), QPointF(5, 5), QPoint(), QPoint(0, 120), Qt::NoButton,
                      Qt::NoModifier, Qt::NoScrollPhase, false);
    QApplication::sendEvent(w, &event);
    return event.isAccepted();
}

// Shows the window and gives `w` the keyboard focus, as a click into it does.
void focus(Window& win, QWidget* w) {
    win.window->show();
    win.window->activateWindow();
    QApplication::processEvents();
    w->setFocus(Qt::MouseFocusReason);
    QApplication::processEvents();
    ASSERT_TRUE(w->hasFocus()) << w->objectName().toStdString();
}

TEST(MainWindow, EveryControlOfTheTableIsShownUnderItsName) {
    for (const auto& [model, rows] : {std::pair{"kt622", 5}, std::pair{"kt655", 6}}) {
        SCOPED_TRACE(model);
        Window w(model);
        EXPECT_EQ(w.window->windowTitle(), "Veltrix Zentra Pulse Application");
        EXPECT_EQ(w.window->shownRows(), rows);
        for (const ControlRegistry::Item& item : w.form->controls().items()) {
            if (item.kind == ControlKind::Window) continue;
            for (int r = 0; r < (item.hasRows() ? item.rowCount() : 1); ++r) {
                const int row = item.hasRows() ? r : -1;
                const std::string name =
                    row >= 0 ? ControlRegistry::rowName(item.name, row) : item.name;
                QObject* o = w.find<QObject>(QString::fromStdString(name));
                ASSERT_NE(o, nullptr) << name;
                if (row >= 0) {
                    EXPECT_EQ(o->property("row"), row) << name;
                }
                if (item.kind == ControlKind::Entry) {
                    const EntryField& f = ControlRegistry::fieldOf(item, row);
                    EXPECT_EQ(qobject_cast<NumericEntry*>(o)->text().toStdString(),
                              f.displayText());
                    EXPECT_EQ(o->property("enabled").toBool(), f.enabled()) << name;
                    continue;
                }
                const Control& c = ControlRegistry::controlOf(item, row);
                EXPECT_EQ(shownCaption(o).toStdString(), c.caption) << name;
                if (!qobject_cast<QMenu*>(o)) {
                    EXPECT_EQ(o->property("enabled").toBool(), c.enabled) << name;
                }
                if (auto* action = qobject_cast<QAction*>(o)) {
                    EXPECT_EQ(action->isCheckable(), item.checkable) << name;
                }
            }
        }
    }
}

TEST(MainWindow, EveryChangeRefreshesTheWindowAndItsStatusLineOnce) {
    Window w("kt622");
    FormBinder& binder = w.window->binder();
    const auto refreshes = [&](const std::function<void()>& act) {
        const int before = binder.refreshCount();
        act();
        return binder.refreshCount() - before;
    };
    auto* status = w.find<QLabel>("lbl_status");
    EXPECT_EQ(status->text(), "KT622A K71 M81 (simulated) - Calculate needed");
    auto* prf = w.find<NumericEntry>("VexoEdit_prf");
    EXPECT_EQ(refreshes([&] { typeAndEnter(prf, "10k"); }), 1);
    EXPECT_EQ(w.find<NumericEntry>("VexoEdit_pri")->text(), "100 usec");
    // Leaving the box after Enter is not a second entry.
    EXPECT_EQ(refreshes([&] {
                  QFocusEvent out(QEvent::FocusOut, Qt::TabFocusReason);
                  QApplication::sendEvent(prf, &out);
              }),
              0);
    EXPECT_EQ(refreshes([&] { key(w.find<NumericEntry>("VexoEdit_IFBW"), Qt::Key_Up); }), 1);
    EXPECT_EQ(refreshes([&] { w.find<QCheckBox>("chk_FixedPRF")->click(); }), 1);
    EXPECT_FALSE(isTrue(w.form->state().FixedPRF));
    EXPECT_EQ(refreshes([&] { w.window->trigger("m_ConverterMeas"); }), 1);
    EXPECT_TRUE(w.find<QAction>("m_ConverterMeas")->isChecked());
    EXPECT_EQ(refreshes([&] { w.find<QPushButton>("b_calculate")->click(); }), 1);
    EXPECT_TRUE(w.find<QPushButton>("b_apply")->isEnabled());
    EXPECT_FALSE(w.find<QLabel>("lbl_DutyCycle")->text().isEmpty());
    EXPECT_EQ(status->text(), "KT622A K71 M81 (simulated) - Calculated");
    EXPECT_EQ(w.changes, 5);
}

// Enter brings the old value back; leaving the field keeps the typed text and the focus and stops
// the click that left it. Either way the rules do not run and the reason stays visible.
TEST(MainWindow, RefusedEntriesShowTheirReasonAndChangeNothing) {
    Window w("kt622");
    auto* prf = w.find<NumericEntry>("VexoEdit_prf");
    const auto expectRefused = [&](const char* text) {
        EXPECT_EQ(prf->text(), text);
        EXPECT_DOUBLE_EQ(w.form->VexoEdit_prf.value(), 5000.0);
        EXPECT_TRUE(prf->property("invalid").toBool());
        EXPECT_FALSE(prf->lastError().isEmpty());
        EXPECT_EQ(prf->toolTip(), prf->lastError());
        EXPECT_EQ(w.window->statusBar()->currentMessage(), prf->lastError());
        EXPECT_EQ(w.changes, 0);
    };
    for (const char* bad : {"1G", "abc", "-5"}) {
        SCOPED_TRACE(bad);
        typeAndEnter(prf, bad);
        expectRefused("5 kHz");
    }

    auto* calculate = w.find<QPushButton>("b_calculate");
    focus(w, prf);
    prf->selectAll();
    for (QChar c : QStringLiteral("5x")) key(prf, 0, QString(c));
    calculate->setFocus(Qt::MouseFocusReason);  // the press on Calculate
    calculate->click();
    QApplication::processEvents();
    EXPECT_TRUE(prf->hasFocus());
    expectRefused("5x");
    EXPECT_FALSE(w.form->b_apply.enabled) << "Calculate must not run on the old value";

    key(prf, Qt::Key_Escape);  // thrown away: the click works again
    EXPECT_EQ(prf->text(), "5 kHz");
    EXPECT_FALSE(prf->property("invalid").toBool());
    calculate->click();
    EXPECT_TRUE(w.form->b_apply.enabled);
    typeAndEnter(prf, "6k");
    EXPECT_TRUE(prf->lastError().isEmpty());
    EXPECT_TRUE(w.window->statusBar()->currentMessage().isEmpty());
}

TEST(MainWindow, TheWheelStepsOnlyTheFocusedField) {
    Window w("kt622");
    auto* delay = w.find<NumericEntry>("VexoEdit_delay(1)");
    EXPECT_FALSE(wheel(delay));  // scrolling past the form
    EXPECT_EQ(w.form->VexoEdit_delay[1].value(), 0.0);
    EXPECT_EQ(w.changes, 0);

    focus(w, delay);
    EXPECT_TRUE(wheel(delay));
    EXPECT_GT(w.form->VexoEdit_delay[1].value(), 0.0);
    EXPECT_EQ(w.changes, 1);
}

TEST(MainWindow, UnbuiltActionsInformFailuresWarnAndHandlersPlugIntoTheModel) {
    Window w("kt622");
    w.window->trigger("b_save");
    EXPECT_EQ(w.ui.lastMessage(), "Save is not available in this version yet.");
    EXPECT_EQ(w.ui.lastMessageKind(), MessageKind::Information);
    w.window->trigger("m_ConfigPG");
    EXPECT_EQ(w.ui.lastMessage(),
              "Pulse Generators/Modulators is not available in this version yet.");

    typeAndEnter(w.find<NumericEntry>("VexoEdit_prf"), "100k");
    typeAndEnter(w.find<NumericEntry>("VexoEdit_width(0)"), "9u");
    w.find<QPushButton>("b_calculate")->click();
    EXPECT_EQ(w.ui.lastMessage(),
              "The pulse width must be less than 90% of the pulse period (1/PRF)");
    EXPECT_EQ(w.ui.lastMessageKind(), MessageKind::Warning);

    int applied = 0;
    w.form->controls().setHandler("b_apply", [&] { ++applied; });
    typeAndEnter(w.find<NumericEntry>("VexoEdit_width(0)"), "1u");
    w.find<QPushButton>("b_calculate")->click();
    w.find<QPushButton>("b_apply")->click();
    EXPECT_EQ(applied, 1);
}

TEST(MainWindow, RowsAreBoundOnceAndDroppedRowsLoseTheirWidgets) {
    PulsedModule state;
    zp::test::ModelBench bench(zp::test::kFourPortThreeSources);
    QtInteraction ui({});
    ui.setUnattended(true);
    MainForm form(state, bench, ui, zp::test::makePassThroughSolver);
    form.Form_Load();
    MainWindow window(form, ui);
    const QPointer<NumericEntry> first = window.findChild<NumericEntry*>("VexoEdit_width(0)");
    const QPointer<NumericEntry> sixth = window.findChild<NumericEntry*>("VexoEdit_width(5)");
    ASSERT_TRUE(first && sixth);

    bench.use(zp::test::kTwoPortExternal);
    form.Form_Load();
    EXPECT_EQ(window.shownRows(), 5);
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    EXPECT_TRUE(sixth.isNull());
    EXPECT_EQ(window.findChild<QLabel*>("lbl_gate(4)")->text(), "R2 IF Gate :");

    bench.use(zp::test::kFourPortThreeSources);
    form.Form_Load();
    EXPECT_EQ(window.shownRows(), 6);
    EXPECT_EQ(window.findChild<NumericEntry*>("VexoEdit_width(0)"), first.data());
    typeAndEnter(window.findChild<NumericEntry*>("VexoEdit_width(5)"), "2u");
    EXPECT_EQ(form.VexoEdit_width[5].value(), 2e-6);
    typeAndEnter(first, "3u");
    EXPECT_EQ(form.VexoEdit_width[0].value(), 3e-6);
}

TEST(MainWindow, HelpShowsOurManualWhenTheAnalyzerNamesNone) {
    sim::SimFaults faults;
    faults.add("analyzer:CommandParser.parse=-113 Undefined header");
    Window w("kt622", faults);
    w.window->trigger("m_contents");
    HelpViewer* viewer = w.ui.helpViewer();
    ASSERT_NE(viewer, nullptr);
    EXPECT_TRUE(viewer->isVisible());
    EXPECT_EQ(viewer->browser()->source().fileName(), "zentra-pulse.html");
    EXPECT_EQ(viewer->browser()->source().fragment(), "topic-1114");
    EXPECT_EQ(viewer->note()->text(),
              "The analyzer named no help file (-113 Undefined header). This is the Zentra "
              "Pulse manual.");
    EXPECT_TRUE(w.ui.lastMessage().isEmpty());
    viewer->close();
}

}  // namespace
}  // namespace zp::ui::testing
