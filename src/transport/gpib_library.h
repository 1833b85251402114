#pragma once
// The local GPIB board's driver library, loaded at run time so that the program neither needs it
// to build nor to start: linux-gpib's libgpib.so.0, else the compatible libni4882.so. The
// environment variable ZP_GPIB_LIBRARY names another library to use instead.

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "transport/device_link.h"
#include "transport/resource.h"

namespace zp::transport {

class GpibLibrary {
  public:
    static constexpr int kErr = 0x8000;
    static constexpr int kTimo = 0x4000;
    static constexpr int kEnd = 0x2000;

    // Library file names tried in order (ZP_GPIB_LIBRARY alone when set).
    static std::vector<std::string> candidates();
    // Loads the first candidate that has every needed function. Throws InstrumentError naming
    // every library tried and why it failed.
    static std::shared_ptr<GpibLibrary> load(const std::vector<std::string>& paths = candidates());

    ~GpibLibrary();
    GpibLibrary(const GpibLibrary&) = delete;
    GpibLibrary& operator=(const GpibLibrary&) = delete;

    const std::string& path() const { return path_; }

    int ibdev(int board, int pad, int sad, int tmo, int eot, int eos) const;
    int ibwrt(int ud, const void* data, long count) const;
    int ibrd(int ud, void* data, long count) const;
    int ibclr(int ud) const;
    int ibonl(int ud, int online) const;
    int status() const;             // ibsta of this thread's last call
    long count() const;             // characters moved by this thread's last call
    std::string errorText() const;  // this thread's iberr as a short text

    struct Key {  // only load() creates libraries
      private:
        Key() = default;
        friend class GpibLibrary;
    };
    explicit GpibLibrary(Key) {}

  private:
    static std::shared_ptr<GpibLibrary> open(const std::string& path, std::string& why);

    std::string path_;
    void* handle_ = nullptr;
    int (*ibdev_)(int, int, int, int, int, int) = nullptr;
    int (*ibwrt_)(int, const void*, long) = nullptr;
    int (*ibrd_)(int, void*, long) = nullptr;
    int (*ibclr_)(int) = nullptr;
    int (*ibonl_)(int, int) = nullptr;
    int (*threadIbsta_)() = nullptr;
    long (*threadIbcntl_)() = nullptr;  // optional
    int (*threadIbcnt_)() = nullptr;    // fallback for count()
    int (*threadIberr_)() = nullptr;    // optional
};

// One device on the board; taken off line when destroyed. The driver bounds each call by the
// timeout code as a whole.
class GpibLink : public DeviceLink {
  public:
    // Throws InstrumentError when the board refuses the device.
    GpibLink(std::shared_ptr<GpibLibrary> library, const GpibResource& resource, int timeoutCode);
    ~GpibLink() override;

    // A device that still holds part of a reply would discard it on the next write and queue
    // "Query INTERRUPTED"; the rest is read off first instead.
    void write(std::string_view text) override;
    std::string read(std::size_t maxChars) override;
    // Reads the rest of a reply whose END has not come yet, within one timeout.
    std::size_t drainReplies() override;
    void clear() override;

  private:
    [[noreturn]] void fail(const char* call);

    std::shared_ptr<GpibLibrary> library_;
    int ud_ = -1;
    std::chrono::milliseconds timeout_;
    bool unfinished_ = false;  // the last read stopped at the buffer size, before END
};

}  // namespace zp::transport
