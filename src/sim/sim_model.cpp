#include "sim/sim_model.h"

namespace zp::sim {

const std::vector<SimModel>& simModels() {
    static const std::vector<SimModel> models = {
        {"kt622", "KT622A", "K71 M81", 2, 1, "5", 10e6, 26.5e9},
        {"kt633", "KT633A", "K72 M81 M82", 2, 2, "4", 10e6, 43.5e9},
        {"kt644", "KT644A", "K71", 4, 1, "5", 10e6, 26.5e9},
        {"kt655", "KT655A", "K71 M83 M84", 4, 3, "5.0", 10e6, 50e9},
        {"kt611", "KT611A", "", 2, 1, "4", 10e6, 13.5e9},
        {"zx20-j55", "ZX20", "J55", 2, 1, "4", 45e6, 20e9},
        {"zx20", "ZX20", "", 2, 1, "4", 45e6, 20e9},
    };
    return models;
}

const SimModel* findSimModel(std::string_view name) {
    for (const auto& model : simModels()) {
        if (model.name == name) return &model;
    }
    return nullptr;
}

}  // namespace zp::sim
