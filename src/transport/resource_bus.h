#pragma once
// An InstrumentBus whose devices are reached through resources (socket, VXI-11, GPIB board)
// instead of one GPIB board: openDevice(0, N, ...) opens the link given for address N.
// Descriptors opened for the same address share one link, as two descriptors for one GPIB
// device talk to the same instrument (many LAN instruments accept one socket only).
// Status word as on a GPIB board: 0 after a good call, ERR after a failed one, ERR|TIMO after a
// timeout. Reads return at most buffer.size() characters; the rest comes with the next read, but
// a write first drops what is left of earlier replies. A link that a failure closed is opened
// anew by the next openDevice for its address (or by clearDevice).

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>

#include "instruments/tracing_bus.h"
#include "transport/device_link.h"
#include "transport/resource.h"
#include "transport/transport_factory.h"

namespace zp::transport {

// Opens the link for a resource; the timeout code is the one given to openDevice.
using LinkFactory =
    std::function<std::unique_ptr<DeviceLink>(const Resource& resource, int timeoutCode)>;

// The links every resource kind uses in the program.
std::unique_ptr<DeviceLink> openLink(const Resource& resource, int timeoutCode);

class ResourceBus : public InstrumentBus, public BusErrorSource, public ReplyDrainSource {
  public:
    // Throws std::invalid_argument for a resource text that does not parse.
    explicit ResourceBus(const BusResources& resources, LinkFactory factory = openLink);

    // Throws InstrumentError when the address has no resource or its link cannot be opened.
    std::int16_t openDevice(int board, int primaryAddress, int secondaryAddress, int timeoutCode,
                            int endOrIdentify, int endOfString) override;
    void writeText(std::int16_t descriptor, const std::string& text) override;
    void readText(std::int16_t descriptor, std::string& buffer) override;
    std::uint16_t status() const override { return status_; }
    void clearDevice(std::int16_t descriptor) override;
    int addressOf(std::int16_t descriptor) const override;

    std::string lastErrorText() const override { return lastError_; }
    std::size_t drainReplies(std::int16_t descriptor) override;

  private:
    template <typename Call>
    void run(std::int16_t descriptor, Call call);

    std::map<int, Resource> resources_;
    std::map<int, std::string> texts_;
    LinkFactory factory_;
    std::map<std::int16_t, int> devices_;               // descriptor -> address
    std::map<int, std::unique_ptr<DeviceLink>> links_;  // per address
    std::int16_t next_ = 1;
    std::uint16_t status_ = 0;
    std::string lastError_;
};

}  // namespace zp::transport
