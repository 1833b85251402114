#include "forms/main_form_json.h"

#include <string_view>
#include <variant>

#include "forms/json_writer.h"
#include "forms/main_form.h"

namespace zp {

namespace {

// One "name": value member.
template <typename T>
void member(JsonWriter& w, std::string_view name, const T& v) {
    w.key(name);
    w.value(v);
}

void geometry(JsonWriter& w, const Geometry& g) {
    member(w, "left", g.left);
    member(w, "top", g.top);
    member(w, "width", g.width);
    member(w, "height", g.height);
}

// The members every control shares, then its own ones, then where it sits.
template <typename Extra>
void controlObject(JsonWriter& w, const Control& c, Extra extra, bool withGeometry = true) {
    w.key(c.name);
    w.beginObject();
    member(w, "caption", c.caption);
    extra();
    member(w, "enabled", c.enabled);
    member(w, "visible", c.visible);
    if (withGeometry) geometry(w, c.geometry);
    w.endObject();
}

void control(JsonWriter& w, const Control& c) {
    controlObject(w, c, [] {});
}

void checkBox(JsonWriter& w, const CheckBox& c) {
    controlObject(w, c, [&] { member(w, "value", static_cast<int>(c.value)); });
}

void menu(JsonWriter& w, const MenuEntry& m) {
    controlObject(
        w, m, [&] { member(w, "checked", m.checked); }, false);
}

void fieldBody(JsonWriter& w, const EntryField& f) {
    w.beginObject();
    member(w, "value", f.value());
    member(w, "enabled", f.enabled());
    member(w, "text", f.displayText());
    member(w, "lower", f.lower());
    member(w, "upper", f.upper());
    w.endObject();
}

void field(JsonWriter& w, const EntryField& f) {
    w.key(f.name());
    fieldBody(w, f);
}

void rowFields(JsonWriter& w, const char* name, const std::vector<EntryField>& rows) {
    w.key(name);
    w.beginArray();
    for (const EntryField& f : rows) fieldBody(w, f);
    w.endArray();
}

void flag(JsonWriter& w, const char* name, Bool16 v) {
    member(w, name, isTrue(v));
}

void number(JsonWriter& w, const char* name, double v) {
    member(w, name, v);
}

template <typename Int>
void whole(JsonWriter& w, const char* name, Int v) {
    member(w, name, static_cast<std::int64_t>(v));
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
    w.key(f.f_PulsedZentra.name);
    w.beginObject();
    member(w, "caption", f.f_PulsedZentra.caption);
    member(w, "width", f.f_PulsedZentra.geometry.width);
    member(w, "height", f.f_PulsedZentra.geometry.height);
    w.endObject();

    control(w, f.frm_PulsedParams);
    control(w, f.lbl_prf);
    field(w, f.VexoEdit_prf);
    control(w, f.lbl_pri);
    field(w, f.VexoEdit_pri);
    control(w, f.lbl_ifbw);
    field(w, f.VexoEdit_IFBW);
    checkBox(w, f.chk_FixedPRF);

    control(w, f.frm_gates);
    control(w, f.lbl_width);
    control(w, f.lbl_delay);
    w.key("lbl_gate");
    w.beginArray();
    for (const Control& label : f.lbl_gate) w.value(label.caption);
    w.endArray();
    rowFields(w, "VexoEdit_width", f.VexoEdit_width);
    rowFields(w, "VexoEdit_delay", f.VexoEdit_delay);

    control(w, f.frm_DutyCycle);
    control(w, f.lbl_DutyCycle);
    control(w, f.frm_pulsed);
    control(w, f.b_calculate);
    control(w, f.b_apply);
    checkBox(w, f.chk_pulsed);
    for (const Control* b : {&f.b_PulseProfile, &f.b_recall, &f.b_save, &f.b_min, &f.b_close})
        control(w, *b);

    for (const MenuEntry* m :
         {&f.m_Config, &f.m_ConfigPG, &f.m_ConfigRx, &f.m_ConverterMeas, &f.m_NoPG, &f.m_NoSWGating,
          &f.m_View, &f.m_PulseProfile, &f.m_PulseConfig, &f.m_help, &f.m_contents, &f.m_about})
        menu(w, *m);

    state(w, f.state());
    w.endObject();
    return w.text() + "\n";
}

}  // namespace zp
