// The Qt services: file filters, the busy pointer, the help file check, the instance key.

#include <gtest/gtest.h>

#include <QCursor>
#include <QDir>
#include <QFile>
#include <QLabel>
#include <QMessageBox>
#include <QTemporaryDir>
#include <QTextBrowser>
#include <QTimer>
#include <csignal>
#include <functional>

#include "ui/help_viewer.h"
#include "ui/single_instance.h"
#include "ui/stop_signals.h"
#include "ui_test_support.h"

namespace zp::ui::testing {
namespace {

TEST(QtFileFilter, TurnsDescriptionPatternPairsIntoQtFilters) {
    EXPECT_EQ(qtFileFilter("Zentra Pulsed Config (*.zpc)|*.zpc"), "Zentra Pulsed Config (*.zpc)");
    EXPECT_EQ(qtFileFilter("Touchstone|*.s1p|Comma delimited|*.prn;*.csv"),
              "Touchstone (*.s1p);;Comma delimited (*.prn *.csv)");
    EXPECT_EQ(qtFileFilter(""), "");
}

TEST(QtInteraction, BusyPointerNeverStacksAndAlwaysComesBack) {
    application();
    QtInteraction ui({});
    ASSERT_EQ(QApplication::overrideCursor(), nullptr);
    ui.setPointer(Pointer::Busy);
    ASSERT_NE(QApplication::overrideCursor(), nullptr);
    EXPECT_EQ(QApplication::overrideCursor()->shape(), Qt::WaitCursor);
    ui.setPointer(Pointer::Wait2);
    ui.setPointer(Pointer::Busy);
    ui.setPointer(Pointer::Normal);
    EXPECT_EQ(QApplication::overrideCursor(), nullptr);
    {
        BusyPointer busy(ui);
        EXPECT_NE(QApplication::overrideCursor(), nullptr);
    }
    EXPECT_EQ(QApplication::overrideCursor(), nullptr);
    // Ending while busy puts the pointer back too.
    {
        QtInteraction other({});
        other.setPointer(Pointer::Busy);
    }
    EXPECT_EQ(QApplication::overrideCursor(), nullptr);
}

// What a message box showed, read while it is up; then `press` closes it.
struct ShownBox {
    bool seen = false;
    Qt::TextFormat format = Qt::AutoText;
    QString text;
    QMessageBox::Icon icon = QMessageBox::NoIcon;
};

std::unique_ptr<QTimer> answerNextBox(ShownBox& shown, QMessageBox::StandardButton press) {
    auto timer = std::make_unique<QTimer>();
    QObject::connect(timer.get(), &QTimer::timeout, [&shown, press] {
        for (QWidget* w : QApplication::topLevelWidgets()) {
            auto* box = qobject_cast<QMessageBox*>(w);
            if (box == nullptr || !box->isVisible()) continue;
            const auto* label = box->findChild<QLabel*>(QStringLiteral("qt_msgbox_label"));
            shown = {true, label ? label->textFormat() : Qt::AutoText, label ? label->text() : "",
                     box->icon()};
            box->done(press);
        }
    });
    timer->start(10);
    return timer;
}

TEST(QtInteraction, BoxesShowPlainTextWithTheIconOfTheirKind) {
    application();
    QtInteraction ui({});
    const std::string reply = "<img src=\"file:///etc/hosts\"><b>-113</b> Undefined header";
    struct Case {
        const char* what;
        std::function<void()> show;
        QMessageBox::Icon icon;
    };
    const Case cases[] = {
        {"information", [&] { ui.message(reply, MessageKind::Information); },
         QMessageBox::Information},
        {"warning", [&] { ui.message(reply, MessageKind::Warning); }, QMessageBox::Warning},
        {"question", [&] { EXPECT_TRUE(ui.ask(reply)); }, QMessageBox::Question},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        ShownBox shown;
        const auto answering = answerNextBox(shown, QMessageBox::Yes);
        c.show();
        ASSERT_TRUE(shown.seen);
        EXPECT_EQ(shown.format, Qt::PlainText);
        EXPECT_EQ(shown.text.toStdString(), reply);
        EXPECT_EQ(shown.icon, c.icon);
    }
}

class HelpFiles : public ::testing::Test {
  protected:
    void SetUp() override {
        application();
        ASSERT_TRUE(root_.isValid());
        QDir(root_.path()).mkpath("manual");
        QDir(root_.path()).mkpath("elsewhere");
        write("manual/zentra-pulse.html",
              "<html><body><h1>Top</h1><p>filler</p>"
              "<h2><a id=\"topic-1114\" name=\"topic-1114\"></a>Main window</h2></body></html>");
        write("elsewhere/secret.html", "<p>not the manual</p>");
    }
    void write(const QString& relative, const QByteArray& text) {
        QFile f(root_.filePath(relative));
        ASSERT_TRUE(f.open(QIODevice::WriteOnly));
        f.write(text);
    }
    QString manual() const { return root_.filePath("manual"); }

