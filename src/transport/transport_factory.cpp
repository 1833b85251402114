#include "transport/transport_factory.h"

#include <cctype>
#include <charconv>
#include <stdexcept>
#include <vector>

#include "core/text.h"
#include "instruments/io_trace.h"
#include "instruments/tracing_bus.h"
#include "transport/resource.h"
#include "transport/resource_bus.h"

namespace zp {

namespace {

constexpr const char* kExample = "11=TCPIP0::192.0.2.10::5025::SOCKET,12=GPIB0::12::INSTR";

bool isBlank(char c) {
    return std::isspace(static_cast<unsigned char>(c)) != 0;
}
bool isDigit(char c) {
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}

// A comma separates entries only when an "N=" follows: VXI-11 device names contain commas
// themselves ("gpib0,12").
bool entryFollows(std::string_view text, std::size_t pos) {
    while (pos < text.size() && isBlank(text[pos])) ++pos;
    const std::size_t digits = pos;
    while (pos < text.size() && isDigit(text[pos])) ++pos;
    while (pos < text.size() && isBlank(text[pos])) ++pos;
    return pos > digits && pos < text.size() && text[pos] == '=';
}

// Entries are separated by blanks or by commas; blanks around "=" belong to their entry.
std::vector<std::string> splitEntries(std::string_view text) {
    std::string compact;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (!isBlank(text[i])) {
            compact += text[i];
            continue;
        }
        std::size_t next = i;
        while (next < text.size() && isBlank(text[next])) ++next;
        const bool besideEquals = (next < text.size() && text[next] == '=') ||
                                  (!compact.empty() && compact.back() == '=');
        if (!besideEquals) compact += ' ';
        i = next - 1;
    }
    std::vector<std::string> entries;
    std::size_t start = 0;
    for (std::size_t i = 0; i <= compact.size(); ++i) {
        const bool end = i == compact.size() || compact[i] == ' ' ||
                         (compact[i] == ',' && entryFollows(compact, i + 1));
        if (!end) continue;
        if (i > start) entries.push_back(compact.substr(start, i - start));
        start = i + 1;
    }
    return entries;
}

// Stray commas around an entry ("11=..., ,") are separators, not part of it.
std::string withoutCommas(std::string_view text) {
    while (!text.empty() && text.front() == ',') text.remove_prefix(1);
    while (!text.empty() && text.back() == ',') text.remove_suffix(1);
    return std::string(text);
}

}  // namespace

BusResources parseBusResources(std::string_view text) {
    BusResources resources;
    for (const std::string& entry : splitEntries(text)) {
        const std::string e = withoutCommas(trim(entry, kWhitespace));
        if (e.empty()) continue;
        const std::size_t eq = e.find('=');
        if (eq == std::string::npos) {
            throw std::invalid_argument(
                "Bus entry \"" + e + "\" is not ADDRESS=RESOURCE (for example " + kExample + ")");
        }
        const std::string addressText(trim(std::string_view(e).substr(0, eq), kWhitespace));
        const std::string resource(trim(std::string_view(e).substr(eq + 1), kWhitespace));
        int address = -1;
        const auto [end, ec] =
            std::from_chars(addressText.data(), addressText.data() + addressText.size(), address);
        if (addressText.empty() || ec != std::errc{} ||
            end != addressText.data() + addressText.size() || address < 0 || address > 30) {
            throw std::invalid_argument("Bus entry \"" + e +
                                        "\": the GPIB address must be a number from 0 to 30");
        }
        if (resource.empty()) {
            throw std::invalid_argument("Bus entry \"" + e + "\" names no resource");
        }
        try {
            transport::parseResource(resource);
        } catch (const transport::BadResource& bad) {
            throw std::invalid_argument("Bus entry \"" + e + "\": " + bad.reason());
        }
        if (!resources.emplace(address, resource).second) {
            throw std::invalid_argument("GPIB address " + std::to_string(address) +
                                        " is given more than once");
        }
    }
    if (resources.empty()) {
        throw std::invalid_argument(std::string("No bus resources given (for example ") + kExample +
                                    ")");
    }
    return resources;
}

std::unique_ptr<InstrumentBus> makeTransportBus(const BusResources& resources, IoTrace* trace) {
    auto bus = std::make_unique<transport::ResourceBus>(resources);
    if (trace == nullptr) return bus;
    return std::make_unique<TracingBus>(std::move(bus), *trace);
}

}  // namespace zp
