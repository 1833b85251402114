#include <gtest/gtest.h>

#include <optional>

#include <QAction>
#include <QCheckBox>
#include <QFocusEvent>
#include <QGroupBox>
#include <QLabel>
#include <QPushButton>
#include <QWheelEvent>

#include "ui/numeric_entry.h"
#include "ui_test_support.h"

namespace zp::ui::testing {
namespace {

// The text a control shows, by its kind; nothing when no control has that name.
std::optional<QString> shownText(const Window& w, const QString& name) {
    if (auto* b = w.find<QPushButton>(name)) return b->text();
    if (auto* l = w.find<QLabel>(name)) return l->text();
    if (auto* g = w.find<QGroupBox>(name)) return g->title();
    if (auto* c = w.find<QCheckBox>(name)) return c->text();
    if (auto* a = w.find<QAction>(name)) return a->text();
    return std::nullopt;
}

TEST(MainWindow, EveryControlExistsUnderItsNameWithItsCaption) {
    Window w("kt622");
    EXPECT_EQ(w.window->windowTitle(), "Veltrix Zentra Pulse Application");
    const std::pair<const char*, const char*> controls[] = {
        {"b_calculate", "Calculate"},
        {"b_apply", "Apply"},
        {"b_recall", "Recall"},
        {"b_save", "Save"},
        {"b_min", "Minimize"},
        {"b_close", "Close"},
        {"b_PulseProfile", "Pulse Profile"},
        {"lbl_prf", "Pulse Repetition Frequency :"},
        {"lbl_pri", "Pulse Repetition Interval :"},
        {"lbl_ifbw", "Receiver IF Bandwidth :"},
        {"lbl_width", "Width"},
        {"lbl_delay", "Delay"},
        {"lbl_gate(0)", "Source Modulation :"},
        {"lbl_gate(4)", "R2 IF Gate :"},
        {"frm_gates", "Modulation/Gates"},
        {"frm_PulsedParams", "Desired PRF and IFBW"},
        {"chk_FixedPRF", "Fixed PRF"},
        {"chk_pulsed", "Pulsed Mode On"},
        {"m_ConfigPG", "&Pulse Generators/Modulators..."},
        {"m_NoSWGating", "No &SW Gating"},
        {"m_contents", "&Contents..."}};
    for (const auto& [name, caption] : controls) {
        EXPECT_EQ(shownText(w, name), caption) << name;
    }
    for (const char* name : {"VexoEdit_prf", "VexoEdit_pri", "VexoEdit_IFBW", "VexoEdit_width(0)",
                             "VexoEdit_delay(4)"}) {
        EXPECT_NE(w.find<NumericEntry>(name), nullptr) << name;
    }
    EXPECT_EQ(w.find<NumericEntry>("VexoEdit_delay(4)")->property("row").toInt(), 4);
    EXPECT_EQ(w.find<NumericEntry>("VexoEdit_width(5)"), nullptr);
    EXPECT_TRUE(w.find<QCheckBox>("chk_FixedPRF")->isChecked());
    EXPECT_TRUE(w.find<QAction>("m_NoSWGating")->isCheckable());
    // Right after start-up Apply and the profile are disabled.
    EXPECT_FALSE(w.find<QPushButton>("b_apply")->isEnabled());
    EXPECT_FALSE(w.find<QAction>("m_PulseProfile")->isEnabled());
    EXPECT_EQ(w.window->shownRows(), 5);
}

TEST(MainWindow, FourPortAnalyzerShowsSixRows) {
    Window w("kt655");
    EXPECT_EQ(w.window->shownRows(), 6);
    EXPECT_EQ(shownText(w, "lbl_gate(5)"), "R IF Gate :");
    EXPECT_EQ(shownText(w, "lbl_gate(4)"), "D IF Gate :");
    EXPECT_NE(w.find<NumericEntry>("VexoEdit_width(5)"), nullptr);
    EXPECT_NE(w.find<NumericEntry>("VexoEdit_delay(5)"), nullptr);
}

TEST(MainWindow, TypedEntriesRunTheirRuleOnceAndRefreshTheOtherFields) {
    Window w("kt622");
    auto* prf = w.find<NumericEntry>("VexoEdit_prf");
    auto* pri = w.find<NumericEntry>("VexoEdit_pri");
    typeAndEnter(prf, "10k");
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_prf.value(), 10000.0);
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_pri.value(), 1e-4);
    EXPECT_EQ(pri->text().toStdString(), w.form->VexoEdit_pri.displayText());
    EXPECT_EQ(prf->text().toStdString(), w.form->VexoEdit_prf.displayText());
    // Leaving the box after Enter is not a second entry.
    QFocusEvent out(QEvent::FocusOut, Qt::TabFocusReason);
    QApplication::sendEvent(prf, &out);
    EXPECT_EQ(w.changes, 1);

