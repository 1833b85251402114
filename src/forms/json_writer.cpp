#include "forms/json_writer.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <stdexcept>

#include "core/text.h"

namespace zp {

std::string jsonQuoted(std::string_view v) {
    std::string out = "\"";
    appendEscaped(out, v, EscapeStyle::Json);
    out += '"';
    return out;
}

void JsonWriter::beforeValue() {
    if (afterKey_) {
        afterKey_ = false;
        return;
    }
    if (open_.empty()) {
        if (!out_.empty()) throw std::logic_error("JSON text already has its one value");
        return;
    }
    if (open_.back().closing == '}') throw std::logic_error("JSON object member without a name");
    separate();
}

void JsonWriter::separate() {
    if (open_.back().hasMembers)
        out_ += open_.size() == 1 ? ",\n " : ", ";
    else if (open_.size() == 1)
        out_ += "\n ";
    open_.back().hasMembers = true;
}

void JsonWriter::open(char bracket, char closing) {
    beforeValue();
    out_ += bracket;
    open_.push_back({closing, false});
}

void JsonWriter::close(char closing) {
    if (open_.empty() || afterKey_ || open_.back().closing != closing)
        throw std::logic_error("unbalanced JSON text");
    if (open_.size() == 1 && open_.back().hasMembers) out_ += '\n';
    open_.pop_back();
    out_ += closing;
}

void JsonWriter::beginObject() {
    open('{', '}');
}
void JsonWriter::endObject() {
    close('}');
}
void JsonWriter::beginArray() {
    open('[', ']');
}
void JsonWriter::endArray() {
    close(']');
}

void JsonWriter::key(std::string_view name) {
    if (open_.empty() || afterKey_ || open_.back().closing != '}')
        throw std::logic_error("JSON member name out of place");
    separate();
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