    QTemporaryDir root_;
};

TEST_F(HelpFiles, OnlyExistingFilesInsideTheManualFolderAreShown) {
    const HelpFileCheck ok = checkHelpFile(manual() + "/zentra-pulse.html", {manual()});
    EXPECT_TRUE(ok.ok()) << ok.error.toStdString();

    const HelpFileCheck missing = checkHelpFile(manual() + "/nothing.html", {manual()});
    EXPECT_TRUE(missing.error.contains("was not found")) << missing.error.toStdString();

    const HelpFileCheck outside =
        checkHelpFile(root_.filePath("elsewhere/secret.html"), {manual()});
    EXPECT_TRUE(outside.error.contains("is not part of the Zentra Pulse manual"));

    // ".." cannot climb out, and a folder whose name merely starts like the manual's is not it.
    EXPECT_FALSE(checkHelpFile(manual() + "/../elsewhere/secret.html", {manual()}).ok());
    QDir(root_.path()).mkpath("manual2");
    write("manual2/x.html", "x");
    EXPECT_FALSE(checkHelpFile(root_.filePath("manual2/x.html"), {manual()}).ok());
    EXPECT_FALSE(checkHelpFile(manual(), {manual()}).ok()) << "a folder is not a help file";
    EXPECT_FALSE(checkHelpFile("", {manual()}).ok());
    EXPECT_FALSE(checkHelpFile(manual() + "/zentra-pulse.html", {}).ok());
}

// A file the analyzer names that cannot be shown: our manual, with a line saying why.
TEST_F(HelpFiles, ShowHelpOpensTheTopicOfTheNamedFileOrOfOurManual) {
    QtInteraction ui({manual()});
    ui.setUnattended(true);
    const std::pair<QString, QString> cases[] = {
        {manual() + "/zentra-pulse.html", ""},
        {root_.filePath("elsewhere/secret.html"),
         "The help file \"" + root_.filePath("elsewhere/secret.html") +
             "\" is not part of the Zentra Pulse manual. This is the Zentra Pulse manual."},
        {manual() + "/nothing.html", "The help file \"" + manual() +
                                         "/nothing.html\" was not found. This is the Zentra "
                                         "Pulse manual."},
    };
    for (const auto& [file, note] : cases) {
        SCOPED_TRACE(file.toStdString());
        EXPECT_TRUE(ui.showHelp({file.toStdString(), 1114, std::nullopt}));
        ASSERT_NE(ui.helpViewer(), nullptr);
        EXPECT_TRUE(ui.helpViewer()->isVisible());
        const QUrl shown = ui.helpViewer()->browser()->source();
        EXPECT_EQ(shown.toLocalFile(),
                  QFileInfo(manual() + "/zentra-pulse.html").canonicalFilePath());
        EXPECT_EQ(shown.fragment(), "topic-1114");
        EXPECT_EQ(ui.helpViewer()->note()->text(), note);
        EXPECT_EQ(ui.helpViewer()->note()->isVisibleTo(ui.helpViewer()), !note.isEmpty());
    }
    EXPECT_TRUE(ui.lastMessage().isEmpty());
    ui.helpViewer()->close();

    // Without our manual either, a warning says both.
    QtInteraction lost({root_.filePath("elsewhere")});
    lost.setUnattended(true);
    EXPECT_FALSE(lost.showHelp({"", 1114, "-113 Undefined header"}));
    EXPECT_EQ(lost.helpViewer(), nullptr);
    EXPECT_EQ(lost.lastMessage(),
              "The analyzer named no help file (-113 Undefined header). The "
              "Zentra Pulse manual was not found in " +
                  root_.filePath("elsewhere") + ".");
    EXPECT_EQ(lost.lastMessageKind(), MessageKind::Warning);
}

TEST(SingleInstance, KeyIsPerUserAndDisplayUnlessOverridden) {
    application();
    const auto keyOn = [](const char* display) {
        qputenv("DISPLAY", display);
        return SingleInstance::defaultKey();
    };
    const QByteArray display = qgetenv("DISPLAY");
    const QByteArray wayland = qgetenv("WAYLAND_DISPLAY");
    qunsetenv("WAYLAND_DISPLAY");
    qputenv("ZP_INSTANCE_KEY", "");
    const QString key = keyOn(":1");
    EXPECT_TRUE(key.startsWith("zentra-pulse-")) << key.toStdString();
    EXPECT_TRUE(key.endsWith("-offscreen-_1")) << key.toStdString();
    EXPECT_EQ(keyOn(":1"), key);
    EXPECT_NE(keyOn(":2"), key);
    EXPECT_FALSE(keyOn("/run/user/1000/a very long display socket path").contains('/'));
    qputenv("ZP_INSTANCE_KEY", "custom-key");
    EXPECT_EQ(SingleInstance::defaultKey(), "custom-key");
    qunsetenv("ZP_INSTANCE_KEY");
    qputenv("DISPLAY", display);
    if (!wayland.isEmpty()) qputenv("WAYLAND_DISPLAY", wayland);
}

TEST(StopSignals, SigtermAndSigintEndTheEventLoopInsteadOfTheProcess) {
    application();
    struct sigaction before {};
    sigaction(SIGTERM, nullptr, &before);
    for (const int signal : {SIGTERM, SIGINT}) {
        const StopSignals stop;
        EXPECT_THROW(StopSignals(), std::logic_error);
        EXPECT_EQ(stop.received(), 0);
        std::raise(signal);
        // Give up with 7 when the stop never reaches the loop.
        QTimer giveUp;
        giveUp.callOnTimeout([] { QCoreApplication::exit(7); });
        giveUp.start(5000);
        EXPECT_EQ(QCoreApplication::exec(), 0);
        EXPECT_EQ(stop.received(), signal);
    }
    struct sigaction after {};
    sigaction(SIGTERM, nullptr, &after);
    EXPECT_EQ(after.sa_handler, before.sa_handler) << "the previous handler must come back";
}

}  // namespace
}  // namespace zp::ui::testing
