#pragma once
// What the window rules need from the person at the screen. The Qt views implement it; tests and
// the command-line front end script it.

#include <optional>
#include <string>

namespace zp {

inline constexpr const char* kAppTitle = "Veltrix Zentra Pulse Application";

enum class Pointer { Normal, Busy, Wait1, Wait2, Wait3 };

// Failures (instrument, solver, limits) are warnings; everything else is information.
enum class MessageKind { Information, Warning };

// The manual at a topic. The file is the one the analyzer named; when it named none, `file` is
// empty, `analyzerError` says why and the program's own manual is meant.
struct HelpRequest {
    std::string file;
    int topic = 0;
    std::optional<std::string> analyzerError;
};

class Interaction {
  public:
    virtual ~Interaction() = default;
    // A message box with an OK button only, titled kAppTitle; a warning shows the warning icon.
    virtual void message(const std::string& text, MessageKind kind) = 0;
    // A yes/no question; true for yes.
    virtual bool ask(const std::string& text) = 0;
    // A file to open or to save, with a filter such as "Zentra Pulsed Config (*.zpc)|*.zpc";
    // nothing when the person cancels.
    virtual std::optional<std::string> chooseOpenFile(const std::string& filter) = 0;
    virtual std::optional<std::string> chooseSaveFile(const std::string& filter) = 0;
    // Lets the event loop run (long work yields here so that Stop can be pressed).
    virtual void processEvents() = 0;
    virtual void setPointer(Pointer p) = 0;
    // Opens the manual at a topic anchor; returns false when it can't.
    virtual bool showHelp(const HelpRequest& request) = 0;
};

// Shows the busy pointer for a scope and puts the normal one back at its end.
class BusyPointer {
  public:
    explicit BusyPointer(Interaction& ui) : ui_(ui) { ui_.setPointer(Pointer::Busy); }
    ~BusyPointer() { ui_.setPointer(Pointer::Normal); }
    BusyPointer(const BusyPointer&) = delete;
    BusyPointer& operator=(const BusyPointer&) = delete;

  private:
    Interaction& ui_;
};

}  // namespace zp
