#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <utility>
#include <vector>

#include "transport/resource.h"
#include "transport/resource_bus.h"
#include "transport/transport_factory.h"

namespace zp {
namespace {

std::string errorText(const std::function<void()>& call) {
    try {
        call();
    } catch (const std::exception& e) {
        return e.what();
    }
    return "<no error>";
}

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
        {"11=TCPIP0::ho$t::5025::SOCKET", "must be a name or an IPv4 address"},
        {"11=USB0::1::2::INSTR", "unknown interface \"USB0\""},
        {"11=GPIB0::31::INSTR", "0 to 30"},
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

TEST(ParseBusResources, RefusalNamesTheEntryAndWhatWasExpected) {
    const std::pair<const char*, const char*> cases[] = {
        {"11=GPIB-1::5::INSTR",
         "the board number after GPIB must be digits, as in GPIB0, not \"-1\""},
        {"11=GPIBx::5::INSTR",
         "the board number after GPIB must be digits, as in GPIB0, not \"x\""},
        {"11=TCPIP-7::host::5025::SOCKET",
         "the board number after TCPIP must be digits, as in TCPIP0, not \"-7\""},
        {"11=TCPIP0::::5025::SOCKET",
         "the host is empty; expected a name, an IPv4 address or an IPv6 address in brackets "
         "([::1])"},
        {"11=TCPIP0::host::::SOCKET", "the port must be a number from 1 to 65535, not \"\""},
        {"11=TCPIP0::host::+5025::SOCKET",
         "the port must be a number from 1 to 65535, not \"+5025\""},
        {"11=GPIB0::-3::INSTR", "the GPIB address must be a number from 0 to 30, not \"-3\""},
        {"11=TCPIP0::gw::gpib0,,,,::INSTR",
         "device \"gpib0,,,,\" must be NAME, NAME,N or NAME,N,S with numbers N and S (gpib0,12)"},
        {"11=TCPIP0::gw::,5::INSTR",
         "device \",5\" must be NAME, NAME,N or NAME,N,S with numbers N and S (gpib0,12)"},
        {"11=TCPIP0::gw::gpib0,5,::INSTR",
         "device \"gpib0,5,\" must be NAME, NAME,N or NAME,N,S with numbers N and S (gpib0,12)"},
        {"11=TCPIP0::::1::5025::SOCKET",
         "the host is empty; expected a name, an IPv4 address or an IPv6 address in brackets "
         "([::1])"},
        {"11=TCPIP0::fe80:1::5025::SOCKET",
         "an IPv6 address must be written in brackets, as in [::1], not \"fe80:1\""},
        {"11=TCPIP0::[::g]::5025::SOCKET",
         "host \"[::g]\" is not an IPv6 address in brackets, as in [::1]"},
        {"11=TCPIP0::[::1::5025::SOCKET",
         "host \"[\" is not an IPv6 address in brackets, as in [::1]"},
        {"11=TCPIP0::[::1]::INSTR",
         "VXI-11 is reached over IPv4 only; give the host's IPv4 address or name"},
        {"11=GPIB0::5::31::INSTR",
         "the secondary address must be a number from 0 to 30, not \"31\""},
        {"11=GPIB0::1::2::3::INSTR",
         "too many fields; expected GPIB0::N::INSTR or GPIB0::N::S::INSTR"},
    };
    for (const auto& [text, reason] : cases) {
        try {
            parseBusResources(text);
            ADD_FAILURE() << "accepted: " << text;
        } catch (const std::invalid_argument& e) {
            EXPECT_EQ(std::string(e.what()), "Bus entry \"" + std::string(text) + "\": " + reason);
        }
    }
    EXPECT_EQ(errorText([] { parseResource("GPIB-1::5::INSTR"); }),
              "Bad resource \"GPIB-1::5::INSTR\": the board number after GPIB must be digits, as "
              "in GPIB0, not \"-1\"");
}

TEST(ParseResource, Kinds) {
    const auto socket = std::get<SocketResource>(parseResource("tcpip0::127.0.0.1::5025::socket"));
    EXPECT_EQ(socket.host + ":" + std::to_string(socket.port), "127.0.0.1:5025");
    const auto vxi = std::get<Vxi11Resource>(parseResource("TCPIP0::gateway::gpib0,7::INSTR"));
    EXPECT_EQ(vxi.host + " " + vxi.device, "gateway gpib0,7");
    EXPECT_EQ(std::get<Vxi11Resource>(parseResource("TCPIP::scope::INSTR")).device, "inst0");
    const auto gpib = std::get<GpibResource>(parseResource("GPIB1::30::30::INSTR"));
    EXPECT_EQ(std::vector<int>({gpib.board, gpib.primary, gpib.secondary}),
              std::vector<int>({1, 30, 30}));
    EXPECT_EQ(std::get<GpibResource>(parseResource("GPIB::4::INSTR")).secondary, -1);
    const auto ipv6 =
        std::get<SocketResource>(parseResource("TCPIP0::[fe80::1%eth0]::5025::SOCKET"));
    EXPECT_EQ(ipv6.host, "fe80::1%eth0");
    EXPECT_EQ(std::get<Vxi11Resource>(parseResource("TCPIP0::gw::gpib0,7,3::INSTR")).device,
              "gpib0,7,3");
    const std::string longest(253, 'h');  // the longest DNS name
    EXPECT_EQ(std::get<SocketResource>(parseResource("TCPIP0::" + longest + "::1::SOCKET")).host,
              longest);
    EXPECT_THROW(parseResource("TCPIP0::" + longest + "h::1::SOCKET"), transport::BadResource);
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
