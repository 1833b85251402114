// The main window's JSON view: valid JSON, keyed by control name, exact texts and numbers.

#include <cctype>
#include <cmath>
#include <map>
#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "form_fixture.h"
#include "forms/json_writer.h"
#include "forms/main_form_json.h"

namespace zp::test {
namespace {

// A strict reader for what the tests look at; it fails the test on anything that is not JSON.
struct Json {
    std::variant<std::nullptr_t, bool, double, std::string, std::vector<Json>,
                 std::map<std::string, Json>>
        v;
    const Json& operator[](const std::string& k) const {
        return std::get<std::map<std::string, Json>>(v).at(k);
    }
    const Json& operator[](std::size_t i) const { return std::get<std::vector<Json>>(v).at(i); }
    double num() const { return std::get<double>(v); }
    const std::string& str() const { return std::get<std::string>(v); }
    bool boolean() const { return std::get<bool>(v); }
    std::size_t size() const { return std::get<std::vector<Json>>(v).size(); }
};

class Reader {
  public:
    explicit Reader(const std::string& t) : t_(t) {}
    Json document() {
        Json j = value();
        blanks();
        if (i_ != t_.size()) fail("text after the value");
        return j;
    }

  private:
    [[noreturn]] void fail(const std::string& why) {
        throw std::runtime_error(why + " at " + std::to_string(i_));
    }
    void blanks() {
        while (i_ < t_.size() && std::isspace(static_cast<unsigned char>(t_[i_]))) ++i_;
    }
    bool eat(char c) {
        blanks();
        if (i_ < t_.size() && t_[i_] == c) return ++i_, true;
        return false;
    }
    void expect(char c) {
        if (!eat(c)) fail(std::string("expected ") + c);
    }
    bool word(const char* w) {
        const std::string s(w);
        if (t_.compare(i_, s.size(), s) != 0) return false;
        i_ += s.size();
        return true;
    }
    std::string string() {
        expect('"');
        std::string out;
        while (i_ < t_.size() && t_[i_] != '"') {
            char c = t_[i_++];
            if (static_cast<unsigned char>(c) < 0x20) fail("raw control character");
            if (c == '\\') {
                c = t_.at(i_++);
                if (c == 'n')
                    c = '\n';
                else if (c == 'r')
                    c = '\r';
                else if (c == 't')
                    c = '\t';
                else if (c == 'u') {
                    c = static_cast<char>(std::stoi(t_.substr(i_, 4), nullptr, 16));
                    i_ += 4;
                } else if (c != '"' && c != '\\' && c != '/')
                    fail("bad escape");
            }
            out += c;
        }
        expect('"');
        return out;
    }
    Json value() {
        blanks();
        if (i_ >= t_.size()) fail("missing value");
        const char c = t_[i_];
        if (c == '{') {
            ++i_;
            std::map<std::string, Json> members;
            if (!eat('}')) {
                do {
                    blanks();
                    std::string k = string();
                    if (members.count(k)) fail("duplicate key " + k);
                    expect(':');
                    members[k] = value();
                } while (eat(','));
                expect('}');
            }
            return {members};
        }
        if (c == '[') {
            ++i_;
            std::vector<Json> items;
            if (!eat(']')) {
                do items.push_back(value());
                while (eat(','));
                expect(']');
            }
            return {items};
        }
        if (c == '"') return {string()};
        if (word("true")) return {true};
        if (word("false")) return {false};
        if (word("null")) return {nullptr};
        std::size_t used = 0;
        const double d = std::stod(t_.substr(i_, 40), &used);
        if (used == 0 || c == '+' || c == '.') fail("bad number");
        i_ += used;
        return {d};
    }
    const std::string& t_;
    std::size_t i_ = 0;
};

Json read(const std::string& text) {
    return Reader(text).document();
}

using MainFormJson = FormTest;

TEST_F(MainFormJson, ControlsAreKeyedByName) {
    const Json j = read(mainFormJson(form));
    EXPECT_EQ(j["f_PulsedZentra"]["caption"].str(), "Veltrix Zentra Pulse Application");
    EXPECT_EQ(j["f_PulsedZentra"]["height"].num(), 7240);
    EXPECT_EQ(j["VexoEdit_prf"]["value"].num(), 5000);
    EXPECT_TRUE(j["VexoEdit_prf"]["enabled"].boolean());
    EXPECT_EQ(j["VexoEdit_prf"]["text"].str(), form.VexoEdit_prf.displayText());
    EXPECT_EQ(j["VexoEdit_pri"]["value"].num(), 0.0002);
    ASSERT_EQ(j["VexoEdit_width"].size(), 5u);
    EXPECT_EQ(j["VexoEdit_width"][3]["value"].num(), 1e-6);
    EXPECT_EQ(j["lbl_gate"][0].str(), "Source Modulation :");
    EXPECT_EQ(j["b_apply"]["caption"].str(), "Apply");
    EXPECT_FALSE(j["b_apply"]["enabled"].boolean());
    EXPECT_EQ(j["chk_FixedPRF"]["value"].num(), 1);
    EXPECT_EQ(j["m_NoSWGating"]["caption"].str(), "No &SW Gating");
    EXPECT_FALSE(j["m_NoSWGating"]["checked"].boolean());
    EXPECT_TRUE(j["m_PulseConfig"]["visible"].boolean());
    EXPECT_EQ(j["frm_gates"]["height"].num(), 2535);
}

TEST_F(MainFormJson, StateCarriesTheSetupAndFullPrecision) {
    load(fourPortThreeSources());
    form.VexoEdit_delay[5].setValue(9.444444444444445e-6);
    const Json j = read(mainFormJson(form));
    const Json& s = j["state"];
    EXPECT_TRUE(s["NeedsCalculation"].boolean());
    EXPECT_TRUE(s["Is4PortMultiSrc"].boolean());
    EXPECT_EQ(s["NumOutputs"].num(), 6);
    EXPECT_EQ(s["UseInternalPG"].num(), 1);
    EXPECT_EQ(s["ReceiverNames"].size(), 8u);
    EXPECT_EQ(s["ReceiverNames"][4].str(), "R1");
    EXPECT_EQ(s["ReceiverGains"][7].num(), 3);
    EXPECT_EQ(s["PGTable"].size(), 6u);
    EXPECT_EQ(s["PGTable"][0].size(), 9u);
    EXPECT_EQ(j["VexoEdit_delay"][5]["value"].num(), 9.444444444444445e-6);
    EXPECT_EQ(j["lbl_gate"][5].str(), "R IF Gate :");
    EXPECT_EQ(j["f_PulsedZentra"]["height"].num(), 7600);
}

TEST_F(MainFormJson, TextsAreEscaped) {
    ASSERT_EQ(form.VexoEdit_prf.enter(100000), std::nullopt);
    form.VexoEdit_width[1].setValue(1.25e-6);
    form.b_calculate_Click();
    form.lbl_gate[2].caption = "Q\"uote\\ \t\x01";
    const std::string text = mainFormJson(form);
    const Json j = read(text);
    EXPECT_EQ(j["lbl_DutyCycle"]["caption"].str(), form.lbl_DutyCycle.caption);
    EXPECT_NE(text.find("A IF Gate :12.5%\\n"), std::string::npos);
    EXPECT_EQ(j["lbl_gate"][2].str(), "Q\"uote\\ \t\x01");
    EXPECT_NE(text.find("\\u0001"), std::string::npos);
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
