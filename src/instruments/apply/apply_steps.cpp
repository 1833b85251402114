#include "instruments/apply/apply_steps.h"

namespace zp::apply {

namespace {

[[noreturn]] void refuse(std::string message) {
    throw InstrumentError(kOwnCheckError, std::move(message));
}

template <class List>
void checkIndex(const List& list, int index, const char* what) {
    if (index < 0 || static_cast<std::size_t>(index) >= list.size()) {
        refuse(std::string("There is no ") + what + " entry " + std::to_string(index) + " (" +
               std::to_string(list.size()) + " given).");
    }
}

}  // namespace

ApplyResult startResult(ApplyProcedure procedure, const ApplySnapshot& snapshot) {
    ApplyResult result;
    result.procedure = procedure;
    result.acceptedWidths.assign(
        static_cast<std::size_t>(std::max<int>(0, snapshot.state.NumOutputs)), std::nullopt);
    result.rxSolveValues = snapshot.state.RxSolveValues;
    return result;
}

double entryAt(const std::vector<double>& values, int row, const char* what) {
    checkIndex(values, row, what);
    return values[static_cast<std::size_t>(row)];
}

const std::string& nameAt(const std::vector<std::string>& names, int index, const char* what) {
    checkIndex(names, index, what);
    return names[static_cast<std::size_t>(index)];
}

std::int16_t valueAt(const std::vector<std::int16_t>& values, int index, const char* what) {
    checkIndex(values, index, what);
    return values[static_cast<std::size_t>(index)];
}

int internalGenerator(const PGRow& row, int rowIndex) {
    if (row.intPGOutput < 1 || row.intPGOutput > 4) {
        refuse("Table row " + std::to_string(rowIndex) + " names internal pulse generator " +
               std::to_string(row.intPGOutput) + "; the internal pulse generators are 1 to 4.");
    }
    return row.intPGOutput;
}

std::int16_t gainCode(std::int16_t code, const std::string& receiver) {
    if (code < 0 || code > 3) {
        refuse("Receiver " + receiver + " has gain code " + std::to_string(code) +
               "; the gain codes are 0 (Low), 1 (Medium), 2 (High) and 3 (Auto).");
    }
    return code;
}

double periodOf(double hz, const char* what) {
    if (!(hz > 0.0)) {
        refuse(std::string("The ") + what +
               " is not above 0 Hz, so it has no period; calculate the timing first.");
    }
    return 1.0 / hz;
}

std::string pulsedIfbwMessage(std::int32_t ifbwHz) {
    return "Pulsed IFBW setting is " + std::to_string(ifbwHz) + " Hz";
}

void showMessage(AnalyzerFrame& frame, const std::string& text) {
    frame.runStep([&] {
        const auto area = frame.application().messageArea();
        need(area, "MessageArea").setText(text);
    });
}

void setElement(PathConfiguration& path, const std::string& name, const std::string& value) {
    const auto element = path.element(name);
    if (!element) refuse("The analyzer has no path element \"" + name + "\".");
    element->setValue(value);
}

void InternalHardware::take(AnalyzerFrame& frame) {
    frame.runStep([&] { pulse = frame.channel().pulseGenerator(); });
    frame.runStep([&] { path = frame.channel().pathConfiguration(); });
    frame.runStep([&] { ifc = frame.channel().ifConfiguration(); });
    frame.runStep([&] { processing = frame.channel().signalProcessingModule(); });
}

void forEachEnabledGenerator(
    AnalyzerFrame& frame, const PulsedModule& state, ApplyResult& result,
    const std::function<void(int i, const PGRow& row, const GeneratorDescriptor& generator)>&
        program) {
    for (int i = 0; i < state.NumOutputs && !frame.failed(); ++i) {
        PGRow row;
        if (!frame.runStep([&] { row = state.SReadRow(i); })) continue;
        if (row.enabled <= 0) continue;

        GeneratorDescriptor generator{row.gpibAddress, -1};
        frame.runStep([&] { generator = frame.generators().open(row.gpibAddress); });
        frame.runStep([&] { frame.generators().checkIdentification(generator); });
        program(i, row, generator);
        if (frame.runStep([&] { frame.generators().checkErrorQueue(generator); })) {
            ++result.generatorRows;
        }
    }
}

}  // namespace zp::apply
