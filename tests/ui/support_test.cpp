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
};

std::unique_ptr<QTimer> answerNextBox(ShownBox& shown, QMessageBox::StandardButton press) {
    auto timer = std::make_unique<QTimer>();
    QObject::connect(timer.get(), &QTimer::timeout, [&shown, press] {
        for (QWidget* w : QApplication::topLevelWidgets()) {
            auto* box = qobject_cast<QMessageBox*>(w);
            if (box == nullptr || !box->isVisible()) continue;
            const auto* label = box->findChild<QLabel*>(QStringLiteral("qt_msgbox_label"));
            shown = {true, label ? label->textFormat() : Qt::AutoText, label ? label->text() : ""};
            box->done(press);
        }
    });
    timer->start(10);
    return timer;
}

TEST(QtInteraction, BoxesShowInstrumentTextAsPlainTextNeverAsMarkup) {
    application();
    QtInteraction ui({});
    const std::string reply = "<img src=\"file:///etc/hosts\"><b>-113</b> Undefined header";
    for (const bool question : {false, true}) {
        SCOPED_TRACE(question ? "ask" : "message");
        ShownBox shown;
        const auto answering = answerNextBox(shown, QMessageBox::Yes);
        if (question) {
            EXPECT_TRUE(ui.ask(reply));
        } else {
            ui.message(reply);
        }
        ASSERT_TRUE(shown.seen);
        EXPECT_EQ(shown.format, Qt::PlainText);
        EXPECT_EQ(shown.text.toStdString(), reply);
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

TEST_F(HelpFiles, ShowHelpOpensTheViewerAtTheTopicOrSaysWhyNot) {
    QtInteraction ui({manual()});
    ui.setUnattended(true);
    EXPECT_FALSE(ui.showHelp(root_.filePath("elsewhere/secret.html").toStdString(), 1114));
    EXPECT_EQ(ui.helpViewer(), nullptr);
    EXPECT_TRUE(ui.lastMessage().contains("not part of the Zentra Pulse manual"));

    EXPECT_TRUE(ui.showHelp((manual() + "/zentra-pulse.html").toStdString(), 1114));
    ASSERT_NE(ui.helpViewer(), nullptr);
    EXPECT_EQ(ui.helpViewer()->browser()->source().fragment(), "topic-1114");
    EXPECT_TRUE(ui.helpViewer()->isVisible());
}

TEST(SingleInstance, KeyIsNamedAfterTheUserUnlessOverridden) {
    qputenv("ZP_INSTANCE_KEY", "");
    const QString key = SingleInstance::defaultKey();
    EXPECT_TRUE(key.startsWith("zentra-pulse-"));
    EXPECT_FALSE(key.contains('/'));
    qputenv("ZP_INSTANCE_KEY", "custom-key");
    EXPECT_EQ(SingleInstance::defaultKey(), "custom-key");
    qunsetenv("ZP_INSTANCE_KEY");
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
