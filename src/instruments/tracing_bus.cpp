#include "instruments/tracing_bus.h"

#include "instruments/io_trace.h"

namespace zp {

TracingBus::TracingBus(std::unique_ptr<InstrumentBus> inner, IoTrace& trace)
    : inner_(std::move(inner)),
      drainSource_(dynamic_cast<ReplyDrainSource*>(inner_.get())),
      trace_(trace) {}

std::int16_t TracingBus::openDevice(int board, int primaryAddress, int secondaryAddress,
                                    int timeoutCode, int endOrIdentify, int endOfString) {
    std::int16_t descriptor = -1;
    try {
        descriptor = inner_->openDevice(board, primaryAddress, secondaryAddress, timeoutCode,
                                        endOrIdentify, endOfString);
    } catch (const std::exception& e) {
        trace_.busEvent(primaryAddress, std::string("error ") + e.what());
        throw;
    }
    if ((inner_->status() & kStatusError) != 0) {
        traceFailure(primaryAddress);
    } else {
        trace_.busEvent(primaryAddress, "open");
    }
    return descriptor;
}

void TracingBus::writeText(std::int16_t descriptor, const std::string& text) {
    const int address = inner_->addressOf(descriptor);
    if (drainSource_ != nullptr) {
        // Dropped here rather than inside the write so that the line comes before the write's.
        const std::size_t dropped = drainSource_->drainReplies(descriptor);
        if (dropped > 0) trace_.busEvent(address, "drained " + std::to_string(dropped) + " bytes");
        if ((inner_->status() & kStatusError) != 0) {
            trace_.busWrite(address, text);  // not sent: the failure line follows
            traceFailure(address);
            return;
        }
    }
    trace_.busWrite(address, text);
    inner_->writeText(descriptor, text);
    if ((inner_->status() & kStatusError) != 0) traceFailure(address);
}

void TracingBus::readText(std::int16_t descriptor, std::string& buffer) {
    const int address = inner_->addressOf(descriptor);
    inner_->readText(descriptor, buffer);
    if ((inner_->status() & kStatusError) != 0) {
        traceFailure(address);
    } else {
        trace_.busRead(address, buffer);
    }
}

void TracingBus::clearDevice(std::int16_t descriptor) {
    const int address = inner_->addressOf(descriptor);
    trace_.busEvent(address, "clear");
    inner_->clearDevice(descriptor);
    if ((inner_->status() & kStatusError) != 0) traceFailure(address);
}

void TracingBus::traceFailure(int address) {
    if ((inner_->status() & kStatusTimeout) != 0) {
        trace_.busEvent(address, "timeout");
        return;
    }
    const auto* source = dynamic_cast<const BusErrorSource*>(inner_.get());
    const std::string reason = source != nullptr ? source->lastErrorText() : std::string();
    trace_.busEvent(address, "error " + (reason.empty() ? std::string("bus call failed") : reason));
}

}  // namespace zp
