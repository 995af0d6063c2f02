#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace emulator {

/// A line of a journey's text, without the blanks around it.
struct TextLine {
    int number; ///< from 1
    std::string text;
};

/// What the line begins with: a step's name, or a sight.
std::string_view firstWord(const TextLine &line);

/// The lines of a scene as they are to be played: once as they stand, or once for each line `with
/// WORD...` among them. In the other lines, $1 to $9 stand for the words of that line, which keep
/// their quotes. A number for which there is no word stays as it is. Throws std::invalid_argument,
/// with what `place` makes of its number, at a line of the table that is not as long as the others
/// or has no words.
std::vector<TextLine> expandTable(const std::vector<TextLine> &scene,
                                  const std::function<std::string(int)> &place);

} // namespace emulator
