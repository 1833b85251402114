#pragma once
// The simulated analyzer models: what each one reports and which hardware it has.

#include <string>
#include <string_view>
#include <vector>

namespace zp::sim {

struct SimModel {
    std::string name;  // "kt622", ... as given on the command line
    std::string modelText;
    std::string optionText;
    int ports = 2;
    int sources = 1;
    std::string hardwareValue;
    double minFrequency = 10e6;
    double maxFrequency = 26.5e9;
};

const std::vector<SimModel>& simModels();
const SimModel* findSimModel(std::string_view name);  // nullptr when unknown
inline constexpr const char* kDefaultModel = "kt622";

}  // namespace zp::sim
