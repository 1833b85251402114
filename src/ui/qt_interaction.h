#pragma once
// The person at the screen for the Qt front end: message boxes titled with the program's name,
// file dialogs, the busy pointer and the help viewer.

#include <QPointer>
#include <QString>
#include <QStringList>
#include <memory>

#include "forms/interaction.h"
#include "ui/help_viewer.h"

class QWidget;

namespace zp::ui {

// "Zentra Pulsed Config (*.zpc)|*.zpc" (description|pattern pairs) as a Qt file dialog filter.
QString qtFileFilter(const std::string& filter);

class QtInteraction : public Interaction {
  public:
    // `manualFolders`: where help files may come from (see checkHelpFile).
    explicit QtInteraction(QStringList manualFolders);
    ~QtInteraction() override;

    void setWindow(QWidget* window) { window_ = window; }
    // Without a person at the screen (screenshots, tests): messages go to stderr, questions are
    // answered no and file choices cancelled, so nothing waits for a click.
    void setUnattended(bool on) { unattended_ = on; }

    void message(const std::string& text, MessageKind kind) override;
    bool ask(const std::string& text) override;
    std::optional<std::string> chooseOpenFile(const std::string& filter) override;
    std::optional<std::string> chooseSaveFile(const std::string& filter) override;
    void processEvents() override;
    void setPointer(Pointer p) override;
    // The analyzer's help file; our own manual, with a note saying why, when the analyzer named
    // none or a file that cannot be shown.
    bool showHelp(const HelpRequest& request) override;

    Pointer pointer() const { return pointer_; }
    const QString& lastMessage() const { return lastMessage_; }
    MessageKind lastMessageKind() const { return lastKind_; }
    HelpViewer* helpViewer() const { return helpViewer_.get(); }

  private:
    enum class FileDialog { Open, Save };
    std::optional<std::string> chooseFile(const std::string& filter, FileDialog kind);

    QStringList manualFolders_;
    QPointer<QWidget> window_;
    bool unattended_ = false;
    Pointer pointer_ = Pointer::Normal;
    QString lastMessage_;
    MessageKind lastKind_ = MessageKind::Information;
    std::unique_ptr<HelpViewer> helpViewer_;
};

}  // namespace zp::ui
