#pragma once

#include "emulator/operators/Operator.h"
#include "emulator/panel/Display.h"
#include "emulator/panel/Keypad.h"

#include <optional>
#include <ostream>
#include <string>

namespace emulator {

/// Writes what is done at the panel as a journey: each key as the program has counted it, and
/// before it what the panel showed when the key was pressed. The journey can be played at any time,
/// because each step waits until the panel shows the same again. Each step is a line, and is not
/// changed once it has been written.
class Recorder : public Operator {
  public:
    /// Writes to `output` once the program asks for a key.
    Recorder(std::ostream &output, const Display &display, const Keypad &keypad);

    std::optional<int> look(TimePoint now) override;
    /// True when what has been written ends before a key and before what the panel showed when it
    /// was pressed. What is written from here on is a journey of its own.
    [[nodiscard]] bool isBetweenKeys() const { return !held && !isKeyDown; }
    /// Writes the end of the journey.
    void finish();
    /// The steps that would end the journey now: the key that is being counted, and what the panel
    /// shows.
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
    bool hasBegun = false;
    bool isKeyDown = false; // at the end of what has been written
    std::string sight;      // the steps that expect what was shown at the last key request
};

} // namespace emulator
