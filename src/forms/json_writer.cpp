#include "forms/json_writer.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <stdexcept>

namespace zp {

std::string jsonQuoted(std::string_view v) {
    std::string out = "\"";
    for (const char c : v) {
        switch (c) {
            case '"':
                out += "\\\"";
                break;
            case '\\':
                out += "\\\\";
                break;
            case '\n':
                out += "\\n";
                break;
            case '\r':
                out += "\\r";
                break;
            case '\t':
                out += "\\t";
                break;
            case '\b':
                out += "\\b";
                break;
            case '\f':
                out += "\\f";
                break;
            default:
                if (static_cast<unsigned char>(c) < 0x20) {
                    char buf[8];
                    std::snprintf(buf, sizeof buf, "\\u%04x", static_cast<unsigned>(c));
                    out += buf;
                } else {
                    out += c;
                }
        }
    }
    out += '"';
    return out;
}

void JsonWriter::beforeValue() {
    if (afterKey_) {
        afterKey_ = false;
        return;
    }
    if (hasMembers_.empty()) {
        if (!out_.empty()) throw std::logic_error("JSON text already has its one value");
        return;
    }
    if (hasMembers_.back())
        out_ += hasMembers_.size() == 1 ? ",\n " : ", ";
    else if (hasMembers_.size() == 1)
        out_ += "\n ";
    hasMembers_.back() = true;
}

void JsonWriter::open(char bracket) {
    beforeValue();
    out_ += bracket;
    hasMembers_.push_back(false);
}

void JsonWriter::close(char bracket) {
    if (hasMembers_.empty() || afterKey_) throw std::logic_error("unbalanced JSON text");
    if (hasMembers_.size() == 1 && hasMembers_.back()) out_ += '\n';
    hasMembers_.pop_back();
    out_ += bracket;
}

void JsonWriter::beginObject() {
    open('{');
}
void JsonWriter::endObject() {
    close('}');
}
void JsonWriter::beginArray() {
    open('[');
}
void JsonWriter::endArray() {
    close(']');
}

void JsonWriter::key(std::string_view name) {
    if (hasMembers_.empty() || afterKey_) throw std::logic_error("JSON member name out of place");
    beforeValue();
    out_ += jsonQuoted(name);
    out_ += ": ";
    afterKey_ = true;
}

void JsonWriter::value(double v) {
    if (!std::isfinite(v)) {
        null();
        return;
    }
    beforeValue();
    char buf[32];
    const auto result = std::to_chars(buf, buf + sizeof buf, v);
    out_.append(buf, result.ptr);
}

void JsonWriter::value(std::int64_t v) {
    beforeValue();
    out_ += std::to_string(v);
}

void JsonWriter::value(bool v) {
    beforeValue();
    out_ += v ? "true" : "false";
}

void JsonWriter::value(std::string_view v) {
    beforeValue();
    out_ += jsonQuoted(v);
}

void JsonWriter::null() {
    beforeValue();
    out_ += "null";
}

}  // namespace zp
