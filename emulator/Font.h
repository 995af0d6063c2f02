#pragma once

#include <array>
#include <cstdint>

namespace emulator {

/// One character cell of 5 by 8 dots: a row of dots each, from the top, the leftmost in bit 4.
using Glyph = std::array<std::uint8_t, 8>;
inline constexpr int glyphColumns = 5;

/// The dots of a printable ASCII character; for any other byte an empty box.
const Glyph &glyph(char character);

/// True for the characters that the table has dots for, blank included.
constexpr bool isPrintable(char character) {
    return character >= ' ' && character <= '~';
}

} // namespace emulator
