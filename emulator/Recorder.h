#pragma once

#include "emulator/Display.h"
#include "emulator/Keypad.h"
#include "emulator/Operator.h"

#include <optional>
#include <ostream>
#include <string>

namespace emulator {

/// Writes what is done at the panel as a journey: each key as the program has counted it, and in
/// front of it what the panel showed when the key was pressed. The journey can be played at any
/// time, since each step waits until the panel shows the same again. Each step is a line, and what
/// has been written stays.
class Recorder : public Operator {
  public:
    /// Writes to `output` from now on.
    Recorder(std::ostream &output, const Display &display, const Keypad &keypad);

    std::optional<int> look(TimePoint now) override;
    /// True when what has been written ends before a key and what the panel showed at it: what is
    /// written from here on is a journey of its own.
    [[nodiscard]] bool isBetweenKeys() const { return !held && !isKeyDown; }
    /// Writes the end, if it is to end now.
    void finish();
    /// The steps that would be the end if it were now: the key that is being counted, and what the
    /// panel shows.
    [[nodiscard]] std::string end() const;

  private:
    struct Held {
        Key key;
        unsigned long polls;
    };

    void countAnswers();
    [[nodiscard]] std::string stroke(bool isReleased) const;
    void writeStroke(bool isReleased);

    const Display &display;
    const Keypad &keypad;
    std::ostream &output;
    unsigned long answersSeen;
    unsigned long requestsSeen;
    std::optional<Held> held;
    bool isKeyDown = false; // at the end of what has been written
    std::string sight;      // the steps that expect what was shown at the last key request
};

} // namespace emulator
