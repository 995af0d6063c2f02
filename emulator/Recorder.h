#pragma once

#include "emulator/Display.h"
#include "emulator/Keypad.h"
#include "emulator/Operator.h"

#include <fstream>
#include <optional>
#include <string>

namespace emulator {

/// Writes what is done at the panel as a journey: each key as the program has counted it, and in
/// front of it what the panel showed when the key was pressed. The journey can be played at any
/// time, since each step waits until the panel shows the same again.
class Recorder : public Operator {
  public:
    /// Throws std::runtime_error when the file cannot be written.
    Recorder(std::string path, const Display &display, const Keypad &keypad);

    std::optional<int> look(TimePoint now) override;
    /// Writes what the panel shows at the end. Throws std::runtime_error when not everything could
    /// be written.
    void finish();

  private:
    struct Held {
        Key key;
        unsigned long polls;
    };

    void countAnswers();
    void writeStroke(bool isReleased);

    const Display &display;
    const Keypad &keypad;
    std::string path;
    std::ofstream file;
    unsigned long answersSeen;
    unsigned long requestsSeen;
    std::optional<Held> held;
    bool isKeyDown = false; // at the end of what has been written
    std::string sight;      // the steps that expect what was shown at the last key request
};

} // namespace emulator
