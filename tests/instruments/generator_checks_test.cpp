#include <gtest/gtest.h>

#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "instruments/error_capture.h"
#include "instruments/generator_session.h"
#include "instruments/instrument_bus.h"
#include "instruments/instrument_error.h"

namespace zp {
namespace {

// Records the calls; each read takes the next scripted reply (nullopt = the read fails).
class FakeBus : public InstrumentBus {
  public:
    std::int16_t openDevice(int board, int address, int secondary, int timeout, int eoi,
                            int eos) override {
        opens.push_back({board, address, secondary, timeout, eoi, eos});
        return 7;
    }
    void writeText(std::int16_t descriptor, const std::string& text) override {
        writes.push_back(std::to_string(descriptor) + ":" + text);
        status_ = failWrite ? kStatusError : 0;
    }
    void readText(std::int16_t, std::string& buffer) override {
        buffers.push_back(buffer);
        const auto reply = replies.empty() ? std::nullopt : replies.front();
        if (!replies.empty()) replies.pop_front();
        status_ = reply ? 0 : kStatusError | kStatusTimeout;
        if (reply) buffer = reply->substr(0, buffer.size());
    }
    std::uint16_t status() const override { return status_; }
    void clearDevice(std::int16_t) override {}
    int addressOf(std::int16_t) const override { return -1; }

    std::vector<std::vector<int>> opens;
    std::vector<std::string> writes;
    std::vector<std::string> buffers;  // as each read was handed them
    std::deque<std::optional<std::string>> replies;
    bool failWrite = false;
    std::uint16_t status_ = 0;
};

using testing_support::errorOf;

TEST(SkippableErrorTest, DecidesByTheFirstFourCharacters) {
    for (const char* yes : {"+106 Parameter ignored", "+143 Setting conflict", "+1061 x", "+143"}) {
        EXPECT_TRUE(isSkippableError(yes)) << yes;
    }
    for (const char* no : {"106 Parameter ignored", "-143 Setting conflict", " +106", "+10", ""}) {
        EXPECT_FALSE(isSkippableError(no)) << no;
    }
    EXPECT_TRUE(isSkippableError(InstrumentError(106, "+106 x")));
}

TEST(GeneratorChecksTest, OpenAndIdentifyWithTheFixedSettings) {
    FakeBus bus;
    EXPECT_EQ(openGenerator(bus, 12), 7);
    EXPECT_EQ(bus.opens, (std::vector<std::vector<int>>{{0, 12, 0, 13, 1, 0}}));
    bus.replies.push_back("Veltrix,PG,1,1.0\n");
    checkIdentification(bus, 7, 11);
    EXPECT_EQ(bus.writes, (std::vector<std::string>{"7:*IDN?\n"}));
    EXPECT_EQ(bus.buffers, (std::vector<std::string>{std::string(100, ' ')}));
}

TEST(GeneratorChecksTest, SessionQueryHandsTheSameBuffer) {
    auto owned = std::make_unique<FakeBus>();
    FakeBus& bus = *owned;
    bus.replies.push_back("5000\n");
    GeneratorSession session(std::move(owned));
    EXPECT_EQ(session.query({12, 7}, ":SOUR:FREQ?"), "5000\n");
    EXPECT_EQ(bus.writes, (std::vector<std::string>{"7::SOUR:FREQ?\n"}));
    EXPECT_EQ(bus.buffers, (std::vector<std::string>{std::string(100, ' ')}));
}

TEST(GeneratorChecksTest, IdentificationFailsWithTheAddressWhenWriteOrReadFails) {
    FakeBus bus;
    bus.failWrite = true;
    long number = 0;
    EXPECT_EQ(errorOf([&] { checkIdentification(bus, 7, 11); }, &number),
              "Error reading from signal generator at address 11");
    EXPECT_EQ(number, kOwnCheckError);
    EXPECT_TRUE(bus.buffers.empty()) << "no read after a failed write";

    FakeBus silent;
    silent.replies.push_back(std::nullopt);
    EXPECT_EQ(errorOf([&] { checkIdentification(silent, 3, 12); }),
              "Error reading from signal generator at address 12");
}

TEST(GeneratorChecksTest, ErrorCheckPassesOnlyForPlusZeroAtTheStartAndQuotesTheReply) {
    FakeBus bus;
    bus.replies.push_back("+0,\"No error\"\n");
    EXPECT_NO_THROW(checkInstrumentError(bus, 7, 13));
    EXPECT_EQ(bus.writes, (std::vector<std::string>{"7::SYST:ERR?\n"}));
    EXPECT_EQ(bus.buffers, (std::vector<std::string>{std::string(100, ' ')}));

    const std::string prefix = "Pulse Generator at address 12 generated the following error: ";
    for (const std::string reply : {"-222,\"Data out of range\"\n", " +0,\"No error\"\n", ""}) {
        FakeBus failing;
        failing.replies.push_back(reply);
        long number = 0;
        EXPECT_EQ(errorOf([&] { checkInstrumentError(failing, 7, 12); }, &number), prefix + reply);
        EXPECT_EQ(number, kOwnCheckError);
    }

    // No reply at all (the read timed out) is a read failure, not an error made of blanks.
    FakeBus silent;
    silent.replies.push_back(std::nullopt);
    EXPECT_EQ(errorOf([&] { checkInstrumentError(silent, 7, 12); }),
              "Error reading from signal generator at address 12");
}

}  // namespace
}  // namespace zp
