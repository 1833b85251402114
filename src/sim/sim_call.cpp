#include "sim/sim_call.h"

namespace zp::sim {

namespace trace_text {

std::string of(const std::vector<std::int32_t>& values) {
    std::string text = "{";
    for (std::size_t i = 0; i < values.size(); ++i) {
        if (i > 0) text += ", ";
        text += std::to_string(values[i]);
    }
    return text + "}";
}

std::string of(const std::vector<std::string>& values) {
    std::string text = "{";
    for (std::size_t i = 0; i < values.size(); ++i) {
        if (i > 0) text += ", ";
        text += IoTrace::quote(values[i]);
    }
    return text + "}";
}

}  // namespace trace_text

std::string objectKind(std::string_view object) {
    return std::string(object.substr(0, object.find('[')));
}

}  // namespace zp::sim
