#include "instruments/instrument_error.h"

namespace zp {

bool isSkippableError(std::string_view description) {
    // Only the first four characters count: "+1061 ..." is skipped, " +106" and "-143" are not.
    const std::string_view head = description.substr(0, 4);
    return head == "+106" || head == "+143";
}

}  // namespace zp
