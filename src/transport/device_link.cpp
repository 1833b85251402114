#include "transport/device_link.h"

#include <array>

namespace zp::transport {

std::chrono::milliseconds timeoutForCode(int code) {
    // Sub-millisecond codes round up: a poll cannot wait less.
    static constexpr std::array<long long, 18> kMillis = {24LL * 3600 * 1000,
                                                          1,
                                                          1,
                                                          1,
                                                          1,
                                                          1,
                                                          3,
                                                          10,
                                                          30,
                                                          100,
                                                          300,
                                                          1000,
                                                          3000,
                                                          10000,
                                                          30000,
                                                          100000,
                                                          300000,
                                                          1000000};
    if (code < 0 || code >= static_cast<int>(kMillis.size())) code = 13;
    return std::chrono::milliseconds(kMillis[static_cast<std::size_t>(code)]);
}

}  // namespace zp::transport
