#include "ui/main_window.h"

#include <QAction>
#include <QCheckBox>
#include <QGridLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QMenuBar>
#include <QPushButton>
#include <QStatusBar>
#include <QVBoxLayout>

#include "forms/main_form_layout.h"
#include "ui/numeric_entry.h"

namespace zp::ui {
namespace {

// Twips to pixels at the logical 96 dots per inch.
int px(int twips) {
    return twips / 15;
}

}  // namespace

MainWindow::MainWindow(MainForm& form, Interaction& ui, QWidget* parent)
    : QMainWindow(parent), binder_(form, this, ui) {
    setObjectName(QString::fromStdString(form.f_PulsedZentra.name));
    binder_.menus(menuBar());
    binder_.widget<QAction>("m_contents")->setShortcut(QKeySequence::HelpContents);
    setCentralWidget(layOut());
    binder_.onClick("b_min", [this] { showMinimized(); });
    binder_.onClick("b_close", [this] { close(); });

    statusBar()->setSizeGripEnabled(true);
    statusBar()->addPermanentWidget(
        binder_.textLabel(QStringLiteral("lbl_status"), [&form] { return form.status().text(); }));
    // A refusal stays in the status line until the next accepted entry.
    connect(&binder_, &FormBinder::refused, statusBar(),
            [this](const QString& reason) { statusBar()->showMessage(reason); });
    connect(&binder_, &FormBinder::entered, statusBar(), &QStatusBar::clearMessage);

    binder_.bind();
    const Geometry& g = form.f_PulsedZentra.geometry;
    resize(sizeHint().expandedTo(QSize(px(g.width), px(g.height))));
}

MainWindow::~MainWindow() = default;

void MainWindow::trigger(const QString& objectName) {
    binder_.trigger(objectName.toStdString());
}

NumericEntry* MainWindow::field(const std::string& name) {
    NumericEntry* entry = binder_.entry(name);
    entry->setMinimumWidth(px(layout::kFieldWidth));
    return entry;
}

QWidget* MainWindow::layOut() {
    FormBinder& b = binder_;
    auto* central = new QWidget;
    auto* column = new QVBoxLayout(central);

    // Desired PRF and IFBW: three label/field lines and the Fixed PRF box.
    QGroupBox* params = b.frame("frm_PulsedParams");
    auto* paramsGrid = new QGridLayout(params);
    const std::pair<const char*, const char*> lines[] = {
        {"lbl_prf", "VexoEdit_prf"}, {"lbl_pri", "VexoEdit_pri"}, {"lbl_ifbw", "VexoEdit_IFBW"}};
    for (int i = 0; i < 3; ++i) {
        QLabel* label = b.label(lines[i].first);
        NumericEntry* entry = field(lines[i].second);
        label->setBuddy(entry);
        paramsGrid->addWidget(label, i, 0);
        paramsGrid->addWidget(entry, i, 1);
    }
    paramsGrid->addWidget(b.checkBox("chk_FixedPRF"), 0, 2);
    paramsGrid->setColumnStretch(1, 1);
    column->addWidget(params);

    // Modulation/Gates: a heading line and one line per row.
    QGroupBox* gates = b.frame("frm_gates");
    gatesGrid_ = new QGridLayout(gates);
    QLabel* widthHeading = b.label("lbl_width");
    QLabel* delayHeading = b.label("lbl_delay");
    widthHeading->setAlignment(Qt::AlignCenter);
    delayHeading->setAlignment(Qt::AlignCenter);
    gatesGrid_->addWidget(widthHeading, 0, 1);
    gatesGrid_->addWidget(delayHeading, 0, 2);
    gatesGrid_->setColumnStretch(1, 1);
    gatesGrid_->setColumnStretch(2, 1);
    column->addWidget(gates);
    b.rows([this](int row) { placeRow(row); });

    // Duty cycle and the Calculate/Apply frame side by side.
    auto* lower = new QHBoxLayout;
    QGroupBox* duty = b.frame("frm_DutyCycle");
    auto* dutyLayout = new QVBoxLayout(duty);
    QLabel* dutyText = b.label("lbl_DutyCycle");
    dutyText->setAlignment(Qt::AlignLeft | Qt::AlignTop);
    dutyText->setWordWrap(true);
    dutyText->setMinimumHeight(dutyText->fontMetrics().lineSpacing() * 6);
    dutyLayout->addWidget(dutyText);
    lower->addWidget(duty, 1);

    QGroupBox* pulsed = b.frame("frm_pulsed");
    auto* pulsedGrid = new QGridLayout(pulsed);
    QPushButton* calculate = b.button("b_calculate");
    calculate->setDefault(false);
    pulsedGrid->addWidget(calculate, 0, 0);
    pulsedGrid->addWidget(b.button("b_apply"), 0, 1);
    pulsedGrid->addWidget(b.checkBox("chk_pulsed"), 1, 0, 1, 2);
    pulsedGrid->setRowStretch(2, 1);
    lower->addWidget(pulsed, 1);
    column->addLayout(lower);

    // The button line, in the designed order.
    auto* buttons = new QHBoxLayout;
    for (const char* name : {"b_PulseProfile", "b_recall", "b_save", "b_min", "b_close"})
        buttons->addWidget(b.button(name));
    column->addLayout(buttons);
    column->addStretch(1);
    return central;
}

void MainWindow::placeRow(int row) {
    const auto name = [row](const char* base) { return ControlRegistry::rowName(base, row); };
    QLabel* label = binder_.label(name("lbl_gate"));
    label->setAlignment(Qt::AlignRight | Qt::AlignVCenter);
    NumericEntry* width = field(name("VexoEdit_width"));
    label->setBuddy(width);
    gatesGrid_->addWidget(label, row + 1, 0);
    gatesGrid_->addWidget(width, row + 1, 1);
    gatesGrid_->addWidget(field(name("VexoEdit_delay")), row + 1, 2);
}

void MainWindow::bringToFront() {
    setWindowState((windowState() & ~Qt::WindowMinimized) | Qt::WindowActive);
    show();
    raise();
    activateWindow();
}

}  // namespace zp::ui
