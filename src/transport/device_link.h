#pragma once
// One open connection to one instrument, whatever carries it (socket, VXI-11, GPIB board).

#include <chrono>
#include <cstddef>
#include <stdexcept>
#include <string>
#include <string_view>

namespace zp::transport {

// Error number of InstrumentErrors raised by the transports themselves (cannot connect, no driver).
inline constexpr long kTransportError = 2;

// A failed call on an open link; timedOut tells a timeout from any other failure.
class LinkFailure : public std::runtime_error {
  public:
    LinkFailure(std::string reason, bool timedOut)
        : std::runtime_error(std::move(reason)), timedOut_(timedOut) {}
    bool timedOut() const { return timedOut_; }

  private:
    bool timedOut_;
};

// A link owns its connection, so links are never copied. Every call gives up once the link's
// timeout has passed since the call began, however slowly the instrument moves data.
class DeviceLink {
  public:
    DeviceLink() = default;
    DeviceLink(const DeviceLink&) = delete;
    DeviceLink& operator=(const DeviceLink&) = delete;
    virtual ~DeviceLink() = default;
    // Drops what is left of earlier replies first (see drainReplies), then sends the text
    // unchanged. Throws LinkFailure.
    virtual void write(std::string_view text) = 0;
    // Returns the next reply text up to and including its line feed (or end mark), at most
    // maxChars characters; what is left over comes with the next read. Throws LinkFailure.
    virtual std::string read(std::size_t maxChars) = 0;
    // Drops the unread rest of a reply that a read left behind (a read that filled its buffer
    // before the reply ended), waiting for the reply's end; returns how many bytes went. write()
    // does this itself; calling it first tells the caller how much was dropped. Throws
    // LinkFailure.
    virtual std::size_t drainReplies() { return 0; }
    // Device clear: drops replies the instrument has not delivered yet. Throws LinkFailure.
    virtual void clear() = 0;
    // False once a failure closed the connection; every call but clear() then fails at once.
    virtual bool isOpen() const { return true; }
};

// The bus library's timeout codes (0 = none, 11 = 1 s, 13 = 10 s, 17 = 1000 s). Codes outside
// 0..17 are treated as 13.
std::chrono::milliseconds timeoutForCode(int code);

}  // namespace zp::transport
