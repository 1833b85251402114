#pragma once
// The headless front end's actions: a table of named actions, each parsing its own words and
// running against the main window model. New actions slot into the table.

#include <functional>
#include <ostream>
#include <stdexcept>
#include <string>
#include <vector>

#include "console_interaction.h"
#include "forms/main_form.h"
#include "instruments/io_trace.h"

namespace zp::app {

// A command line that cannot be run, or an action that failed; the text is for the user.
class ActionError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

struct ActionContext {
    MainForm& form;
    ConsoleInteraction& ui;
    std::ostream& out;
    const IoTrace* trace = nullptr;  // the bench's, when its file must keep up
    bool keepGoing = false;          // a failed action does not end the run
};

// One parsed action, ready to run.
struct Action {
    std::string words;  // as given, for messages
    // Runs and returns the echo line (empty for none). Throws ActionError on failure.
    std::function<std::string(ActionContext&)> run;
    // A message box during the action means it failed (the model reports trouble that way).
    bool messageFails = true;
};

// The words an action takes, one after another.
class WordCursor {
  public:
    explicit WordCursor(const std::vector<std::string>& words) : words_(words) {}
    bool atEnd() const { return pos_ >= words_.size(); }
    const std::string& peek() const { return words_.at(pos_); }
    // The next word; throws ActionError "<action>: missing <what>" at the end.
    const std::string& next(const std::string& action, const std::string& what);
    std::size_t position() const { return pos_; }

  private:
    const std::vector<std::string>& words_;
    std::size_t pos_ = 0;
};

struct ActionKind {
    std::string name;
    std::string usage;
    std::function<Action(WordCursor&)> parse;  // the action's name has been taken already
    std::string help;  // what it does, for --help; one line each, 50 characters at most
};

const std::vector<ActionKind>& actionTable();

// Parses every action before any runs, so that a typing error costs nothing.
std::vector<Action> parseActions(const std::vector<std::string>& words);

// Runs the actions in order and echoes each on `ctx.out`. A failure is printed on `err` as
// "zentra-pulse-cli: <action>: <reason>" (one line) and ends the run, unless `ctx.keepGoing`;
// returns the exit status (0, or 1 after any failure). Output that cannot be written is a failure
// of the action that wrote it, and ends the run always.
int runActions(const std::vector<Action>& actions, ActionContext& ctx, std::ostream& err);

// Why the run's output is lost, empty while it is not: `ctx.out` (flushed to find out) or the
// trace file cannot be written.
std::string lostOutput(ActionContext& ctx);

}  // namespace zp::app
