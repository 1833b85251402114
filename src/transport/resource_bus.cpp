#include "transport/resource_bus.h"

#include <limits>

#include "instruments/instrument_error.h"
#include "transport/gpib_library.h"
#include "transport/raw_socket_link.h"
#include "transport/vxi11_link.h"

namespace zp::transport {

namespace {

template <class... Ts>
struct Overloaded : Ts... {
    using Ts::operator()...;
};
template <class... Ts>
Overloaded(Ts...) -> Overloaded<Ts...>;

}  // namespace

std::unique_ptr<DeviceLink> openLink(const Resource& resource, int timeoutCode) {
    const auto timeout = timeoutForCode(timeoutCode);
    return std::visit(
        Overloaded{[&](const SocketResource& r) -> std::unique_ptr<DeviceLink> {
                       return std::make_unique<RawSocketLink>(r.host, r.port, timeout);
                   },
                   [&](const Vxi11Resource& r) -> std::unique_ptr<DeviceLink> {
                       return std::make_unique<Vxi11Link>(r.host, r.device, timeout);
                   },
                   [&](const GpibResource& r) -> std::unique_ptr<DeviceLink> {
                       return std::make_unique<GpibLink>(GpibLibrary::load(), r, timeoutCode);
                   }},
        resource);
}

ResourceBus::ResourceBus(const BusResources& resources, LinkFactory factory)
    : texts_(resources), factory_(std::move(factory)) {
    for (const auto& [address, text] : resources) resources_.emplace(address, parseResource(text));
}

std::int16_t ResourceBus::openDevice(int board, int primaryAddress, int, int timeoutCode, int,
                                     int) {
    if (board != 0) {
        throw InstrumentError(kTransportError, "GPIB board " + std::to_string(board) +
                                                   " is not available; only board 0 is mapped");
    }
    const auto it = resources_.find(primaryAddress);
    if (it == resources_.end()) {
        throw InstrumentError(kTransportError, "No bus resource is given for GPIB address " +
                                                   std::to_string(primaryAddress));
    }
    if (next_ == std::numeric_limits<std::int16_t>::max()) {
        throw InstrumentError(kTransportError, "No free GPIB device descriptor");
    }
    try {
        auto& link = links_[primaryAddress];
        if (!link || !link->isOpen()) {
            link.reset();  // an instrument may take one connection only: close before connecting
            link = factory_(it->second, timeoutCode);
        }
        const std::int16_t descriptor = next_++;
        devices_.emplace(descriptor, primaryAddress);
        status_ = 0;
        return descriptor;
    } catch (const InstrumentError&) {
        throw;
    } catch (const std::exception& e) {
        throw InstrumentError(kTransportError, "GPIB address " + std::to_string(primaryAddress) +
                                                   " (" + texts_[primaryAddress] +
                                                   "): " + e.what());
    }
}

template <typename Call>
void ResourceBus::run(std::int16_t descriptor, Call call) {
    const auto device = devices_.find(descriptor);
    if (device == devices_.end()) {
        status_ = kStatusError;
        lastError_ = "invalid descriptor " + std::to_string(descriptor);
        return;
    }
    DeviceLink* link = links_[device->second].get();
    if (link == nullptr) {  // opening it again failed
        status_ = kStatusError;
        lastError_ = "GPIB address " + std::to_string(device->second) +
                     " has no connection; open the device again";
        return;
    }
    try {
        call(*link);
        status_ = 0;
    } catch (const LinkFailure& e) {
        status_ = e.timedOut() ? (kStatusError | kStatusTimeout) : kStatusError;
        lastError_ = e.what();
    }
}

void ResourceBus::writeText(std::int16_t descriptor, const std::string& text) {
    run(descriptor, [&](DeviceLink& link) { link.write(text); });
}

std::size_t ResourceBus::drainReplies(std::int16_t descriptor) {
    std::size_t dropped = 0;
    run(descriptor, [&](DeviceLink& link) { dropped = link.drainReplies(); });
    return dropped;
}

void ResourceBus::readText(std::int16_t descriptor, std::string& buffer) {
    run(descriptor, [&](DeviceLink& link) { buffer = link.read(buffer.size()); });
}

void ResourceBus::clearDevice(std::int16_t descriptor) {
    run(descriptor, [&](DeviceLink& link) { link.clear(); });
}

int ResourceBus::addressOf(std::int16_t descriptor) const {
    const auto it = devices_.find(descriptor);
    return it == devices_.end() ? -1 : it->second;
}

}  // namespace zp::transport
