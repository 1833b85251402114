#include "cli_actions.h"

#include <charconv>
#include <sstream>
#include <utility>

#include "core/numeric.h"
#include "forms/main_form_json.h"
#include "instruments/instrument_error.h"

namespace zp::app {
namespace {

enum class FieldKind { Prf, Pri, Ifbw, Width, Delay };

struct FieldRef {
    FieldKind kind;
    std::string name;  // as typed
    int row = -1;      // width and delay only
};

enum class ToggleKind { FixedPrf, Converter, NoPg, NoSwGating, Pulsed };

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

std::optional<FieldKind> fieldKind(const std::string& name) {
    static const std::pair<const char*, FieldKind> kFields[] = {{"prf", FieldKind::Prf},
                                                                {"pri", FieldKind::Pri},
                                                                {"ifbw", FieldKind::Ifbw},
                                                                {"width", FieldKind::Width},
                                                                {"delay", FieldKind::Delay}};
    for (const auto& [text, kind] : kFields) {
        if (name == text) return kind;
    }
    return std::nullopt;
}

// Takes a field name and, for width and delay, its row.
std::optional<FieldRef> takeField(WordCursor& words, const std::string& action) {
    std::optional<FieldKind> kind = fieldKind(words.peek());
    if (!kind) return std::nullopt;
    FieldRef ref{*kind, words.next(action, "FIELD"), -1};
    if (ref.kind == FieldKind::Width || ref.kind == FieldKind::Delay) {
        ref.row = parseRow(action + " " + ref.name, words.next(action + " " + ref.name, "ROW"));
    }
    return ref;
}

EntryField& fieldOf(MainForm& form, const FieldRef& ref) {
    switch (ref.kind) {
        case FieldKind::Prf:
            return form.VexoEdit_prf;
        case FieldKind::Pri:
            return form.VexoEdit_pri;
        case FieldKind::Ifbw:
            return form.VexoEdit_IFBW;
        case FieldKind::Width:
        case FieldKind::Delay:
            break;
    }
    if (ref.row >= form.rowCount()) {
        throw ActionError("row " + std::to_string(ref.row) + " does not exist (rows 0 to " +
                          std::to_string(form.rowCount() - 1) + " on this analyzer)");
    }
    auto& fields = ref.kind == FieldKind::Width ? form.VexoEdit_width : form.VexoEdit_delay;
    return fields[static_cast<std::size_t>(ref.row)];
}

// The value in the field's base unit, e.g. "12340 Hz" or "2e-06 sec".
std::string baseText(const EntryField& field) {
    std::string text = generalText(field.value());
    if (!field.units().empty() && field.units().front().name != ".") {
        text += ' ' + field.units().front().name;
    }
    return text;
}

std::string menuCaption(const MenuEntry& entry) {
    std::string text;
    for (char c : entry.caption) {
        if (c != '&') text += c;
    }
    return text;
}

void setToggle(MainForm& form, ToggleKind kind, bool on) {
    switch (kind) {
        case ToggleKind::FixedPrf:
            if (!form.chk_FixedPRF.enabled) throw ActionError("Fixed PRF is disabled");
            form.setFixedPRF(on);
            if (form.chk_FixedPRF.checked() != on) throw ActionError("Fixed PRF did not change");
            return;
        case ToggleKind::Pulsed:
            if (!form.chk_pulsed.enabled) throw ActionError("Pulsed Mode On is disabled");
            form.chk_pulsed.value = on ? kChecked : kUnchecked;
            form.chk_pulsed_Click();
            return;
        case ToggleKind::Converter:
        case ToggleKind::NoPg:
        case ToggleKind::NoSwGating:
            break;
    }
    MenuEntry& entry = kind == ToggleKind::Converter ? form.m_ConverterMeas
                       : kind == ToggleKind::NoPg    ? form.m_NoPG
                                                     : form.m_NoSWGating;
    if (!entry.enabled || !entry.visible) {
        throw ActionError(menuCaption(entry) + " is not available on this analyzer");
    }
    if (entry.checked == on) return;
    if (kind == ToggleKind::Converter) form.m_ConverterMeas_Click();
    if (kind == ToggleKind::NoPg) form.m_NoPG_Click();
    if (kind == ToggleKind::NoSwGating) form.m_NoSWGating_Click();
    if (entry.checked != on) throw ActionError(menuCaption(entry) + " did not change");
}

Action parseSet(WordCursor& words) {
    const std::string& what = words.next("set", "FIELD");
    if (words.atEnd()) throw ActionError("set " + what + ": missing value");
    static const std::pair<const char*, ToggleKind> kToggles[] = {
        {"fixedprf", ToggleKind::FixedPrf},
        {"converter", ToggleKind::Converter},
        {"nopg", ToggleKind::NoPg},
        {"noswgating", ToggleKind::NoSwGating},
        {"pulsed", ToggleKind::Pulsed}};
    for (const auto& [text, kind] : kToggles) {
        if (what != text) continue;
        const std::string word = words.next("set " + what, "on|off");
        const bool on = parseOnOff("set " + what, word);
        Action a;
        a.words = "set " + what + " " + word;
        a.run = [kind, on, echo = a.words](ActionContext& ctx) {
            setToggle(ctx.form, kind, on);
            return echo + " -> " + (on ? "on" : "off");
        };
        return a;
    }
    std::optional<FieldKind> kind = fieldKind(what);
    if (!kind) {
        throw ActionError("set: unknown field '" + what +
                          "' (prf, pri, ifbw, width, delay, fixedprf, converter, nopg, "
                          "noswgating, pulsed)");
    }
    std::optional<FieldRef> ref = FieldRef{*kind, what, -1};
    if (ref->kind == FieldKind::Width || ref->kind == FieldKind::Delay) {
        ref->row = parseRow("set " + what, words.next("set " + what, "ROW"));
    }
    const std::string value = words.next("set " + what, "VALUE");
    Action a;
    a.words = "set " + what + (ref->row >= 0 ? " " + std::to_string(ref->row) : "") + " " + value;
    a.run = [field = *ref, value, echo = a.words](ActionContext& ctx) {
        EntryField& f = fieldOf(ctx.form, field);
        if (std::optional<std::string> reason = f.enterText(value)) throw ActionError(*reason);
        return echo + " -> " + baseText(f);
    };
    return a;
}

Action parseStep(WordCursor& words) {
    if (words.atEnd()) throw ActionError("step: missing FIELD");
    std::optional<FieldRef> ref = takeField(words, "step");
    if (!ref) {
        throw ActionError("step: unknown field '" + words.peek() +
                          "' (prf, pri, ifbw, width ROW, delay ROW)");
    }
    const std::string word = words.next("step " + ref->name, "up|down");
    if (word != "up" && word != "down") {
        throw ActionError("step " + ref->name + ": expected up or down, not '" + word + "'");
    }
    Action a;
    a.words =
        "step " + ref->name + (ref->row >= 0 ? " " + std::to_string(ref->row) : "") + " " + word;
    a.run = [field = *ref, direction = word == "up" ? 1 : -1, echo = a.words](ActionContext& ctx) {
        EntryField& f = fieldOf(ctx.form, field);
        if (std::optional<std::string> reason = f.step(direction)) throw ActionError(*reason);
        return echo + " -> " + baseText(f);
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
        ctx.form.b_calculate_Click();
        return "calculate -> PRF " + baseText(ctx.form.VexoEdit_prf) + ", IF bandwidth " +
               baseText(ctx.form.VexoEdit_IFBW) +
               (isTrue(ctx.form.state().NeedsCalculation) ? " (not solved)" : "");
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
        ctx.form.m_contents_Click();
        std::optional<ConsoleInteraction::HelpRequest> request = ctx.ui.takeHelpRequest();
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
         "type VALUE into a field, or set a toggle\n"
         "FIELD: prf|pri|ifbw|width ROW|delay ROW\n"
         "TOGGLE: fixedprf|converter|nopg|noswgating|pulsed\n"
         "VALUE: a number with a unit, e.g. 10k, 200us"},
        {"step", "step FIELD [ROW] up|down", parseStep,
         "one step of the field, as the arrow keys do"},
        {"calculate", "calculate", parseCalculate, "solve the timing"},
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
        if (failure.empty()) failure = lostOutput(ctx);
        if (!failure.empty()) {
            ctx.out.flush();
            err << "zentra-pulse-cli: " << action.words << ": "
                << ConsoleInteraction::oneLine(failure) << '\n';
            return 1;
        }
    }
    return 0;
}

std::string lostOutput(ActionContext& ctx) {
    // Flushed action by action, so a script reading along sees each echo as it happens.
    if (!ctx.out.flush()) return "cannot write the output";
    if (ctx.trace != nullptr && ctx.trace->fileFailed()) return "cannot write the I/O trace file";
    return {};
}

}  // namespace zp::app
