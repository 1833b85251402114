#pragma once
// The description (and number) of the InstrumentError a call raises, "<no error>" when it raises
// none.

#include <functional>
#include <string>

#include "instruments/instrument_error.h"

namespace zp::testing_support {

inline std::string errorOf(const std::function<void()>& call, long* number = nullptr) {
    try {
        call();
    } catch (const InstrumentError& e) {
        if (number) *number = e.number();
        return e.description();
    }
    return "<no error>";
}

}  // namespace zp::testing_support
