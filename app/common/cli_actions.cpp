#include "cli_actions.h"

#include <charconv>
#include <sstream>
#include <utility>

#include "core/numeric.h"
#include "forms/main_form_json.h"
#include "instruments/apply/apply_types.h"
#include "instruments/instrument_error.h"

namespace zp::app {
namespace {

// The words of `set` and `step` and the window control each one drives: the documented words stay
// while the window's names are its own.
enum class Takes { Value, RowValue, OnOff };

struct Word {
    const char* word;
    const char* control;
    Takes takes;
};

constexpr Word kWords[] = {
    {"prf", "VexoEdit_prf", Takes::Value},          {"pri", "VexoEdit_pri", Takes::Value},
    {"ifbw", "VexoEdit_IFBW", Takes::Value},        {"width", "VexoEdit_width", Takes::RowValue},
    {"delay", "VexoEdit_delay", Takes::RowValue},   {"fixedprf", "chk_FixedPRF", Takes::OnOff},
    {"converter", "m_ConverterMeas", Takes::OnOff}, {"nopg", "m_NoPG", Takes::OnOff},
    {"noswgating", "m_NoSWGating", Takes::OnOff},   {"pulsed", "chk_pulsed", Takes::OnOff},
};

const Word* findWord(const std::string& word) {
    for (const Word& w : kWords) {
        if (word == w.word) return &w;
    }
    return nullptr;
}

// "prf, pri, ..." for the words `set` (all) or `step` (fields only, rows named) take.
std::string wordList(bool fieldsOnly) {
    std::string list;
    for (const Word& w : kWords) {
        if (fieldsOnly && w.takes == Takes::OnOff) continue;
        list += (list.empty() ? "" : ", ") + std::string(w.word);
        if (fieldsOnly && w.takes == Takes::RowValue) list += " ROW";
    }
    return list;
}

// "prf|pri|ifbw|width ROW|delay ROW" or the toggles, for --help.
std::string helpWords(bool toggles) {
    std::string list;
    for (const Word& w : kWords) {
        if ((w.takes == Takes::OnOff) != toggles) continue;
        list += (list.empty() ? "" : "|") + std::string(w.word);
        if (w.takes == Takes::RowValue) list += " ROW";
    }
    return list;
}

// A field of the window as the words name it.
struct FieldRef {
    const Word* word;
    int row = -1;  // width and delay only
};

int parseRow(const std::string& action, const std::string& word) {
    int row = -1;
    const char* end = word.data() + word.size();
    auto [ptr, ec] = std::from_chars(word.data(), end, row);
    if (ec != std::errc() || ptr != end || row < 0) {
        throw ActionError(action + ": row must be a whole number from 0, not '" + word + "'");
    }
    return row;
}

bool parseOnOff(const std::string& action, const std::string& word) {
    if (word == "on") return true;
    if (word == "off") return false;
    throw ActionError(action + ": expected on or off, not '" + word + "'");
}

// Takes the row of a width or delay after the field's word.
FieldRef takeRow(WordCursor& words, const std::string& action, const Word& word) {
    FieldRef ref{&word, -1};
    if (word.takes == Takes::RowValue) {
        const std::string what = action + " " + word.word;
        ref.row = parseRow(what, words.next(what, "ROW"));
    }
    return ref;
}

// The control's name in the window, e.g. "VexoEdit_width(2)"; a row the window lacks is refused.
std::string controlName(const MainForm& form, const FieldRef& ref) {
    if (ref.row < 0) return ref.word->control;
    const int rows = form.controls().item(ref.word->control).rowCount();
    if (ref.row >= rows) {
        throw ActionError("row " + std::to_string(ref.row) + " does not exist (rows 0 to " +
                          std::to_string(rows - 1) + " on this analyzer)");
    }
    return ControlRegistry::rowName(ref.word->control, ref.row);
}

std::string words(const std::string& action, const FieldRef& ref, const std::string& last) {
    return action + " " + ref.word->word + (ref.row >= 0 ? " " + std::to_string(ref.row) : "") +
           " " + last;
}

// The value in the field's base unit, e.g. "12340 Hz" or "2e-06 sec".
std::string baseText(const EntryField& field) {
    std::string text = generalText(field.value());
    if (!field.units().empty() && field.units().front().name != ".") {
        text += ' ' + field.units().front().name;
    }
    return text;
}

void refuseIf(const std::optional<std::string>& reason) {
    if (reason) throw ActionError(*reason);
}

Action parseSet(WordCursor& cursor) {
    const std::string& what = cursor.next("set", "FIELD");
    if (cursor.atEnd()) throw ActionError("set " + what + ": missing value");
    const Word* word = findWord(what);
    if (word == nullptr) {
        throw ActionError("set: unknown field '" + what + "' (" + wordList(false) + ")");
    }
    Action a;
    if (word->takes == Takes::OnOff) {
        const std::string state = cursor.next("set " + what, "on|off");
        const bool on = parseOnOff("set " + what, state);
        a.words = "set " + what + " " + state;
        a.run = [control = std::string(word->control), on, echo = a.words](ActionContext& ctx) {
            refuseIf(ctx.form.controls().setChecked(control, on));
            return echo + " -> " + (on ? "on" : "off");
        };
        return a;
    }
    const FieldRef ref = takeRow(cursor, "set", *word);
    const std::string value = cursor.next("set " + what, "VALUE");
    a.words = words("set", ref, value);
    a.run = [ref, value, echo = a.words](ActionContext& ctx) {
        const std::string name = controlName(ctx.form, ref);
        refuseIf(ctx.form.controls().enterText(name, value));
        return echo + " -> " + baseText(ctx.form.controls().field(name));
    };
    return a;
}

Action parseStep(WordCursor& cursor) {
    if (cursor.atEnd()) throw ActionError("step: missing FIELD");
    const Word* word = findWord(cursor.peek());
    if (word == nullptr || word->takes == Takes::OnOff) {
        throw ActionError("step: unknown field '" + cursor.peek() + "' (" + wordList(true) + ")");
    }
    cursor.next("step", "FIELD");
    const FieldRef ref = takeRow(cursor, "step", *word);
    const std::string what = std::string("step ") + word->word;
    const std::string direction = cursor.next(what, "up|down");
    if (direction != "up" && direction != "down") {
        throw ActionError(what + ": expected up or down, not '" + direction + "'");
    }
    Action a;
    a.words = words("step", ref, direction);
    a.run = [ref, up = direction == "up", echo = a.words](ActionContext& ctx) {
        const std::string name = controlName(ctx.form, ref);
        refuseIf(ctx.form.controls().step(name, up ? 1 : -1));
        return echo + " -> " + baseText(ctx.form.controls().field(name));
    };
    return a;
}

// An action that takes no words of its own.
Action plainAction(std::string words, std::function<std::string(ActionContext&)> run) {
    Action a;
    a.words = std::move(words);
    a.run = std::move(run);
    return a;
}

Action parseCalculate(WordCursor&) {
    return plainAction("calculate", [](ActionContext& ctx) {
        refuseIf(ctx.form.controls().click("b_calculate"));
        return "calculate -> PRF " + baseText(ctx.form.VexoEdit_prf) + ", IF bandwidth " +
               baseText(ctx.form.VexoEdit_IFBW) +
               (isTrue(ctx.form.state().NeedsCalculation) ? " (not solved)" : "");
    });
}

// "SPulsedModeOn, generator rows programmed: 5": the procedure, and on the external path how many
// generator rows got through to their error check.
std::string applyEcho(const ApplyResult& result) {
    std::string echo = procedureName(result.procedure);
    if (result.procedure == ApplyProcedure::PulsedModeOn) {
        echo += ", generator rows programmed: " + std::to_string(result.generatorRows);
    } else if (result.procedure == ApplyProcedure::PulsedModeOff) {
        echo += ", generator rows switched off: " + std::to_string(result.generatorRows);
    }
    return echo;
}

Action parseApply(WordCursor&) {
    return plainAction("apply", [](ActionContext& ctx) {
        refuseIf(ctx.form.controls().click("b_apply"));
        // A failure has shown its message, which fails the action before this echo is printed.
        if (!ctx.form.lastApply()) throw ActionError("Apply did not run");
        return "apply -> " + applyEcho(*ctx.form.lastApply());
    });
}

Action parseShow(WordCursor&) {
    return plainAction("show", [](ActionContext& ctx) {
        ctx.out << mainFormJson(ctx.form) << '\n';
        return std::string();
    });
}

Action parseHelp(WordCursor&) {
    return plainAction("help", [](ActionContext& ctx) {
        refuseIf(ctx.form.controls().click("m_contents"));
        std::optional<HelpRequest> request = ctx.ui.takeHelpRequest();
        // Without a file the window has said why in a message, and that message is the failure.
        if (!request && ctx.ui.hasMessages()) return std::string();
        if (!request || request->file.empty()) {
            throw ActionError("the analyzer did not name a help file");
        }
        return "help -> " + request->file + " (topic " + std::to_string(request->topic) + ")";
    });
}

}  // namespace

const std::string& WordCursor::next(const std::string& action, const std::string& what) {
    if (atEnd()) throw ActionError(action + ": missing " + what);
    return words_[pos_++];
}

const std::vector<ActionKind>& actionTable() {
    static const std::vector<ActionKind> kTable = {
        {"set", "set FIELD [ROW] VALUE | set TOGGLE on|off", parseSet,
         "type VALUE into a field, or set a toggle\nFIELD: " + helpWords(false) +
             "\nTOGGLE: " + helpWords(true) + "\nVALUE: a number with a unit, e.g. 10k, 200us"},
        {"step", "step FIELD [ROW] up|down", parseStep,
         "one step of the field, as the arrow keys do"},
        {"calculate", "calculate", parseCalculate, "solve the timing"},
        {"apply", "apply", parseApply, "put the setup onto the instruments (or off)"},
        {"show", "show", parseShow, "print the main window state as JSON"},
        {"help", "help", parseHelp, "print the help file the analyzer reports"},
    };
    return kTable;
}

std::vector<Action> parseActions(const std::vector<std::string>& words) {
    std::vector<Action> actions;
    WordCursor cursor(words);
    while (!cursor.atEnd()) {
        const std::string& name = cursor.next("", "action");
        const ActionKind* kind = nullptr;
        for (const ActionKind& k : actionTable()) {
            if (k.name == name) kind = &k;
        }
        if (kind == nullptr) {
            std::string known;
            for (const ActionKind& k : actionTable()) known += (known.empty() ? "" : ", ") + k.name;
            throw ActionError("unknown action '" + name + "' (actions: " + known + ")");
        }
        actions.push_back(kind->parse(cursor));
    }
    return actions;
}

int runActions(const std::vector<Action>& actions, ActionContext& ctx, std::ostream& err) {
    int status = 0;
    for (const Action& action : actions) {
        std::string failure;
        std::string echo;
        ctx.ui.takeMessages();
        try {
            echo = action.run(ctx);
        } catch (const InstrumentError& e) {
            failure = "analyzer error: " + e.description();
        } catch (const std::exception& e) {
            failure = e.what();
        }
        std::vector<std::string> messages = ctx.ui.takeMessages();
        if (failure.empty() && action.messageFails && !messages.empty()) {
            for (const std::string& m : messages) failure += (failure.empty() ? "" : "; ") + m;
        }
        if (failure.empty() && !echo.empty()) ctx.out << echo << '\n';
        bool lost = false;
        if (failure.empty()) {
            failure = lostOutput(ctx);
            lost = !failure.empty();
        }
        if (!failure.empty()) {
            ctx.out.flush();
            err << "zentra-pulse-cli: " << action.words << ": "
                << ConsoleInteraction::oneLine(failure) << '\n';
            status = 1;
            // Lost output would stay lost for every later action.
            if (!ctx.keepGoing || lost) return status;
        }
    }
    return status;
}

std::string lostOutput(ActionContext& ctx) {
    // Flushed action by action, so a script reading along sees each echo as it happens.
    if (!ctx.out.flush()) return "cannot write the output";
    if (ctx.trace != nullptr && ctx.trace->fileFailed()) return "cannot write the I/O trace file";
    return {};
}

}  // namespace zp::app
