#pragma once
// The PRF and IF bandwidth the program works with: the main window's fields take no other values
// and the default solver refuses requests outside them.

namespace zp {

struct ValueRange {
    double low;
    double high;
};

inline constexpr ValueRange kPrfRangeHz{0.001, 165e6};
inline constexpr ValueRange kIfbwRangeHz{1.0, 10000.0};

}  // namespace zp
