#pragma once

#include <string>
#include <vector>

namespace emulator {

/// A line of a journey's text, without the blanks around it.
struct TextLine {
    int number; ///< from 1
    std::string text;
};

/// The lines of a scene as they are to be played: once as they stand, or once for each line `with
/// WORD...` among them. In the other lines, $1 to $9 stand for the words of that line, which keep
/// their quotes. A number for which there is no word stays as it is.
std::vector<TextLine> expandTable(const std::vector<TextLine> &scene);

} // namespace emulator
