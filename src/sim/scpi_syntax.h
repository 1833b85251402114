#pragma once
// Lexical pieces of SCPI program messages shared by the simulated instruments: keyword matching,
// header nodes, command patterns, numbers with unit suffixes and the standard errors.

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "core/text.h"

namespace zp::sim {

struct ScpiErrorCode {
    int code;
    const char* text;
};

// Command errors: the message cannot be read.
inline constexpr ScpiErrorCode kSyntaxError{-102, "Syntax error"};
inline constexpr ScpiErrorCode kDataTypeError{-104, "Data type error"};
inline constexpr ScpiErrorCode kParameterNotAllowed{-108, "Parameter not allowed"};
inline constexpr ScpiErrorCode kMissingParameter{-109, "Missing parameter"};
inline constexpr ScpiErrorCode kUndefinedHeader{-113, "Undefined header"};
inline constexpr ScpiErrorCode kHeaderSuffixOutOfRange{-114, "Header suffix out of range"};
inline constexpr ScpiErrorCode kInvalidSuffix{-131, "Invalid suffix"};
inline constexpr ScpiErrorCode kStringDataError{-150, "String data error"};
// Execution errors: the message was read but cannot be carried out.
inline constexpr ScpiErrorCode kSettingsConflict{-221, "Settings conflict"};
inline constexpr ScpiErrorCode kDataOutOfRange{-222, "Data out of range"};
inline constexpr ScpiErrorCode kIllegalParameterValue{-224, "Illegal parameter value"};
// Device errors.
inline constexpr ScpiErrorCode kQueueOverflow{-350, "Queue overflow"};

// The queue entry text, e.g. -113,"Undefined header".
std::string errorEntry(ScpiErrorCode error);

// Thrown by the parsing helpers; the instrument queues the code.
struct ScpiFailure {
    ScpiErrorCode error;
};

// True when word (any case) is the short or the long form of keyword, whose upper-case letters
// are the short form: "OUTPut" matches "outp" and "OUTPUT", not "OUTPU".
bool matchesKeyword(std::string_view word, std::string_view keyword);

// A header node such as "WIDT2": the mnemonic and its numeric suffix (absent when not written).
struct HeaderNode {
    std::string mnemonic;
    std::optional<int> suffix;
};

// Splits a program header like ":SOUR:PULS:WIDT1?" into nodes; a leading colon is optional.
// Throws ScpiFailure (syntax error) for empty nodes or stray characters.
struct ProgramHeader {
    std::vector<HeaderNode> nodes;
    bool query = false;
};
ProgramHeader parseHeader(std::string_view header);

// True when the nodes spell the command pattern, e.g. {"[SOURce]", "PULSe", "WIDTh#"}: a node in
// brackets may be left out, and only a node marked "#" may carry a numeric suffix, which is stored
// in `suffix` (left empty when not written).
bool matchesPattern(std::span<const char* const> pattern, std::span<const HeaderNode> nodes,
                    std::optional<int>& suffix);

enum class ScpiUnit { none, second, hertz, volt, ohm };

// Parses a decimal number in fixed or exponent form with an optional unit suffix of the given
// kind ("100NS", "10MHZ", "1.5E-06", "2.5 V"). Throws ScpiFailure: syntax error for junk,
// invalid suffix for a suffix that does not fit the unit.
double parseNumber(std::string_view text, ScpiUnit unit);

// ON/OFF/1/0. Throws ScpiFailure (illegal parameter value) for anything else.
bool parseBoolean(std::string_view text);

}  // namespace zp::sim
