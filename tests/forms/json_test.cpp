// The main window's JSON view: keyed by control name, exact texts and numbers, balanced.

#include <algorithm>
#include <cmath>
#include <string>

#include "form_fixture.h"
#include "forms/json_writer.h"
#include "forms/main_form_json.h"

namespace zp::test {
namespace {

// Brackets balance outside strings and no raw control character stands inside one.
::testing::AssertionResult wellFormed(const std::string& text) {
    std::string open;
    bool inString = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (inString) {
            if (static_cast<unsigned char>(c) < 0x20)
                return ::testing::AssertionFailure() << "raw control character at " << i;
            if (c == '\\') ++i;
            if (c == '"') inString = false;
        } else if (c == '"') {
            inString = true;
        } else if (c == '{' || c == '[') {
            open += c == '{' ? '}' : ']';
        } else if (c == '}' || c == ']') {
            if (open.empty() || open.back() != c)
                return ::testing::AssertionFailure() << "unbalanced " << c << " at " << i;
            open.pop_back();
        }
    }
    if (inString || !open.empty()) return ::testing::AssertionFailure() << "unclosed text";
    return ::testing::AssertionSuccess();
}

class MainFormJson : public FormTest {
  protected:
    void expectHas(const std::string& text, const std::vector<std::string>& fragments) {
        for (const std::string& f : fragments) EXPECT_NE(text.find(f), std::string::npos) << f;
    }
};

TEST_F(MainFormJson, ControlsAreKeyedByNameOnePerLine) {
    const std::string text = mainFormJson(form);
    ASSERT_TRUE(wellFormed(text));
    EXPECT_EQ(text.rfind("{\n \"f_PulsedZentra\": {\"caption\": \"Veltrix Zentra Pulse "
                         "Application\", \"width\": 5400, \"height\": 7240},\n",
                         0),
              0u);
    expectHas(
        text,
        {
            "\n \"VexoEdit_prf\": {\"value\": 5000, \"enabled\": true, \"text\": \"5 kHz\", "
            "\"lower\": 0.001, \"upper\": 1.65e+08},\n",
            "\n \"b_apply\": {\"caption\": \"Apply\", \"enabled\": false, \"visible\": true, "
            "\"left\": 1320, \"top\": 300, \"width\": 975, \"height\": 375},\n",
            "\n \"chk_FixedPRF\": {\"caption\": \"Fixed PRF\", \"value\": 1, \"enabled\": true, ",
            "\n \"m_NoSWGating\": {\"caption\": \"No &SW Gating\", \"checked\": false, "
            "\"enabled\": "
            "true, \"visible\": true},\n",
            "\n \"lbl_gate\": [\"Source Modulation :\", \"A IF Gate :\", \"B IF Gate :\", \"R1 IF "
            "Gate :\", \"R2 IF Gate :\"],\n",
            "\n \"VexoEdit_width\": [{\"value\": 1e-06, \"enabled\": true, \"text\": \"1 usec\", ",
        });
    EXPECT_EQ(text.substr(text.size() - 4), "}\n}\n");
}

TEST_F(MainFormJson, StateCarriesTheSetupAndFullPrecision) {
    load(fourPortThreeSources());
    form.VexoEdit_delay[5].setValue(9.444444444444445e-6);
    const std::string text = mainFormJson(form);
    ASSERT_TRUE(wellFormed(text));
    expectHas(text,
              {"\"Is4PortMultiSrc\": true, ", "\"NeedsCalculation\": true, ",
               "\"UseInternalPG\": 1, ", "\"NumOutputs\": 6, ",
               "\"ReceiverNames\": [\"A\", \"B\", \"C\", \"D\", \"R1\", \"R2\", \"R3\", "
               "\"R4\"], ",
               "\"ReceiverGains\": [3, 3, 3, 3, 3, 3, 3, 3], ",
               "{\"value\": 9.444444444444445e-06, ", "\"R IF Gate :\"]", "\"height\": 7600}"});
    // Six table rows of nine cells.
    const auto table = text.find("\"PGTable\": [[");
    ASSERT_NE(table, std::string::npos);
    const std::string rows = text.substr(table, text.find("]]", table) - table);
    EXPECT_EQ(std::count(rows.begin(), rows.end(), '['), 7);
    EXPECT_EQ(std::count(rows.begin(), rows.end(), ','), 6 * 8 + 5);
}

TEST_F(MainFormJson, TextsAreEscaped) {
    typePrf(100000);
    form.VexoEdit_width[1].setValue(1.25e-6);
    form.b_calculate_Click();
    form.lbl_gate[2].caption = "Q\"uote\\ \t\x01";
    const std::string text = mainFormJson(form);
    ASSERT_TRUE(wellFormed(text));
    expectHas(text, {"A IF Gate :12.5%\\n", "\"Q\\\"uote\\\\ \\t\\u0001\""});
}

TEST(JsonWriter, NonFiniteNumbersBecomeNull) {
    JsonWriter w;
    w.beginArray();
    w.value(std::nan(""));
    w.value(HUGE_VAL);
    w.value(-0.5);
    w.endArray();
    EXPECT_EQ(w.text(), "[\n null,\n null,\n -0.5\n]");
}

TEST(JsonWriter, MisuseIsRefused) {
    JsonWriter w;
    EXPECT_THROW(w.key("x"), std::logic_error);
    w.beginObject();
    EXPECT_THROW(w.endArray(), std::logic_error);  // would leave an unbalanced text
}

}  // namespace
}  // namespace zp::test
