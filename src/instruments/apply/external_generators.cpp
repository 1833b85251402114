// The external two-output pulse generators: one table row is one output of one generator.

#include <algorithm>
#include <string>
#include <vector>

#include "core/numeric.h"
#include "instruments/apply/apply_procedures.h"
#include "instruments/apply/apply_steps.h"

namespace zp {

void SInitPulseGenerator(GeneratorSession& session, const GeneratorDescriptor& generator,
                         int output, bool isMaster) {
    const std::string n = std::to_string(output);
    session.write(generator, "*CLS");
    session.write(generator, ":OUTP" + n + ":POL NORM");
    session.write(generator, ":HOLD VOLT");
    session.write(generator, ":VOLT" + n + ":HIGH 2.5");
    session.write(generator, ":VOLT" + n + ":LOW 0");
    if (isMaster) {
        session.write(generator, ":TRIG:SOUR INT2");
        session.write(generator, ":ARM:SOUR IMM");
        session.write(generator, ":SOUR:ROSC:SOUR EXT");
        session.write(generator, ":SOUR:ROSC:EXT:FREQ 10MHZ");
    } else {
        session.write(generator, ":ARM:SOUR EXT");
    }
}

namespace apply {

namespace {

// The commands that follow the initialisation of a row, in the order they are sent. Entry values
// keep 15 significant digits, the single-precision levels 7.
std::vector<std::string> rowCommands(const PGRow& row, const ApplyEntries& entries, int rowIndex) {
    const std::string n = std::to_string(row.gateOutput);
    std::vector<std::string> commands = {
        ":VOLT" + n + ":HIGH " + singleText(row.highLevel),
        ":VOLT" + n + ":LOW " + singleText(row.lowLevel),
        ":OUTP" + n + ":IMP:EXT " + std::to_string(row.loadImpedance),
    };
    if (row.complement == kChecked) commands.push_back(":OUTP" + n + ":POL INV");
    commands.push_back(":SOUR:FREQ " + generalText(entries.prf));
    commands.push_back(":SOUR:PULS:WIDT" + n + " " +
                       generalText(entryAt(entries.widths, rowIndex, "width")));
    commands.push_back(":SOUR:PULS:DEL" + n + " " +
                       generalText(entryAt(entries.delays, rowIndex, "delay")));
    commands.push_back(":OUTP" + n + ":STAT ON");
    return commands;
}

}  // namespace

void programExternalGenerators(AnalyzerFrame& frame, const ApplySnapshot& snapshot,
                               ApplyResult& result) {
    const PulsedModule& state = snapshot.state;
    // A generator that carries several rows is preset once, by its first enabled row.
    std::vector<std::int16_t> presets(static_cast<std::size_t>(std::max<int>(0, state.NumOutputs)),
                                      0);
    int masterAddress = 0;
    forEachEnabledGenerator(
        frame, state, result, [&](int i, const PGRow& row, const GeneratorDescriptor& generator) {
            if (std::find(presets.begin(), presets.end(), row.gpibAddress) == presets.end()) {
                frame.runStep([&] { frame.generators().write(generator, ":SYST:PRES"); });
                presets[static_cast<std::size_t>(i)] = row.gpibAddress;
            }
            // A row of the master's generator that comes before the master row is a slave.
            const bool master = isTrue(row.master) || row.gpibAddress == masterAddress;
            if (master) masterAddress = row.gpibAddress;
            frame.runStep([&] {
                SInitPulseGenerator(frame.generators(), generator, row.gateOutput, master);
            });

            std::vector<std::string> commands;
            frame.runStep([&] { commands = rowCommands(row, snapshot.entries, i); });
            for (const std::string& command : commands) {
                frame.runStep([&] { frame.generators().write(generator, command); });
            }
        });
}

}  // namespace apply
}  // namespace zp
