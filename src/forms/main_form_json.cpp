#include "forms/main_form_json.h"

#include <string_view>
#include <variant>

#include "forms/form_json.h"
#include "forms/json_writer.h"
#include "forms/main_form.h"

namespace zp {

namespace {

void flag(JsonWriter& w, const char* name, Bool16 v) {
    w.member(name, isTrue(v));
}

void number(JsonWriter& w, const char* name, double v) {
    w.member(name, v);
}

template <typename Int>
void whole(JsonWriter& w, const char* name, Int v) {
    w.member(name, static_cast<std::int64_t>(v));
}

template <typename T>
void list(JsonWriter& w, const char* name, const std::vector<T>& values) {
    w.key(name);
    w.beginArray();
    for (const T& v : values) {
        if constexpr (std::is_same_v<T, std::string>)
            w.value(v);
        else
            w.value(static_cast<std::int64_t>(v));
    }
    w.endArray();
}

void cell(JsonWriter& w, const PGCell& c) {
    std::visit(
        [&w](const auto& v) {
            using T = std::decay_t<decltype(v)>;
            if constexpr (std::is_same_v<T, std::monostate>)
                w.null();
            else if constexpr (std::is_same_v<T, std::string>)
                w.value(v);
            else if constexpr (std::is_floating_point_v<T>)
                w.value(static_cast<double>(v));
            else
                w.value(static_cast<std::int64_t>(v));
        },
        c);
}

void state(JsonWriter& w, const PulsedModule& s) {
    w.key("state");
    w.beginObject();
    flag(w, "IsListedModel", s.IsListedModel);
    flag(w, "Is2Port1Src", s.Is2Port1Src);
    flag(w, "Is2Port2Src", s.Is2Port2Src);
    flag(w, "Is4Port1Src", s.Is4Port1Src);
    flag(w, "Is4PortMultiSrc", s.Is4PortMultiSrc);
    flag(w, "HasClock100MHz", s.HasClock100MHz);
    flag(w, "HasInternalPG", s.HasInternalPG);
    flag(w, "HasInternalMod", s.HasInternalMod);
    flag(w, "HasModSource1", s.HasModSource1);
    flag(w, "HasModSource2", s.HasModSource2);
    flag(w, "HasInternalGates", s.HasInternalGates);
    whole(w, "UseInternalGates", s.UseInternalGates);
    whole(w, "UseInternalPG", s.UseInternalPG);
    whole(w, "UseInternalMod", s.UseInternalMod);
    flag(w, "FixedPRF", s.FixedPRF);
    flag(w, "NeedsCalculation", s.NeedsCalculation);
    number(w, "PRF", s.PRF);
    number(w, "IFBW", s.IFBW);
    whole(w, "IFBWHz", s.IFBWHz);
    number(w, "ConverterDelay", s.ConverterDelay);
    number(w, "SolvedFreqOffset", s.SolvedFreqOffset);
    whole(w, "SolvedIFCount", s.SolvedIFCount);
    number(w, "PulseClockHz", s.PulseClockHz);
    number(w, "IntSolveTime1", s.IntSolveTime1);
    number(w, "IntSolveTime2", s.IntSolveTime2);
    list(w, "IntSolveList1", s.IntSolveList1);
    list(w, "IntSolveList2", s.IntSolveList2);
    list(w, "IntSolveList3", s.IntSolveList3);
    number(w, "GatedSolveTime1", s.GatedSolveTime1);
    number(w, "GatedSolveTime2", s.GatedSolveTime2);
    whole(w, "GatedSolveTicks", s.GatedSolveTicks);
    whole(w, "NumOutputs", s.NumOutputs);
    w.key("PGTable");
    w.beginArray();
    for (int row = 0; row < s.Table.rows(); ++row) {
        w.beginArray();
        for (int column = 0; column < PGColumnCount; ++column) cell(w, s.Table.cell(row, column));
        w.endArray();
    }
    w.endArray();
    list(w, "IntPGNames", s.IntPGNames);
    list(w, "ReceiverNames", s.ReceiverNames);
    list(w, "OutputNames", s.OutputNames);
    list(w, "RxPathNames", s.RxPathNames);
    list(w, "RxSolveValues", s.RxSolveValues);
    list(w, "ReceiverGains", s.ReceiverGains);
    list(w, "GainTable", s.GainTable);
    whole(w, "GainOffCode", s.GainOffCode);
    number(w, "ProfileStart", s.ProfileStart);
    number(w, "ProfileStop", s.ProfileStop);
    number(w, "ProfileStep", s.ProfileStep);
    number(w, "ProfileCWFreq", s.ProfileCWFreq);
    whole(w, "ProfileSrcPort", s.ProfileSrcPort);
    whole(w, "ProfileParam", s.ProfileParam);
    whole(w, "ProfileCoupled", s.ProfileCoupled);
    whole(w, "ProfileFormat", s.ProfileFormat);
    w.endObject();
}

}  // namespace

std::string mainFormJson(const MainForm& f) {
    JsonWriter w;
    w.beginObject();
    writeControls(w, f.controls());
    const AnalyzerStatus s = f.status();
    w.key("status");
    w.beginObject();
    w.member("model", s.model);
    w.member("options", s.options);
    w.member("simulated", s.simulated);
    w.member("needsCalculation", s.needsCalculation);
    w.member("text", s.text());
    w.endObject();
    state(w, f.state());
    w.endObject();
    return w.text() + "\n";
}

}  // namespace zp
