#pragma once
// The one error type raised by every instrument call: a number and the instrument's description.

#include <stdexcept>
#include <string>
#include <string_view>

namespace zp {

class InstrumentError : public std::runtime_error {
  public:
    InstrumentError(long number, std::string description)
        : std::runtime_error(description), number_(number), description_(std::move(description)) {}

    long number() const { return number_; }
    const std::string& description() const { return description_; }

  private:
    long number_;
    std::string description_;
};

// Error number of the program's own checks (identification, error queue, sweep limits).
inline constexpr long kOwnCheckError = 1;
// Error number that a cancelled file dialog reports.
inline constexpr long kCancelError = 32755;

// Analyzer errors whose description begins "+106" or "+143" are skipped: the procedure goes on
// with its next step.
bool isSkippableError(std::string_view description);
inline bool isSkippableError(const InstrumentError& e) {
    return isSkippableError(e.description());
}

}  // namespace zp
