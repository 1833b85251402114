#include "transport/gpib_library.h"

#include <dlfcn.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>

#include "instruments/instrument_error.h"

namespace zp::transport {

namespace {

template <typename Fn>
bool bind(void* handle, const char* name, Fn& fn) {
    fn = reinterpret_cast<Fn>(::dlsym(handle, name));
    return fn != nullptr;
}

const char* iberrText(int code) {
    switch (code) {
        case 0:
            return "system error";
        case 1:
            return "board not controller in charge";
        case 2:
            return "no listener";
        case 3:
            return "board not addressed";
        case 4:
            return "invalid argument";
        case 5:
            return "board not system controller";
        case 6:
            return "I/O aborted or timed out";
        case 7:
            return "no GPIB board";
        case 10:
            return "I/O in progress";
        case 11:
            return "no capability";
        case 14:
            return "bus error";
        default:
            return "GPIB error";
    }
}

}  // namespace

std::vector<std::string> GpibLibrary::candidates() {
    if (const char* path = std::getenv("ZP_GPIB_LIBRARY"); path != nullptr && *path != '\0') {
        return {path};
    }
    return {"libgpib.so.0", "libni4882.so"};
}

std::shared_ptr<GpibLibrary> GpibLibrary::open(const std::string& path, std::string& why) {
    void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (handle == nullptr) {
        const char* error = ::dlerror();
        why = error != nullptr ? error : "cannot load";
        return nullptr;
    }
    auto library = std::make_shared<GpibLibrary>(Key{});
    library->path_ = path;
    library->handle_ = handle;
    GpibLibrary& l = *library;
    const std::pair<const char*, bool> required[] = {
        {"ibdev", bind(handle, "ibdev", l.ibdev_)},
        {"ibwrt", bind(handle, "ibwrt", l.ibwrt_)},
        {"ibrd", bind(handle, "ibrd", l.ibrd_)},
        {"ibclr", bind(handle, "ibclr", l.ibclr_)},
        {"ibonl", bind(handle, "ibonl", l.ibonl_)},
        {"ThreadIbsta", bind(handle, "ThreadIbsta", l.threadIbsta_)},
    };
    for (const auto& [name, found] : required) {
        if (!found) {
            why = path + " has no function " + name;
            return nullptr;  // the destructor unloads it
        }
    }
    bind(handle, "ThreadIbcntl", l.threadIbcntl_);
    bind(handle, "ThreadIbcnt", l.threadIbcnt_);
    bind(handle, "ThreadIberr", l.threadIberr_);
    if (l.threadIbcntl_ == nullptr && l.threadIbcnt_ == nullptr) {
        why = path + " has neither ThreadIbcntl nor ThreadIbcnt";
        return nullptr;
    }
    return library;
}

std::shared_ptr<GpibLibrary> GpibLibrary::load(const std::vector<std::string>& paths) {
    std::string reasons;
    for (const auto& path : paths) {
        std::string why;
        if (auto library = open(path, why)) return library;
        reasons += (reasons.empty() ? "" : "; ") + why;
    }
    std::string names;
    for (const auto& path : paths) names += (names.empty() ? "" : ", ") + path;
    throw InstrumentError(
        kTransportError, "No GPIB driver library could be loaded (tried " + names + ": " + reasons +
                             "). Install linux-gpib or NI-488.2, or set ZP_GPIB_LIBRARY.");
}

GpibLibrary::~GpibLibrary() {
    if (handle_ != nullptr) ::dlclose(handle_);
}

int GpibLibrary::ibdev(int board, int pad, int sad, int tmo, int eot, int eos) const {
    return ibdev_(board, pad, sad, tmo, eot, eos);
}
int GpibLibrary::ibwrt(int ud, const void* data, long count) const {
    return ibwrt_(ud, data, count);
}
int GpibLibrary::ibrd(int ud, void* data, long count) const {
    return ibrd_(ud, data, count);
}
int GpibLibrary::ibclr(int ud) const {
    return ibclr_(ud);
}
int GpibLibrary::ibonl(int ud, int online) const {
    return ibonl_(ud, online);
}
int GpibLibrary::status() const {
    return threadIbsta_();
}

long GpibLibrary::count() const {
    return threadIbcntl_ != nullptr ? threadIbcntl_() : threadIbcnt_();
}

std::string GpibLibrary::errorText() const {
    if ((status() & kTimo) != 0) return "timeout";
    return threadIberr_ != nullptr ? iberrText(threadIberr_()) : "GPIB error";
}

GpibLink::GpibLink(std::shared_ptr<GpibLibrary> library, const GpibResource& resource,
                   int timeoutCode)
    : library_(std::move(library)), timeout_(timeoutForCode(timeoutCode)) {
    const int sad = resource.secondary < 0 ? 0 : 0x60 + resource.secondary;
    ud_ = library_->ibdev(resource.board, resource.primary, sad, timeoutCode, 1, 0);
    if (ud_ < 0 || (library_->status() & GpibLibrary::kErr) != 0) {
        throw InstrumentError(kTransportError, "GPIB" + std::to_string(resource.board) +
                                                   ": cannot open the device at address " +
                                                   std::to_string(resource.primary) + " (" +
                                                   library_->errorText() + ")");
    }
}

GpibLink::~GpibLink() {
    if (ud_ >= 0) library_->ibonl(ud_, 0);
}

void GpibLink::fail(const char* call) {
    unfinished_ = false;  // whatever is left of the reply is the device's to discard now
    const bool timedOut = (library_->status() & GpibLibrary::kTimo) != 0;
    throw LinkFailure(std::string(call) + ": " + library_->errorText(), timedOut);
}

void GpibLink::write(std::string_view text) {
    drainReplies();
    library_->ibwrt(ud_, text.data(), static_cast<long>(text.size()));
    if ((library_->status() & GpibLibrary::kErr) != 0) fail("ibwrt");
}

std::string GpibLink::read(std::size_t maxChars) {
    std::string buffer(std::min<std::size_t>(maxChars, 1u << 30), '\0');
    library_->ibrd(ud_, buffer.data(), static_cast<long>(buffer.size()));
    if ((library_->status() & GpibLibrary::kErr) != 0) fail("ibrd");
    const long n = library_->count();
    buffer.resize(
        static_cast<std::size_t>(std::clamp<long>(n, 0, static_cast<long>(buffer.size()))));
    if (!buffer.empty()) unfinished_ = (library_->status() & GpibLibrary::kEnd) == 0;
    return buffer;
}

std::size_t GpibLink::drainReplies() {
    const auto deadline = std::chrono::steady_clock::now() + timeout_;
    std::size_t dropped = 0;
    char scratch[4096];
    while (unfinished_) {
        // Each ibrd has its own timeout; a device that streams without END must still stop.
        if (std::chrono::steady_clock::now() >= deadline) {
            unfinished_ = false;
            throw LinkFailure("ibrd: the rest of an earlier reply did not end in time", true);
        }
        library_->ibrd(ud_, scratch, static_cast<long>(sizeof scratch));
        if ((library_->status() & GpibLibrary::kErr) != 0) fail("ibrd");
        dropped += static_cast<std::size_t>(
            std::clamp<long>(library_->count(), 0, static_cast<long>(sizeof scratch)));
        unfinished_ = (library_->status() & GpibLibrary::kEnd) == 0;
    }
    return dropped;
}

void GpibLink::clear() {
    unfinished_ = false;
    library_->ibclr(ud_);
    if ((library_->status() & GpibLibrary::kErr) != 0) fail("ibclr");
}

}  // namespace zp::transport
