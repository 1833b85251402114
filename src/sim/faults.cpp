#include "sim/faults.h"

#include <cctype>
#include <charconv>
#include <stdexcept>
#include <string_view>

namespace zp::sim {

namespace {

constexpr const char* kAcceptedForms =
    "accepted forms: analyzer:Object.operation=DESCRIPTION, noidn:ADDR, generror:ADDR=ENTRY, "
    "timeout:ADDR, baddata";

[[noreturn]] void reject(const std::string& fault, const std::string& why) {
    throw std::invalid_argument("bad fault '" + fault + "' (" + why + "); " + kAcceptedForms);
}

int parseAddress(const std::string& fault, std::string_view text) {
    int address = -1;
    const auto* end = text.data() + text.size();
    const auto [ptr, ec] = std::from_chars(text.data(), end, address);
    if (text.empty() || ec != std::errc{} || ptr != end || address < 0 || address > 30) {
        reject(fault, "GPIB address must be a whole number 0 to 30");
    }
    return address;
}

bool isIdentifier(std::string_view text) {
    if (text.empty()) return false;
    for (const char c : text) {
        if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_') return false;
    }
    return true;
}

}  // namespace

void SimFaults::add(const std::string& fault) {
    const auto colon = fault.find(':');
    const std::string kind = fault.substr(0, colon);
    const std::string rest = colon == std::string::npos ? std::string() : fault.substr(colon + 1);

    if (kind == "baddata") {
        if (colon != std::string::npos) reject(fault, "baddata takes no argument");
        malformedData = true;
        return;
    }
    if (colon == std::string::npos) reject(fault, "unknown fault kind");

    if (kind == "analyzer") {
        const auto eq = rest.find('=');
        if (eq == std::string::npos) reject(fault, "missing '=DESCRIPTION'");
        const std::string operation = rest.substr(0, eq);
        const std::string description = rest.substr(eq + 1);
        const auto dot = operation.find('.');
        if (dot == std::string::npos || !isIdentifier(std::string_view(operation).substr(0, dot)) ||
            !isIdentifier(std::string_view(operation).substr(dot + 1))) {
            reject(fault, "operation must be written Object.operation");
        }
        if (description.empty()) reject(fault, "empty description");
        analyzer.push_back({operation, description, -1});
    } else if (kind == "noidn") {
        silentGenerators.insert(parseAddress(fault, rest));
    } else if (kind == "timeout") {
        timeoutGenerators.insert(parseAddress(fault, rest));
    } else if (kind == "generror") {
        const auto eq = rest.find('=');
        if (eq == std::string::npos) reject(fault, "missing '=ENTRY'");
        const int address = parseAddress(fault, std::string_view(rest).substr(0, eq));
        const std::string entry = rest.substr(eq + 1);
        if (entry.empty()) reject(fault, "empty error entry");
        generatorErrors[address] = entry;
    } else {
        reject(fault, "unknown fault kind");
    }
}

}  // namespace zp::sim