    typeAndEnter(pri, "200 us");
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_prf.value(), 5000.0);
    typeAndEnter(w.find<NumericEntry>("VexoEdit_width(1)"), "2.5u");
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_width[1].value(), 2.5e-6);
    EXPECT_EQ(w.changes, 3);
}

TEST(MainWindow, RefusedEntryKeepsTheOldValueAndShowsTheReason) {
    Window w("kt622");
    auto* prf = w.find<NumericEntry>("VexoEdit_prf");
    const QString before = prf->text();
    for (const char* bad : {"1G", "abc", "-5"}) {
        typeAndEnter(prf, bad);
        EXPECT_DOUBLE_EQ(w.form->VexoEdit_prf.value(), 5000.0) << bad;
        EXPECT_EQ(prf->text(), before) << bad;
        EXPECT_FALSE(prf->lastError().isEmpty()) << bad;
        EXPECT_EQ(prf->toolTip(), prf->lastError());
        EXPECT_TRUE(prf->property("invalid").toBool());
    }
    EXPECT_EQ(w.changes, 0) << "a refused entry must not run the rules";
    typeAndEnter(prf, "6k");
    EXPECT_TRUE(prf->lastError().isEmpty());
    EXPECT_FALSE(prf->property("invalid").toBool());
}

TEST(MainWindow, ArrowKeysAndWheelStepTheValue) {
    Window w("kt622");
    auto* ifbw = w.find<NumericEntry>("VexoEdit_IFBW");
    const double start = w.form->VexoEdit_IFBW.value();
    key(ifbw, Qt::Key_Up);
    const double up = w.form->VexoEdit_IFBW.value();
    EXPECT_GT(up, start);
    key(ifbw, Qt::Key_Down);
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_IFBW.value(), start);
    QWheelEvent wheel(QPointF(5, 5), QPointF(5, 5), QPoint(), QPoint(0, 120), Qt::NoButton,
                      Qt::NoModifier, Qt::NoScrollPhase, false);
    QApplication::sendEvent(ifbw, &wheel);
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_IFBW.value(), up);
    EXPECT_EQ(w.changes, 3);
}

TEST(MainWindow, WidgetsFollowTheModelAfterEveryChange) {
    Window w("kt622");
    w.form->VexoEdit_width[2].setEnabled(false);
    w.form->notifyChanged();
    EXPECT_FALSE(w.find<NumericEntry>("VexoEdit_width(2)")->isEnabled());

    w.window->trigger("m_ConverterMeas");
    EXPECT_TRUE(w.form->m_ConverterMeas.checked);
    EXPECT_TRUE(w.find<QAction>("m_ConverterMeas")->isChecked());

    w.find<QCheckBox>("chk_FixedPRF")->click();
    EXPECT_FALSE(isTrue(w.form->state().FixedPRF));
    EXPECT_FALSE(w.find<QCheckBox>("chk_FixedPRF")->isChecked());

    w.find<QPushButton>("b_calculate")->click();
    EXPECT_TRUE(w.find<QPushButton>("b_apply")->isEnabled());
    EXPECT_FALSE(w.find<QLabel>("lbl_DutyCycle")->text().isEmpty());
}

TEST(MainWindow, WindowsOfLaterVersionsSayTheyAreNotAvailable) {
    Window w("kt622");
    w.window->trigger("b_save");
    EXPECT_EQ(w.ui.lastMessage(), "Save is not available in this version yet.");
    w.window->trigger("m_ConfigPG");
    EXPECT_EQ(w.ui.lastMessage(),
              "Pulse Generators/Modulators is not available in this version yet.");
    bool called = false;
    w.window->setHandler("b_save", [&] { called = true; });
    w.window->trigger("b_save");
    EXPECT_TRUE(called);
}

}  // namespace
}  // namespace zp::ui::testing
