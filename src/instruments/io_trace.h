#pragma once
// The I/O trace: every analyzer call and every bus text, in order. docs/io-trace.md fixes the line
// format; scripts and tests rely on it.

#include <fstream>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace zp {

class IoTrace {
  public:
    // An analyzer call: object path, operation, arguments as text, reply as text ("" for none).
    void analyzerCall(std::string_view object, std::string_view operation,
                      std::string_view arguments, std::string_view reply);
    // A failing analyzer call.
    void analyzerError(std::string_view object, std::string_view operation,
                       std::string_view arguments, std::string_view description);
    // Bus traffic, per GPIB address.
    void busWrite(int address, std::string_view text);
    void busRead(int address, std::string_view text);
    void busEvent(int address, std::string_view event);  // open, clear, timeout, error

    std::vector<std::string> lines() const;
    void clear();
    // Also appends every line to this file from now on; throws std::runtime_error if it can't.
    void openFile(const std::string& path);
    // True once a line could not be written to that file (a full disk, say).
    bool fileFailed() const;

    // Quoting used by the trace: C-style escapes for control characters, quotes and backslashes.
    static std::string quote(std::string_view text);

  private:
    void add(std::string line);
    mutable std::mutex mutex_;
    std::vector<std::string> lines_;
    std::ofstream file_;
};

}  // namespace zp
