#pragma once
// One call on the simulated analyzer: locked, checked against the injected faults, and written to
// the I/O trace with its arguments and reply (or its error).

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include "core/numeric.h"
#include "instruments/io_trace.h"
#include "sim/analyzer/sim_analyzer_state.h"
#include "sim/analyzer/sim_errors.h"

namespace zp::sim::trace_text {

inline std::string of(std::string_view text) {
    return IoTrace::quote(text);
}
inline std::string of(const std::string& text) {
    return IoTrace::quote(text);
}
inline std::string of(const char* text) {
    return IoTrace::quote(text);
}
inline std::string of(double value) {
    return generalText(value);
}
inline std::string of(int value) {
    return std::to_string(value);
}
inline std::string of(bool value) {
    return value ? "true" : "false";
}
std::string of(const std::vector<std::int32_t>& values);
std::string of(const std::vector<std::string>& values);
template <class T>
std::string of(const std::unique_ptr<T>&) {
    return "";  // sub-objects show up in the trace by their own calls
}

// Arguments joined by ", ".
inline std::string args() {
    return "";
}
template <class First, class... Rest>
std::string args(const First& first, const Rest&... rest) {
    std::string text = of(first);
    ((text += ", " + of(rest)), ...);
    return text;
}

}  // namespace zp::sim::trace_text

namespace zp::sim {

// The object name without its "[...]" part, as faults name it.
std::string objectKind(std::string_view object);

// "Kind[channel]" and "Kind[channel:name]", as objects are written in the trace.
std::string objectName(std::string_view kind, int channel);
std::string objectName(std::string_view kind, int channel, std::string_view name);

template <class F>
auto simCall(SimAnalyzerState& state, const std::string& object, std::string_view operation,
             const std::string& arguments, F&& body) -> decltype(body()) {
    using Result = decltype(body());
    std::lock_guard lock(state.mutex());
    IoTrace* trace = state.trace();
    const std::string key = objectKind(object) + "." + std::string(operation);
    if (auto description = state.takeFault(key)) {
        if (trace) trace->analyzerError(object, operation, arguments, *description);
        throw analyzerError(*description);
    }
    try {
        if constexpr (std::is_void_v<Result>) {
            body();
            if (trace) trace->analyzerCall(object, operation, arguments, "");
        } else {
            Result result = body();
            if (trace) trace->analyzerCall(object, operation, arguments, trace_text::of(result));
            return result;
        }
    } catch (const InstrumentError& e) {
        if (trace) trace->analyzerError(object, operation, arguments, e.description());
        throw;
    }
}

}  // namespace zp::sim
