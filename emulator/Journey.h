#pragma once

#include "Clock.h"
#include "Key.h"
#include "Picture.h"

#include <istream>
#include <string>
#include <vector>

namespace emulator {

/// An operator's journey: steps read from a text of one step a line, as `panel-emulator --help`
/// lists them.
class Journey {
  public:
    enum class Action {
        tap,
        hold,
        release,
        wait,
        expect,
        expectCursor,
        picture,
        say,
        limit,
        run,
    };

    /// A step; which fields beside the line number mean something depends on the action.
    struct Step {
        Action action = Action::release;
        int line = 0;
        Key key = Key::up;
        int count = 1;          ///< taps, or polls of a hold
        Clock::duration time{}; ///< of a wait or a limit
        Picture::Rows rows;     ///< expected, padded to 16 columns
        int row = 0;            ///< of the expected cursor
        int column = 0;         ///< of the expected cursor, 0 to 39
        bool blinking = false;  ///< of the expected cursor
        std::string text;       ///< picture's name, words to say, command to run
    };

    /// Reads a whole journey. Throws std::invalid_argument with "NAME:LINE: what is wrong".
    Journey(std::istream &input, std::string name);

    [[nodiscard]] const std::vector<Step> &steps() const { return steps_; }
    /// "NAME:LINE: ", to open a message about the step.
    [[nodiscard]] std::string place(int line) const;

  private:
    std::string name_;
    std::vector<Step> steps_;
};

} // namespace emulator
