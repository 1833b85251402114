// zentra-pulse: the Qt front end. One instance per user and display; a second start brings the
// first to the front and ends.

#include <QApplication>
#include <QDir>
#include <QPixmap>
#include <QTimer>
#include <iostream>
#include <optional>
#include <string>
#include <vector>

#include "common/bench_options.h"
#include "forms/main_form.h"
#include "instruments/instrument_error.h"
#include "ui/main_window.h"
#include "ui/qt_interaction.h"
#include "ui/single_instance.h"
#include "ui/stop_signals.h"

namespace {

// Where help files may come from: the manual in the source tree, the installed one, and the one
// installed beside this program when the installation was moved.
QStringList manualFolders() {
    return {QStringLiteral(ZP_HELP_DIR_BUILD), QStringLiteral(ZP_HELP_DIR_INSTALL),
            QDir(QCoreApplication::applicationDirPath())
                .absoluteFilePath(QStringLiteral("../share/zentra-pulse/help"))};
}

}  // namespace

int main(int argc, char** argv) {
    using namespace zp::app;
    const std::vector<std::string> args(argv + 1, argv + argc);
    const ParsedCommandLine cmd = parseCommandLine(args, Program::Gui);
    if (const std::optional<int> status = earlyExit(cmd, Program::Gui, std::cout, std::cerr)) {
        return *status;
    }
    const BenchOptions& options = cmd.options;

    QApplication app(argc, argv);
    QApplication::setApplicationName(QStringLiteral("zentra-pulse"));
    QApplication::setApplicationVersion(QStringLiteral(ZP_VERSION));
    // SIGTERM and SIGINT close the program like its window does, so the instance socket goes too.
    const zp::ui::StopSignals stopSignals;

    // A second start hands over before anything else runs. A screenshot run stands alone.
    zp::ui::SingleInstance instance(zp::ui::SingleInstance::defaultKey());
    if (!options.screenshot && instance.start() == zp::ui::SingleInstance::Role::Secondary) {
        std::cerr << "zentra-pulse: already running on this display; brought it to the front\n";
        return 0;
    }

    const std::unique_ptr<zp::sim::SimBench> bench =
        makeBenchOrReport(options, Program::Gui, std::cerr);
    if (!bench) return kUsageExit;

    zp::ui::QtInteraction ui(manualFolders());
    ui.setUnattended(options.screenshot.has_value());
    zp::MainForm form(zp::pulsedModule(), *bench, ui);
    try {
        form.Form_Load();
    } catch (const zp::InstrumentError& e) {
        ui.message("The analyzer cannot be reached: " + e.description() + "\nThe program ends.",
                   zp::MessageKind::Warning);
        return 1;
    } catch (const std::exception& e) {
        ui.message(std::string("The program could not start: ") + e.what(),
                   zp::MessageKind::Warning);
        return 1;
    }

    zp::ui::MainWindow window(form, ui);
    ui.setWindow(&window);
    QObject::connect(&instance, &zp::ui::SingleInstance::raiseRequested, &window, [&window] {
        std::cerr << "zentra-pulse: raised by a second start" << std::endl;
        window.bringToFront();
    });
    window.show();
    // From here a second start is heard and answered: scripts and tests wait for this line.
    if (instance.listening()) {
        std::cerr << "zentra-pulse: listening for a second start" << std::endl;
    }

    if (options.screenshot) {
        const QString file = QString::fromStdString(*options.screenshot);
        QTimer::singleShot(300, &window, [&window, file] {
            const bool saved = window.grab().save(file, "PNG");
            if (!saved) std::cerr << "zentra-pulse: cannot write " << file.toStdString() << '\n';
            QApplication::exit(saved ? 0 : 1);
        });
    }
    if (stopSignals.received() != 0) return 0;
    return QApplication::exec();
}
