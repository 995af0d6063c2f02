// Every byte value that the panel and the program agree on, in one table.
//
// The panel acknowledges nothing and cannot be asked what it has understood. Two things that look
// needless are therefore kept as every panel in the field has been driven: the command before each
// key request, and the detour into row 1.
#pragma once

#include <cstdint>

namespace PanelCommand {
constexpr std::uint8_t prefix = 0xFE; ///< goes before each of the commands below

constexpr std::uint8_t beforeKeyRequest = 0x00; ///< shows nothing on the display
constexpr std::uint8_t clear = 0x01;
constexpr std::uint8_t home = 0x02;
constexpr std::uint8_t readKey = 0x06; ///< answered by two bytes while a key is down, else by none
constexpr std::uint8_t cursorOff = 0x0C;
constexpr std::uint8_t cursorBlink = 0x0D;
constexpr std::uint8_t cursorLeft = 0x10;
constexpr std::uint8_t cursorRight = 0x14;
constexpr std::uint8_t initialise = 0x28;

/// Row 1 is always addressed one column too far right and then entered with `cursorLeft`.
constexpr std::uint8_t row1AfterColumn0 = 0x41;
constexpr std::uint8_t row0Column0 = 0x80;
} // namespace PanelCommand

/// Second byte of the answer to a key request.
namespace PanelKey {
constexpr std::uint8_t escape = 0xB7;
constexpr std::uint8_t enter = 0xBB;
constexpr std::uint8_t down = 0xBD;
constexpr std::uint8_t up = 0xBE;
} // namespace PanelKey
