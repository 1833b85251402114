// zentra-pulse: the Qt front end. One instance per user and display; a second start brings the
// first to the front and ends.

#include <QApplication>
#include <QDir>
#include <QPixmap>
#include <QTimer>
#include <iostream>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "common/startup.h"
#include "ui/main_window.h"
#include "ui/qt_interaction.h"
#include "ui/single_instance.h"
#include "ui/stop_signals.h"

namespace {

using namespace zp::app;

// Where help files may come from: the manual in the source tree, the installed one, and the one
// installed beside this program when the installation was moved.
QStringList manualFolders() {
    return {QStringLiteral(ZP_HELP_DIR_BUILD), QStringLiteral(ZP_HELP_DIR_INSTALL),
            QDir(QCoreApplication::applicationDirPath())
                .absoluteFilePath(QStringLiteral("../share/zentra-pulse/help"))};
}

class GuiFrontEnd : public FrontEnd {
  public:
    GuiFrontEnd(int& argc, char** argv) : argc_(argc), argv_(argv) {}

    std::optional<int> prepare(const ParsedCommandLine& cmd) override {
        app_ = std::make_unique<QApplication>(argc_, argv_);
        QApplication::setApplicationName(QStringLiteral("zentra-pulse"));
        QApplication::setApplicationVersion(QStringLiteral(ZP_VERSION));
        // SIGTERM and SIGINT close the program like its window does, so the instance socket goes
        // too.
        stopSignals_ = std::make_unique<zp::ui::StopSignals>();

        // A second start hands over before anything else runs. A screenshot run stands alone.
        instance_ = std::make_unique<zp::ui::SingleInstance>(zp::ui::SingleInstance::defaultKey());
        screenshot_ = cmd.options.screenshot;
        if (!screenshot_ && instance_->start() == zp::ui::SingleInstance::Role::Secondary) {
            std::cerr << "zentra-pulse: already running on this display; brought it to the front\n";
            return 0;
        }
        ui_ = std::make_unique<zp::ui::QtInteraction>(manualFolders());
        ui_->setUnattended(screenshot_.has_value());
        return std::nullopt;
    }

    zp::Interaction& interaction() override { return *ui_; }

    void showStartupFailure(StartupFailure failure, const std::string& text) override {
        ui_->message(failure == StartupFailure::AnalyzerUnreachable
                         ? "The analyzer cannot be reached: " + text + "\nThe program ends."
                         : "The program could not start: " + text,
                     zp::MessageKind::Warning);
    }

    int run(zp::MainForm& form, zp::Bench&) override {
        zp::ui::MainWindow window(form, *ui_);
        ui_->setWindow(&window);
        QObject::connect(instance_.get(), &zp::ui::SingleInstance::raiseRequested, &window,
                         [&window] {
                             std::cerr << "zentra-pulse: raised by a second start" << std::endl;
                             window.bringToFront();
                         });
        window.show();
        // From here a second start is heard and answered: scripts and tests wait for this line.
        if (instance_->listening()) {
            std::cerr << "zentra-pulse: listening for a second start" << std::endl;
        }

        if (screenshot_) {
            const QString file = QString::fromStdString(*screenshot_);
            QTimer::singleShot(300, &window, [&window, file] {
                const bool saved = window.grab().save(file, "PNG");
                if (!saved)
                    std::cerr << "zentra-pulse: cannot write " << file.toStdString() << '\n';
                QApplication::exit(saved ? 0 : 1);
            });
        }
        if (stopSignals_->received() != 0) return 0;
        return QApplication::exec();
    }

  private:
    int& argc_;
    char** argv_;
    std::optional<std::string> screenshot_;
    // Declared in the order they are made, so that they go in reverse.
    std::unique_ptr<QApplication> app_;
    std::unique_ptr<zp::ui::StopSignals> stopSignals_;
    std::unique_ptr<zp::ui::SingleInstance> instance_;
    std::unique_ptr<zp::ui::QtInteraction> ui_;
};

}  // namespace

int main(int argc, char** argv) {
    GuiFrontEnd frontEnd(argc, argv);
    return runFrontEnd(Program::Gui, std::vector<std::string>(argv + 1, argv + argc), frontEnd);
}
