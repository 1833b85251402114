// The main window's JSON view: one line per control of the table in its order, then the status
// and the state; exact texts and numbers.

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <cmath>
#include <sstream>
#include <string>

#include "form_fixture.h"
#include "forms/json_writer.h"
#include "forms/main_form_json.h"

namespace zp::test {
namespace {

QJsonObject parsed(const std::string& text) {
    QJsonParseError error{};
    const QJsonDocument doc = QJsonDocument::fromJson(QByteArray::fromStdString(text), &error);
    EXPECT_EQ(error.error, QJsonParseError::NoError) << error.errorString().toStdString();
    return doc.object();
}

std::string str(const QJsonValue& v) {
    return v.toString().toStdString();
}

class MainFormJson : public FormTest {
  protected:
    void expectHas(const std::string& text, const std::vector<std::string>& fragments) {
        for (const std::string& f : fragments) EXPECT_NE(text.find(f), std::string::npos) << f;
    }
};

TEST_F(MainFormJson, OneLinePerControlInTableOrderThenStatusAndState) {
    const std::string text = mainFormJson(form);
    std::vector<std::string> expected;
    for (const auto& item : form.controls().items()) expected.push_back(item.name);
    expected.insert(expected.end(), {"status", "state"});
    std::vector<std::string> keys;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        if (line.rfind(" \"", 0) == 0) keys.push_back(line.substr(2, line.find('"', 2) - 2));
    }
    EXPECT_EQ(keys, expected);
    // The form scripts read, member by member.
    EXPECT_EQ(text.rfind("{\n \"f_PulsedZentra\": {\"caption\": \"Veltrix Zentra Pulse "
                         "Application\", \"width\": 5400, \"height\": 7240},\n",
                         0),
              0u);
    expectHas(text,
              {"\n \"VexoEdit_prf\": {\"value\": 5000, \"enabled\": true, \"text\": \"5 kHz\", "
               "\"lower\": 0.001, \"upper\": 1.65e+08},\n",
               "\n \"b_apply\": {\"caption\": \"Apply\", \"enabled\": false, \"visible\": true, "
               "\"left\": 1320, \"top\": 300, \"width\": 975, \"height\": 375},\n",
               "\n \"chk_FixedPRF\": {\"caption\": \"Fixed PRF\", \"value\": 1, \"enabled\": "
               "true, ",
               "\n \"m_NoSWGating\": {\"caption\": \"No &SW Gating\", \"checked\": false, "
               "\"enabled\": true, \"visible\": true},\n",
               "\n \"status\": {\"model\": \"KT611A\", \"options\": \"\", \"simulated\": "
               "true, \"needsCalculation\": true, \"text\": \"KT611A (simulated) - Calculate "
               "needed\"},\n"});
    EXPECT_EQ(text.substr(text.size() - 4), "}\n}\n");

    const QJsonObject json = parsed(text);
    EXPECT_EQ(json["lbl_gate"].toArray().size(), 5);
    EXPECT_EQ(str(json["lbl_gate"][4]), "R2 IF Gate :");
    EXPECT_EQ(str(json["VexoEdit_width"][0]["text"]), "1 usec");
    EXPECT_EQ(json["VexoEdit_delay"][4]["upper"].toDouble(), 1.0);

    form.b_calculate_Click();
    const QJsonObject status = parsed(mainFormJson(form))["status"].toObject();
    EXPECT_FALSE(status["needsCalculation"].toBool());
    EXPECT_EQ(str(status["text"]), "KT611A (simulated) - Calculated");
}

TEST_F(MainFormJson, StateCarriesTheSetupAndFullPrecision) {
    load(kFourPortThreeSources);
    form.VexoEdit_delay[5].setValue(9.444444444444445e-6);
    const std::string text = mainFormJson(form);
    EXPECT_NE(text.find("{\"value\": 9.444444444444445e-06, "), std::string::npos);
    const QJsonObject json = parsed(text);
    const QJsonObject s = json["state"].toObject();
    EXPECT_TRUE(s["Is4PortMultiSrc"].toBool());
    EXPECT_TRUE(s["NeedsCalculation"].toBool());
    EXPECT_EQ(s["UseInternalPG"].toInt(), 1);
    EXPECT_EQ(s["NumOutputs"].toInt(), 6);
    EXPECT_EQ(s["ReceiverNames"].toArray(),
              QJsonArray({"A", "B", "C", "D", "R1", "R2", "R3", "R4"}));
    EXPECT_EQ(s["ReceiverGains"].toArray(), QJsonArray({3, 3, 3, 3, 3, 3, 3, 3}));
    EXPECT_EQ(json["VexoEdit_delay"][5]["value"].toDouble(), 9.444444444444445e-6);
    EXPECT_EQ(str(json["lbl_gate"][5]), "R IF Gate :");
    EXPECT_EQ(json["f_PulsedZentra"]["height"].toInt(), 7600);
    const QJsonArray table = s["PGTable"].toArray();
    ASSERT_EQ(table.size(), 6);
    for (const QJsonValue& row : table) EXPECT_EQ(row.toArray().size(), 9);
}

TEST_F(MainFormJson, TextsAreEscaped) {
    typePrf(100000);
    form.VexoEdit_width[1].setValue(1.25e-6);
    form.b_calculate_Click();
    form.lbl_gate[2].caption = "Q\"uote\\ \t\x01";
    const std::string text = mainFormJson(form);
    EXPECT_NE(text.find("\"Q\\\"uote\\\\ \\t\\u0001\""), std::string::npos);
    const QJsonObject json = parsed(text);
    EXPECT_EQ(str(json["lbl_gate"][2]), "Q\"uote\\ \t\x01");
    EXPECT_NE(str(json["lbl_DutyCycle"]["caption"]).find("\nA IF Gate :12.5%\n"),
              std::string::npos);
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
