#include "console_interaction.h"

#include <utility>

namespace zp::app {

std::string ConsoleInteraction::oneLine(const std::string& text) {
    std::string line;
    line.reserve(text.size());
    bool pendingBlank = false;
    for (char c : text) {
        if (c == '\r' || c == '\n') {
            pendingBlank = !line.empty();
            continue;
        }
        if (pendingBlank && line.back() != ' ') line += ' ';
        pendingBlank = false;
        line += c;
    }
    return line;
}

void ConsoleInteraction::message(const std::string& text, MessageKind) {
    std::string line = oneLine(text);
    out_ << "message: " << line << '\n';
    messages_.push_back(std::move(line));
}

bool ConsoleInteraction::ask(const std::string& text) {
    out_ << "question: " << oneLine(text) << " -> " << (answerYes_ ? "yes" : "no") << '\n';
    return answerYes_;
}

std::optional<std::string> ConsoleInteraction::chooseOpenFile(const std::string&) {
    return std::exchange(nextFile_, std::nullopt);
}

std::optional<std::string> ConsoleInteraction::chooseSaveFile(const std::string&) {
    return std::exchange(nextFile_, std::nullopt);
}

bool ConsoleInteraction::showHelp(const HelpRequest& request) {
    if (request.analyzerError) {
        message(*request.analyzerError, MessageKind::Warning);
        return false;
    }
    help_ = request;
    return true;
}

std::vector<std::string> ConsoleInteraction::takeMessages() {
    return std::exchange(messages_, {});
}

std::optional<HelpRequest> ConsoleInteraction::takeHelpRequest() {
    return std::exchange(help_, std::nullopt);
}

}  // namespace zp::app
