#include "sim/analyzer/sim_call.h"

namespace zp::sim {

namespace trace_text {

namespace {

template <class T, class Format>
std::string braced(const std::vector<T>& values, Format format) {
    std::string text = "{";
    for (std::size_t i = 0; i < values.size(); ++i) {
        if (i > 0) text += ", ";
        text += format(values[i]);
    }
    return text + "}";
}

}  // namespace

std::string of(const std::vector<std::int32_t>& values) {
    return braced(values, [](std::int32_t value) { return std::to_string(value); });
}

std::string of(const std::vector<std::string>& values) {
    return braced(values, [](const std::string& value) { return IoTrace::quote(value); });
}

}  // namespace trace_text

std::string objectKind(std::string_view object) {
    return std::string(object.substr(0, object.find('[')));
}

std::string objectName(std::string_view kind, int channel) {
    return std::string(kind) + "[" + std::to_string(channel) + "]";
}

std::string objectName(std::string_view kind, int channel, std::string_view name) {
    return std::string(kind) + "[" + std::to_string(channel) + ":" + std::string(name) + "]";
}

}  // namespace zp::sim
