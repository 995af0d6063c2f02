#pragma once

#include "ChildProcess.h"
#include "Display.h"
#include "JourneyPlayer.h"
#include "Keypad.h"
#include "Line.h"
#include "Options.h"
#include "TerminalFront.h"

#include <memory>
#include <string>

namespace emulator {

/// The emulated panel at work: one loop around the line, the display, the keypad, the command
/// that uses them, and either a journey or the terminal as the operator.
class Emulator {
  public:
    /// Opens the line and starts the command. The journey, if any, has been read by then.
    /// Throws when the line, the terminal or a process cannot be had.
    Emulator(const Options &options, std::optional<Journey> journey);

    /// Runs until the journey or the command ends, the operator quits or a signal comes. Returns
    /// the emulator's exit status. Throws std::runtime_error when the journey fails.
    int run();

  private:
    void waitForEvents();
    void drainOutput();
    bool advance(TimePoint now);
    std::optional<int> takeSignal();
    int finish(int status);
    [[nodiscard]] bool hasTerminal() const { return front_ != nullptr; }

    Display display_;
    Line line_;
    Keypad keypad_;
    FileDescriptor signals_;
    FileDescriptor output_;  // where a command's output is read on a terminal
    std::string outputTail_; // the last of it
    std::optional<JourneyPlayer> player_;
    std::unique_ptr<TerminalFront> front_;
    std::unique_ptr<ChildProcess> command_;
};

} // namespace emulator
