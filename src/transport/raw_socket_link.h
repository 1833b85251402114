#pragma once
// Raw SCPI over TCP (port 5025 by convention): line-feed framed replies, Nagle off so a write
// followed by a query does not stall, no SIGPIPE on a peer that went away.
//
// Every write and read has one deadline, ioTimeout after the call began. Any failure (timeout,
// peer gone) closes the connection: a half-sent text or a half-received reply cannot be told
// from the next one, so nothing of it is kept. clear() connects again.

#include <chrono>
#include <string>
#include <vector>

#include "transport/device_link.h"

namespace zp::transport {

class RawSocketLink : public DeviceLink {
  public:
    // host is a name, an IPv4 or an IPv6 address (without brackets). Connects within
    // connectTimeout (the name lookup itself is the system resolver's).
    // Throws InstrumentError naming host:port when the connection cannot be made.
    RawSocketLink(const std::string& host, int port, std::chrono::milliseconds ioTimeout,
                  std::chrono::milliseconds connectTimeout = std::chrono::seconds(5));
    ~RawSocketLink() override;

    void write(std::string_view text) override;
    // Waits until a line feed arrived or maxChars characters are buffered.
    std::string read(std::size_t maxChars) override;
    std::size_t drainReplies() override;
    // A raw socket has no device clear: drops what arrived and the rest of a reply already
    // begun (waiting for its line feed). On a closed link, connects again.
    void clear() override;
    bool isOpen() const override { return fd_ >= 0; }

    const std::string& peer() const { return peer_; }

  private:
    using Deadline = std::chrono::steady_clock::time_point;

    Deadline deadline() const { return std::chrono::steady_clock::now() + ioTimeout_; }
    void connect();  // throws InstrumentError
    void ensureOpen() const;
    [[noreturn]] void fail(std::string reason, bool timedOut);  // closes, then throws
    // Appends what the peer already sent to in_ without waiting; false when nothing came.
    bool receiveAvailable();
    // Waits for input until the deadline; fails (closing the link) on timeout.
    void awaitInput(Deadline deadline, const char* what);
    // Drops the rest of a reply that was begun (read in part, or dropped in part by clear), up to
    // its line feed; fails (closing the link) when that does not come by the deadline.
    std::size_t drainTail(Deadline deadline);
    std::size_t dropInput();  // everything received and not delivered

    std::string host_;
    int port_;
    std::chrono::milliseconds ioTimeout_;
    std::chrono::milliseconds connectTimeout_;
    int fd_ = -1;
    std::string peer_;                                        // "host:port" for messages
    std::string closedBy_;                                    // why the link was closed
    std::vector<char> chunk_ = std::vector<char>(64 * 1024);  // receive buffer
    std::string in_;                                          // received, not yet delivered
    std::size_t head_ = 0;                                    // start of undelivered data in in_
    std::size_t scanned_ = 0;  // in_[head_, scanned_) holds no line feed
    bool midReply_ = false;    // the last character taken (read or dropped) was no line feed
};

}  // namespace zp::transport
