#pragma once
// Snapshots as the window takes them at Apply, a recording solver, and ways to read the trace.

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <initializer_list>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "core/pulsed_module.h"
#include "instruments/apply/apply_procedures.h"
#include "sim/sim_bench.h"

namespace zp::testing_support {

using Lines = std::vector<std::string>;

inline Lines join(std::initializer_list<Lines> parts) {
    Lines all;
    for (const Lines& p : parts) all.insert(all.end(), p.begin(), p.end());
    return all;
}

// The state a start-up on this simulated model gives, with a calculated timing and entries.
inline ApplySnapshot snapshotFor(std::string_view modelName) {
    const sim::SimModel& m = *sim::findSimModel(modelName);
    ApplySnapshot s;
    fillAtStartup(s.state, AnalyzerIdentity(m.modelText, m.optionText, Ports(m.ports),
                                            Sources(m.sources), m.hardwareValue));
    PulsedModule& st = s.state;
    st.PRF = 10000;
    st.IFBWHz = 2500;
    st.SolvedIFCount = 4;
    st.ConverterDelay = 6.2e-6;
    st.SolvedFreqOffset = 125;
    st.PulseClockHz = 1e8;
    st.IntSolveTime1 = 2500;
    st.IntSolveTime2 = 2400;
    st.IntSolveList1 = {4, 1};
    st.IntSolveList2 = {3, 2};
    st.IntSolveList3 = {7};
    st.GatedSolveTime1 = 1e-6;
    st.GatedSolveTime2 = 2e-6;
    st.GatedSolveTicks = 200;
    s.entries.prf = 10000;
    s.entries.ifbw = 2500;
    s.entries.widths.assign(static_cast<std::size_t>(st.NumOutputs), 1e-6);
    s.entries.delays.assign(static_cast<std::size_t>(st.NumOutputs), 0.0);
    s.autoGain = 1;
    return s;
}

inline void setEnabled(ApplySnapshot& s, std::initializer_list<int> enabledRows) {
    for (int r = 0; r < s.state.NumOutputs; ++r) {
        PGRow row = s.state.SReadRow(r);
        const bool on = std::find(enabledRows.begin(), enabledRows.end(), r) != enabledRows.end();
        row.enabled = on ? kChecked : kUnchecked;
        s.state.SWriteRow(r, row);
    }
}

template <class Change>
void changeRow(ApplySnapshot& s, int r, Change change) {
    PGRow row = s.state.SReadRow(r);
    change(row);
    s.state.SWriteRow(r, row);
}

// Answers SolveReceiver with the gate width in whole 10 ns and remembers what it was given.
class RecordingSolver : public TimingSolver {
  public:
    explicit RecordingSolver(std::vector<std::pair<double, double>>& calls) : calls_(calls) {}
    void SolveReceiver(double prf, double gateWidth, std::int16_t& rxValue) override {
        calls_.emplace_back(prf, gateWidth);
        rxValue = static_cast<std::int16_t>(std::lround(gateWidth / 1e-8));
    }

  private:
    ExternalSolution external(const ExternalRequest&) override { return {}; }
    InternalSolution internal(const InternalRequest&) override { return {}; }
    InternalSolution internalGated(const InternalRequest&, const GateWindow&) override {
        return {};
    }
    std::vector<std::pair<double, double>>& calls_;
};

// A hand-written expected trace in tests/instruments/expected/: one line each, "#" for a note.
inline Lines expectedLines(const std::string& name) {
    std::ifstream in(std::filesystem::path(__FILE__).parent_path() / "expected" / name);
    Lines out;
    for (std::string line; std::getline(in, line);) {
        if (line.rfind('#', 0) != 0) out.push_back(line);
    }
    return out;
}

// The trace lines that contain any of the parts.
inline Lines linesWith(const Lines& lines, std::initializer_list<std::string_view> parts) {
    Lines out;
    for (const std::string& l : lines) {
        for (std::string_view p : parts) {
            if (l.find(p) != std::string::npos) {
                out.push_back(l);
                break;
            }
        }
    }
    return out;
}

// Bus opens and writes in short form: "11 open", "11 :SYST:PRES" (replies left out).
inline Lines busWrites(const Lines& lines) {
    Lines out;
    for (const std::string& l : lines) {
        if (l.rfind("BUS ", 0) != 0 || l.find(" R \"") != std::string::npos) continue;
        const std::size_t sp = l.find(' ', 4);
        const std::string rest = l.substr(sp + 1);
        const bool write = rest.rfind("W \"", 0) == 0;  // quotes and "\n" dropped
        out.push_back(l.substr(4, sp - 4) + " " + (write ? rest.substr(3, rest.size() - 6) : rest));
    }
    return out;
}

// Path element values set, "IFGateA=Pulse2", and reads, "IFGateR1?", in trace order.
inline Lines elementSettings(const Lines& lines) {
    const std::string prefix = "ANA PathElement[1:";
    Lines out;
    for (const std::string& l : lines) {
        if (l.rfind(prefix, 0) != 0) continue;
        const std::string name = l.substr(prefix.size(), l.find(']') - prefix.size());
        const std::size_t q = l.find("(\"");
        out.push_back(q == std::string::npos ? name + "?"
                                             : name + "=" + l.substr(q + 2, l.size() - q - 4));
    }
    return out;
}

// The entries of elementSettings whose name contains any of the parts.
inline Lines settingsOf(const Lines& settings, std::initializer_list<std::string_view> parts) {
    Lines out;
    for (const std::string& s : settings) {
        const std::string name = s.substr(0, s.find_first_of("=?"));
        for (std::string_view p : parts) {
            if (name.find(p) != std::string::npos) {
                out.push_back(s);
                break;
            }
        }
    }
    return out;
}

// The frame's opening and normal end as the trace shows them.
inline const Lines kOpening = {"ANA Application.setUpdateSwitch(false)",
                               "ANA Application.currentChannel()",
                               "ANA Channel[1].beginChannelSetup(true)"};
inline const Lines kEnd = {"ANA Application.setUpdateSwitch(true)",
                           "ANA Channel[1].endChannelSetup()", "release Application"};
inline const Lines kBusEnd = {"ANA Application.setUpdateSwitch(true)",
                              "ANA Channel[1].endChannelSetup()", "release Bus",
                              "ANA Application.setBusSwitch(false)", "release Application"};

}  // namespace zp::testing_support
