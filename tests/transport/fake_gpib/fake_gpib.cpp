// A stand-in for the GPIB driver library, loaded by the transport tests at run time.
// Devices: address 29 has no listener; every other address answers "*IDN?" with
// "FAKE,GPIB,<address>,1", "ECHO? text" with the text and ":SYST:ERR?" with its error queue;
// other queries get no reply. A write while a reply is still unread discards the reply and
// queues -410 "Query INTERRUPTED", as a real instrument does. The state is per process, as in a
// real driver.

#include <algorithm>
#include <cstring>
#include <deque>
#include <map>
#include <string>

namespace {

constexpr int kErr = 0x8000;
constexpr int kTimo = 0x4000;
constexpr int kEnd = 0x2000;
constexpr int kCmpl = 0x0100;
constexpr int kNoListenerAddress = 29;

struct Driver {
    int sta = 0;
    int err = 0;
    long cntl = 0;
    std::map<int, std::string> pending;  // per descriptor
    std::map<int, std::deque<std::string>> errors;
    std::map<int, int> online;
    std::string lastWrite;
    int lastTimeoutCode = -1;
};

Driver& driver() {
    static Driver d;
    return d;
}

int fail(int error, int extra = 0) {
    driver().sta = kErr | extra;
    driver().err = error;
    driver().cntl = 0;
    return driver().sta;
}

int address(int ud) {
    return ud - 100;
}

}  // namespace

extern "C" {

int ibdev(int board, int pad, int, int tmo, int, int) {
    if (board != 0) {
        fail(7);  // ENEB
        return -1;
    }
    driver().sta = kCmpl;
    driver().lastTimeoutCode = tmo;
    driver().online[pad + 100] = 1;
    return pad + 100;
}

int ibwrt(int ud, const void* data, long count) {
    if (address(ud) == kNoListenerAddress) return fail(2);  // ENOL
    std::string text(static_cast<const char*>(data), static_cast<std::size_t>(count));
    driver().lastWrite = text;
    while (!text.empty() && (text.back() == '\n' || text.back() == '\r')) text.pop_back();
    if (driver().pending.erase(ud) != 0)
        driver().errors[ud].push_back("-410,\"Query INTERRUPTED\"");
    if (text == ":SYST:ERR?") {
        auto& queue = driver().errors[ud];
        driver().pending[ud] = (queue.empty() ? "+0,\"No error\"" : queue.front()) + "\n";
        if (!queue.empty()) queue.pop_front();
    } else if (text == "*IDN?") {
        driver().pending[ud] = "FAKE,GPIB," + std::to_string(address(ud)) + ",1\n";
    } else if (text.rfind("ECHO? ", 0) == 0) {
        driver().pending[ud] = text.substr(6) + "\n";
    }
    driver().sta = kCmpl;
    driver().cntl = count;
    return driver().sta;
}

int ibrd(int ud, void* data, long count) {
    auto it = driver().pending.find(ud);
    if (it == driver().pending.end()) return fail(6, kTimo);  // EABO
    const std::size_t n = std::min(static_cast<std::size_t>(count), it->second.size());
    std::memcpy(data, it->second.data(), n);
    it->second.erase(0, n);
    driver().sta = kCmpl | (it->second.empty() ? kEnd : 0);
    if (it->second.empty()) driver().pending.erase(it);
    driver().cntl = static_cast<long>(n);
    return driver().sta;
}

int ibclr(int ud) {
    if (address(ud) == kNoListenerAddress) return fail(2);
    driver().pending.erase(ud);
    driver().sta = kCmpl;
    return driver().sta;
}

int ibonl(int ud, int online) {
    driver().online[ud] = online;
    driver().sta = kCmpl;
    return driver().sta;
}

int ThreadIbsta() {
    return driver().sta;
}
long ThreadIbcntl() {
    return driver().cntl;
}
int ThreadIberr() {
    return driver().err;
}

// Test hooks.
const char* fake_gpib_last_write() {
    return driver().lastWrite.c_str();
}
int fake_gpib_is_online(int ud) {
    return driver().online.count(ud) != 0 ? driver().online[ud] : -1;
}
int fake_gpib_last_timeout_code() {
    return driver().lastTimeoutCode;
}

}  // extern "C"
