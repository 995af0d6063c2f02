#pragma once

#include "Clock.h"
#include "Display.h"
#include "Keypad.h"
#include "TerminalRescue.h"

#include <array>
#include <deque>
#include <optional>

namespace emulator {

/// The panel on a terminal, as an operator sees it: display, keys, and what the line carries.
///
/// One at a time, because the terminal has one screen. The terminal gets back what it had when
/// this object is destroyed, and also when the program crashes.
class TerminalFront {
  public:
    /// Takes over the terminal; throws std::runtime_error if its kind is not known.
    TerminalFront(const Display &display, Keypad &keypad);
    TerminalFront(const TerminalFront &) = delete;
    TerminalFront &operator=(const TerminalFront &) = delete;
    ~TerminalFront();

    /// Takes in what the operator typed or clicked. Returns false when the operator quits.
    bool handleInput(TimePoint now);
    /// Notes a byte that the line has carried.
    void count(unsigned char byte);
    void draw(TimePoint now);
    /// When to draw again even if nothing happens.
    [[nodiscard]] TimePoint wakeAt() const { return drawAgain_; }

  private:
    void handleCode(int code);
    void handleMouse();
    void tap(Key key);
    void hold(Key key);
    bool letGo(std::optional<Key> pressed);
    void drawGlass(TimePoint now) const;
    void drawKeys(TimePoint now);
    void drawLine(TimePoint now);

    TerminalRescue rescue_;
    const Display &display_;
    Keypad &keypad_;
    std::deque<Key> taps_;    // typed, and not yet asked for by the program
    std::optional<Key> held_; // until another key is pressed
    bool clicked_ = false;    // a key is down by the mouse
    std::array<TimePoint, keys.size()> litUntil_{};
    std::deque<unsigned char> recent_;
    unsigned long counted_ = 0; // bytes since `countedSince_`
    TimePoint countedSince_;
    double bytesPerSecond_ = 0;
    TimePoint drawAgain_;
};

} // namespace emulator
