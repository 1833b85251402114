#include "ui/main_window.h"

#include <QAction>
#include <QCheckBox>
#include <QGridLayout>
#include <QGroupBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QMenu>
#include <QMenuBar>
#include <QPushButton>
#include <QStatusBar>
#include <QVBoxLayout>

#include "forms/main_form_layout.h"
#include "instruments/instrument_error.h"
#include "ui/numeric_entry.h"

namespace zp::ui {
namespace {

QString text(const std::string& s) {
    return QString::fromStdString(s);
}

// "&Pulse Profile..." -> "Pulse Profile"
QString plainCaption(const std::string& caption) {
    QString t = text(caption);
    t.remove(QLatin1Char('&'));
    if (t.endsWith(QStringLiteral("..."))) t.chop(3);
    return t.trimmed();
}

void applyControl(QWidget* w, const Control& c) {
    w->setEnabled(c.enabled);
    // Hidden by the model only; a shown window shows the rest.
    if (w->isHidden() == c.visible) w->setVisible(c.visible);
}

// Twips to pixels at the logical 96 dots per inch.
int px(int twips) {
    return twips / 15;
}

}  // namespace

MainWindow::MainWindow(MainForm& form, Interaction& ui, QWidget* parent)
    : QMainWindow(parent), form_(form), ui_(ui), alive_(std::make_shared<bool>(true)) {
    setObjectName(text(form_.f_PulsedZentra.name));
    buildMenus();
    setCentralWidget(buildCentral());
    statusBar()->setSizeGripEnabled(true);

    // Buttons and entries of windows this version does not have yet.
    for (const Control* c :
         {&form_.b_apply, &form_.b_save, &form_.b_recall, &form_.b_PulseProfile}) {
        handlers_[text(c->name)] = [this, c] { notAvailable(*c); };
    }
    for (const MenuEntry* m : {&form_.m_ConfigPG, &form_.m_ConfigRx, &form_.m_PulseProfile,
                               &form_.m_PulseConfig, &form_.m_about}) {
        handlers_[text(m->name)] = [this, m] { notAvailable(*m); };
    }
    handlers_[QStringLiteral("b_calculate")] = [this] { form_.b_calculate_Click(); };
    handlers_[QStringLiteral("b_min")] = [this] { showMinimized(); };
    handlers_[QStringLiteral("b_close")] = [this] { close(); };
    handlers_[QStringLiteral("m_ConverterMeas")] = [this] { form_.m_ConverterMeas_Click(); };
    handlers_[QStringLiteral("m_NoPG")] = [this] { form_.m_NoPG_Click(); };
    handlers_[QStringLiteral("m_NoSWGating")] = [this] { form_.m_NoSWGating_Click(); };
    handlers_[QStringLiteral("m_contents")] = [this] { form_.m_contents_Click(); };

    // The model outlives no view: a listener left behind after this window goes does nothing.
    form_.onChanged([weak = std::weak_ptr<bool>(alive_), this] {
        if (weak.lock()) refresh();
    });
    refresh();
    const Geometry& g = form_.f_PulsedZentra.geometry;
    resize(sizeHint().expandedTo(QSize(px(g.width), px(g.height))));
}

MainWindow::~MainWindow() {
    alive_.reset();
}

void MainWindow::setHandler(const QString& objectName, std::function<void()> handler) {
    handlers_[objectName] = std::move(handler);
}

void MainWindow::trigger(const QString& objectName) {
    auto it = handlers_.find(objectName);
    if (it == handlers_.end()) return;
    // The handler may replace itself; run a copy.
    const std::function<void()> handler = it->second;
    run(handler);
}

void MainWindow::notAvailable(const Control& c) {
    ui_.message(plainCaption(c.caption).toStdString() + " is not available in this version yet.");
}

void MainWindow::run(const std::function<void()>& handler) {
    try {
        handler();
    } catch (const InstrumentError& e) {
        ui_.message(e.description());
    } catch (const std::exception& e) {
        ui_.message(e.what());
    }
    refresh();
}

QAction* MainWindow::makeAction(QMenu* menu, const MenuEntry& entry, bool checkable) {
    auto* action = menu->addAction(text(entry.caption));
    action->setObjectName(text(entry.name));
    action->setCheckable(checkable);
    const QString name = text(entry.name);
    connect(action, &QAction::triggered, this, [this, name] { trigger(name); });
    refreshers_.push_back([action, &entry] {
        action->setText(text(entry.caption));
        action->setEnabled(entry.enabled);
        action->setVisible(entry.visible);
        if (action->isCheckable()) action->setChecked(entry.checked);
    });
    return action;
}

void MainWindow::buildMenus() {
    struct Item {
        const MenuEntry* entry;
        bool checkable;
    };
    struct Top {
        const MenuEntry* menu;
        std::vector<Item> items;
        int separatorBefore;  // index of the first item after a separator, -1 for none
    };
    const Top tops[] = {
        {&form_.m_Config,
         {{&form_.m_ConfigPG, false},
          {&form_.m_ConfigRx, false},
          {&form_.m_ConverterMeas, true},
          {&form_.m_NoPG, true},
          {&form_.m_NoSWGating, true}},
         2},
        {&form_.m_View, {{&form_.m_PulseProfile, false}, {&form_.m_PulseConfig, false}}, -1},
        {&form_.m_help, {{&form_.m_contents, false}, {&form_.m_about, false}}, -1},
    };
    for (const Top& top : tops) {
        QMenu* menu = menuBar()->addMenu(text(top.menu->caption));
        menu->setObjectName(text(top.menu->name));
        const MenuEntry* m = top.menu;
        refreshers_.push_back([menu, m] {
            menu->setTitle(text(m->caption));
            menu->menuAction()->setEnabled(m->enabled);
            menu->menuAction()->setVisible(m->visible);
        });
        for (std::size_t i = 0; i < top.items.size(); ++i) {
            if (static_cast<int>(i) == top.separatorBefore) menu->addSeparator();
            makeAction(menu, *top.items[i].entry, top.items[i].checkable);
        }
    }
    if (QAction* contents = findChild<QAction*>(QStringLiteral("m_contents"))) {
        contents->setShortcut(QKeySequence::HelpContents);
    }
}

QLabel* MainWindow::makeLabel(const Control& c) {
    auto* label = new QLabel(text(c.caption));
    label->setObjectName(text(c.name));
    label->setTextFormat(Qt::PlainText);
    refreshers_.push_back([label, &c] {
        QString caption = text(c.caption);
        caption.replace(QStringLiteral("\r\n"), QStringLiteral("\n"));
        label->setText(caption);
        applyControl(label, c);
    });
    return label;
}

QPushButton* MainWindow::makeButton(const Control& c) {
    auto* button = new QPushButton(text(c.caption));
    button->setObjectName(text(c.name));
    const QString name = text(c.name);
    connect(button, &QPushButton::clicked, this, [this, name] { trigger(name); });
    refreshers_.push_back([button, &c] {
        button->setText(text(c.caption));
        applyControl(button, c);
    });
    return button;
}

QGroupBox* MainWindow::makeFrame(const Control& c) {
    auto* frame = new QGroupBox(text(c.caption));
    frame->setObjectName(text(c.name));
    refreshers_.push_back([frame, &c] {
        frame->setTitle(text(c.caption));
        applyControl(frame, c);
    });
    return frame;
}

QCheckBox* MainWindow::makeCheckBox(const CheckBox& c, std::function<void(bool)> onClick) {
    auto* box = new QCheckBox(text(c.caption));
    box->setObjectName(text(c.name));
    connect(box, &QCheckBox::clicked, this, [this, onClick = std::move(onClick)](bool checked) {
        run([&onClick, checked] { onClick(checked); });
    });
    refreshers_.push_back([box, &c] {
        box->setText(text(c.caption));
        box->setChecked(c.checked());
        applyControl(box, c);
    });
    return box;
}

NumericEntry* MainWindow::makeEntry(EntryField& field) {
    auto* entry = new NumericEntry(field);
    entry->setMinimumWidth(px(zp::layout::kFieldWidth));
    connect(entry, &NumericEntry::entered, this, [this] {
        statusBar()->clearMessage();
        refresh();
    });
    connect(entry, &NumericEntry::refused, this,
            [this](const QString& reason) { statusBar()->showMessage(reason, 10000); });
    return entry;
}

QWidget* MainWindow::buildCentral() {
    auto* central = new QWidget;
    auto* column = new QVBoxLayout(central);

    // Desired PRF and IFBW.
    QGroupBox* params = makeFrame(form_.frm_PulsedParams);
    auto* paramsGrid = new QGridLayout(params);
    EntryField* fields[] = {&form_.VexoEdit_prf, &form_.VexoEdit_pri, &form_.VexoEdit_IFBW};
    const Control* labels[] = {&form_.lbl_prf, &form_.lbl_pri, &form_.lbl_ifbw};
    for (int i = 0; i < 3; ++i) {
        QLabel* label = makeLabel(*labels[i]);
        NumericEntry* entry = makeEntry(*fields[i]);
        entries_.push_back(entry);
        label->setBuddy(entry);
        paramsGrid->addWidget(label, i, 0);
        paramsGrid->addWidget(entry, i, 1);
    }
    QCheckBox* fixedPrf =
        makeCheckBox(form_.chk_FixedPRF, [this](bool checked) { form_.setFixedPRF(checked); });
    paramsGrid->addWidget(fixedPrf, 0, 2);
    paramsGrid->setColumnStretch(1, 1);
    column->addWidget(params);

    // Modulation/Gates: a heading line and one line per row.
    gatesFrame_ = makeFrame(form_.frm_gates);
    gatesGrid_ = new QGridLayout(gatesFrame_);
    QLabel* widthHeading = makeLabel(form_.lbl_width);
    QLabel* delayHeading = makeLabel(form_.lbl_delay);
    widthHeading->setAlignment(Qt::AlignCenter);
    delayHeading->setAlignment(Qt::AlignCenter);
    gatesGrid_->addWidget(widthHeading, 0, 1);
    gatesGrid_->addWidget(delayHeading, 0, 2);
    gatesGrid_->setColumnStretch(1, 1);
    gatesGrid_->setColumnStretch(2, 1);
    column->addWidget(gatesFrame_);
    buildRows();

    // Duty cycle and the Calculate/Apply frame side by side.
    auto* lower = new QHBoxLayout;
    QGroupBox* duty = makeFrame(form_.frm_DutyCycle);
    auto* dutyLayout = new QVBoxLayout(duty);
    QLabel* dutyText = makeLabel(form_.lbl_DutyCycle);
    dutyText->setAlignment(Qt::AlignLeft | Qt::AlignTop);
    dutyText->setWordWrap(true);
    dutyText->setMinimumHeight(dutyText->fontMetrics().lineSpacing() * 6);
    dutyLayout->addWidget(dutyText);
    lower->addWidget(duty, 1);

    QGroupBox* pulsed = makeFrame(form_.frm_pulsed);
    auto* pulsedGrid = new QGridLayout(pulsed);
    QPushButton* calculate = makeButton(form_.b_calculate);
    calculate->setDefault(false);
    pulsedGrid->addWidget(calculate, 0, 0);
    pulsedGrid->addWidget(makeButton(form_.b_apply), 0, 1);
    QCheckBox* pulsedBox = makeCheckBox(form_.chk_pulsed, [this](bool checked) {
        form_.chk_pulsed.value = checked ? kChecked : kUnchecked;
        form_.chk_pulsed_Click();
    });
    pulsedGrid->addWidget(pulsedBox, 1, 0, 1, 2);
    pulsedGrid->setRowStretch(2, 1);
    lower->addWidget(pulsed, 1);
    column->addLayout(lower);

    // The button line, in the designed order.
    auto* buttons = new QHBoxLayout;
    for (const Control* c :
         {&form_.b_PulseProfile, &form_.b_recall, &form_.b_save, &form_.b_min, &form_.b_close}) {
        buttons->addWidget(makeButton(*c));
    }
    column->addLayout(buttons);
    column->addStretch(1);
    return central;
}

void MainWindow::buildRows() {
    for (Row& r : rows_) {
        delete r.label;
        delete r.width;
        delete r.delay;
    }
    rows_.clear();
    for (int row = 0; row < form_.rowCount(); ++row) {
        const auto i = static_cast<std::size_t>(row);
        Row r;
        r.label = new QLabel(text(form_.lbl_gate[i].caption));
        r.label->setObjectName(text(form_.lbl_gate[i].name));
        r.label->setAlignment(Qt::AlignRight | Qt::AlignVCenter);
        r.width = makeEntry(form_.VexoEdit_width[i]);
        r.delay = makeEntry(form_.VexoEdit_delay[i]);
        for (QWidget* w : {static_cast<QWidget*>(r.label), static_cast<QWidget*>(r.width),
                           static_cast<QWidget*>(r.delay)}) {
            w->setProperty("row", row);
        }
        r.label->setBuddy(r.width);
        gatesGrid_->addWidget(r.label, row + 1, 0);
        gatesGrid_->addWidget(r.width, row + 1, 1);
        gatesGrid_->addWidget(r.delay, row + 1, 2);
        rows_.push_back(r);
    }
}

void MainWindow::refresh() {
    // A refresh can arrive from inside another (a rule run by a widget's own write).
    if (refreshing_) return;
    refreshing_ = true;
    setWindowTitle(text(form_.f_PulsedZentra.caption));
    if (shownRows() != form_.rowCount()) buildRows();
    for (auto& refresher : refreshers_) refresher();
    for (NumericEntry* e : entries_) e->refresh();
    for (int row = 0; row < shownRows(); ++row) {
        const auto i = static_cast<std::size_t>(row);
        Row& r = rows_[i];
        r.width->bind(form_.VexoEdit_width[i]);
        r.delay->bind(form_.VexoEdit_delay[i]);
        r.label->setText(text(form_.lbl_gate[i].caption));
        applyControl(r.label, form_.lbl_gate[i]);
    }
    refreshing_ = false;
}

void MainWindow::bringToFront() {
    setWindowState((windowState() & ~Qt::WindowMinimized) | Qt::WindowActive);
    show();
    raise();
    activateWindow();
}

}  // namespace zp::ui
