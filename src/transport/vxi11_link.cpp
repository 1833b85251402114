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

using Clock = std::chrono::steady_clock;

int clampMs(std::chrono::milliseconds timeout) {
    return timeout.count() > 1'000'000'000 ? 1'000'000'000 : static_cast<int>(timeout.count());
}

// At least 1 ms: a VXI-11 timeout of 0 means "do not wait at all".
int remainingMs(Clock::time_point deadline) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now());
    return std::max(1, clampMs(left));
}

}  // namespace

Vxi11Link::Vxi11Link(const std::string& host, const std::string& device,
                     std::chrono::milliseconds timeout)
    : name_(device + " at " + host), timeout_(timeout) {
    initialiseLibrary();
    const Deadline deadline = Clock::now() + timeout_;
    device_ = lxi_connect(host.c_str(), 0, device.c_str(), remainingMs(deadline), VXI11);
    if (device_ < 0) {
        throw InstrumentError(kTransportError, "Cannot open VXI-11 device " + name_);
    }
    std::string identity;
    try {
        send("*IDN?\n", deadline);
        identity = receive(256, deadline);
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

void Vxi11Link::send(std::string_view text, Deadline deadline) {
    const std::string copy(text);  // liblxi takes a non-const-correct length
    if (lxi_send(device_, copy.data(), static_cast<int>(copy.size()), remainingMs(deadline)) < 0) {
        throw LinkFailure("write to " + name_ + " failed", false);
    }
}

std::string Vxi11Link::receive(std::size_t maxChars, Deadline deadline) {
    if (maxChars == 0) return {};
    maxChars = std::min<std::size_t>(maxChars, 1u << 30);
    std::vector<char> buffer(maxChars);
    const int n =
        lxi_receive(device_, buffer.data(), static_cast<int>(maxChars), remainingMs(deadline));
    // liblxi does not tell a timeout from other failures; a silent device is the usual cause.
    if (n < 0) {
        unfinished_ = false;
        throw LinkFailure("read from " + name_ + " failed or timed out", true);
    }
    std::string reply(buffer.data(), static_cast<std::size_t>(n));
    unfinished_ = reply.size() == maxChars && reply.back() != '\n';
    return reply;
}

std::size_t Vxi11Link::drain(Deadline deadline) {
    constexpr std::size_t kScratch = 4096;
    std::size_t dropped = 0;
    while (unfinished_) {
        if (Clock::now() >= deadline) {
            unfinished_ = false;
            throw LinkFailure("dropping the rest of an earlier reply from " + name_ + " timed out",
                              true);
        }
        dropped += receive(kScratch, deadline).size();
    }
    return dropped;
}

void Vxi11Link::write(std::string_view text) {
    const Deadline deadline = Clock::now() + timeout_;
    drain(deadline);
    send(text, deadline);
}

std::string Vxi11Link::read(std::size_t maxChars) {
    return receive(maxChars, Clock::now() + timeout_);
}

std::size_t Vxi11Link::drainReplies() {
    return drain(Clock::now() + timeout_);
}

}  // namespace zp::transport
