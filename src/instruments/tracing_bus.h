#pragma once
// A bus decorator that writes every call of the bus it wraps to the I/O trace:
//   BUS <addr> open | W "<text>" | R "<text>" | clear | drained <n> bytes | timeout | error <text>
// A write is traced before it is sent, a read after it returned; a failed call adds a "timeout"
// line (status ERR|TIMO) or an "error" line with the wrapped bus's reason. Unread reply text that
// the wrapped bus drops before a write shows as a "drained" line ahead of the write.

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

#include "instruments/instrument_bus.h"

namespace zp {

class IoTrace;

// Implemented by buses that can say why their last call failed ("no listener").
class BusErrorSource {
  public:
    virtual ~BusErrorSource() = default;
    virtual std::string lastErrorText() const = 0;
};

// Implemented by buses whose links can hold the unread rest of a reply: drops it before a write
// and returns how many bytes went. A failure sets status().
class ReplyDrainSource {
  public:
    virtual ~ReplyDrainSource() = default;
    virtual std::size_t drainReplies(std::int16_t descriptor) = 0;
};

class TracingBus : public InstrumentBus {
  public:
    // The trace must outlive this bus.
    TracingBus(std::unique_ptr<InstrumentBus> inner, IoTrace& trace);

    std::int16_t openDevice(int board, int primaryAddress, int secondaryAddress, int timeoutCode,
                            int endOrIdentify, int endOfString) override;
    void writeText(std::int16_t descriptor, const std::string& text) override;
    void readText(std::int16_t descriptor, std::string& buffer) override;
    std::uint16_t status() const override { return inner_->status(); }
    void clearDevice(std::int16_t descriptor) override;
    int addressOf(std::int16_t descriptor) const override { return inner_->addressOf(descriptor); }

    InstrumentBus& inner() { return *inner_; }

  private:
    void traceFailure(int address);

    std::unique_ptr<InstrumentBus> inner_;
    ReplyDrainSource* drainSource_;  // inner_ when it can drop replies, else null
    IoTrace& trace_;
};

}  // namespace zp
