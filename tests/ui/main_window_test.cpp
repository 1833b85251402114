#include <gtest/gtest.h>

#include <QAction>
#include <QCheckBox>
#include <QFocusEvent>
#include <QGroupBox>
#include <QLabel>
#include <QPushButton>
#include <QTextBrowser>
#include <QWheelEvent>

#include "ui/numeric_entry.h"
#include "ui_test_support.h"

namespace zp::ui::testing {
namespace {

TEST(MainWindow, EveryControlExistsUnderItsNameWithItsCaption) {
    Window w("kt622");
    EXPECT_EQ(w.window->windowTitle(), "Veltrix Zentra Pulse Application");
    const std::pair<const char*, const char*> buttons[] = {{"b_calculate", "Calculate"},
                                                           {"b_apply", "Apply"},
                                                           {"b_recall", "Recall"},
                                                           {"b_save", "Save"},
                                                           {"b_min", "Minimize"},
                                                           {"b_close", "Close"},
                                                           {"b_PulseProfile", "Pulse Profile"}};
    for (const auto& [name, caption] : buttons) {
        auto* b = w.find<QPushButton>(name);
        ASSERT_NE(b, nullptr) << name;
        EXPECT_EQ(b->text(), caption);
    }
    const std::pair<const char*, const char*> labels[] = {
        {"lbl_prf", "Pulse Repetition Frequency :"},
        {"lbl_pri", "Pulse Repetition Interval :"},
        {"lbl_ifbw", "Receiver IF Bandwidth :"},
        {"lbl_width", "Width"},
        {"lbl_delay", "Delay"},
        {"lbl_gate(0)", "Source Modulation :"},
        {"lbl_gate(1)", "A IF Gate :"},
        {"lbl_gate(4)", "R2 IF Gate :"}};
    for (const auto& [name, caption] : labels) {
        auto* l = w.find<QLabel>(name);
        ASSERT_NE(l, nullptr) << name;
        EXPECT_EQ(l->text(), caption);
    }
    EXPECT_EQ(w.find<QGroupBox>("frm_gates")->title(), "Modulation/Gates");
    EXPECT_EQ(w.find<QGroupBox>("frm_PulsedParams")->title(), "Desired PRF and IFBW");
    EXPECT_EQ(w.find<QCheckBox>("chk_FixedPRF")->text(), "Fixed PRF");
    EXPECT_TRUE(w.find<QCheckBox>("chk_FixedPRF")->isChecked());
    EXPECT_EQ(w.find<QCheckBox>("chk_pulsed")->text(), "Pulsed Mode On");
    for (const char* name : {"VexoEdit_prf", "VexoEdit_pri", "VexoEdit_IFBW", "VexoEdit_width(0)",
                             "VexoEdit_delay(4)"}) {
        EXPECT_NE(w.find<NumericEntry>(name), nullptr) << name;
    }
    EXPECT_EQ(w.find<NumericEntry>("VexoEdit_delay(4)")->property("row").toInt(), 4);
    EXPECT_EQ(w.find<NumericEntry>("VexoEdit_width(5)"), nullptr);

    // Menus with their mnemonics; right after start-up Apply and the profile are disabled.
    EXPECT_EQ(w.find<QAction>("m_ConfigPG")->text(), "&Pulse Generators/Modulators...");
    EXPECT_EQ(w.find<QAction>("m_NoSWGating")->text(), "No &SW Gating");
    EXPECT_TRUE(w.find<QAction>("m_NoSWGating")->isCheckable());
    EXPECT_EQ(w.find<QAction>("m_contents")->text(), "&Contents...");
    EXPECT_FALSE(w.find<QPushButton>("b_apply")->isEnabled());
    EXPECT_FALSE(w.find<QAction>("m_PulseProfile")->isEnabled());
    EXPECT_EQ(w.window->shownRows(), 5);
}

TEST(MainWindow, FourPortAnalyzerShowsSixRows) {
    Window w("kt655");
    EXPECT_EQ(w.window->shownRows(), 6);
    ASSERT_NE(w.find<QLabel>("lbl_gate(5)"), nullptr);
    EXPECT_EQ(w.find<QLabel>("lbl_gate(5)")->text(), "R IF Gate :");
    EXPECT_EQ(w.find<QLabel>("lbl_gate(4)")->text(), "D IF Gate :");
    EXPECT_NE(w.find<NumericEntry>("VexoEdit_width(5)"), nullptr);
    EXPECT_NE(w.find<NumericEntry>("VexoEdit_delay(5)"), nullptr);
}

TEST(MainWindow, TypedPrfRunsThePrfRuleOnceAndRefreshesThePri) {
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
}

TEST(MainWindow, EntriesWithUnitsAndRulesReachTheModel) {
    Window w("kt622");
    typeAndEnter(w.find<NumericEntry>("VexoEdit_pri"), "200 us");
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_prf.value(), 5000.0);
    typeAndEnter(w.find<NumericEntry>("VexoEdit_width(1)"), "2.5u");
    EXPECT_DOUBLE_EQ(w.form->VexoEdit_width[1].value(), 2.5e-6);
    EXPECT_EQ(w.changes, 2);
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

TEST(MainWindow, HelpMenuOpensTheManualAtTheMainWindowTopic) {
    if (manualFolder().isEmpty()) GTEST_SKIP() << "ZP_SOURCE_DIR not set";
    Window w("kt622");
    w.window->trigger("m_contents");
    ASSERT_NE(w.ui.helpViewer(), nullptr) << w.ui.lastMessage().toStdString();
    EXPECT_TRUE(w.ui.helpViewer()->isVisible());
    EXPECT_EQ(w.ui.helpViewer()->browser()->source().fragment(), "topic-1114");
    EXPECT_TRUE(w.ui.helpViewer()->browser()->toPlainText().contains("Calculate"));
}

}  // namespace
}  // namespace zp::ui::testing
