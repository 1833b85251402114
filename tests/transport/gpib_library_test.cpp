#include "transport/gpib_library.h"

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "instruments/error_capture.h"
#include "instruments/instrument_bus.h"
#include "instruments/instrument_error.h"
#include "instruments/io_trace.h"
#include "transport/transport_factory.h"

namespace zp::transport {
namespace {

using testing_support::errorOf;

constexpr std::uint16_t kErr = InstrumentBus::kStatusError;
constexpr std::uint16_t kTimo = InstrumentBus::kStatusTimeout;

// The fake driver's test hooks, looked up in the already loaded library.
template <typename Fn>
Fn hook(const char* name) {
    void* handle = ::dlopen(ZP_FAKE_GPIB_LIBRARY, RTLD_NOW | RTLD_NOLOAD);
    EXPECT_NE(handle, nullptr);
    auto fn = reinterpret_cast<Fn>(::dlsym(handle, name));
    ::dlclose(handle);
    return fn;
}

TEST(GpibLibrary, LoadsTheFirstUsableCandidateOrNamesEveryFailure) {
    const std::string missing = errorOf([] {
        GpibLibrary::load({"/nonexistent/libgpib.so.0", "libni4882-missing.so"});
    });
    for (const char* part :
         {"/nonexistent/libgpib.so.0", "libni4882-missing.so", "ZP_GPIB_LIBRARY"}) {
        EXPECT_NE(missing.find(part), std::string::npos) << missing;
    }
    const std::string incomplete = errorOf([] { GpibLibrary::load({ZP_FAKE_GPIB_INCOMPLETE}); });
    EXPECT_NE(incomplete.find("has no function"), std::string::npos) << incomplete;
    const auto library = GpibLibrary::load({"/nonexistent/libgpib.so.0", ZP_FAKE_GPIB_LIBRARY});
    EXPECT_EQ(library->path(), ZP_FAKE_GPIB_LIBRARY);
}

TEST(GpibLibrary, EnvironmentOverridesTheCandidates) {
    ::setenv("ZP_GPIB_LIBRARY", "/tmp/custom-gpib.so", 1);
    EXPECT_EQ(GpibLibrary::candidates(), std::vector<std::string>{"/tmp/custom-gpib.so"});
    ::unsetenv("ZP_GPIB_LIBRARY");
    EXPECT_EQ(GpibLibrary::candidates(),
              (std::vector<std::string>{"libgpib.so.0", "libni4882.so"}));
}

class GpibBusTest : public ::testing::Test {
  protected:
    void SetUp() override { ::setenv("ZP_GPIB_LIBRARY", ZP_FAKE_GPIB_LIBRARY, 1); }
    void TearDown() override { ::unsetenv("ZP_GPIB_LIBRARY"); }
    IoTrace trace;
};

TEST_F(GpibBusTest, QueryThroughTheDriverWithBufferLimit) {
    auto bus = makeTransportBus({{12, "GPIB0::5::INSTR"}}, &trace);
    const auto d = bus->openDevice(0, 12, 0, 13, 1, 0);
    EXPECT_EQ(hook<int (*)()>("fake_gpib_last_timeout_code")(), 13);
    bus->writeText(d, "*IDN?\n");
    EXPECT_EQ(bus->status(), 0);
    EXPECT_STREQ(hook<const char* (*)()>("fake_gpib_last_write")(), "*IDN?\n");
    std::string buffer(4, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(buffer, "FAKE");
    buffer.assign(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(buffer, ",GPIB,5,1\n");
    EXPECT_EQ(trace.lines().front(), "BUS 12 open");
    EXPECT_EQ(trace.lines().back(), "BUS 12 R \",GPIB,5,1\\n\"");
}

TEST_F(GpibBusTest, DriverTimeoutAndNoListenerMapOntoTheStatusWord) {
    auto bus = makeTransportBus({{11, "GPIB0::11::INSTR"}, {29, "GPIB0::29::INSTR"}}, &trace);
    const auto d = bus->openDevice(0, 11, 0, 13, 1, 0);
    bus->writeText(d, "SILENT?\n");
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(bus->status(), kErr | kTimo);
    EXPECT_EQ(buffer, std::string(100, ' '));
    EXPECT_EQ(trace.lines().back(), "BUS 11 timeout");

    const auto nobody = bus->openDevice(0, 29, 0, 13, 1, 0);
    bus->writeText(nobody, "*IDN?\n");
    EXPECT_EQ(bus->status(), kErr);
    EXPECT_EQ(trace.lines().back(), "BUS 29 error ibwrt: no listener");
}

TEST_F(GpibBusTest, RestOfALongReplyIsReadOffBeforeTheNextWrite) {
    // Left on the device, the next write would make it queue -410 "Query INTERRUPTED".
    auto bus = makeTransportBus({{12, "GPIB0::12::INSTR"}}, &trace);
    const auto d = openGenerator(*bus, 12);
    const std::string echo(149, 'e');
    bus->writeText(d, "ECHO? " + echo + "\n");
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(errorOf([&] { checkInstrumentError(*bus, d, 12); }), "<no error>");
    const auto lines = trace.lines();
    EXPECT_EQ(std::vector<std::string>(lines.end() - 4, lines.end()),
              (std::vector<std::string>{"BUS 12 R \"" + echo.substr(0, 100) + "\"",
                                        "BUS 12 drained 50 bytes", "BUS 12 W \":SYST:ERR?\\n\"",
                                        "BUS 12 R \"+0,\\\"No error\\\"\\n\""}));
    // After a device clear the device holds nothing more, so nothing is read off.
    bus->writeText(d, "ECHO? " + echo + "\n");
    bus->readText(d, buffer);
    bus->clearDevice(d);
    bus->writeText(d, "*IDN?\n");
    EXPECT_EQ(trace.lines().size(), lines.size() + 4);  // W, R, clear, W: no "drained" line
}

TEST_F(GpibBusTest, ClearDropsThePendingReplyAndDevicesGoOfflineWithTheBus) {
    auto bus = makeTransportBus({{7, "GPIB0::7::INSTR"}}, nullptr);
    const auto d = bus->openDevice(0, 7, 0, 13, 1, 0);
    bus->writeText(d, "ECHO? hello\n");
    bus->clearDevice(d);
    EXPECT_EQ(bus->status(), 0);
    std::string buffer(100, ' ');
    bus->readText(d, buffer);
    EXPECT_EQ(bus->status(), kErr | kTimo);
    const auto isOnline = hook<int (*)(int)>("fake_gpib_is_online");
    EXPECT_EQ(isOnline(107), 1);
    bus.reset();
    EXPECT_EQ(isOnline(107), 0);
}

TEST(GpibBusOpen, MissingBoardDriverOrGatewayFailsClearly) {
    const auto openError = [](const std::string& resource, const char* library) {
        ::setenv("ZP_GPIB_LIBRARY", library, 1);
        auto bus = makeTransportBus({{7, resource}}, nullptr);
        const std::string error = errorOf([&] { bus->openDevice(0, 7, 0, 11, 1, 0); });
        ::unsetenv("ZP_GPIB_LIBRARY");
        return error;
    };
    const std::pair<std::string, std::vector<const char*>> cases[] = {
        {openError("GPIB3::7::INSTR", ZP_FAKE_GPIB_LIBRARY), {"GPIB3", "no GPIB board"}},
        {openError("GPIB0::7::INSTR", "/nonexistent/libgpib-test.so"),
         {"/nonexistent/libgpib-test.so"}},
        // Nothing answers RPC on the loopback port mapper here; the link must fail, not hang.
        {openError("TCPIP0::127.0.0.1::gpib0,9::INSTR", ZP_FAKE_GPIB_LIBRARY),
         {"gpib0,9 at 127.0.0.1"}},
    };
    for (const auto& [error, parts] : cases) {
        for (const char* part : parts) EXPECT_NE(error.find(part), std::string::npos) << error;
    }
}

}  // namespace
}  // namespace zp::transport
