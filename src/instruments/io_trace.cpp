#include "instruments/io_trace.h"

#include <cstdio>
#include <stdexcept>

#include "core/text.h"

namespace zp {

namespace {

// Escapes without the surrounding quotes, so error descriptions stay on one line too.
void appendEscaped(std::string& out, std::string_view text) {
    zp::appendEscaped(out, text, EscapeStyle::Hex);
}

std::string callText(std::string_view object, std::string_view operation,
                     std::string_view arguments) {
    std::string line = "ANA ";
    line.append(object).append(".").append(operation).append("(").append(arguments).append(")");
    return line;
}

}  // namespace

std::string IoTrace::quote(std::string_view text) {
    std::string out = "\"";
    appendEscaped(out, text);
    out += '"';
    return out;
}

void IoTrace::analyzerCall(std::string_view object, std::string_view operation,
                           std::string_view arguments, std::string_view reply) {
    std::string line = callText(object, operation, arguments);
    if (!reply.empty()) line.append(" -> ").append(reply);
    add(std::move(line));
}

void IoTrace::analyzerError(std::string_view object, std::string_view operation,
                            std::string_view arguments, std::string_view description) {
    std::string line = callText(object, operation, arguments);
    line += " !! ";
    appendEscaped(line, description);
    add(std::move(line));
}

void IoTrace::busWrite(int address, std::string_view text) {
    add("BUS " + std::to_string(address) + " W " + quote(text));
}

void IoTrace::busRead(int address, std::string_view text) {
    add("BUS " + std::to_string(address) + " R " + quote(text));
}

void IoTrace::busEvent(int address, std::string_view event) {
    std::string line = "BUS " + std::to_string(address) + " ";
    appendEscaped(line, event);
    add(std::move(line));
}

std::vector<std::string> IoTrace::lines() const {
    std::lock_guard lock(mutex_);
    return lines_;
}

void IoTrace::clear() {
    std::lock_guard lock(mutex_);
    lines_.clear();
}

void IoTrace::openFile(const std::string& path) {
    std::ofstream file(path, std::ios::out | std::ios::trunc);
    if (!file) throw std::runtime_error("cannot write the I/O trace to '" + path + "'");
    std::lock_guard lock(mutex_);
    file_ = std::move(file);
}

bool IoTrace::fileFailed() const {
    std::lock_guard lock(mutex_);
    return file_.is_open() && !file_.good();
}

void IoTrace::add(std::string line) {
    std::lock_guard lock(mutex_);
    if (file_.is_open()) {
        // Flushed line by line so that a crashed run still leaves its trace behind.
        file_ << line << '\n';
        file_.flush();
    }
    lines_.push_back(std::move(line));
}

}  // namespace zp
