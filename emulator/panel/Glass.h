// The display's glass as it is drawn in pictures and on the page: its measures and colours. All
// measures are in dots.
#pragma once

#include "emulator/panel/Display.h"
#include "emulator/panel/Font.h"

#include <tuple>

namespace emulator::glass {

inline constexpr int glyphRows = std::tuple_size_v<Glyph>;
inline constexpr int cellPitch = glyphColumns + 1; ///< from one character to the next
inline constexpr int rowPitch = 10;
inline constexpr int margin = 4; ///< around the characters
inline constexpr int textWidth = Display::visibleColumns * cellPitch - 1;
inline constexpr int textHeight = rowPitch + glyphRows;

inline constexpr const char *background = "#a9c23f";
inline constexpr const char *blankDot = "#a0b83a";
inline constexpr const char *darkDot = "#1d2a10";

} // namespace emulator::glass
