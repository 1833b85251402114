#pragma once
// The person at the screen, played by the command line: messages are printed, questions get the
// answer chosen on the command line, file choices come from the running action.

#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "forms/interaction.h"

namespace zp::app {

class ConsoleInteraction : public Interaction {
  public:
    ConsoleInteraction(std::ostream& out, bool answerYes) : out_(out), answerYes_(answerYes) {}

    // Printed as "message: <text>" on one line (line breaks become blanks), whatever the kind.
    void message(const std::string& text, MessageKind kind) override;
    bool ask(const std::string& text) override;
    // The file set by the running action, used once; nothing means the person cancelled.
    std::optional<std::string> chooseOpenFile(const std::string& filter) override;
    std::optional<std::string> chooseSaveFile(const std::string& filter) override;
    void processEvents() override {}
    void setPointer(Pointer) override {}
    // Remembers the file and topic; the help action prints them. Without a screen there is no
    // manual to fall back on: the analyzer's error, when it named no file, is a message.
    bool showHelp(const HelpRequest& request) override;

    void setNextFile(std::optional<std::string> file) { nextFile_ = std::move(file); }

    // Messages shown since the last takeMessages(); an action uses them to tell failure.
    std::vector<std::string> takeMessages();
    bool hasMessages() const { return !messages_.empty(); }

    std::optional<HelpRequest> takeHelpRequest();

    // Line breaks become blanks: every report of this front end is one line.
    static std::string oneLine(const std::string& text);

  private:
    std::ostream& out_;
    bool answerYes_;
    std::optional<std::string> nextFile_;
    std::vector<std::string> messages_;
    std::optional<HelpRequest> help_;
};

}  // namespace zp::app
