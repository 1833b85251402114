#pragma once
// The shared state keeps booleans as 16-bit integers (true = -1) and check-box states as 0 or 1.

#include <cstdint>

namespace zp {

using Bool16 = std::int16_t;
using Check16 = std::int16_t;

inline constexpr Bool16 kTrue = -1;
inline constexpr Bool16 kFalse = 0;
inline constexpr Check16 kChecked = 1;
inline constexpr Check16 kUnchecked = 0;

constexpr Bool16 toBool16(bool b) {
    return b ? kTrue : kFalse;
}
constexpr bool isTrue(Bool16 b) {
    return b != 0;
}
constexpr bool isChecked(Check16 c) {
    return c == kChecked;
}

}  // namespace zp
