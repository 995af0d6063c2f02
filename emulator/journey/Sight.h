#pragma once

#include "emulator/panel/Display.h"

#include <optional>
#include <string>

namespace emulator {

/// What is to be seen on the display. What is not given may be anything.
struct Sight {
    std::optional<std::string> row0; ///< filled up with blanks to 16 characters, as row 1 is
    std::optional<std::string> row1;
    std::optional<Display::Place> cursor; ///< where it blinks
    std::optional<std::string> chosen;    ///< the entry behind the marker, in either row

    [[nodiscard]] bool isShownBy(const Display &display) const;
    /// A frame of four lines as `Picture` draws it, for a message.
    [[nodiscard]] std::string text() const;
};

} // namespace emulator
