#include <gtest/gtest.h>

#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <vector>

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
        ++reads;
        bufferSizes.push_back(buffer);
        std::optional<std::string> reply;
        if (!replies.empty()) {
            reply = replies.front();
            replies.pop_front();
        }
        if (!reply) {
            status_ = kStatusError | kStatusTimeout;
            return;
        }
        buffer = reply->substr(0, buffer.size());
        status_ = 0;
    }
    std::uint16_t status() const override { return status_; }
    void clearDevice(std::int16_t) override {}
    int addressOf(std::int16_t) const override { return -1; }

    std::vector<std::vector<int>> opens;
    std::vector<std::string> writes;
    std::vector<std::string> bufferSizes;
    std::deque<std::optional<std::string>> replies;
    bool failWrite = false;
    int reads = 0;

  private:
    std::uint16_t status_ = 0;
};

std::string messageOf(const std::function<void()>& f, long* number = nullptr) {
    try {
        f();
    } catch (const InstrumentError& e) {
        if (number) *number = e.number();
        return e.description();
    }
    return "<no error>";
}

TEST(SkippableErrorTest, DecidesByTheFirstFourCharacters) {
    EXPECT_TRUE(isSkippableError("+106 Parameter ignored"));
    EXPECT_TRUE(isSkippableError("+143 Setting conflict"));
    EXPECT_TRUE(isSkippableError("+1061 something"));
    EXPECT_TRUE(isSkippableError("+143"));
    EXPECT_FALSE(isSkippableError("106 Parameter ignored"));
    EXPECT_FALSE(isSkippableError("-143 Setting conflict"));
    EXPECT_FALSE(isSkippableError(" +106"));
    EXPECT_FALSE(isSkippableError("+10"));
    EXPECT_FALSE(isSkippableError(""));
    EXPECT_FALSE(isSkippableError("+107 Other"));
    EXPECT_TRUE(isSkippableError(InstrumentError(106, "+106 x")));
}

TEST(GeneratorChecksTest, OpenUsesTheFixedDeviceSettings) {
    FakeBus bus;
    EXPECT_EQ(openGenerator(bus, 12), 7);
    ASSERT_EQ(bus.opens.size(), 1u);
    EXPECT_EQ(bus.opens[0], (std::vector<int>{0, 12, 0, 13, 1, 0}));
}

TEST(GeneratorChecksTest, IdentificationSendsIdnAndReadsIntoAHundredBlanks) {
    FakeBus bus;
    bus.replies.push_back("Veltrix,PG,1,1.0\n");
    checkIdentification(bus, 7, 11);
    EXPECT_EQ(bus.writes, (std::vector<std::string>{"7:*IDN?\n"}));
    ASSERT_EQ(bus.bufferSizes.size(), 1u);
    EXPECT_EQ(bus.bufferSizes[0], std::string(100, ' '));
}

TEST(GeneratorChecksTest, IdentificationFailsWithTheAddressWhenWriteOrReadFails) {
    FakeBus bus;
    bus.failWrite = true;
    long number = 0;
    EXPECT_EQ(messageOf([&] { checkIdentification(bus, 7, 11); }, &number),
              "Error reading from signal generator at address 11");
    EXPECT_EQ(number, kOwnCheckError);
    EXPECT_EQ(bus.reads, 0) << "no read after a failed write";

    FakeBus silent;
    silent.replies.push_back(std::nullopt);
    EXPECT_EQ(messageOf([&] { checkIdentification(silent, 3, 12); }),
              "Error reading from signal generator at address 12");
}

TEST(GeneratorChecksTest, ErrorCheckPassesOnlyForPlusZeroAtTheStart) {
    FakeBus bus;
    bus.replies.push_back("+0,\"No error\"\n");
    EXPECT_NO_THROW(checkInstrumentError(bus, 7, 13));
    EXPECT_EQ(bus.writes, (std::vector<std::string>{"7::SYST:ERR?\n"}));
    EXPECT_EQ(bus.bufferSizes.at(0), std::string(100, ' '));
}

TEST(GeneratorChecksTest, ErrorCheckQuotesTheReplyExactly) {
    const std::string reply = "-222,\"Data out of range\"\n";
    FakeBus bus;
    bus.replies.push_back(reply);
    long number = 0;
    EXPECT_EQ(messageOf([&] { checkInstrumentError(bus, 7, 12); }, &number),
              "Pulse Generator at address 12 generated the following error: " + reply);
    EXPECT_EQ(number, kOwnCheckError);

    FakeBus blank;
    blank.replies.push_back(" +0,\"No error\"\n");
    EXPECT_EQ(messageOf([&] { checkInstrumentError(blank, 7, 11); }),
              "Pulse Generator at address 11 generated the following error:  +0,\"No error\"\n");

    FakeBus empty;
    empty.replies.push_back("");
    EXPECT_EQ(messageOf([&] { checkInstrumentError(empty, 7, 11); }),
              "Pulse Generator at address 11 generated the following error: ");
}

TEST(GeneratorChecksTest, ErrorCheckWithAFailedReadReportsTheUntouchedBuffer) {
    FakeBus bus;
    bus.replies.push_back(std::nullopt);
    EXPECT_EQ(
        messageOf([&] { checkInstrumentError(bus, 7, 11); }),
        "Pulse Generator at address 11 generated the following error: " + std::string(100, ' '));
}

}  // namespace
}  // namespace zp
