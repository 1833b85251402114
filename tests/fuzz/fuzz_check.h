#pragma once
// Shared by the fuzz targets: a broken invariant prints what was expected and aborts, which
// libFuzzer records as a crash together with the input that caused it.

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>
#include <vector>

namespace zp::fuzz {

inline std::string_view text(const std::uint8_t* data, std::size_t size) {
    return {reinterpret_cast<const char*>(data), size};
}

inline void require(bool ok, std::string_view expected, std::string_view input) {
    if (ok) return;
    std::fprintf(stderr, "fuzz invariant broken: %.*s\ninput line: \"%.*s\"\n",
                 static_cast<int>(expected.size()), expected.data(), static_cast<int>(input.size()),
                 input.data());
    std::abort();
}

// One program message per line, the way the instruments read them.
inline std::vector<std::string_view> lines(std::string_view all) {
    std::vector<std::string_view> out;
    while (!all.empty()) {
        const auto end = all.find('\n');
        out.push_back(all.substr(0, end));
        if (end == std::string_view::npos) break;
        all.remove_prefix(end + 1);
    }
    return out;
}

// A reply the program can read: ends in a line feed and holds no other one.
inline bool oneLine(std::string_view reply) {
    return !reply.empty() && reply.find('\n') == reply.size() - 1;
}

}  // namespace zp::fuzz
