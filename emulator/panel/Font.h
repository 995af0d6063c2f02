#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace emulator {

/// One character cell of 5 by 8 dots: one byte for each row from the top, the leftmost dot in
/// bit 4.
using Glyph = std::array<std::uint8_t, 8>;
inline constexpr int glyphColumns = 5;

/// The dots of a printable ASCII character, or an empty box for any other byte.
const Glyph &glyph(char character);

/// True for the characters that the table has dots for, including the blank.
constexpr bool isPrintable(char character) {
    return character >= ' ' && character <= '~';
}

/// The text with a question mark in place of every other byte.
std::string printable(std::string text);

} // namespace emulator
