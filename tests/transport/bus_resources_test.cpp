#include <gtest/gtest.h>

#include <stdexcept>
#include <utility>
#include <vector>

#include "transport/resource.h"
#include "transport/resource_bus.h"
#include "transport/transport_factory.h"

namespace zp {
namespace {

using transport::GpibResource;
using transport::parseResource;
using transport::SocketResource;
using transport::Vxi11Resource;

TEST(ParseBusResources, CommasBlanksAndVxiCommas) {
    const auto r = parseBusResources(
        "11=TCPIP0::192.0.2.10::5025::SOCKET,12=GPIB0::12::INSTR "
        "13=TCPIP0::gw.lab::gpib0,13::INSTR, 14 = TCPIP::10.0.0.2::INSTR");
    const BusResources expected = {{11, "TCPIP0::192.0.2.10::5025::SOCKET"},
                                   {12, "GPIB0::12::INSTR"},
                                   {13, "TCPIP0::gw.lab::gpib0,13::INSTR"},
                                   {14, "TCPIP::10.0.0.2::INSTR"}};
    EXPECT_EQ(r, expected);
}

TEST(ParseBusResources, BadInputNamesTheProblem) {
    const std::pair<const char*, const char*> cases[] = {
        {"", "No bus resources"},
        {"  , ", "No bus resources"},
        {"11", "ADDRESS=RESOURCE"},
        {"=GPIB0::1::INSTR", "0 to 30"},
        {"31=GPIB0::1::INSTR", "0 to 30"},
        {"x=GPIB0::1::INSTR", "0 to 30"},
        {"11=", "names no resource"},
        {"11=GPIB0::1::INSTR,11=GPIB0::2::INSTR", "more than once"},
        {"11=TCPIP0::host::99999::SOCKET", "port"},
        {"11=TCPIP0::host::SOCKET", "host and port"},
        {"11=TCPIP0::ho st::5025::SOCKET", "Bad resource"},
        {"11=USB0::1::2::INSTR", "unknown interface"},
        {"11=GPIB0::31::INSTR", "0..30"},
        {"11=GPIB0::5::SOCKET", "INSTR"},
    };
    for (const auto& [text, mentions] : cases) {
        try {
            parseBusResources(text);
            ADD_FAILURE() << "accepted: " << text;
        } catch (const std::invalid_argument& e) {
            EXPECT_NE(std::string(e.what()).find(mentions), std::string::npos) << e.what();
        }
    }
    EXPECT_THROW(transport::ResourceBus({{11, "GPIB0::99::INSTR"}}), std::invalid_argument);
}

TEST(ParseResource, Kinds) {
    const auto socket = std::get<SocketResource>(parseResource("tcpip0::127.0.0.1::5025::socket"));
    EXPECT_EQ(socket.host + ":" + std::to_string(socket.port), "127.0.0.1:5025");
    const auto vxi = std::get<Vxi11Resource>(parseResource("TCPIP0::gateway::gpib0,7::INSTR"));
    EXPECT_EQ(vxi.host + " " + vxi.device, "gateway gpib0,7");
    EXPECT_EQ(std::get<Vxi11Resource>(parseResource("TCPIP::scope::INSTR")).device, "inst0");
    const auto gpib = std::get<GpibResource>(parseResource("GPIB1::22::3::INSTR"));
    EXPECT_EQ(std::vector<int>({gpib.board, gpib.primary, gpib.secondary}),
              std::vector<int>({1, 22, 3}));
    EXPECT_EQ(std::get<GpibResource>(parseResource("GPIB::4::INSTR")).secondary, -1);
}

}  // namespace
}  // namespace zp

namespace zp::transport {
namespace {

class ScriptedLink : public DeviceLink {
  public:
    void write(std::string_view text) override { written += text; }
    std::string read(std::size_t maxChars) override {
        if (reply.empty()) throw LinkFailure("no reply", true);
        std::string out = reply.substr(0, maxChars);
        reply.erase(0, out.size());
        return out;
    }
    void clear() override { throw LinkFailure("clear refused", false); }
    std::string written;
    std::string reply = "+0,\"No error\"\n";
};

TEST(ResourceBus, DescriptorsOfOneAddressShareOneLink) {
    int opened = 0;
    ScriptedLink* last = nullptr;
    ResourceBus bus({{11, "GPIB0::11::INSTR"}, {12, "GPIB0::12::INSTR"}},
                    [&](const Resource& r, int timeoutCode) -> std::unique_ptr<DeviceLink> {
                        EXPECT_EQ(std::get<GpibResource>(r).primary, opened == 0 ? 11 : 12);
                        EXPECT_EQ(timeoutCode, 13);
                        ++opened;
                        auto link = std::make_unique<ScriptedLink>();
                        last = link.get();
                        return link;
                    });
    const auto a = bus.openDevice(0, 11, 0, 13, 1, 0);
    const auto b = bus.openDevice(0, 11, 0, 13, 1, 0);
    EXPECT_NE(a, b);
    EXPECT_EQ(opened, 1);
    bus.writeText(a, "A\n");
    bus.writeText(b, "B\n");
    EXPECT_EQ(last->written, "A\nB\n");
    // A reply longer than the buffer is read in pieces, across descriptors of the device.
    std::string buffer(3, ' ');
    bus.readText(a, buffer);
    EXPECT_EQ(buffer, "+0,");
    buffer.assign(100, ' ');
    bus.readText(b, buffer);
    EXPECT_EQ(buffer, "\"No error\"\n");
    bus.openDevice(0, 12, 0, 13, 1, 0);
    EXPECT_EQ(opened, 2);
}

TEST(ResourceBus, LinkFailuresSetTheStatusWordAndGiveTheReason) {
    ResourceBus bus({{11, "GPIB0::11::INSTR"}},
                    [](const Resource&, int) { return std::make_unique<ScriptedLink>(); });
    const auto d = bus.openDevice(0, 11, 0, 13, 1, 0);
    bus.clearDevice(d);
    EXPECT_EQ(bus.status(), InstrumentBus::kStatusError);
    EXPECT_EQ(bus.lastErrorText(), "clear refused");
    std::string buffer(100, ' ');
    bus.readText(d, buffer);  // first read empties the scripted reply
    bus.readText(d, buffer);
    EXPECT_EQ(bus.status(), InstrumentBus::kStatusError | InstrumentBus::kStatusTimeout);
    EXPECT_EQ(buffer, "+0,\"No error\"\n");  // unchanged by the failed read
    bus.writeText(d, "X\n");
    EXPECT_EQ(bus.status(), 0);
}

}  // namespace
}  // namespace zp::transport
