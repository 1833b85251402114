#include "transport/vxi11_link.h"

#include <lxi.h>

#include <algorithm>
#include <csignal>
#include <mutex>
#include <vector>

#include "instruments/instrument_error.h"

namespace zp::transport {

namespace {

void initialiseLibrary() {
    static std::once_flag once;
    std::call_once(once, [] {
        // RPC over a dropped TCP link must not kill the program.
        std::signal(SIGPIPE, SIG_IGN);
        lxi_init();
    });
}

int clampMs(std::chrono::milliseconds timeout) {
    return timeout.count() > 1'000'000'000 ? 1'000'000'000 : static_cast<int>(timeout.count());
}

}  // namespace

Vxi11Link::Vxi11Link(const std::string& host, const std::string& device,
                     std::chrono::milliseconds timeout)
    : name_(device + " at " + host), timeoutMs_(clampMs(timeout)) {
    initialiseLibrary();
    device_ = lxi_connect(host.c_str(), 0, device.c_str(), timeoutMs_, VXI11);
    if (device_ < 0) {
        throw InstrumentError(kTransportError, "Cannot open VXI-11 device " + name_);
    }
    std::string identity;
    try {
        write("*IDN?\n");
        identity = read(256);
    } catch (const LinkFailure& e) {
        lxi_disconnect(device_);
        throw InstrumentError(kTransportError,
                              "VXI-11 device " + name_ + " does not answer *IDN?: " + e.what());
    }
    if (identity.empty()) {
        lxi_disconnect(device_);
        throw InstrumentError(kTransportError,
                              "VXI-11 device " + name_ + " gave an empty reply to *IDN?");
    }
}

Vxi11Link::~Vxi11Link() {
    if (device_ >= 0) lxi_disconnect(device_);
}

void Vxi11Link::write(std::string_view text) {
    const std::string copy(text);  // liblxi takes a non-const-correct length
    if (lxi_send(device_, copy.data(), static_cast<int>(copy.size()), timeoutMs_) < 0) {
        throw LinkFailure("write to " + name_ + " failed", false);
    }
}

std::string Vxi11Link::read(std::size_t maxChars) {
    if (maxChars == 0) return {};
    maxChars = std::min<std::size_t>(maxChars, 1u << 30);
    std::vector<char> buffer(maxChars);
    const int n = lxi_receive(device_, buffer.data(), static_cast<int>(maxChars), timeoutMs_);
    // liblxi does not tell a timeout from other failures; a silent device is the usual cause.
    if (n < 0) throw LinkFailure("read from " + name_ + " failed or timed out", true);
    return std::string(buffer.data(), static_cast<std::size_t>(n));
}

}  // namespace zp::transport
