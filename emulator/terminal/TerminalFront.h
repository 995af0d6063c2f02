#pragma once

#include "emulator/base/FileDescriptor.h"
#include "emulator/base/Loop.h"
#include "emulator/line/LineLoad.h"
#include "emulator/operators/Finger.h"
#include "emulator/operators/Operator.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"
#include "emulator/terminal/TerminalKeys.h"
#include "emulator/terminal/TerminalRescue.h"
#include "emulator/terminal/TerminalScreen.h"

#include <array>
#include <functional>
#include <string>

namespace emulator {

/// The panel on a terminal, as an operator sees it: display, keys, and what the line carries.
///
/// There is one at a time, because the terminal has one screen. The terminal is restored when this
/// object is destroyed, and also if the program crashes.
class TerminalFront : public Operator {
  public:
    /// Takes over the terminal; throws std::runtime_error if the panel cannot be drawn on it. From
    /// a person who only watches, no key but q is accepted.
    TerminalFront(Loop &loop, const Display &display, Keypad &keypad, Use use);
    TerminalFront(const TerminalFront &) = delete;
    TerminalFront &operator=(const TerminalFront &) = delete;

    /// Ends with status 0 when the operator quits or the operator's terminal goes away; throws
    /// std::runtime_error when the terminal of a person who only watches does.
    std::optional<int> look(TimePoint now) override;
    [[nodiscard]] std::optional<TimePoint> wakeAt() const override;
    void carried(unsigned char byte) override { load.carried(byte); }

    /// Draws for the terminal's present size.
    void resize();
    /// Gives the terminal back while the emulator is stopped, and takes it over again.
    void stopWith(const std::function<void()> &stop);
    /// Shows a line below the panel from now on.
    void tell(const std::string &itsWord) { word = itsWord; }

  private:
    void readInput();
    void act(const std::vector<TerminalKeys::Event> &events, TimePoint now);
    void act(const TerminalKeys::Tap &tap, TimePoint now);
    void act(const TerminalKeys::Hold &hold, TimePoint now);
    void act(const TerminalKeys::MouseDown &mouse, TimePoint now);
    void act(const TerminalKeys::MouseUp &mouse, TimePoint now);
    void act(const TerminalKeys::Quit &quit, TimePoint now);
    void act(const TerminalKeys::Other &other, TimePoint now);
    void draw(TimePoint now);
    void drawGlass(TimePoint now) const;
    void drawKeys(TimePoint now);
    void drawLine(TimePoint now);

    TerminalRescue rescue;
    TerminalScreen screen;
    // Not standard input itself, because the loop reads without blocking, and the shell would share
    // that setting.
    FileDescriptor keyboard;
    const Display &display;
    Keypad &keypad;
    Use use;
    Readable input;
    TerminalKeys decoder;
    Finger finger;
    bool isOver = false;
    bool isGone = false; // the terminal
    std::array<TimePoint, keys.size()> litUntil{};
    LineLoad load;
    std::string word; // told below the panel
    TimePoint drawAgain;
};

} // namespace emulator
